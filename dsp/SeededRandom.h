#pragma once

#include <cstdint>

namespace veltrane
{

// The 48-bit linear congruential generator of juce::Random, without JUCE, for the engine's
// random tables and for Randomize: a SeededRandom and a juce::Random constructed with the
// same seed draw the same bits and the same floats, except that the few float draws that
// round up to 1.0 stay 1.0 here.
class SeededRandom
{
public:
    explicit SeededRandom (int64_t initialSeed) noexcept : seed (initialSeed) {}

    int64_t getSeed() const noexcept { return seed; }

    // 32 random bits: seed = (seed * 25214903917 + 11) mod 2^48, result = seed >> 16.
    uint32_t nextBits() noexcept
    {
        seed = (int64_t) ((((uint64_t) seed) * 0x5deece66dULL + 11) & 0xffffffffffffULL);
        return (uint32_t) (seed >> 16);
    }

    // The 32 bits as a float times 2^-32: uniform over [0, 1], where the top 128 of the 2^32
    // draws round to exactly 1.0 (juce::Random::nextFloat moves those just below 1). Kept,
    // so that a choice parameter drawn by Randomize can land on its last entry.
    float nextFloat() noexcept
    {
        return (float) nextBits() * 2.3283064e-10f;
    }

    int64_t nextInt64() noexcept
    {
        const auto high = (uint64_t) nextBits();
        return (int64_t) ((high << 32) | (uint64_t) nextBits());
    }

private:
    static_assert (2.3283064e-10f == 1.0f / 4294967296.0f, "the scale must be exactly 2^-32");

    int64_t seed;
};

} // namespace veltrane
