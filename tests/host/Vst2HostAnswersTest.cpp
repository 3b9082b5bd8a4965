// What the shipped VST2 binary answers a host about pins, layouts, bypass, tail and
// typed values. The VST 2.4 numbers are written out here rather than taken from the
// header folder the plug-in is built with, which is under test too.

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <cmath>
#include <string>
#include <vector>

namespace
{
enum : VstInt32 { opOpen = 0, opClose = 1, opSetSampleRate = 10, opSetBlockSize = 11, opMainsChanged = 12, opString2Parameter = 27,
                  opGetInputProperties = 33, opGetOutputProperties = 34, opSetSpeakerArrangement = 42,
                  opSetBypass = 44, opGetTailSize = 52, opGetNumMidiInputs = 78, opGetNumMidiOutputs = 79 };
enum { pinIsActive = 1, pinIsStereo = 2, pinUseSpeaker = 4 };

struct PinProperties { char label[64]; VstInt32 flags, arrangementType; char shortLabel[8], future[48]; };
struct SpeakerArrangement { VstInt32 type, numChannels; char speakers[8][112]; };

VstIntPtr hostCallback (AEffect*, VstInt32 opcode, VstInt32, VstIntPtr, void*, float)
{
    return opcode == 1 ? 2400 : 0;   // audioMasterVersion
}

class Vst2HostAnswers : public ::testing::Test
{
protected:
    void SetUp() override
    {
        library = dlopen (VELTRANE_VST2_BINARY, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE (library, nullptr) << dlerror();
        auto main = reinterpret_cast<AEffect* (*) (AEffectDispatcherProc)> (dlsym (library, "VSTPluginMain"));
        effect = main (reinterpret_cast<AEffectDispatcherProc> (hostCallback));
        ASSERT_NE (effect, nullptr);
        dispatch (opOpen);
        dispatch (opSetSampleRate, 0, 0, nullptr, 48000.0f);
        dispatch (opSetBlockSize, 0, 64);
        dispatch (opMainsChanged, 0, 1);
    }

    void TearDown() override
    {
        dispatch (opClose);
        dlclose (library);
    }

    VstIntPtr dispatch (VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0, void* ptr = nullptr, float opt = 0)
    {
        return effect->dispatcher (effect, opcode, index, value, ptr, opt);
    }

    VstIntPtr arrange (VstInt32 type, VstInt32 numChannels)
    {
        SpeakerArrangement in { type, numChannels, {} }, out = in;
        return dispatch (opSetSpeakerArrangement, 0, reinterpret_cast<VstIntPtr> (&in), &out);
    }

    PinProperties pin (VstInt32 opcode, int index)
    {
        PinProperties properties {};
        properties.flags = dispatch (opcode, index, 0, &properties) == 1 ? properties.flags : -1;
        return properties;
    }

    // One block of the ramp 0.01, 0.02 ... 0.64 in both channels; the left output.
    std::vector<float> processRamp()
    {
        std::vector<float> ramp (64), left (64), right (64);
        for (size_t i = 0; i < 64; ++i)
            ramp[i] = 0.01f * (float) (i + 1);
        float* ins[] = { ramp.data(), ramp.data() };
        float* outs[] = { left.data(), right.data() };
        effect->processReplacing (effect, ins, outs, 64);
        return left;
    }

    void* library = nullptr;
    AEffect* effect = nullptr;
};
}

TEST_F (Vst2HostAnswers, PinsAreActiveSpeakerPinsOfOneStereoPair)
{
    for (auto [opcode, bus] : { std::pair (opGetInputProperties, "Input L"), std::pair (opGetOutputProperties, "Output L") })
    {
        EXPECT_EQ (pin (opcode, 0).flags, pinIsActive | pinUseSpeaker | pinIsStereo);
        EXPECT_EQ (pin (opcode, 1).flags, pinIsActive | pinUseSpeaker);
        EXPECT_EQ (pin (opcode, 2).flags, -1);
        EXPECT_EQ (std::string (pin (opcode, 0).label), bus);   // JUCE's labels: bus and channel
    }
}

TEST_F (Vst2HostAnswers, AcceptsEveryArrangementOfOneOrTwoChannelsAlike)
{
    EXPECT_EQ (arrange (2, 2), 1);   // kSpeakerArrStereoSurround: two channels, not called stereo
    EXPECT_EQ (std::string (pin (opGetInputProperties, 1).label), "Input 2");   // JUCE numbers discrete channels
    EXPECT_EQ (arrange (-2, 3), 0);   // kSpeakerArrUserDefined
    EXPECT_EQ (arrange (-2, 1), 1);
}

TEST_F (Vst2HostAnswers, TextWithoutANumberLeavesTheValueAlone)
{
    effect->setParameter (effect, 1, 0.5f);   // Delay1Feedback, 50 %
    for (auto* text : { "garbage", "", "%", "-" })
    {
        dispatch (opString2Parameter, 1, 0, const_cast<char*> (text));
        EXPECT_EQ (effect->getParameter (effect, 1), 0.5f) << '"' << text << '"';
    }

    dispatch (opString2Parameter, 1, 0, const_cast<char*> (" 25 %"));
    EXPECT_EQ (effect->getParameter (effect, 1), 0.25f);
}

TEST_F (Vst2HostAnswers, SoftBypassPassesTheInputUntilUndone)
{
    EXPECT_EQ (processRamp()[63], 0.0f);   // fully wet with a 120 ms delay: silent at first
    EXPECT_EQ (dispatch (opSetBypass, 0, 1), 1);
    EXPECT_EQ (processRamp()[63], 0.64f);

    EXPECT_EQ (dispatch (opSetBypass, 0, 0), 1);
    EXPECT_EQ (processRamp()[63], 0.0f);
}

TEST_F (Vst2HostAnswers, ReportsTheEchoTailAndMidiInput)
{
    // Two delays of 120 ms looping at 0.4 * 0.96 until an echo is 60 dB down.
    const auto seconds = 2 * 0.12 * (1 + std::log (0.001) / std::log (0.384));
    EXPECT_NEAR ((double) dispatch (opGetTailSize), seconds * 48000, 1.0);
    EXPECT_EQ (dispatch (opGetNumMidiInputs), 16);
    EXPECT_EQ (dispatch (opGetNumMidiOutputs), 0);
}
