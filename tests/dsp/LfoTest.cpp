#include "dsp/Lfo.h"
#include "dsp/SeededRandom.h"

#include <gtest/gtest.h>

#include <cmath>

using veltrane::Lfo;

TEST (Lfo, TablesFollowTheirFormulasAndSampleAndHoldTakesOneEntryPerCycle)
{
    Lfo lfo (5);
    veltrane::SeededRandom random (5);   // the draws of juce::Random with that seed
    for (int i = 0; i < 1024; ++i)
    {
        const auto x = (float) i;
        const float expected[] { std::sin (x * (float) (6.283185307179586 / 1024)), i < 512 ? 1.0f : -1.0f, x / 512.0f - 1.0f, 1.0f - x / 512.0f,
                                 i < 512 ? x / 256.0f - 1.0f : 3.0f - x / 256.0f, random.nextFloat() * 2.0f - 1.0f };
        for (int wave = 0; wave < Lfo::numWaves; ++wave)
            ASSERT_EQ (lfo.getTable (wave)[(size_t) i], expected[wave]) << "wave " << wave << " at " << i;
    }

    lfo.setSampleRate (1024.0);
    lfo.setWave (Lfo::sampleAndHold);
    lfo.setFrequency (1.0f);   // one table point per sample
    lfo.updateIncrement();
    for (int i = 0; i < 3 * 1024; ++i)   // the first tick already wraps
        ASSERT_EQ (lfo.tick(), lfo.getTable (Lfo::sampleAndHold)[(size_t) (1 + i / 1024)]) << i;
    lfo.restart();
    EXPECT_EQ (lfo.tick(), lfo.getTable (Lfo::sampleAndHold)[1]);
}

TEST (Lfo, RatesFreeAndSyncedToTheTempo)
{
    Lfo lfo (1);
    lfo.setFrequency (40.0f);
    lfo.updateIncrement();
    EXPECT_NEAR (lfo.getPhaseIncrement(), 0.92880f, 5e-6);   // points per sample at 44100 Hz

    // "1/4", "1/4D", "8 Bars", "1 Bar", "1/128D", "1/8" at 120 and 90 bpm; no tempo stands still; no such division changes nothing.
    for (auto [bpm, division, hz] : { std::tuple (120.0f, 6, 2.0f), { 120.0f, 7, 1.5f }, { 120.0f, 0, 0.0625f }, { 120.0f, 3, 0.5f }, { 120.0f, 17, 48.0f },
                                      { 90.0f, 8, 3.0f }, { 0.0f, 6, 0.0f }, { 120.0f, 18, 0.0f } })
    {
        lfo.setSyncedFrequency (bpm, division);
        EXPECT_FLOAT_EQ (lfo.getFrequency(), hz) << bpm << " bpm, division " << division;
    }
    for (auto hz : { 1.0e6f, 5.0e9f, -3.0f, NAN, INFINITY })   // a wild tempo keeps the phase inside the table
    {
        lfo.setFrequency (hz);
        lfo.updateIncrement();
        EXPECT_TRUE (lfo.getPhaseIncrement() >= 0.0f && lfo.getPhaseIncrement() < 1024.0f) << hz;
    }
}
