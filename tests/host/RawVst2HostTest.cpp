// The shipped VST2 binary through dlopen and the bare VST 2.4 calling convention, as any host drives it. The
// VST 2.4 numbers are written out rather than taken from the header folder the plug-in is built with.

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <cmath>
#include <string>

namespace
{
enum : VstInt32 { opOpen = 0, opClose = 1, opGetParamLabel = 6, opGetParamDisplay = 7, opGetParamName = 8,
                  opSetSampleRate = 10, opSetBlockSize = 11, opMainsChanged = 12, opString2Parameter = 27, opGetInputProperties = 33,
                  opGetOutputProperties = 34, opGetPlugCategory = 35, opSetSpeakerArrangement = 42, opSetBypass = 44, opGetEffectName = 45,
                  opGetVendorString = 47, opGetProductString = 48, opCanDo = 51, opGetTailSize = 52, opGetVstVersion = 58,
                  opGetNumMidiInputs = 78, opGetNumMidiOutputs = 79 };
enum { pinIsActive = 1, pinIsStereo = 2, pinUseSpeaker = 4 };
struct PinProperties { char label[64]; VstInt32 flags, arrangementType; char shortLabel[8], future[48]; };
struct SpeakerArrangement { VstInt32 type, numChannels; char speakers[8][112]; };

class RawVst2 : public ::testing::Test
{
protected:
    void SetUp() override
    {
        library = dlopen (VELTRANE_VST2_BINARY, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE (library, nullptr) << dlerror();
        const auto main = reinterpret_cast<AEffect* (*) (AEffectDispatcherProc)> (dlsym (library, "VSTPluginMain"));
        ASSERT_NE (main, nullptr);
        effect = main ([] (AEffect*, int opcode, int, VstIntPtr, void*, float) -> VstIntPtr { return opcode == 1 ? 2400 : 0; });   // audioMasterVersion
        ASSERT_NE (effect, nullptr);
        dispatch (opOpen);
        dispatch (opSetSampleRate, 0, 0, nullptr, 48000.0f);
        dispatch (opSetBlockSize, 0, 64);
        dispatch (opMainsChanged, 0, 1);
    }
    void TearDown() override
    {
        if (effect != nullptr)
            dispatch (opClose);
        if (library != nullptr)
            dlclose (library);
    }
    VstIntPtr dispatch (VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0, void* ptr = nullptr, float opt = 0) { return effect->dispatcher (effect, opcode, index, value, ptr, opt); }
    std::string text (VstInt32 opcode, VstInt32 index = 0)
    {
        char buffer[256] = {};
        dispatch (opcode, index, 0, buffer);
        return buffer;
    }
    PinProperties pin (VstInt32 opcode, int index)
    {
        PinProperties properties {};
        properties.flags = dispatch (opcode, index, 0, &properties) == 1 ? properties.flags : -1;
        return properties;
    }
    // One block of the ramp 0.01, 0.02 ... 0.64 in both channels: the last left output.
    float lastOfRamp()
    {
        float ramp[64], left[64], right[64];
        for (int i = 0; i < 64; ++i)
            ramp[i] = 0.01f * (float) (i + 1);
        float* ins[] { ramp, ramp };
        float* outs[] { left, right };
        effect->processReplacing (effect, ins, outs, 64);
        return left[63];
    }
    void* library = nullptr;
    AEffect* effect = nullptr;
};
}

TEST_F (RawVst2, AnswersAHostsQueriesPinsAndArrangementsAsDocumented)
{
    EXPECT_EQ (effect->magic, CCONST ('V', 's', 't', 'P'));
    EXPECT_EQ (effect->uniqueID, CCONST ('T', 'a', 'V', 'e'));
    EXPECT_EQ (effect->version, 121);
    EXPECT_EQ (effect->numParams, 33);
    EXPECT_EQ (effect->numInputs * 10 + effect->numOutputs, 22);
    EXPECT_EQ (effect->initialDelay, 0);
    // Has an editor (1), replaces (16), program chunks (32); no synth (256), no "no sound in stop" (512).
    EXPECT_EQ (effect->flags & (1 | 16 | 32 | 256 | 512), 1 | 16 | 32);
    EXPECT_EQ (text (opGetEffectName) + "|" + text (opGetProductString) + "|" + text (opGetVendorString), "Veltrane|Veltrane|Tarnwell_Audio");
    // Two delays of 120 ms looping at 0.4 * 0.96 until an echo is 60 dB down.
    const auto tail = 2 * 0.12 * (1 + std::log (0.001) / std::log (0.384)) * 48000;
    EXPECT_NEAR ((double) dispatch (opGetTailSize), tail, 1.0);
    for (auto [opcode, answer] : { std::pair (opGetPlugCategory, 1), { opGetVstVersion, 2400 }, { opGetNumMidiInputs, 16 }, { opGetNumMidiOutputs, 0 } })
        EXPECT_EQ (dispatch (opcode), answer) << opcode;
    for (auto [query, answer] : { std::pair ("receiveVstEvents", 1), { "receiveVstMidiEvent", 1 }, { "receiveVstTimeInfo", 1 }, { "bypass", 1 },
                                  { "sendVstEvents", -1 }, { "sendVstMidiEvent", -1 }, { "openCloseAnyThread", -1 }, { "offline", 0 }, { "", 0 } })
        EXPECT_EQ (dispatch (opCanDo, 0, 0, const_cast<char*> (query)), answer) << query;
    // Pins: one active stereo pair of speaker pins each way; any arrangement of one or two channels taken alike.
    for (auto [opcode, bus] : { std::pair (opGetInputProperties, "Input L"), { opGetOutputProperties, "Output L" } })
    {
        EXPECT_EQ (pin (opcode, 0).flags, pinIsActive | pinUseSpeaker | pinIsStereo);
        EXPECT_EQ (pin (opcode, 1).flags, pinIsActive | pinUseSpeaker);
        EXPECT_EQ (pin (opcode, 2).flags, -1);
        EXPECT_EQ (std::string (pin (opcode, 0).label), bus);   // JUCE's labels: bus and channel
    }
    // Mono 0, stereo 1, stereo surround 2 (two channels, not called stereo), user defined -2.
    for (auto [inType, inChannels, outType, outChannels, accepted] : { std::tuple (0, 1, 0, 1, 1), { 1, 2, 1, 2, 1 }, { 1, 2, 0, 1, 0 },
                                                                       { 2, 2, 2, 2, 1 }, { -2, 3, -2, 3, 0 }, { -2, 1, -2, 1, 1 } })
    {
        SpeakerArrangement in { inType, inChannels, {} }, out { outType, outChannels, {} };
        EXPECT_EQ (dispatch (opSetSpeakerArrangement, 0, (VstIntPtr) &in, &out), accepted) << inType << " " << inChannels << " " << outChannels;
    }
}

TEST_F (RawVst2, ParametersShowTheirTextsTextWithoutANumberChangesNothingAndBypassPassesTheInput)
{
    EXPECT_EQ (text (opGetParamName, 0) + " " + text (opGetParamDisplay, 0) + "|" + text (opGetParamLabel, 0), "Delay1Time 120.00 Ms|");
    EXPECT_EQ (text (opGetParamName, 32) + " " + text (opGetParamDisplay, 32), "LFO2SyncedRate 1/4");
    effect->setParameter (effect, 14, 1.0f);
    EXPECT_EQ (text (opGetParamDisplay, 14), "Reverse Stereo Parallel");
    effect->setParameter (effect, 1, 0.5f);   // Delay1Feedback, 50 %
    for (auto* typed : { "garbage", "", "%", "-" })
    {
        dispatch (opString2Parameter, 1, 0, const_cast<char*> (typed));
        EXPECT_EQ (effect->getParameter (effect, 1), 0.5f) << '"' << typed << '"';
    }
    dispatch (opString2Parameter, 1, 0, const_cast<char*> (" 25 %"));
    EXPECT_EQ (effect->getParameter (effect, 1), 0.25f);
    // Fully wet with a 120 ms delay: silent at first; soft bypass passes the input until undone.
    EXPECT_EQ (lastOfRamp(), 0.0f);
    EXPECT_EQ (dispatch (opSetBypass, 0, 1), 1);
    EXPECT_EQ (lastOfRamp(), 0.64f);
    EXPECT_EQ (dispatch (opSetBypass, 0, 0), 1);
    EXPECT_EQ (lastOfRamp(), 0.0f);
}
