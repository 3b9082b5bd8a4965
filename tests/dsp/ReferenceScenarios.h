// Ways the product is used, run block by block through the reference model and through what is
// checked against it (the engine, the shipped VST2 binary).
#pragma once

#include "ReferenceModel.h"

#include <gtest/gtest.h>
#include <cstring>

namespace reference
{
enum Parameter { Time1, Feedback1, TimeMod1, TimeSource1, FeedbackMod1, FeedbackSource1, Gain1, Time2, Feedback2, TimeMod2, TimeSource2,
                 FeedbackMod2, FeedbackSource2, Gain2, Mix, DryWet, Shaper, Amount, Randomize, Sensitivity1, Attack1, Release1,
                 Sensitivity2, Attack2, Release2, Wave1, Rate1, Sync1, Division1, Wave2, Rate2, Sync2, Division2 };

// Normalised values of choice entries: sources and mix modes, waveshapers, waves, sync divisions.
constexpr float source (int k) { return (float) k / 6.0f; }
constexpr float mix (int k) { return (float) k / 6.0f; }
constexpr float shaper (int k) { return (float) k / 3.0f; }
constexpr float wave (int k) { return (float) k / 5.0f; }
constexpr float division (int k) { return (float) k / 17.0f; }
enum Source { none, envelope1, reverseEnvelope1, envelope2, reverseEnvelope2, lfo1, lfo2 };

// Delay 1 at 605.7 ms, Delay 2 at 320.8 ms, LFO 1 a 4.9 Hz sine, LFO 2 a 2.5 Hz square.
constexpr float baseline[33] { 0.55f, 0.5f, 0, 0, 0, 0, 0.9f, 0.4f, 0.6f, 0, 0, 0, 0, 0.8f, 0, 0.7f, 0, 0.37f, 0,
                               0.53f, 0.3f, 0.45f, 0.7f, 0.2f, 0.6f, 0, 0.35f, 0, division (6), wave (1), 0.25f, 0, 0.5f };

struct Change { int position, index; float value; }; // at the first block starting at or after position
struct Tempo { bool hasPosition, hasTempo; double bpm; };
using Audio = std::vector<std::vector<float>>;

struct Scenario
{
    const char* name;
    int channels, blockSize;
    double sampleRate;
    std::vector<std::pair<int, float>> settings; // over the baseline
    std::vector<Midi> notes;                      // in time order
    std::vector<Change> changes {};
    int samples = 88200;
    Tempo tempo { true, true, 120.0 };
    int resumeAt = -1; // the host stops and restarts processing (prepareToPlay again) at this block start

    std::vector<float> values() const
    {
        std::vector<float> v (baseline, baseline + 33);
        for (auto [index, value] : settings)
            v[(size_t) index] = value;
        return v;
    }
    Knobs knobs() const { return knobsFrom (values().data()); }
    // What the play head gives: 120 bpm without a position, 0 for a position without a tempo.
    float hostTempo() const { return ! tempo.hasPosition ? 120.0f : tempo.hasTempo ? (float) tempo.bpm : 0.0f; }
};

// Noise bursts of 30 ms every 400 ms over a bed of random signs at steady levels (which the
// envelopes meet exactly), different on each channel; a NaN and an inf count as silence.
inline Audio inputFor (const Scenario& s)
{
    Audio audio ((size_t) s.channels, std::vector<float> ((size_t) s.samples));
    for (uint32_t c = 0, noise = 12345u; c < (uint32_t) s.channels; ++c)
        for (uint32_t j = 0; j < (uint32_t) s.samples; ++j)
        {
            noise = noise * 1664525u + 1013904223u;
            const float u = (float) (noise >> 8) / 8388608.0f - 1.0f, level = 0.02f + 0.001f * (float) (j / 100 % 50);
            audio[c][j] = j % 17640 < 1323 ? 0.9f * u : u < 0.0f ? -level : level;
        }
    audio[0][1000] = std::numeric_limits<float>::quiet_NaN();
    audio[(size_t) s.channels - 1][2000] = std::numeric_limits<float>::infinity();
    return audio;
}

// Calls block (values, channels, n, events, resumed) for every block of the scenario's input, in place.
template <typename Block>
Audio run (const Scenario& s, Block&& block)
{
    auto audio = inputFor (s);
    auto values = s.values();
    for (int start = 0; start < s.samples; start += s.blockSize)
    {
        const int n = std::min (s.blockSize, s.samples - start);
        for (auto c : s.changes)
            if (c.position <= start && c.position > start - s.blockSize)
                values[(size_t) c.index] = c.value;
        std::vector<Midi> events;
        for (auto e : s.notes)
            if (e.position >= start && e.position < start + n)
                events.push_back ({ e.position - start, e.status, e.data1, e.data2 });
        events.push_back ({ n, 0x90, 60, 100 }); // beyond the block: ignored
        float* io[2] { audio[0].data() + start, audio[(size_t) s.channels - 1].data() + start };
        block (values.data(), io, n, events, start == s.resumeAt);
    }
    return audio;
}

inline Audio referenceRun (const Scenario& s, uint64_t seed, unsigned silenced = 0)
{
    Model model (seed);
    model.silenced = silenced;
    model.prepare (s.sampleRate);
    return run (s, [&] (const float* values, float* const* io, int n, const std::vector<Midi>& events, bool resumed) {
        if (resumed)
            model.prepare (s.sampleRate);
        model.block (values, io, s.channels, n, s.hostTempo(), events);
    });
}

// Bit for bit, but "Dirt" (sinf, tanhf here; polynomials in the engine: 4 ulps apart at worst over 6e7 inputs).
inline ::testing::AssertionResult matches (const Scenario& s, const Audio& expected, const Audio& actual)
{
    const int ulps = s.knobs().shaper == 3 ? 6 : 0;
    auto key = [] (float f) { int32_t i; std::memcpy (&i, &f, sizeof i); return i < 0 ? (int64_t) INT32_MIN - i : (int64_t) i; };
    for (size_t c = 0; c < expected.size(); ++c)
        for (size_t j = 0; j < expected[c].size(); ++j)
            if (std::abs (key (expected[c][j]) - key (actual[c][j])) > ulps)
                return ::testing::AssertionFailure() << "channel " << c << " sample " << j << ": " << expected[c][j] << " expected, " << actual[c][j] << " got";
    return ::testing::AssertionSuccess();
}

constexpr Midi note (int position, int status, int velocity = 100) { return { position, status, 64, velocity }; }

inline const std::vector<Scenario>& scenarios()
{
    // Every mix mode in stereo and mono; every modulation source on time and on feedback; every
    // wave; every shaper (the driven ones at 0.37 and 1); block sizes 1, 64, 512 and 8192.
    static const std::vector<Scenario> table {
        { "ParallelStereo", 2, 512, 44100, { { TimeSource1, source (envelope1) }, { TimeMod1, 0.6f }, { FeedbackSource2, source (reverseEnvelope1) }, { FeedbackMod2, 0.8f }, { Shaper, shaper (1) } }, {} },
        { "ParallelMono", 1, 64, 44100, { { Feedback1, 0.3f }, { FeedbackSource1, source (envelope2) }, { FeedbackMod1, 0.7f }, { TimeSource2, source (reverseEnvelope2) }, { TimeMod2, 0.5f }, { Shaper, shaper (2) } }, {} },
        { "ChainStereo", 2, 1, 44100, { { Mix, mix (1) }, { TimeSource1, source (lfo1) }, { TimeMod1, 0.5f }, { FeedbackSource2, source (lfo2) }, { FeedbackMod2, 0.9f }, { Shaper, shaper (2) }, { Amount, 1 } }, {} },
        { "ChainMono", 1, 8192, 44100, { { Mix, mix (1) }, { FeedbackSource1, source (lfo1) }, { FeedbackMod1, 0.6f }, { Wave1, wave (2) }, { TimeSource2, source (lfo2) }, { TimeMod2, 0.4f }, { Wave2, wave (3) }, { Shaper, shaper (3) } }, {} },
        { "ReverseChainStereo", 2, 64, 44100, { { Mix, mix (2) }, { TimeSource2, source (lfo1) }, { TimeMod2, 0.7f }, { Wave1, wave (4) }, { FeedbackSource1, source (envelope1) }, { FeedbackMod1, 0.5f }, { Shaper, shaper (3) }, { Amount, 1 } }, {} },
        { "ReverseChainMono", 1, 512, 44100, { { Mix, mix (2) }, { TimeSource1, source (reverseEnvelope1) }, { TimeMod1, 0.8f }, { Attack1, 0 }, { Release1, 0.1f }, { FeedbackSource2, source (envelope2) }, { FeedbackMod2, 0.6f } }, {} },
        { "Solo1Stereo", 2, 512, 44100, { { Mix, mix (3) }, { TimeSource1, source (lfo2) }, { TimeMod1, 0.3f }, { FeedbackSource1, source (reverseEnvelope2) }, { FeedbackMod1, 0.9f }, { Shaper, shaper (1) } }, {} },
        { "Solo1Mono", 1, 1, 44100, { { Mix, mix (3) }, { FeedbackSource1, source (lfo1) }, { FeedbackMod1, 1 }, { Wave1, wave (1) }, { Shaper, shaper (2) } }, {} },
        { "Solo2Stereo", 2, 8192, 44100, { { Mix, mix (4) }, { TimeSource2, source (envelope2) }, { TimeMod2, 0.5f }, { FeedbackSource2, source (lfo2) }, { FeedbackMod2, 0.5f } }, {} },
        { "Solo2Mono", 1, 64, 44100, { { Mix, mix (4) }, { TimeSource2, source (reverseEnvelope1) }, { TimeMod2, 0.9f }, { Shaper, shaper (3) } }, {} },
        { "StereoParallelStereo", 2, 512, 44100, { { Mix, mix (5) }, { TimeSource1, source (lfo1) }, { TimeMod1, 0.4f }, { TimeSource2, source (lfo2) }, { TimeMod2, 0.6f }, { Shaper, shaper (1) } }, {} },
        { "StereoParallelMono", 1, 64, 44100, { { Mix, mix (5) }, { FeedbackSource1, source (envelope1) }, { FeedbackMod1, 0.8f } }, {} },
        { "ReverseStereoParallelStereo", 2, 1, 44100, { { Mix, mix (6) }, { TimeSource1, source (envelope2) }, { TimeMod1, 0.5f }, { FeedbackSource2, source (reverseEnvelope2) }, { FeedbackMod2, 0.7f } }, {} },
        { "ReverseStereoParallelMono", 1, 8192, 44100, { { Mix, mix (6) }, { TimeSource2, source (lfo1) }, { TimeMod2, 0.5f }, { Shaper, shaper (2) } }, {} },
        // Each channel's LFOs walk their own random table; notes restart the walk.
        { "SampleAndHoldStereo", 2, 512, 44100, { { Wave1, wave (5) }, { Rate1, 0.5f }, { Wave2, wave (5) }, { Rate2, 0.3f }, { TimeSource1, source (lfo1) }, { TimeMod1, 0.6f }, { TimeSource2, source (lfo1) }, { TimeMod2, 0.4f }, { FeedbackSource2, source (lfo2) }, { FeedbackMod2, 0.9f } },
          { note (30000, 0x90), note (30100, 0x91), note (60000, 0x90) } },
        { "SampleAndHoldMono", 1, 64, 44100, { { Wave1, wave (5) }, { Rate1, 0.6f }, { Wave2, wave (5) }, { FeedbackSource1, source (lfo1) }, { FeedbackMod1, 0.9f }, { TimeSource2, source (lfo2) }, { TimeMod2, 0.5f } },
          { note (20000, 0x91), note (44100, 0x90) } },
        { "SyncedStereo", 2, 512, 44100, { { Sync1, 1 }, { Division1, division (7) }, { Sync2, 1 }, { Division2, division (10) }, { TimeSource1, source (lfo1) }, { TimeMod1, 0.5f }, { TimeSource2, source (lfo2) }, { TimeMod2, 0.5f } }, {}, {}, 88200, { true, true, 133.0 } },
        { "SyncedWithoutPosition", 2, 64, 44100, { { Sync1, 1 }, { Division1, division (5) }, { Sync2, 1 }, { Division2, division (17) }, { FeedbackSource1, source (lfo1) }, { FeedbackMod1, 0.8f }, { TimeSource2, source (lfo2) }, { TimeMod2, 0.5f } }, {}, {}, 88200, { false, false, 0.0 } },
        { "SyncedWithoutTempo", 2, 8192, 44100, { { Sync2, 1 }, { TimeSource1, source (lfo2) }, { TimeMod1, 0.5f } }, { note (50000, 0x91) }, {}, 88200, { true, false, 90.0 } },
        // Absurd tempos: above a cycle per sample the phase folds back, a negative rate stands still.
        { "AbsurdTempo", 2, 512, 44100, { { Sync1, 1 }, { Sync2, 1 }, { TimeSource1, source (lfo1) }, { TimeMod1, 0.5f }, { FeedbackSource2, source (lfo2) }, { FeedbackMod2, 0.5f } }, {}, {}, 88200, { true, true, 1.0e9 } },
        { "NegativeTempo", 1, 64, 44100, { { Sync1, 1 }, { Wave1, wave (1) }, { TimeSource1, source (lfo1) }, { TimeMod1, 0.5f } }, {}, {}, 88200, { true, true, -90.0 } },
        // Only note-ons with velocity on MIDI channels 1 and 2 restart; channel 0 meets them at their sample.
        { "NoteRestarts", 2, 64, 44100, { { TimeSource1, source (lfo1) }, { TimeMod1, 0.6f }, { Wave2, wave (4) }, { TimeSource2, source (lfo2) }, { TimeMod2, 0.6f } },
          { note (5000, 0x90), note (9001, 0x91), note (9001, 0x90), note (20000, 0x80), note (21000, 0x90, 0), note (22000, 0x92), note (30047, 0x91), note (40063, 0x90) } },
        { "Feedback100", 2, 512, 44100, { { Feedback1, 1 }, { Feedback2, 1 }, { Time1, 0.3f }, { Time2, 0.2f }, { DryWet, 0.5f } }, {}, {}, 132300 },
        // A stop and restart of processing silences the echoes and envelopes held; LFOs and glide carry on.
        { "Resumed", 2, 512, 44100, { { Feedback1, 0.9f }, { Feedback2, 0.9f }, { TimeSource1, source (envelope1) }, { TimeMod1, 0.5f } }, {}, {}, 132300, { true, true, 120.0 }, 66048 },
        // The glide from new times, sample by sample, until it settles in single precision.
        { "Glide", 2, 512, 44100, {}, {}, { { 22050, Time1, 0.9f }, { 22050, Time2, 0.1f }, { 57330, Time1, 0.3f } }, 132300 },
        { "GlideInLongBlocks", 2, 8192, 32000, { { TimeSource2, source (lfo1) }, { TimeMod2, 0.3f } }, {}, { { 20000, Time1, 0.8f }, { 40000, Time2, 0.05f } }, 120000 },
        { "At48kHz", 2, 64, 48000, { { TimeSource1, source (lfo2) }, { TimeMod1, 0.5f }, { FeedbackSource2, source (envelope1) }, { FeedbackMod2, 0.5f } }, { note (7000, 0x91) } },
        { "RateOutOfRangeIgnored", 1, 512, 1.0e6, { { TimeSource1, source (lfo1) }, { TimeMod1, 0.5f } }, {} },
        // Envelopes above 1 push the delays past either end of the buffer.
        { "ModulationBeyondTheBuffer", 2, 64, 44100, { { Sensitivity1, 1 }, { Time1, 0.8f }, { TimeSource1, source (envelope1) }, { TimeMod1, 1 }, { TimeSource2, source (reverseEnvelope1) }, { TimeMod2, 1 } }, {} },
    };
    return table;
}

inline std::string nameOf (const ::testing::TestParamInfo<Scenario>& info) { return info.param.name; }
inline void PrintTo (const Scenario& s, std::ostream* os) { *os << s.name; }
} // namespace reference
