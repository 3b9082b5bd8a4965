#include "dsp/Lfo.h"
#include "dsp/SeededRandom.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using veltrane::Lfo;

namespace
{
    constexpr int n = Lfo::tableSize;

    // An LFO ticking exactly one table point per sample: 1024 samples per cycle.
    Lfo onePointPerSample (int wave, int64_t seed = 99)
    {
        Lfo lfo (seed);
        lfo.setSampleRate (1024.0);
        lfo.setWave (wave);
        lfo.setFrequency (1.0f);
        lfo.updateIncrement();
        return lfo;
    }
}

TEST (Lfo, TablesHaveTheirShapesWithinUnitRange)
{
    const Lfo lfo (5);

    for (int w = 0; w < Lfo::numWaves; ++w)
        for (auto v : lfo.getTable (w))
            ASSERT_TRUE (v >= -1.0f && v <= 1.0f) << "wave " << w;

    const auto& sine = lfo.getTable (Lfo::sine);
    EXPECT_EQ (sine[0], 0.0f);
    EXPECT_NEAR (sine[256], 1.0f, 1e-7);
    EXPECT_NEAR (sine[768], -1.0f, 1e-7);

    for (int i = 0; i < n; ++i)
        ASSERT_EQ (lfo.getTable (Lfo::square)[(size_t) i], i < n / 2 ? 1.0f : -1.0f);

    EXPECT_EQ (lfo.getTable (Lfo::sawUp).front(), -1.0f);
    EXPECT_EQ (lfo.getTable (Lfo::sawUp).back(), 1.0f - 2.0f / n);
    EXPECT_EQ (lfo.getTable (Lfo::sawDown).front(), 1.0f);
    EXPECT_EQ (lfo.getTable (Lfo::sawDown).back(), -1.0f + 2.0f / n);
    EXPECT_EQ (lfo.getTable (Lfo::triangle)[0], -1.0f);
    EXPECT_EQ (lfo.getTable (Lfo::triangle)[n / 2 - 1], 1.0f - 2.0f / (n / 2));
    EXPECT_EQ (lfo.getTable (Lfo::triangle)[n / 2], 1.0f);
    EXPECT_EQ (lfo.getTable (Lfo::triangle)[n - 1], -1.0f + 2.0f / (n / 2));
}

TEST (Lfo, SampleAndHoldTableIsTheSeedsDraws)
{
    const Lfo lfo (12345);
    veltrane::SeededRandom random (12345);

    for (auto v : lfo.getTable (Lfo::sampleAndHold))
        ASSERT_EQ (v, random.nextFloat() * 2.0f - 1.0f);

    EXPECT_NE (Lfo (1).getTable (Lfo::sampleAndHold), Lfo (2).getTable (Lfo::sampleAndHold));
}

TEST (Lfo, IncrementAt40HzIs0_9288PointsPerSample)
{
    Lfo lfo (1);
    lfo.setSampleRate (44100.0);
    lfo.setFrequency (40.0f);
    lfo.updateIncrement();
    EXPECT_NEAR (lfo.getPhaseIncrement(), 0.92880f, 5e-6);
}

TEST (Lfo, SyncedRatesFollowTheTempo)
{
    struct Case { float bpm; int division; float hz; };
    const Case cases[] = {
        { 120.0f, 6, 2.0f },        // "1/4"
        { 120.0f, 7, 1.5f },        // "1/4D"
        { 120.0f, 0, 0.0625f },     // "8 Bars"
        { 120.0f, 3, 0.5f },        // "1 Bar"
        { 120.0f, 17, 48.0f },      // "1/128D"
        { 90.0f, 8, 3.0f },         // "1/8"
        { 0.0f, 6, 0.0f },          // no tempo: stands still
    };

    for (const auto& c : cases)
    {
        Lfo lfo (1);
        lfo.setSyncedFrequency (c.bpm, c.division);
        EXPECT_FLOAT_EQ (lfo.getFrequency(), c.hz) << c.bpm << " bpm, division " << c.division;
    }

    Lfo lfo (1);
    lfo.setFrequency (3.0f);
    lfo.setSyncedFrequency (120.0f, 18);
    lfo.setSyncedFrequency (120.0f, -1);
    EXPECT_EQ (lfo.getFrequency(), 3.0f);
}

TEST (Lfo, SquareIsExactlyPlusOneThenMinusOneByHalfCycles)
{
    auto lfo = onePointPerSample (Lfo::square);

    for (int cycle = 0; cycle < 3; ++cycle)
        for (int i = 0; i < n; ++i)
            ASSERT_EQ (lfo.tick(), i < n / 2 ? 1.0f : -1.0f) << "cycle " << cycle << ", sample " << i;
}

TEST (Lfo, ZeroRateFreezesTheOutput)
{
    auto lfo = onePointPerSample (Lfo::sine);

    for (int i = 0; i < 300; ++i)
        lfo.tick();

    lfo.setFrequency (0.0f);
    lfo.updateIncrement();
    const auto held = lfo.tick();

    for (int i = 0; i < 5000; ++i)
        ASSERT_EQ (lfo.tick(), held);
}

TEST (Lfo, SampleAndHoldHoldsOneEntryPerCycleAndRestartsAtEntryOne)
{
    auto lfo = onePointPerSample (Lfo::sampleAndHold);
    const auto& table = lfo.getTable (Lfo::sampleAndHold);

    for (int cycle = 1; cycle <= 3; ++cycle)
        for (int i = 0; i < n; ++i)
            ASSERT_EQ (lfo.tick(), table[(size_t) cycle]) << "cycle " << cycle;

    for (int i = 0; i < 100; ++i)
        lfo.tick();

    lfo.restart();
    EXPECT_EQ (lfo.tick(), table[1]);
}

TEST (Lfo, SampleAndHoldAtOneHertzHoldsForOneSecond)
{
    Lfo lfo (7);
    lfo.setSampleRate (44100.0);
    lfo.setWave (Lfo::sampleAndHold);
    lfo.setFrequency (1.0f);
    lfo.updateIncrement();

    auto current = lfo.tick();
    int run = 1;
    int completeRuns = 0;

    for (int i = 0; i < 44100 * 4; ++i)
    {
        const auto v = lfo.tick();

        if (v == current)
        {
            ++run;
            continue;
        }

        // The phase accumulates in single precision, which stretches the cycle by 0.05 %.
        if (completeRuns++ > 0)
            EXPECT_NEAR (run, 44100, 30);

        current = v;
        run = 1;
    }

    EXPECT_GE (completeRuns, 3);
}

TEST (Lfo, ObjectsWithDifferentSeedsHoldDifferentValues)
{
    auto left = onePointPerSample (Lfo::sampleAndHold, 1);
    auto right = onePointPerSample (Lfo::sampleAndHold, 2);
    EXPECT_NE (left.tick(), right.tick());
}

TEST (Lfo, NonsenseRatesKeepThePhaseInsideTheTable)
{
    const float frequencies[] = { 1.0e6f, 5.0e9f, -3.0f, std::numeric_limits<float>::quiet_NaN(),
                                  std::numeric_limits<float>::infinity() };

    for (auto hz : frequencies)
    {
        Lfo lfo (3);
        lfo.setSampleRate (1000.0);
        lfo.setWave (Lfo::sawUp);
        lfo.setFrequency (hz);
        lfo.updateIncrement();
        EXPECT_TRUE (lfo.getPhaseIncrement() >= 0.0f && lfo.getPhaseIncrement() < (float) n) << hz;

        for (int i = 0; i < 10000; ++i)
        {
            const auto v = lfo.tick();
            ASSERT_TRUE (v >= -1.0f && v <= 1.0f) << hz;
            ASSERT_TRUE (lfo.getMotion().phase >= 0.0f && lfo.getMotion().phase < (float) n) << hz;
        }
    }

    Lfo lfo (3);
    lfo.setSyncedFrequency (std::numeric_limits<float>::quiet_NaN(), 6);
    lfo.updateIncrement();
    EXPECT_EQ (lfo.getPhaseIncrement(), 0.0f);
}

TEST (Lfo, WaveOutsideTheListIsIgnored)
{
    Lfo lfo (1);
    lfo.setWave (Lfo::triangle);
    lfo.setWave (6);
    lfo.setWave (-1);
    EXPECT_EQ (lfo.getWave(), Lfo::triangle);
}
