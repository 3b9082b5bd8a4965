#include "dsp/EnvelopeFollower.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using veltrane::EnvelopeFollower;

TEST (EnvelopeFollower, CoefficientsAt44100Hz)
{
    EnvelopeFollower follower;
    follower.setTimes (1.0f, 2.0f);
    EXPECT_FLOAT_EQ (follower.getAttackSamples(), 44.1f);
    EXPECT_FLOAT_EQ (follower.getReleaseSamples(), 88.2f);
    EXPECT_NEAR (follower.getAttackCoefficient(), 0.977579f, 5e-7);
    EXPECT_NEAR (follower.getReleaseCoefficient(), 0.988726f, 5e-7);

    follower.setSampleRate (48000.0);
    follower.setTimes (12.0f, 0.0f);
    EXPECT_FLOAT_EQ (follower.getAttackSamples(), 576.0f);
    EXPECT_EQ (follower.getReleaseCoefficient(), 0.0f);
}

TEST (EnvelopeFollower, ZeroTimesFollowTheMagnitudeExactly)
{
    EnvelopeFollower follower;
    follower.setTimes (0.0f, 0.0f);

    for (auto x : { 0.5f, -0.25f, 0.0f, 1.75f, -3.0f, 1.0e-30f, -0.125f })
        EXPECT_EQ (follower.process (x), std::fabs (x));
}

TEST (EnvelopeFollower, RisesWithAttackAndFallsWithRelease)
{
    EnvelopeFollower follower;
    follower.setTimes (1.0f, 2.0f);
    const auto a = follower.getAttackCoefficient();
    const auto r = follower.getReleaseCoefficient();

    const auto first = follower.process (1.0f);
    EXPECT_FLOAT_EQ (first, 1.0f - a);
    EXPECT_FLOAT_EQ (follower.process (0.0f), r * first);
}

TEST (EnvelopeFollower, ConstantInputConvergesToItsMagnitude)
{
    // The input is already scaled by the sensitivity: +6 dB on a full-scale input.
    for (auto m : { 0.5f, 1.0f, 1.995262f })
    {
        EnvelopeFollower follower;
        follower.setTimes (1.0f, 2.0f);
        float e = 0.0f;

        for (int i = 0; i < 44100; ++i)
            e = follower.process (i % 2 == 0 ? m : -m);

        EXPECT_NEAR (e, m, 1e-5f * m);
    }
}

TEST (EnvelopeFollower, ResetStartsFromZero)
{
    EnvelopeFollower follower;
    follower.setTimes (1.0f, 2.0f);

    for (int i = 0; i < 100; ++i)
        follower.process (0.8f);

    follower.reset();
    EXPECT_EQ (follower.getEnvelope(), 0.0f);
    EXPECT_FLOAT_EQ (follower.process (1.0f), 1.0f - follower.getAttackCoefficient());
}

TEST (EnvelopeFollower, NonFiniteInputDoesNotStick)
{
    for (auto bad : { std::numeric_limits<float>::infinity(), -std::numeric_limits<float>::infinity(),
                      std::numeric_limits<float>::quiet_NaN() })
    {
        EnvelopeFollower follower;
        follower.setTimes (0.0f, 0.0f);
        follower.process (0.5f);
        EXPECT_TRUE (std::isfinite (follower.process (bad)));
        EXPECT_EQ (follower.process (0.25f), 0.25f);
    }
}
