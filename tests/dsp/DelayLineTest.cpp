#include "dsp/DelayLine.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <vector>

using veltrane::DelayLine;

namespace
{
    // Feeds an impulse followed by silence and returns the line's outputs.
    std::vector<float> impulseResponse (DelayLine& line, int numSamples)
    {
        std::vector<float> out ((size_t) numSamples);

        for (int i = 0; i < numSamples; ++i)
            out[(size_t) i] = line.process (i == 0 ? 1.0f : 0.0f);

        return out;
    }
}

TEST (DelayLine, ConstructionHoldsTwoSecondsAt44100)
{
    DelayLine line;
    EXPECT_EQ (line.getLength(), 88200);
    EXPECT_EQ (line.getDelaySamples(), 4410.0f);
}

TEST (DelayLine, BaseDelayIsClampedToOneSampleAndTheLength)
{
    DelayLine line;
    struct Case { float ms; float samples; };
    const Case cases[] = {
        { 120.0f, 5292.0f }, { 2000.0f, 88200.0f }, { 2500.0f, 88200.0f }, { 0.0f, 1.0f }, { -3.0f, 1.0f },
        { std::numeric_limits<float>::quiet_NaN(), 88200.0f }, { std::numeric_limits<float>::infinity(), 88200.0f },
        { 0.01f, 0.441f },
    };

    for (const auto& c : cases)
        EXPECT_FLOAT_EQ (line.baseDelayFor (c.ms), c.samples) << c.ms << " ms";
}

TEST (DelayLine, ImpulseReturnsAfterExactDelay)
{
    DelayLine line;
    line.setBaseDelay (100.0f);
    const auto out = impulseResponse (line, 300);

    for (int i = 0; i < 300; ++i)
        ASSERT_EQ (out[(size_t) i], i == 100 ? 1.0f : 0.0f) << i;
}

TEST (DelayLine, FractionalDelayInterpolatesStraight)
{
    DelayLine line;
    line.setBaseDelay (10.25f);
    const auto out = impulseResponse (line, 20);
    EXPECT_FLOAT_EQ (out[10], 0.75f);
    EXPECT_FLOAT_EQ (out[11], 0.25f);
    EXPECT_EQ (out[9], 0.0f);
    EXPECT_EQ (out[12], 0.0f);
}

TEST (DelayLine, FullFeedbackRepeatsAtZeroPointNineSix)
{
    DelayLine line;
    line.setBaseDelay (100.0f);
    line.setBaseFeedback (1.0f);
    const auto out = impulseResponse (line, 401);
    EXPECT_EQ (out[100], 1.0f);
    EXPECT_FLOAT_EQ (out[200], 0.96f);
    EXPECT_FLOAT_EQ (out[300], 0.9216f);
    EXPECT_FLOAT_EQ (out[400], 0.884736f);
}

TEST (DelayLine, DelayOfTheWholeLengthReadsTheOldestEntry)
{
    DelayLine line;
    line.setBaseDelay (88200.0f);
    const auto out = impulseResponse (line, 88201);
    EXPECT_EQ (out[88200], 1.0f);
    EXPECT_EQ (out[88199], 0.0f);
}

TEST (DelayLine, ResizeKeepsTwoSecondsAndSilences)
{
    DelayLine line;
    line.setBaseDelay (10.0f);
    line.setBaseFeedback (0.9f);
    impulseResponse (line, 50);

    line.resize (48000.0);
    EXPECT_EQ (line.getLength(), 96000);
    EXPECT_EQ (line.getWriteIndex(), 0);

    for (int i = 0; i < 96000; ++i)
        ASSERT_EQ (line.process (0.0f), 0.0f);

    line.resize (96000.0);
    EXPECT_EQ (line.getLength(), 192000);
    line.resize (44100.0);
    EXPECT_EQ (line.getLength(), 88200);
}

TEST (DelayLine, ResizeToTheSameRateKeepsTheContent)
{
    DelayLine line;
    line.setBaseDelay (10.0f);
    line.process (1.0f);
    line.resize (44100.0);

    for (int i = 1; i < 10; ++i)
        line.process (0.0f);

    EXPECT_EQ (line.process (0.0f), 1.0f);
}

TEST (DelayLine, ClearSilences)
{
    DelayLine line;
    line.setBaseDelay (10.0f);
    line.setBaseFeedback (1.0f);
    impulseResponse (line, 25);
    line.clear();
    EXPECT_EQ (line.getWriteIndex(), 0);

    for (int i = 0; i < 100; ++i)
        ASSERT_EQ (line.process (0.0f), 0.0f);
}

TEST (DelayLine, TimeModulationSwingsToTheNearerEnd)
{
    DelayLine line;
    struct Case { float baseMs; float lowMs; float highMs; };
    const Case cases[] = { { 1500.0f, 1000.0f, 2000.0f }, { 500.0f, 0.0f, 1000.0f }, { 1000.0f, 0.0f, 2000.0f } };

    for (const auto& c : cases)
    {
        line.setBaseDelay (line.baseDelayFor (c.baseMs));
        line.modulateTime (1.0f, -1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), c.lowMs * 44.1f) << c.baseMs;
        line.modulateTime (1.0f, 1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), c.highMs * 44.1f) << c.baseMs;
        line.modulateTime (0.5f, 1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), (c.baseMs + (c.highMs - c.baseMs) * 0.5f) * 44.1f) << c.baseMs;
    }
}

TEST (DelayLine, FeedbackModulationSwingsToTheNearerEnd)
{
    DelayLine line;
    struct Case { float base; float low; float high; };
    const Case cases[] = { { 0.4f, 0.0f, 0.8f }, { 0.8f, 0.6f, 1.0f }, { 0.5f, 0.0f, 1.0f }, { 0.0f, 0.0f, 0.0f } };

    for (const auto& c : cases)
    {
        line.setBaseFeedback (c.base);
        line.modulateFeedback (1.0f, -1.0f);
        EXPECT_NEAR (line.getFeedback(), c.low, 1e-7) << c.base;
        line.modulateFeedback (1.0f, 1.0f);
        EXPECT_NEAR (line.getFeedback(), c.high, 1e-7) << c.base;
    }

    // A source above 1 (a loud envelope) is not clamped.
    line.setBaseFeedback (0.8f);
    line.modulateFeedback (1.0f, 2.0f);
    EXPECT_FLOAT_EQ (line.getFeedback(), 1.2f);
}

TEST (DelayLine, DelaysOutsideTheBufferReadTheNearestEnd)
{
    // Run under the address sanitizer these would show any read outside the buffer; here the
    // outputs show where the line read.
    const float delays[] = { -1.0e9f, -88200.0f, -0.3f, 88200.5f, 3.0f * 88200.0f, 1.0e30f,
                             std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity(),
                             -std::numeric_limits<float>::infinity(), 1.0e-10f, 88199.99999f };

    for (auto d : delays)
    {
        DelayLine line;
        line.setBaseDelay (100.0f);
        line.process (1.0f);                 // slot 0 holds the impulse
        line.setBaseDelay (d);

        for (int i = 1; i < 88200; ++i)      // write slots 1 .. L - 1 with silence
            ASSERT_EQ (line.process (0.0f), 0.0f) << d << " at " << i;

        // At slot 0 again both ends of the range read the impulse.
        EXPECT_NEAR (line.process (0.0f), 1.0f, 1e-4) << d;
    }
}

TEST (DelayLine, OverflowingLoopRecovers)
{
    DelayLine line;
    line.setBaseDelay (1.0f);
    line.setBaseFeedback (1.0e30f);
    line.process (1.0e30f);

    for (int i = 0; i < 10; ++i)
        line.process (0.0f);

    line.setBaseFeedback (0.5f);

    for (int i = 0; i < 100; ++i)
        ASSERT_TRUE (std::isfinite (line.process (0.0f))) << i;

    EXPECT_EQ (line.process (0.0f), 0.0f);
}

TEST (DelayLine, BlocksMatchSampleBySampleProcessing)
{
    // Runs of steady, swept, tiny and out-of-range delays with per-sample and constant feedback:
    // processing four at a time must give exactly what one at a time gives.
    constexpr int n = 20000;
    std::vector<float> input (n), delays (n), feedbacks (n);
    uint32_t noise = 7;

    for (int i = 0; i < n; ++i)
    {
        noise = noise * 1664525u + 1013904223u;
        input[(size_t) i] = (float) (noise >> 8) / 16777216.0f - 0.5f;
        const auto segment = i / 2500;
        delays[(size_t) i] = segment == 0 ? 300.25f
                           : segment == 1 ? 2.0f + (float) (i % 7) * 0.6f
                           : segment == 2 ? 88199.7f
                           : segment == 3 ? 10.0f + (float) i * 3.1f
                           : segment == 4 ? 88200.0f - (float) (i % 9)
                           : segment == 5 ? -5.0f
                           : segment == 6 ? 5000.0f + 4000.0f * std::sin ((float) i * 0.001f)
                                          : 4.0f + (float) (i % 3);
        feedbacks[(size_t) i] = 0.5f + 0.45f * std::sin ((float) i * 0.01f);
    }

    for (bool perSampleFeedback : { false, true })
    {
        DelayLine whole, single;
        whole.setBaseFeedback (0.7f);
        single.setBaseFeedback (0.7f);
        std::vector<float> blockOut (n), singleOut (n);

        for (int start = 0; start < n; start += 509)
        {
            const auto count = std::min (509, n - start);
            whole.process (input.data() + start, delays.data() + start,
                           perSampleFeedback ? feedbacks.data() + start : nullptr, blockOut.data() + start, count);
        }

        for (int i = 0; i < n; ++i)
        {
            single.setBaseDelay (delays[(size_t) i]);
            single.setBaseFeedback (perSampleFeedback ? feedbacks[(size_t) i] : 0.7f);
            singleOut[(size_t) i] = single.process (input[(size_t) i]);
        }

        EXPECT_EQ (blockOut, singleOut) << "per-sample feedback " << perSampleFeedback;
    }
}

TEST (DelayLine, PairMatchesOneLineAfterTheOther)
{
    constexpr int n = 6000;
    std::vector<float> input (n), delaysA (n), delaysB (n), feedbacks (n);

    for (int i = 0; i < n; ++i)
    {
        input[(size_t) i] = std::sin ((float) i * 0.07f) + ((i % 1000) == 0 ? 1.0f : 0.0f);
        delaysA[(size_t) i] = 700.0f + 690.0f * std::sin ((float) i * 0.003f);   // dips below 4 samples
        delaysB[(size_t) i] = (float) (i % 1500) * 0.5f + 0.25f;
        feedbacks[(size_t) i] = 0.6f + 0.3f * std::cos ((float) i * 0.02f);
    }

    struct Case { bool chained; bool perSampleA; bool perSampleFeedbackA; bool perSampleB; };
    const Case cases[] = { { false, false, false, false }, { true, false, false, false }, { false, true, true, false },
                           { true, true, false, true }, { true, true, true, true }, { false, false, false, true } };

    for (const auto& c : cases)
    {
        DelayLine pairA, pairB, soloA, soloB;

        for (auto* line : { &pairA, &pairB, &soloA, &soloB })
        {
            line->setBaseDelay (333.5f); // reads the buffer end's mirror of slot 0 early on
            line->setBaseFeedback (0.7f);
        }

        std::vector<float> pairOutA (n), pairOutB (n), soloOutA (n), soloOutB (n);

        for (int start = 0; start < n; start += 256)
        {
            const auto count = std::min (256, n - start);
            const auto* dA = c.perSampleA ? delaysA.data() + start : nullptr;
            const auto* fA = c.perSampleFeedbackA ? feedbacks.data() + start : nullptr;
            const auto* dB = c.perSampleB ? delaysB.data() + start : nullptr;
            DelayLine::processPair (pairA, pairB, c.chained, input.data() + start, dA, fA, pairOutA.data() + start,
                                    dB, nullptr, pairOutB.data() + start, count);
            soloA.process (input.data() + start, dA, fA, soloOutA.data() + start, count);
            soloB.process (c.chained ? soloOutA.data() + start : input.data() + start, dB, nullptr, soloOutB.data() + start, count);
        }

        EXPECT_EQ (pairOutA, soloOutA) << "chained " << c.chained;
        EXPECT_EQ (pairOutB, soloOutB) << "chained " << c.chained;
    }
}
