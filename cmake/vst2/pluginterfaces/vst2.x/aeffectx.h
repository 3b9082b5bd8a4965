// Forwards JUCE's VST 2.4 includes to Debian's FST headers (fst-dev).
//
// Two FST structs are shorter than the original interface's, and JUCE relies on
// the original sizes; both are redeclared here with the original layout:
// - the speaker arrangement has a flexible array of speakers, while JUCE sizes it
//   as if it held eight: it allocates max (8, n) - 8 extra entries beyond
//   sizeof (VstSpeakerArrangement) and then writes n of them, overrunning the heap
//   for every arrangement of up to eight channels;
// - the pin properties end at the 8-character short label, while JUCE's wrapper
//   writes 9 bytes into it (label and terminator), which the original 48 spare
//   bytes after it absorb; without them a host's stack is overrun.
#pragma once

#ifndef FST2VST
 #define FST2VST 1
#endif
#include <pluginterfaces/fst/fst.h>

struct VeltraneVstSpeakerArrangement
{
    int type;
    int numChannels;
    VstSpeakerProperties speakers[8];
};

#define VstSpeakerArrangement VeltraneVstSpeakerArrangement

struct VeltraneVstPinProperties
{
    char label[64];
    int flags;
    int arrangementType;
    char shortLabel[8];
    char future[48];
};

#define VstPinProperties VeltraneVstPinProperties
