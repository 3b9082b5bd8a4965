#include "Lfo.h"

#include "SeededRandom.h"

#include <cmath>

namespace veltrane
{

Lfo::Lfo (int64_t seed) noexcept
{
    constexpr int half = tableSize / 2;
    const auto n = (float) tableSize;
    const auto h = (float) half;
    const auto w = (float) (6.283185307179586 / tableSize);
    SeededRandom random (seed);

    for (int i = 0; i < tableSize; ++i)
    {
        const auto x = (float) i;
        tables[sine][(size_t) i] = std::sin (x * w);
        tables[square][(size_t) i] = i < half ? 1.0f : -1.0f;
        tables[sawUp][(size_t) i] = (x / n) * 2.0f - 1.0f;
        tables[sawDown][(size_t) i] = (1.0f - x / n) * 2.0f - 1.0f;
        tables[triangle][(size_t) i] = i < half ? (x / h) * 2.0f - 1.0f : 3.0f - (x / h) * 2.0f;
        tables[sampleAndHold][(size_t) i] = random.nextFloat() * 2.0f - 1.0f;
    }
}

void Lfo::setWave (int newWave) noexcept
{
    if (newWave >= 0 && newWave < numWaves)
        wave = newWave;
}

void Lfo::setSyncedFrequency (float tempoBpm, int division) noexcept
{
    // Length of each division in bars, from "8 Bars" (0) to "1/128D" (17); every dotted
    // division (odd index from 5 on) shares the length of the plain one before it.
    static constexpr float bars[] = { 8.0f, 4.0f, 2.0f, 1.0f,
                                      0.5f, 0.5f, 0.25f, 0.25f, 0.125f, 0.125f, 0.0625f, 0.0625f,
                                      0.03125f, 0.03125f, 0.015625f, 0.015625f, 0.0078125f, 0.0078125f };

    if (division < 0 || division > 17)
        return;

    const auto barMs = 60000.0f / tempoBpm * 4.0f; // a bar of four beats; 0 bpm gives infinity
    frequency = 1000.0f / (barMs * bars[division]);

    if (division >= 5 && (division & 1) != 0)
        frequency = (float) ((double) frequency * 0.75);
}

void Lfo::updateIncrement() noexcept
{
    auto increment = ((float) tableSize / (float) sampleRate) * frequency;

    // The tick wraps the phase only once per sample, so the increment must stay below one
    // cycle per sample; a negative or non-finite rate (nonsense tempo) stands still, as 0 bpm does.
    if (! (increment >= 0.0f && increment <= 1.0e30f))
        increment = 0.0f;
    else if (increment >= (float) tableSize)
        increment = std::fmod (increment, (float) tableSize);

    motion.phaseIncrement = increment;
}

} // namespace veltrane
