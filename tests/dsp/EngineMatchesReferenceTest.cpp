// The optimised engine against the plain reference model, with the same seed for "Sample & Hold".

#include "ReferenceScenarios.h"

#include "dsp/Engine.h"

using namespace reference;

namespace
{
constexpr uint64_t seed = 0x5eed1234abcdull;

// Driven as the processor drives it: the knobs once per block, the block split where a note restarts an LFO.
Audio engineRun (const Scenario& s)
{
    veltrane::Engine engine (seed);
    engine.prepare (s.sampleRate);
    return run (s, [&] (const float* values, float* const* io, int n, const std::vector<Midi>& events, bool resumed) {
        const auto k = knobsFrom (values);
        veltrane::EngineSettings settings;
        for (int u = 0; u < 2; ++u)
        {
            const auto& d = k.delay[u];
            settings.delay[u] = { d.timeMs, d.feedback, d.timeDepth, d.timeSource, d.feedbackDepth, d.feedbackSource, d.gain };
            settings.envelope[u] = { k.follower[u].sensitivity, k.follower[u].attackMs, k.follower[u].releaseMs };
            settings.lfo[u] = { k.lfo[u].wave, k.lfo[u].rateHz, k.lfo[u].sync, k.lfo[u].division };
        }
        settings.mixMode = k.mixMode, settings.dryWet = k.dryWet, settings.shaper = k.shaper, settings.shaperAmount = k.amount, settings.tempoBpm = s.hostTempo();
        if (resumed)
            engine.prepare (s.sampleRate);
        auto restarts = [&] (int lfo) { return std::any_of (events.begin(), events.end(), [&] (const Midi& e) { return e.position < n && restartedLfo (e) == lfo; }); };
        engine.beginBlock (settings, s.channels, n, { restarts (0), restarts (1) });
        int done = 0;
        for (const auto& e : events)
            if (e.position < n && restartedLfo (e) >= 0)
                engine.process (io, done, e.position), done = e.position, engine.restartLfo (restartedLfo (e));
        engine.process (io, done, n);
    });
}

// Bits 0, 1: the delays heard (both in the chains); bits 2..5: the sources they read (envelope 1, 2, LFO 1, 2).
unsigned unitsHeard (const Scenario& s)
{
    const auto k = s.knobs();
    unsigned units = k.mixMode <= 2 ? 3 : wetOf[k.mixMode][0] | wetOf[k.mixMode][s.channels - 1];
    for (int u = 0; u < 2; ++u)
        for (auto [source, depth] : { std::pair (k.delay[u].timeSource, k.delay[u].timeDepth), std::pair (k.delay[u].feedbackSource, k.delay[u].feedbackDepth) })
            if ((units >> u & 1) != 0 && source != 0 && depth != 0.0f)
                units |= 1u << (source <= 4 ? 2 + (source - 1) / 2 : source - 1);
    return units;
}

class EngineMatchesReference : public ::testing::TestWithParam<Scenario> {};
}

TEST_P (EngineMatchesReference, SampleBySample)
{
    const auto& s = GetParam();
    const auto expected = referenceRun (s, seed);
    EXPECT_TRUE (matches (s, expected, engineRun (s)));

    // Long enough for every delay heard, and every source it reads, to shape the output.
    for (int unit = 0; unit < 6; ++unit)
        if ((unitsHeard (s) >> unit & 1) != 0)
            EXPECT_NE (referenceRun (s, seed, 1u << unit), expected) << "unit " << unit << " never reaches the output";
}

INSTANTIATE_TEST_SUITE_P (EveryScenario, EngineMatchesReference, ::testing::ValuesIn (scenarios()), nameOf);
