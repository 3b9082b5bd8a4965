#include "dsp/OutputStage.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

TEST (OutputStage, CurvesFollowTheirFormulasWithADriveInAStraightLine)
{
    const struct { Shaper shaper; float amount, v, y; } figures[] {
        { Shaper::softClipper, 0, 1, 0.833333f }, { Shaper::softClipper, 0.7f, std::sqrt (2.0f), 0.942809f }, { Shaper::softClipper, 0, 3, -1.5f },
        { Shaper::hardClipper, 0, 1, 0.761594f }, { Shaper::hardClipper, 1, 0.1f, 0.761594f }, { Shaper::dirt, 0, 0.1f, 0.571426f },
        { Shaper::dirt, 1, -1.0e6f, -0.686587f }, { Shaper::dry, 1, 7.5f, 7.5f } };
    for (const auto& f : figures)
        EXPECT_NEAR ((OutputStage { 1.0f, (int) f.shaper, f.amount }).shape (f.v), f.y, 2e-6) << (int) f.shaper << " at " << f.v;

    for (auto amount : { 0.0f, 0.25f, 0.5f, 0.9f, 1.0f })
        for (float v = -2.0f; v <= 2.0f; v += 0.0025f)
        {
            const auto t = (10.0 + 390.0 * amount) * v;
            ASSERT_NEAR ((OutputStage { 1.0f, (int) Shaper::hardClipper, amount }).shape (v), std::tanh ((1.0 + 9.0 * amount) * v), 1e-6) << amount << ", " << v;
            ASSERT_NEAR ((OutputStage { 1.0f, (int) Shaper::dirt, amount }).shape (v), std::tanh (std::sin (t / std::sqrt (t * t + 1.0))), 2e-6) << amount << ", " << v;
        }

    for (auto [balance, y] : { std::pair (0.0f, -1.0f), { 0.25f, -0.5f }, { 1.0f, 1.0f } })
        EXPECT_FLOAT_EQ ((OutputStage { balance }).blend (1.0f, -1.0f), y) << balance;
}
