// Loads the shipped VST2 binary with nothing but dlopen and the VST 2.4 calling
// convention, the way any host scans a plug-in, independently of JUCE's hosting.

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <cstring>
#include <string>

namespace
{
using PluginMain = AEffect* (*) (AEffectDispatcherProc);

VstIntPtr hostCallback (AEffect*, VstInt32 opcode, VstInt32, VstIntPtr, void*, float)
{
    return opcode == audioMasterVersion ? 2400 : 0;
}

class RawVst2Host : public ::testing::Test
{
protected:
    void SetUp() override
    {
        library = dlopen (VELTRANE_VST2_BINARY, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE (library, nullptr) << dlerror();
        auto main = reinterpret_cast<PluginMain> (dlsym (library, "VSTPluginMain"));
        ASSERT_NE (main, nullptr);
        effect = main (reinterpret_cast<AEffectDispatcherProc> (hostCallback));
        ASSERT_NE (effect, nullptr);
        dispatch (effOpen);
    }

    void TearDown() override
    {
        if (effect != nullptr)
            dispatch (effClose);
        if (library != nullptr)
            dlclose (library);
    }

    VstIntPtr dispatch (VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0, void* ptr = nullptr)
    {
        return effect->dispatcher (effect, opcode, index, value, ptr, 0.0f);
    }

    std::string text (VstInt32 opcode, VstInt32 index = 0)
    {
        char buffer[256] = {};
        dispatch (opcode, index, 0, buffer);
        return buffer;
    }

    VstIntPtr canDo (const char* what) { return dispatch (effCanDo, 0, 0, const_cast<char*> (what)); }

    VstIntPtr setArrangement (int inputs, int outputs)
    {
        VstSpeakerArrangement in {}, out {};
        in.type = inputs == 1 ? kSpeakerArrMono : kSpeakerArrStereo;
        in.numChannels = inputs;
        out.type = outputs == 1 ? kSpeakerArrMono : kSpeakerArrStereo;
        out.numChannels = outputs;
        return dispatch (effSetSpeakerArrangement, 0, reinterpret_cast<VstIntPtr> (&in), &out);
    }

    void* library = nullptr;
    AEffect* effect = nullptr;
};
}

TEST_F (RawVst2Host, EffectRecordHoldsTheIdentity)
{
    EXPECT_EQ (effect->magic, 0x56737450);
    EXPECT_EQ (effect->uniqueID, CCONST ('T', 'a', 'V', 'e'));
    EXPECT_EQ (effect->version, 121);
    EXPECT_EQ (effect->numParams, 33);
    EXPECT_EQ (effect->numInputs, 2);
    EXPECT_EQ (effect->numOutputs, 2);
    EXPECT_EQ (effect->initialDelay, 0);

    EXPECT_TRUE (effect->flags & effFlagsHasEditor);
    EXPECT_TRUE (effect->flags & effFlagsCanReplacing);
    EXPECT_TRUE (effect->flags & effFlagsProgramChunks);
    EXPECT_FALSE (effect->flags & effFlagsIsSynth);
    EXPECT_FALSE (effect->flags & effFlagsNoSoundInStop);

    EXPECT_EQ (text (effGetEffectName), "Veltrane");
    EXPECT_EQ (text (effGetProductString), "Veltrane");
    EXPECT_EQ (text (effGetVendorString), "Tarnwell_Audio");
    EXPECT_EQ (dispatch (effGetPlugCategory), kPlugCategEffect);
    EXPECT_EQ (dispatch (effGetVstVersion), 2400);
    // JUCE's wrapper answers the vendor version with its hex version code
    // 0x010201; the effect record above carries 121.
    EXPECT_EQ (dispatch (effGetVendorVersion), 0x010201);
}

TEST_F (RawVst2Host, ParametersHaveTheirNamesAndTexts)
{
    EXPECT_EQ (text (effGetParamName, 0), "Delay1Time");
    EXPECT_EQ (text (effGetParamDisplay, 0), "120.00 Ms");
    EXPECT_EQ (text (effGetParamLabel, 0), "");
    EXPECT_EQ (text (effGetParamName, 32), "LFO2SyncedRate");
    EXPECT_EQ (text (effGetParamDisplay, 32), "1/4");

    effect->setParameter (effect, 14, 1.0f);
    EXPECT_EQ (effect->getParameter (effect, 14), 1.0f);
    EXPECT_EQ (text (effGetParamDisplay, 14), "Reverse Stereo Parallel");
}

TEST_F (RawVst2Host, AnswersCapabilityQueries)
{
    for (auto yes : { "receiveVstEvents", "receiveVstMidiEvent", "receiveVstMidiEvents", "receiveVstTimeInfo",
                      "conformsToWindowRules", "bypass" })
        EXPECT_EQ (canDo (yes), 1) << yes;

    for (auto no : { "sendVstEvents", "sendVstMidiEvent", "sendVstMidiEvents", "openCloseAnyThread" })
        EXPECT_EQ (canDo (no), -1) << no;

    for (auto unknown : { "offline", "midiProgramNames", "noRealTime", "" })
        EXPECT_EQ (canDo (unknown), 0) << unknown;
}

TEST_F (RawVst2Host, AcceptsMonoAndStereoPairsOnly)
{
    EXPECT_EQ (setArrangement (1, 1), 1);
    EXPECT_EQ (setArrangement (2, 2), 1);
    EXPECT_EQ (setArrangement (2, 1), 0);
}

TEST_F (RawVst2Host, OffersNoNamedPrograms)
{
    // JUCE's wrapper always reports one program; it has no name.
    EXPECT_LE (effect->numPrograms, 1);
    EXPECT_EQ (text (effGetProgramName), "");
}
