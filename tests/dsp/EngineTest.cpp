#include "dsp/Engine.h"

#include <gtest/gtest.h>

#include <cmath>
#include <vector>

using namespace veltrane;

namespace
{
// Both channels through the engine in blocks.
void run (Engine& engine, const EngineSettings& settings, std::vector<float>& left, std::vector<float>& right, int block = 512)
{
    for (size_t start = 0; start < left.size(); start += (size_t) block)
    {
        float* samples[2] = { left.data() + start, right.data() + start };
        const auto n = (int) std::min ((size_t) block, left.size() - start);
        engine.beginBlock (settings, 2, n);
        engine.process (samples, 0, n);
    }
}
}

TEST (Engine, TimeGlidesOverAQuarterSecondAndLongBlocksDoNotSwingEverWider)
{
    // 500 * 1024 / 11025 ms in the first stereo block of 512; over 5512 samples it overshoots, over 11025 it would swing ever wider.
    for (int block : { 512, 8192, 20000 })
    {
        Engine engine (1);
        EngineSettings settings;
        settings.delay[0].timeMs = 620.0f;
        std::vector<float> left ((size_t) block, 0.1f), right ((size_t) block, 0.1f);
        auto distance = 500.0f;
        for (int i = 0; i < (block == 512 ? 1 : 30); ++i)
        {
            run (engine, settings, left, right, block);
            ASSERT_LE (std::fabs (620.0f - engine.getSmoothedTimeMs (0)), distance) << block << " block " << i;
            distance = std::fabs (620.0f - engine.getSmoothedTimeMs (0));
        }
        EXPECT_NEAR (distance, block == 512 ? 500.0f - 46.44f : 0.0f, 0.01f) << block;
    }
}

TEST (Engine, SampleAndHoldTakesOneValuePerCycleFromEachChannelsOwnTable)
{
    // At 1024 Hz and 1 Hz an LFO steps one table point per sample. It swings Delay 1 (512
    // samples) fully; the same ramp in both channels comes out differently only where the
    // channels' LFOs give different values.
    for (int wave : { (int) Lfo::sampleAndHold, (int) Lfo::sine })
    {
        Engine engine (3);
        engine.prepare (1024.0);
        EngineSettings settings;
        settings.mixMode = (int) MixMode::solo1;
        settings.delay[0] = { 500.0f, 0.0f, 1.0f, (int) ModSource::lfo1, 0.0f, 0, 1.0f };
        settings.lfo[0] = { wave, 1.0f, false, 6 };
        std::vector<float> left (1024), right (1024);
        run (engine, settings, left, right, 1024);   // a block this long lands the glide on its target
        left.resize (3 * 1024);
        right.resize (3 * 1024);
        for (size_t i = 0; i < 3 * 1024; ++i)
            left[i] = right[i] = (float) i * 0.001f;
        run (engine, settings, left, right, 1024);
        EXPECT_EQ (left != right, wave == Lfo::sampleAndHold);
        if (wave == Lfo::sampleAndHold)
            EXPECT_EQ (engine.getLfo (0, 0).getMotion().holdIndex * 10 + engine.getLfo (1, 0).getMotion().holdIndex, 44);   // the first tick wraps too
    }
}

TEST (Engine, PrepareTakesUsableRatesOnlyAndAlwaysSilences)
{
    Engine engine (1);
    EngineSettings settings;
    settings.delay[0].feedback = settings.delay[1].feedback = 0.9f;
    settings.lfo[1].rateHz = 40.0f;
    engine.prepare (48000.0);
    for (double bad : { 0.0, -44100.0, (double) NAN, (double) INFINITY, 1.0e12, 10.0 })
        engine.prepare (bad);
    EXPECT_EQ (engine.getSampleRate(), 48000.0);
    EXPECT_EQ (engine.getDelayLine (1, 1).getLength(), 96000);   // still two seconds
    std::vector<float> left (4000), right (4000);
    left[0] = right[0] = 1.0f;
    run (engine, settings, left, right);
    EXPECT_FLOAT_EQ (engine.getLfo (1, 1).getPhaseIncrement(), 1024.0f / 48000.0f * 40.0f);
    engine.prepare (48000.0);   // the echoes held in the lines are gone
    std::vector<float> silentLeft (30000), silentRight (30000);
    run (engine, settings, silentLeft, silentRight);
    EXPECT_TRUE (std::all_of (silentLeft.begin(), silentLeft.end(), [] (float v) { return std::fabs (v) < 1.0e-20f; }));
}

TEST (Engine, LoudEnvelopeAtFullDepthStaysInsideTheLines)
{
    // +6 dB on an input of 8: envelopes near 16 would push unclamped delays far outside the
    // buffers (the address sanitizer watches for stray reads).
    Engine engine (1);
    EngineSettings settings;
    settings.envelope[0].sensitivity = 1.995262f;
    settings.delay[0] = { 1800.0f, 0.9f, 1.0f, (int) ModSource::envelope1, 1.0f, (int) ModSource::envelope1, 1.0f };
    settings.delay[1] = { 200.0f, 0.9f, 1.0f, (int) ModSource::reverseEnvelope1, 1.0f, (int) ModSource::reverseEnvelope1, 1.0f };
    std::vector<float> left (88200), right (88200);
    for (size_t i = 0; i < left.size(); ++i)
        left[i] = right[i] = (i / 300) % 2 == 0 ? 8.0f : -8.0f;
    run (engine, settings, left, right);
    EXPECT_TRUE (std::all_of (left.begin(), left.end(), [] (float v) { return std::isfinite (v); }));
}
