#pragma once

#include <cstdint>
#include <limits>

namespace veltrane
{

// The 48-bit linear congruential generator of juce::Random, reproduced bit for bit so that
// the engine's random tables can be built (and tested) without JUCE: a SeededRandom and a
// juce::Random constructed with the same seed draw the same numbers.
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

    // Uniform in [0, 1): the 32 bits as a float times 2^-32. The few draws that round up to
    // 1.0 give the float just below 1, as juce::Random::nextFloat does.
    float nextFloat() noexcept
    {
        const auto result = (float) nextBits() * 2.3283064e-10f;
        return result == 1.0f ? 1.0f - std::numeric_limits<float>::epsilon() : result;
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
