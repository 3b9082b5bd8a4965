// Forwards JUCE's VST 2.4 includes to Debian's FST headers (fst-dev).
//
// FST declares the speaker arrangement with a flexible array of speakers, while
// JUCE sizes it as if it held eight: JUCE allocates max (8, n) - 8 extra entries
// beyond sizeof (VstSpeakerArrangement) and then writes n of them, which overruns
// the heap for every arrangement of up to eight channels. The arrangement is
// therefore redeclared here with its eight fixed entries, the layout of the
// original interface, so hosting and wrapper code allocate and copy it safely.
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
