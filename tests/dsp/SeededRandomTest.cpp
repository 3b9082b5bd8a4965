#include "dsp/SeededRandom.h"

#include <gtest/gtest.h>

using veltrane::SeededRandom;

// Reference draws printed by juce::Random (JUCE 7.0.5) constructed with the same seeds.
TEST (SeededRandom, ReproducesJuceRandomNextFloat)
{
    struct Case { int64_t seed; float draws[4]; int64_t nextInt64; };
    const Case cases[] = {
        { 0, { 0.0f, 0.000985394465f, 0.041631002f, 0.176642641f }, 6725724361348706664LL },
        { 12345, { 0.105881572f, 0.798259735f, 0.0160589572f, 0.664036632f }, 791993983699685453LL },
        { -7, { 0.999372959f, 0.884210944f, 0.228441775f, 0.784304738f }, 6579662127546429028LL },
        { 0x123456789abcLL, { 0.097699739f, 0.408675671f, 0.962656319f, 0.49226281f }, -8049847530605200061LL },
    };

    for (const auto& c : cases)
    {
        SeededRandom random (c.seed);

        for (auto expected : c.draws)
            EXPECT_EQ (random.nextFloat(), expected) << "seed " << c.seed;

        EXPECT_EQ (random.nextInt64(), c.nextInt64) << "seed " << c.seed;
    }
}

TEST (SeededRandom, DrawThatRoundsToOneIsOne)
{
    // This seed's first state has its top 32 bits all set, which rounds to 1.0f as a float.
    SeededRandom random (76518726186285LL);
    EXPECT_EQ (random.nextFloat(), 1.0f);
}
