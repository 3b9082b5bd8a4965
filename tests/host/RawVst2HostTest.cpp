// The shipped VST2 binary loaded with nothing but dlopen and the VST 2.4 calling convention, as
// any host scans a plug-in, independently of JUCE's hosting.

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <string>

namespace
{
class RawVst2 : public ::testing::Test
{
protected:
    void SetUp() override
    {
        library = dlopen (VELTRANE_VST2_BINARY, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE (library, nullptr) << dlerror();
        const auto main = reinterpret_cast<AEffect* (*) (AEffectDispatcherProc)> (dlsym (library, "VSTPluginMain"));
        ASSERT_NE (main, nullptr);
        effect = main ([] (AEffect*, int opcode, int, VstIntPtr, void*, float) -> VstIntPtr { return opcode == audioMasterVersion ? 2400 : 0; });
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
    VstIntPtr dispatch (VstInt32 opcode, VstInt32 index = 0, VstIntPtr value = 0, void* ptr = nullptr) { return effect->dispatcher (effect, opcode, index, value, ptr, 0.0f); }
    std::string text (VstInt32 opcode, VstInt32 index = 0)
    {
        char buffer[256] = {};
        dispatch (opcode, index, 0, buffer);
        return buffer;
    }
    void* library = nullptr;
    AEffect* effect = nullptr;
};
}

TEST_F (RawVst2, EffectRecordAndQueriesGiveTheDocumentedIdentity)
{
    EXPECT_EQ (effect->magic, CCONST ('V', 's', 't', 'P'));
    EXPECT_EQ (effect->uniqueID, CCONST ('T', 'a', 'V', 'e'));
    EXPECT_EQ (effect->version, 121);
    EXPECT_EQ (effect->numParams, 33);
    EXPECT_EQ (effect->numInputs * 10 + effect->numOutputs, 22);
    EXPECT_EQ (effect->initialDelay, 0);
    EXPECT_EQ (effect->flags & (effFlagsHasEditor | effFlagsCanReplacing | effFlagsProgramChunks | effFlagsIsSynth | effFlagsNoSoundInStop),
               effFlagsHasEditor | effFlagsCanReplacing | effFlagsProgramChunks);
    EXPECT_LE (effect->numPrograms, 1);   // JUCE's wrapper reports one program at most, without a name
    EXPECT_EQ (text (effGetProgramName), "");
    EXPECT_EQ (text (effGetEffectName) + "|" + text (effGetProductString) + "|" + text (effGetVendorString), "Veltrane|Veltrane|Tarnwell_Audio");
    EXPECT_EQ (dispatch (effGetPlugCategory), kPlugCategEffect);
    EXPECT_EQ (dispatch (effGetVstVersion), 2400);
    for (auto [query, answer] : { std::pair ("receiveVstEvents", 1), { "receiveVstMidiEvent", 1 }, { "receiveVstMidiEvents", 1 },
                                  { "receiveVstTimeInfo", 1 }, { "conformsToWindowRules", 1 }, { "bypass", 1 }, { "sendVstEvents", -1 },
                                  { "sendVstMidiEvent", -1 }, { "sendVstMidiEvents", -1 }, { "openCloseAnyThread", -1 }, { "offline", 0 }, { "", 0 } })
        EXPECT_EQ (dispatch (effCanDo, 0, 0, const_cast<char*> (query)), answer) << query;
    for (auto [inputs, outputs, accepted] : { std::tuple (1, 1, 1), { 2, 2, 1 }, { 2, 1, 0 } })
    {
        VstSpeakerArrangement in {}, out {};
        in.type = inputs == 1 ? kSpeakerArrMono : kSpeakerArrStereo;
        out.type = outputs == 1 ? kSpeakerArrMono : kSpeakerArrStereo;
        in.numChannels = inputs;
        out.numChannels = outputs;
        EXPECT_EQ (dispatch (effSetSpeakerArrangement, 0, (VstIntPtr) &in, &out), accepted) << inputs << " in, " << outputs << " out";
    }
}

TEST_F (RawVst2, ParametersShowTheirNamesAndTexts)
{
    EXPECT_EQ (text (effGetParamName, 0) + " " + text (effGetParamDisplay, 0) + "|" + text (effGetParamLabel, 0), "Delay1Time 120.00 Ms|");
    EXPECT_EQ (text (effGetParamName, 32) + " " + text (effGetParamDisplay, 32), "LFO2SyncedRate 1/4");
    effect->setParameter (effect, 14, 1.0f);
    EXPECT_EQ (effect->getParameter (effect, 14), 1.0f);
    EXPECT_EQ (text (effGetParamDisplay, 14), "Reverse Stereo Parallel");
}
