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
//
// FST also leaves some constants it has not identified at placeholder values: the
// pin flags are 0, and the opcodes below lie far outside the range hosts send, so
// JUCE's wrapper would answer them with 0. Those JUCE's wrapper uses are given
// their published VST 2.4 values here; FST's own names for them are moved aside.
#pragma once

#ifndef FST2VST
 #define FST2VST 1
#endif

#define kVstPinIsActive fstUnidentifiedPinIsActive
#define kVstPinIsStereo fstUnidentifiedPinIsStereo
#define kVstPinUseSpeaker fstUnidentifiedPinUseSpeaker
#define effSetBypass fstUnidentifiedSetBypass
#define effGetTailSize fstUnidentifiedGetTailSize
#define effKeysRequired fstUnidentifiedKeysRequired
#define effGetNumMidiInputChannels fstUnidentifiedGetNumMidiInputChannels
#define effGetNumMidiOutputChannels fstUnidentifiedGetNumMidiOutputChannels

#include <pluginterfaces/fst/fst.h>

#undef kVstPinIsActive
#undef kVstPinIsStereo
#undef kVstPinUseSpeaker
#undef effSetBypass
#undef effGetTailSize
#undef effKeysRequired
#undef effGetNumMidiInputChannels
#undef effGetNumMidiOutputChannels

enum
{
    kVstPinIsActive = 1 << 0,
    kVstPinIsStereo = 1 << 1,
    kVstPinUseSpeaker = 1 << 2
};

enum
{
    effSetBypass = 44,
    effGetTailSize = 52,
    effKeysRequired = 57,
    effGetNumMidiInputChannels = 78,
    effGetNumMidiOutputChannels = 79
};

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
