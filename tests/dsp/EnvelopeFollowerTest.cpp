#include "dsp/EnvelopeFollower.h"

#include <gtest/gtest.h>

using veltrane::EnvelopeFollower;

TEST (EnvelopeFollower, RisesWithTheAttackFallsWithTheReleaseAndTakesNonFiniteInputAsSilence)
{
    EnvelopeFollower follower;
    follower.setTimes (1.0f, 2.0f);   // 44.1 and 88.2 samples at 44100 Hz
    const auto risen = follower.process (-1.0f);
    EXPECT_NEAR (risen, 1.0f - 0.977579f, 5e-7);
    EXPECT_NEAR (follower.process (0.0f), 0.988726f * risen, 1e-8);

    follower.setTimes (0.0f, 0.0f);   // instant
    for (auto [x, e] : { std::pair (0.5f, 0.5f), { -0.25f, 0.25f }, { INFINITY, 0.0f }, { 1.75f, 1.75f }, { NAN, 0.0f }, { -3.0f, 3.0f } })
        EXPECT_EQ (follower.process (x), e) << x;
}
