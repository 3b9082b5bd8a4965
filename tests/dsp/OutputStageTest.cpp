#include "dsp/OutputStage.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

TEST (OutputStage, CurvesGiveTheDocumentedFigures)
{
    const struct { Shaper shaper; float amount, v, y; } cases[] {
        { Shaper::softClipper, 0.0f, 1.0f, 0.833333f }, { Shaper::softClipper, 0.7f, std::sqrt (2.0f), 0.942809f },
        { Shaper::softClipper, 0.0f, 3.0f, -1.5f },     { Shaper::hardClipper, 0.0f, 1.0f, 0.761594f },
        { Shaper::hardClipper, 1.0f, 0.1f, 0.761594f }, { Shaper::dirt, 0.0f, 0.1f, 0.571426f },
        { Shaper::dirt, 1.0f, -1.0e6f, -0.686587f },    { Shaper::dry, 1.0f, 7.5f, 7.5f },
    };

    for (const auto& c : cases)
    {
        OutputStage stage;
        stage.shaper = (int) c.shaper;
        stage.amount = c.amount;
        EXPECT_NEAR (stage.shape (c.v), c.y, 2e-6) << (int) c.shaper << " at " << c.v;
    }
}

TEST (OutputStage, DriveRisesInAStraightLineWithTheAmount)
{
    for (auto amount : { 0.0f, 0.25f, 0.5f, 0.9f, 1.0f })
    {
        OutputStage hard, dirt;
        hard.shaper = (int) Shaper::hardClipper;
        dirt.shaper = (int) Shaper::dirt;
        hard.amount = dirt.amount = amount;

        for (float v = -2.0f; v <= 2.0f; v += 0.0025f)
        {
            const auto t = (10.0 + 390.0 * amount) * v;
            ASSERT_NEAR (hard.shape (v), std::tanh ((1.0 + 9.0 * amount) * v), 1e-6) << amount << ", " << v;
            ASSERT_NEAR (dirt.shape (v), std::tanh (std::sin (t / std::sqrt (t * t + 1.0))), 2e-6) << amount << ", " << v;
        }
    }
}

TEST (OutputStage, BlendWeighsWetAgainstDry)
{
    OutputStage stage;
    for (auto [balance, y] : { std::pair (0.0f, -1.0f), { 0.25f, -0.5f }, { 1.0f, 1.0f } })
    {
        stage.balance = balance;
        EXPECT_FLOAT_EQ (stage.blend (1.0f, -1.0f), y) << balance;
    }
}
