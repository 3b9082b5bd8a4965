#include "dsp/OutputStage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>

using veltrane::OutputStage;

TEST (OutputStage, SoftClipperIsTheCubic)
{
    EXPECT_NEAR (OutputStage::softClip (1.0f), 0.833333f, 1e-6);
    EXPECT_NEAR (OutputStage::softClip (std::sqrt (2.0f)), 0.942809f, 1e-6);
    EXPECT_NEAR (OutputStage::softClip (-std::sqrt (2.0f)), -0.942809f, 1e-6);
    EXPECT_NEAR (OutputStage::softClip (std::sqrt (6.0f)), 0.0f, 1e-6);
    EXPECT_FLOAT_EQ (OutputStage::softClip (3.0f), -1.5f);
}

TEST (OutputStage, HardClipperDriveRunsFromOneToTen)
{
    EXPECT_NEAR (OutputStage::hardClip (1.0f, OutputStage::hardClipDrive (0.0f)), 0.761594f, 1e-6);
    EXPECT_NEAR (OutputStage::hardClip (0.1f, OutputStage::hardClipDrive (1.0f)), 0.761594f, 1e-6);
    EXPECT_NEAR (OutputStage::hardClip (-0.1f, OutputStage::hardClipDrive (1.0f)), -0.761594f, 1e-6);
}

TEST (OutputStage, DirtNeverExceedsTanhOfSinOfOne)
{
    EXPECT_NEAR (OutputStage::dirt (0.1f, OutputStage::dirtDrive (0.0f)), 0.571426f, 1e-6);

    for (auto v : { 100.0f, 1.0e6f, 1.0e15f })
    {
        EXPECT_NEAR (OutputStage::dirt (v, OutputStage::dirtDrive (0.0f)), 0.686587f, 1e-5) << v;
        EXPECT_NEAR (OutputStage::dirt (-v, OutputStage::dirtDrive (1.0f)), -0.686587f, 1e-5) << v;
    }

    for (float v = -4.0f; v <= 4.0f; v += 0.001f)
        ASSERT_LE (std::fabs (OutputStage::dirt (v, OutputStage::dirtDrive (0.37f))), std::tanh (std::sin (1.0f)) + 1e-6f);
}

TEST (OutputStage, DirtFollowsTheCurveToTheLastBit)
{
    auto ulpDistance = [] (float a, float b)
    {
        int32_t ia, ib;
        std::memcpy (&ia, &a, sizeof a);
        std::memcpy (&ib, &b, sizeof b);
        ia = ia < 0 ? std::numeric_limits<int32_t>::min() - ia : ia;
        ib = ib < 0 ? std::numeric_limits<int32_t>::min() - ib : ib;
        return std::abs ((int64_t) ia - (int64_t) ib);
    };

    // Against the double-precision functions rounded to float at each step, and against
    // the single-precision library, whose tanhf itself strays by up to 2 ulp.
    int64_t worstToRounded = 0, worstToLibrary = 0;

    for (auto amount : { 0.0f, 0.013f, 0.4f, 1.0f })
    {
        const auto drive = OutputStage::dirtDrive (amount);

        for (float v = -2.0f; v <= 2.0f; v += 1.0e-5f)
        {
            const auto t = drive * v;
            const auto u = t / std::sqrt (t * t + 1.0f);
            const auto rounded = (float) std::tanh ((double) (float) std::sin ((double) u));
            const auto library = std::tanh (std::sin (u));
            const auto y = OutputStage::dirt (v, drive);
            worstToRounded = std::max (worstToRounded, ulpDistance (y, rounded));
            worstToLibrary = std::max (worstToLibrary, ulpDistance (y, library));
        }
    }

    EXPECT_LE (worstToRounded, 1);
    EXPECT_LE (worstToLibrary, 3);
}

TEST (OutputStage, ZeroBalanceWithDryPassesTheInput)
{
    OutputStage stage;
    stage.balance = 0.0f;

    for (auto x : { 0.3f, -1.0f, 7.5f })
        EXPECT_EQ (stage.shape (stage.blend (123.0f, x)), x);

    stage.balance = 0.25f;
    EXPECT_FLOAT_EQ (stage.blend (1.0f, -1.0f), -0.5f);
}
