// The shipped VST2 binary against the plain reference model, through dlopen and the VST 2.4 calls a
// host makes. It seeds its "Sample & Hold" tables randomly, so those scenarios are left to the engine's test.

#include "../dsp/ReferenceScenarios.h"

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <dlfcn.h>

using namespace reference;

namespace
{
VstTimeInfo timeInfo {};
bool answersTime = false; // a host without a play head position

VstIntPtr hostCallback (AEffect*, VstInt32 opcode, VstInt32, VstIntPtr, void*, float)
{
    return opcode == audioMasterGetTime ? (answersTime ? reinterpret_cast<VstIntPtr> (&timeInfo) : 0) : opcode == audioMasterVersion ? 2400 : 0;
}

Audio vst2Run (const Scenario& s)
{
    void* library = dlopen (VELTRANE_VST2_BINARY, RTLD_NOW | RTLD_LOCAL);
    auto main = reinterpret_cast<AEffect* (*) (AEffectDispatcherProc)> (dlsym (library, "VSTPluginMain"));
    AEffect* effect = main (reinterpret_cast<AEffectDispatcherProc> (hostCallback));
    auto dispatch = [effect] (VstInt32 opcode, VstIntPtr value, void* ptr = nullptr, float opt = 0.0f) { return effect->dispatcher (effect, opcode, 0, value, ptr, opt); };

    VstSpeakerArrangement in {}, out {};
    in.type = out.type = s.channels == 1 ? kSpeakerArrMono : kSpeakerArrStereo, in.numChannels = out.numChannels = s.channels;
    dispatch (effOpen, 0), dispatch (effSetSpeakerArrangement, reinterpret_cast<VstIntPtr> (&in), &out);
    dispatch (effSetSampleRate, 0, nullptr, (float) s.sampleRate), dispatch (effSetBlockSize, s.blockSize), dispatch (effMainsChanged, 1);
    timeInfo = {};
    timeInfo.sampleRate = s.sampleRate, timeInfo.tempo = s.tempo.bpm, timeInfo.flags = s.tempo.hasTempo ? kVstTempoValid : 0;
    answersTime = s.tempo.hasPosition;
    auto audio = run (s, [&] (const float* values, float* const* io, int n, const std::vector<Midi>& events, bool resumed) {
        if (resumed)
            dispatch (effMainsChanged, 0), dispatch (effMainsChanged, 1);
        for (int i = 0; i < 33; ++i)
            effect->setParameter (effect, i, values[i]);
        VstMidiEvent midi[16] {};
        struct { VstInt32 numEvents; VstIntPtr reserved; VstEvent* events[16]; } list {};
        for (const auto& e : events)
        {
            auto& m = midi[list.numEvents];
            m.type = kVstMidiType, m.byteSize = sizeof m, m.deltaFrames = e.position;
            m.midiData[0] = (char) e.status, m.midiData[1] = (char) e.data1, m.midiData[2] = (char) e.data2;
            list.events[list.numEvents++] = reinterpret_cast<VstEvent*> (&m);
        }
        dispatch (effProcessEvents, 0, &list);
        effect->processReplacing (effect, const_cast<float**> (io), const_cast<float**> (io), n);
    });
    dispatch (effMainsChanged, 0), dispatch (effClose, 0), dlclose (library);
    return audio;
}

std::vector<Scenario> withoutSampleAndHold()
{
    auto kept = scenarios();
    kept.erase (std::remove_if (kept.begin(), kept.end(), [] (const Scenario& s) { return s.knobs().lfo[0].wave == 5 || s.knobs().lfo[1].wave == 5; }), kept.end());
    return kept;
}

class Vst2MatchesReference : public ::testing::TestWithParam<Scenario> {};
}

TEST_P (Vst2MatchesReference, SampleBySample)
{
    EXPECT_TRUE (matches (GetParam(), referenceRun (GetParam(), 1), vst2Run (GetParam())));
}

INSTANTIATE_TEST_SUITE_P (EveryScenario, Vst2MatchesReference, ::testing::ValuesIn (withoutSampleAndHold()), nameOf);
