#include "dsp/DelayLine.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <vector>

using veltrane::DelayLine;

namespace
{
// An impulse through the line in one block: four samples at a time where the delay allows.
std::vector<float> impulseResponse (DelayLine& line, int n)
{
    std::vector<float> in ((size_t) n, 0.0f), out ((size_t) n);
    in[0] = 1.0f;
    line.process (in.data(), nullptr, nullptr, out.data(), n);
    return out;
}
}

TEST (DelayLine, ImpulseRepeatsEveryDelayAt0_96TimesTheFeedback)
{
    // 100 samples run four at a time, 3 and 1 one at a time; the whole length reads the oldest entry.
    const struct { int delay; float feedback; int length; } cases[] { { 100, 1.0f, 401 }, { 3, 1.0f, 40 },
                                                                       { 1, 0.5f, 10 }, { 88200, 0.0f, 88201 } };
    for (const auto& c : cases)
    {
        DelayLine line;
        line.setBaseDelay ((float) c.delay);
        line.setBaseFeedback (c.feedback);
        const auto out = impulseResponse (line, c.length);

        for (int i = 0; i < c.length; ++i)
            ASSERT_NEAR (out[(size_t) i], i > 0 && i % c.delay == 0 ? std::pow (0.96 * c.feedback, i / c.delay - 1) : 0.0, 1e-6)
                << "delay " << c.delay << " at " << i;
    }
}

TEST (DelayLine, FractionalDelayInterpolatesInAStraightLine)
{
    for (float delay : { 10.25f, 2.25f })   // four at a time, one at a time
    {
        DelayLine line;
        line.setBaseDelay (delay);
        const auto out = impulseResponse (line, 20);
        const auto at = (size_t) delay;
        EXPECT_FLOAT_EQ (out[at], 0.75f) << delay;
        EXPECT_FLOAT_EQ (out[at + 1], 0.25f) << delay;
        EXPECT_FLOAT_EQ (out[at - 1] + out[at + 2], 0.0f) << delay;
    }
}

TEST (DelayLine, BaseDelayIsTheTimeInSamplesWithinOneSampleAndTheLength)
{
    DelayLine line;
    const std::pair<float, float> cases[] { { 120.0f, 5292.0f }, { 2000.0f, 88200.0f }, { 2500.0f, 88200.0f }, { 0.0f, 1.0f },
                                            { -3.0f, 1.0f }, { std::numeric_limits<float>::quiet_NaN(), 88200.0f } };
    for (auto [ms, samples] : cases)
        EXPECT_FLOAT_EQ (line.baseDelayFor (ms), samples) << ms << " ms";

    line.resize (48000.0);
    EXPECT_EQ (line.getLength(), 96000);
    line.resize (96000.0);
    EXPECT_EQ (line.getLength(), 192000);
}

TEST (DelayLine, ModulationSwingsBaseByTheDistanceToTheNearerEnd)
{
    DelayLine line;
    const struct { float base, low, high; } times[] { { 1500.0f, 1000.0f, 2000.0f }, { 500.0f, 0.0f, 1000.0f } };
    for (const auto& t : times)
    {
        line.setBaseDelay (line.baseDelayFor (t.base));
        line.modulateTime (1.0f, -1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), t.low * 44.1f) << t.base;
        line.modulateTime (0.5f, 1.0f);
        EXPECT_FLOAT_EQ (line.getDelaySamples(), (t.base + t.high) * 0.5f * 44.1f) << t.base;
    }

    const struct { float base, low, high; } feedbacks[] { { 0.4f, 0.0f, 0.8f }, { 0.8f, 0.6f, 1.0f }, { 0.0f, 0.0f, 0.0f } };
    for (const auto& f : feedbacks)
    {
        line.setBaseFeedback (f.base);
        line.modulateFeedback (1.0f, -1.0f);
        EXPECT_NEAR (line.getFeedback(), f.low, 1e-7) << f.base;
        line.modulateFeedback (1.0f, 1.0f);
        EXPECT_NEAR (line.getFeedback(), f.high, 1e-7) << f.base;
    }

    line.setBaseFeedback (0.8f);
    line.modulateFeedback (1.0f, 2.0f);   // a loud envelope is not clamped
    EXPECT_FLOAT_EQ (line.getFeedback(), 1.2f);
}
