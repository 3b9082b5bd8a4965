// What the shipped VST2 binary answers a host about pins, layouts, bypass, tail and
// typed parameter values. The VST 2.4 numbers are written out here, not taken from
// the header folder the plug-in is built with, since that folder is under test too.

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <cmath>
#include <string>
#include <vector>

namespace
{
enum : VstInt32
{
    opOpen = 0, opClose = 1, opSetSampleRate = 10, opSetBlockSize = 11, opMainsChanged = 12,
    opString2Parameter = 27, opGetInputProperties = 33, opGetOutputProperties = 34,
    opSetSpeakerArrangement = 42, opSetBypass = 44, opGetTailSize = 52,
    opGetNumMidiInputChannels = 78, opGetNumMidiOutputChannels = 79
};
enum { pinIsActive = 1, pinIsStereo = 2, pinUseSpeaker = 4 };
enum { arrangementUserDefined = -2, arrangementStereoSurround = 2 };

struct PinProperties { char label[64]; VstInt32 flags, arrangementType; char shortLabel[8]; char future[48]; };
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
        ASSERT_NE (main, nullptr);
        effect = main (reinterpret_cast<AEffectDispatcherProc> (hostCallback));
        ASSERT_NE (effect, nullptr);
        dispatch (opOpen);
        effect->dispatcher (effect, opSetSampleRate, 0, 0, nullptr, 48000.0f);
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

    VstIntPtr dispatch (VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0, void* ptr = nullptr)
    {
        return effect->dispatcher (effect, opcode, index, value, ptr, 0.0f);
    }

    VstIntPtr arrange (VstInt32 type, VstInt32 numChannels)
    {
        SpeakerArrangement in {}, out {};
        in.type = out.type = type;
        in.numChannels = out.numChannels = numChannels;
        return dispatch (opSetSpeakerArrangement, 0, reinterpret_cast<VstIntPtr> (&in), &out);
    }

    // One block of a ramp through processReplacing; returns the left output.
    std::vector<float> processRamp()
    {
        std::vector<float> inL (64), inR (64), outL (64), outR (64);
        for (size_t i = 0; i < inL.size(); ++i)
            inL[i] = inR[i] = 0.01f * (float) (i + 1);
        float* ins[] = { inL.data(), inR.data() };
        float* outs[] = { outL.data(), outR.data() };
        effect->processReplacing (effect, ins, outs, 64);
        return outL;
    }

    void* library = nullptr;
    AEffect* effect = nullptr;
};
}

TEST_F (Vst2HostAnswers, PinsAreActiveSpeakerPinsOfOneStereoPair)
{
    for (auto opcode : { opGetInputProperties, opGetOutputProperties })
    {
        const std::string bus = opcode == opGetInputProperties ? "Input " : "Output ";

        for (int pin = 0; pin < 2; ++pin)
        {
            PinProperties properties {};
            ASSERT_EQ (dispatch (opcode, pin, 0, &properties), 1);
            EXPECT_EQ (properties.flags, pinIsActive | pinUseSpeaker | (pin == 0 ? pinIsStereo : 0)) << bus << pin;
            EXPECT_EQ (std::string (properties.label), bus + (pin == 0 ? "L" : "R"));
        }

        PinProperties none {};
        EXPECT_EQ (dispatch (opcode, 2, 0, &none), 0);
    }
}

TEST_F (Vst2HostAnswers, AcceptsEveryArrangementOfOneOrTwoChannelsAlike)
{
    EXPECT_EQ (arrange (arrangementStereoSurround, 2), 1);
    PinProperties properties {};
    dispatch (opGetInputProperties, 1, 0, &properties);
    EXPECT_EQ (std::string (properties.label), "Input 2");   // JUCE names discrete channels by number

    EXPECT_EQ (arrange (arrangementUserDefined, 3), 0);
    EXPECT_EQ (arrange (arrangementUserDefined, 1), 1);
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

TEST_F (Vst2HostAnswers, SoftBypassPassesTheInputAndIsUndone)
{
    const auto ramp = processRamp();   // fully wet, 120 ms delay: silence at first
    EXPECT_EQ (ramp[63], 0.0f);

    EXPECT_EQ (dispatch (opSetBypass, 0, 1), 1);
    const auto bypassed = processRamp();
    for (size_t i = 0; i < bypassed.size(); ++i)
        ASSERT_EQ (bypassed[i], 0.01f * (float) (i + 1)) << i;

    EXPECT_EQ (dispatch (opSetBypass, 0, 0), 1);
    EXPECT_EQ (processRamp()[63], 0.0f);
}

TEST_F (Vst2HostAnswers, ReportsTheEchoTailAndMidiInput)
{
    // Two delays of 120 ms looping at 0.4 * 0.96 until an echo is 60 dB down.
    const auto seconds = 2 * 0.12 * (1 + std::log (0.001) / std::log (0.384));
    EXPECT_NEAR ((double) dispatch (opGetTailSize), seconds * 48000, 1.0);

    EXPECT_EQ (dispatch (opGetNumMidiInputChannels), 16);
    EXPECT_EQ (dispatch (opGetNumMidiOutputChannels), 0);
}
