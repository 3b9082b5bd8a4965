// The engine against the documented per-sample order, written out plainly from the units:
// channel after channel, one sample at a time, MIDI restarts met during channel 0's pass.
// The engine runs both channels side by side, in chunks, four samples at a time where it can;
// none of that may change a single bit.

#include "dsp/Engine.h"
#include "dsp/SeededRandom.h"

#include <gtest/gtest.h>

#include <cmath>
#include <utility>
#include <vector>

using namespace veltrane;

namespace
{
    constexpr double rate = 44100.0;

    struct ReferenceChannel
    {
        ReferenceChannel (int64_t seed1, int64_t seed2) : lfo { Lfo (seed1), Lfo (seed2) } {}

        DelayLine delay[2];
        EnvelopeFollower envelope[2];
        Lfo lfo[2];
    };

    struct Reference
    {
        explicit Reference (uint64_t seed) : Reference (seedsFrom (seed)) {}

        static std::vector<int64_t> seedsFrom (uint64_t seed)
        {
            SeededRandom random ((int64_t) seed);
            std::vector<int64_t> seeds;

            for (int i = 0; i < 4; ++i)
                seeds.push_back (random.nextInt64());

            return seeds;
        }

        explicit Reference (const std::vector<int64_t>& seeds)
            : channel { ReferenceChannel (seeds[0], seeds[1]), ReferenceChannel (seeds[2], seeds[3]) } {}

        // restarts: (sample position, LFO index) in time order.
        void block (const EngineSettings& s, float* const* samples, int numChannels, int n,
                    const std::vector<std::pair<int, int>>& restarts)
        {
            offset = -offset;

            for (int d = 0; d < 2; ++d)
                step[d] = (float) ((double) (s.delay[d].timeMs - smoothed[d]) / (rate * 0.25));

            for (auto& ch : channel)
            {
                for (int d = 0; d < 2; ++d)
                    ch.delay[d].setBaseFeedback (s.delay[d].feedback);

                for (int e = 0; e < 2; ++e)
                    ch.envelope[e].setTimes (s.envelope[e].attackMs, s.envelope[e].releaseMs);

                for (int l = 0; l < 2; ++l)
                {
                    ch.lfo[l].setWave (s.lfo[l].wave);

                    if (s.lfo[l].sync)
                        ch.lfo[l].setSyncedFrequency (s.tempoBpm, s.lfo[l].syncedRate);
                    else
                        ch.lfo[l].setFrequency (s.lfo[l].rateHz);

                    ch.lfo[l].updateIncrement();
                }
            }

            OutputStage stage;
            stage.balance = s.dryWet;
            stage.shaper = s.shaper;
            stage.amount = s.shaperAmount;
            const auto mode = (MixMode) s.mixMode;

            for (int c = 0; c < numChannels; ++c)
            {
                auto& ch = channel[c];
                size_t nextRestart = 0;

                for (int j = 0; j < n; ++j)
                {
                    auto x = samples[c][j] + offset;
                    x = std::isfinite (x) ? x : offset;

                    for (; c == 0 && nextRestart < restarts.size() && restarts[nextRestart].first == j; ++nextRestart)
                        for (auto& each : channel)
                            each.lfo[restarts[nextRestart].second].restart();

                    smoothed[0] += step[0];
                    smoothed[1] += step[1];

                    for (int d = 0; d < 2; ++d)
                        ch.delay[d].setBaseDelay (ch.delay[d].baseDelayFor (smoothed[d]));

                    const auto e1 = ch.envelope[0].process (s.envelope[0].sensitivity * x);
                    const auto e2 = ch.envelope[1].process (s.envelope[1].sensitivity * x);
                    const auto l1 = ch.lfo[0].tick();
                    const auto l2 = ch.lfo[1].tick();
                    const float values[7] = { 0.0f, e1, -e1, e2, -e2, l1, l2 };

                    for (int d = 0; d < 2; ++d)
                    {
                        const auto& ds = s.delay[d];

                        if (ds.timeModSource != 0 && ds.timeModDepth != 0.0f)
                            ch.delay[d].modulateTime (ds.timeModDepth, values[ds.timeModSource]);

                        if (ds.feedbackModSource != 0 && ds.feedbackModDepth != 0.0f)
                            ch.delay[d].modulateFeedback (ds.feedbackModDepth, values[ds.feedbackModSource]);
                    }

                    float o1, o2;

                    if (mode == MixMode::chain)
                    {
                        o1 = ch.delay[0].process (x);
                        o2 = ch.delay[1].process (o1);
                    }
                    else if (mode == MixMode::reverseChain)
                    {
                        o2 = ch.delay[1].process (x);
                        o1 = ch.delay[0].process (o2);
                    }
                    else
                    {
                        o1 = ch.delay[0].process (x);
                        o2 = ch.delay[1].process (x);
                    }

                    const auto w1 = s.delay[0].gain * o1, w2 = s.delay[1].gain * o2;
                    const auto left = c == 0;
                    const auto wet = mode == MixMode::parallel ? w1 + w2
                                   : mode == MixMode::chain || mode == MixMode::solo2 ? w2
                                   : mode == MixMode::reverseChain || mode == MixMode::solo1 ? w1
                                   : mode == MixMode::stereoParallel ? (left ? w1 : w2)
                                                                     : (left ? w2 : w1);
                    samples[c][j] = stage.shape (stage.blend (wet, x));
                }
            }
        }

        ReferenceChannel channel[2];
        float smoothed[2] = { 120.0f, 220.0f };
        float step[2] = {};
        float offset = 1.0e-25f;
    };

    EngineSettings busySettings (int mode, int shaper)
    {
        EngineSettings s;
        s.mixMode = mode;
        s.shaper = shaper;
        s.shaperAmount = 0.3f;
        s.dryWet = 0.8f;
        s.delay[0] = { 700.0f, 0.7f, 0.4f, (int) ModSource::lfo1, 0.5f, (int) ModSource::reverseEnvelope1, 0.9f };
        s.delay[1] = { 3.0f, 0.5f, 1.0f, (int) ModSource::envelope2, 0.8f, (int) ModSource::lfo2, 0.5f };
        s.envelope[0] = { 1.4f, 0.5f, 3.0f };
        s.envelope[1] = { 0.6f, 0.0f, 7.0f };
        s.lfo[0] = { Lfo::sampleAndHold, 9.0f, false, 6 };
        s.lfo[1] = { Lfo::triangle, 0.0f, true, 9 };
        s.tempoBpm = 133.0f;
        return s;
    }
}

TEST (Engine, MatchesTheSampleBySampleOrderBitForBit)
{
    // Every mix mode with every shaper, stereo and mono, all kinds of sources, moving glides, a
    // short Delay 2 (below four samples at times, so the lines also take their one-by-one
    // path) and LFO restarts mid-block.
    for (int numChannels : { 2, 1 })
    {
        for (int mode = 0; mode < 7; ++mode)
        {
            for (int shaper = 0; shaper < 4; ++shaper)
            {
                Engine engine (77);
                Reference reference (77);
                engine.prepare (rate);
                auto settings = busySettings (mode, shaper);

                for (int block = 0; block < 10; ++block)
                {
                    const int n = block == 4 ? 37 : 600;
                    std::vector<float> a ((size_t) n), b ((size_t) n);

                    for (int i = 0; i < n; ++i)
                    {
                        a[(size_t) i] = 0.7f * std::sin ((float) (block * 600 + i) * 0.031f);
                        b[(size_t) i] = ((block * 600 + i) % 331) == 0 ? 1.0f : 0.1f * std::cos ((float) i * 0.2f);
                    }

                    auto c = a, d = b;
                    const std::vector<std::pair<int, int>> restarts = block == 3 ? std::vector<std::pair<int, int>> { { 5, 0 }, { 300, 1 }, { 301, 0 } }
                                                                                 : std::vector<std::pair<int, int>> {};
                    bool restarted[2] = { false, false };

                    for (auto [position, lfo] : restarts)
                        restarted[lfo] = true;

                    if (block == 6)
                        settings.delay[0].timeMs = 90.0f;

                    float* engineSamples[2] = { a.data(), b.data() };
                    engine.beginBlock (settings, numChannels, n, restarted);
                    int done = 0;

                    for (auto [position, lfo] : restarts)
                    {
                        engine.process (engineSamples, done, position);
                        engine.restartLfo (lfo);
                        done = position;
                    }

                    engine.process (engineSamples, done, n);

                    float* referenceSamples[2] = { c.data(), d.data() };
                    reference.block (settings, referenceSamples, numChannels, n, restarts);

                    ASSERT_EQ (a, c) << "channel 0, mode " << mode << ", shaper " << shaper << ", " << numChannels << " channels, block " << block;

                    if (numChannels == 2)
                        ASSERT_EQ (b, d) << "channel 1, mode " << mode << ", shaper " << shaper << ", block " << block;
                }
            }
        }
    }
}
