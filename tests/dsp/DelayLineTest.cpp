#include "dsp/DelayLine.h"

#include <gtest/gtest.h>

#include <cmath>
#include <vector>

using veltrane::DelayLine;

TEST (DelayLine, ImpulseRepeatsEveryDelayAt0_96OfTheFeedbackAndFractionsInterpolate)
{
    // Delays above four samples run four at a time, shorter ones one at a time; the whole length
    // reads the oldest entry; 10.25 and 2.25 samples spread the impulse over two samples.
    const struct { float delay, feedback; int length; } cases[] { { 100, 1.0f, 401 }, { 3, 1.0f, 40 }, { 1, 0.5f, 10 }, { 88200, 0, 88201 },
                                                                   { 10.25f, 0, 20 }, { 2.25f, 0, 20 } };
    for (const auto& c : cases)
    {
        DelayLine line;
        line.setBaseDelay (c.delay);
        line.setBaseFeedback (c.feedback);
        std::vector<float> in ((size_t) c.length, 0.0f), out ((size_t) c.length);
        in[0] = 1.0f;
        line.process (in.data(), nullptr, nullptr, out.data(), c.length);
        const auto d = (int) c.delay;
        for (int i = 0; i < c.length; ++i)
        {
            const auto expected = c.delay != (float) d ? (i == d ? 0.75 : i == d + 1 ? 0.25 : 0.0)
                                                       : i > 0 && i % d == 0 ? std::pow (0.96 * c.feedback, i / d - 1) : 0.0;
            ASSERT_NEAR (out[(size_t) i], expected, 1e-6) << "delay " << c.delay << " at " << i;
        }
    }
}

TEST (DelayLine, BaseDelayIsTheTimeInSamplesWithinOneSampleAndTwoSeconds)
{
    DelayLine line;
    for (auto [ms, samples] : { std::pair (120.0f, 5292.0f), { 2000.0f, 88200.0f }, { 2500.0f, 88200.0f }, { 0.0f, 1.0f }, { -3.0f, 1.0f }, { NAN, 88200.0f } })
        EXPECT_FLOAT_EQ (line.baseDelayFor (ms), samples) << ms << " ms";
    line.resize (96000.0);
    EXPECT_EQ (line.getLength(), 192000);
}

TEST (DelayLine, ModulationSwingsByTheDistanceToTheNearerEnd)
{
    DelayLine line;
    for (auto [base, low, high] : { std::tuple (1500.0f, 1000.0f, 2000.0f), { 500.0f, 0.0f, 1000.0f } })
    {
        line.setBaseDelay (line.baseDelayFor (base));
        line.modulateTime (1.0f, -1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), low * 44.1f) << base;
        line.modulateTime (0.5f, 1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), (base + high) * 0.5f * 44.1f) << base;
    }
    // Feedback factors; a loud envelope (2) is not clamped.
    for (auto [base, m, factor] : { std::tuple (0.4f, -1.0f, 0.0f), { 0.4f, 1.0f, 0.8f }, { 0.8f, -1.0f, 0.6f }, { 0.8f, 1.0f, 1.0f }, { 0.8f, 2.0f, 1.2f }, { 0.0f, 1.0f, 0.0f } })
    {
        line.setBaseFeedback (base);
        line.modulateFeedback (1.0f, m);
        EXPECT_NEAR (line.getFeedback(), factor, 1e-6) << base << ", " << m;
    }
}
