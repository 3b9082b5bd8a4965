#include "dsp/Lfo.h"
#include "dsp/SeededRandom.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using veltrane::Lfo;

TEST (Lfo, TablesFollowTheirFormulas)
{
    const Lfo lfo (5);
    veltrane::SeededRandom random (5);
    const auto w = (float) (6.283185307179586 / 1024);

    for (int i = 0; i < 1024; ++i)
    {
        const auto x = (float) i;
        const float expected[] { std::sin (x * w), i < 512 ? 1.0f : -1.0f, x / 512.0f - 1.0f, 1.0f - x / 512.0f,
                                 i < 512 ? x / 256.0f - 1.0f : 3.0f - x / 256.0f, random.nextFloat() * 2.0f - 1.0f };
        for (int wave = 0; wave < Lfo::numWaves; ++wave)
            ASSERT_EQ (lfo.getTable (wave)[(size_t) i], expected[wave]) << "wave " << wave << " at " << i;
    }
}

TEST (Lfo, RatesFreeAndSyncedToTheTempo)
{
    Lfo lfo (1);
    lfo.setFrequency (40.0f);
    lfo.updateIncrement();
    EXPECT_NEAR (lfo.getPhaseIncrement(), 0.92880f, 5e-6);   // points per sample at 44100 Hz

    // bpm, division, Hz: "1/4", "1/4D", "8 Bars", "1 Bar", "1/128D", "1/8"; no tempo stands still.
    const struct { float bpm; int division; float hz; } cases[] { { 120, 6, 2 }, { 120, 7, 1.5f }, { 120, 0, 0.0625f },
                                                                 { 120, 3, 0.5f }, { 120, 17, 48 }, { 90, 8, 3 }, { 0, 6, 0 } };
    for (const auto& c : cases)
    {
        lfo.setSyncedFrequency (c.bpm, c.division);
        EXPECT_FLOAT_EQ (lfo.getFrequency(), c.hz) << c.bpm << " bpm, division " << c.division;
    }

    lfo.setSyncedFrequency (120.0f, 18);   // no such division: unchanged
    EXPECT_EQ (lfo.getFrequency(), 0.0f);

    // Nonsense rates (a wild tempo) keep the phase inside the table.
    for (auto hz : { 1.0e6f, 5.0e9f, -3.0f, std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity() })
    {
        lfo.setFrequency (hz);
        lfo.updateIncrement();
        EXPECT_TRUE (lfo.getPhaseIncrement() >= 0.0f && lfo.getPhaseIncrement() < 1024.0f) << hz;
    }
}

TEST (Lfo, SampleAndHoldTakesOneEntryPerCycleAndRestartsAtEntryOne)
{
    Lfo lfo (99);
    lfo.setSampleRate (1024.0);
    lfo.setWave (Lfo::sampleAndHold);
    lfo.setFrequency (1.0f);   // one table point per sample
    lfo.updateIncrement();
    const auto& table = lfo.getTable (Lfo::sampleAndHold);

    for (int cycle = 1; cycle <= 3; ++cycle)
        for (int i = 0; i < 1024; ++i)
            ASSERT_EQ (lfo.tick(), table[(size_t) cycle]) << "cycle " << cycle;

    lfo.restart();
    EXPECT_EQ (lfo.tick(), table[1]);
}
