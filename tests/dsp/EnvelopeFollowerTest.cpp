#include "dsp/EnvelopeFollower.h"

#include <gtest/gtest.h>

#include <limits>

using veltrane::EnvelopeFollower;

TEST (EnvelopeFollower, RisesWithTheAttackAndFallsWithTheReleaseCoefficient)
{
    EnvelopeFollower follower;
    follower.setTimes (1.0f, 2.0f);   // 44.1 and 88.2 samples at 44100 Hz
    const auto attack = 0.977579f, release = 0.988726f;
    EXPECT_NEAR (follower.getAttackCoefficient(), attack, 5e-7);
    EXPECT_NEAR (follower.getReleaseCoefficient(), release, 5e-7);

    const auto risen = follower.process (-1.0f);
    EXPECT_NEAR (risen, 1.0f - attack, 1e-6);
    EXPECT_NEAR (follower.process (0.0f), release * risen, 1e-7);
    EXPECT_NEAR (follower.process (release * risen), release * risen, 1e-7);   // equal counts as falling
}

TEST (EnvelopeFollower, ZeroTimesFollowTheMagnitudeAndNonFiniteInputIsSilence)
{
    EnvelopeFollower follower;
    follower.setTimes (0.0f, 0.0f);
    const auto inf = std::numeric_limits<float>::infinity(), nan = std::numeric_limits<float>::quiet_NaN();

    for (auto [x, e] : { std::pair (0.5f, 0.5f), { -0.25f, 0.25f }, { inf, 0.0f }, { 1.75f, 1.75f }, { nan, 0.0f }, { -3.0f, 3.0f } })
        EXPECT_EQ (follower.process (x), e) << x;
}
