#pragma once

#include "Simd.h"

#include <array>
#include <cstddef>
#include <cstdint>

namespace veltrane
{

// A table-lookup low-frequency oscillator: six waves of 1024 points each, no interpolation
// (a staircase of 1024 steps per cycle). "Sample & Hold" walks through a random table that is
// drawn once, at construction, from the object's own seed. Audio thread only, allocation-free.
class Lfo
{
public:
    static constexpr int tableSize = 1024;
    static constexpr int numWaves = 6;

    enum Wave { sine, square, sawUp, sawDown, triangle, sampleAndHold };

    // The part of the oscillator that moves every sample, apart from the tables so that a
    // caller running several oscillators in one loop can keep it in a local copy.
    struct Motion
    {
        float phase = 0.0f;          // position in table points, [0, tableSize)
        float phaseIncrement = 0.0f; // table points per sample, [0, tableSize)
        int lastIndex = tableSize - 1;
        int holdIndex = 0;           // entry of the random table that "Sample & Hold" outputs
    };

    // seed: the state of the generator that fills the "Sample & Hold" table (see SeededRandom).
    explicit Lfo (int64_t seed) noexcept;

    void setSampleRate (double newSampleRate) noexcept { sampleRate = newSampleRate; }

    // Per-block settings, in this order: wave, frequency (free or synced), then the increment.
    void setWave (int newWave) noexcept;               // ignores values outside 0..5
    void setFrequency (float newFrequencyHz) noexcept { frequency = newFrequencyHz; }
    void setSyncedFrequency (float tempoBpm, int division) noexcept; // ignores divisions outside 0..17
    void updateIncrement() noexcept;

    // MIDI note restart: the cycle and the "Sample & Hold" walk begin again.
    void restart() noexcept { motion = Motion { 0.0f, motion.phaseIncrement }; }

    float tick() noexcept { return wave == sampleAndHold ? tick<true> (motion) : tick<false> (motion); }

    template <bool holding>
    float tick (Motion& m) const noexcept
    {
        const auto i = (int) m.phase;
        m.phase += m.phaseIncrement;

        if (m.phase >= (float) tableSize)
            m.phase -= (float) tableSize;

        if constexpr (holding)
        {
            if (i < m.lastIndex) // wrapped since the previous tick
                m.holdIndex = (m.holdIndex + 1) & (tableSize - 1);

            m.lastIndex = i;
            return tables[sampleAndHold][(size_t) m.holdIndex];
        }
        else
        {
            m.lastIndex = i;
            return tables[(size_t) wave][(size_t) i];
        }
    }

    // The motion of four oscillators side by side, one per lane.
    struct Lanes
    {
        simd::Float4 phase, phaseIncrement;
        simd::Int4 lastIndex, holdIndex;
        simd::Int4 holding; // all bits set in the lanes whose wave is "Sample & Hold"
    };

    // tick's steps for four oscillators at once: the phases and the "Sample & Hold" cycle
    // counts move exactly as tick moves them. Returns each lane's table index: the hold
    // position in holding lanes, the point before the step in the others. anyHolding false
    // promises that no lane holds.
    template <bool anyHolding>
    static simd::Int4 tick (Lanes& l) noexcept
    {
        using namespace simd;
        const auto size = splat ((float) tableSize);
        const auto i = truncate (l.phase);
        l.phase += l.phaseIncrement;
        l.phase -= select (l.phase >= size, size, splat (0.0f));

        if constexpr (anyHolding)
            l.holdIndex = (l.holdIndex - ((i < l.lastIndex) & l.holding)) & (tableSize - 1);

        l.lastIndex = i;
        return anyHolding ? select (l.holding, l.holdIndex, i) : i;
    }

    Motion& getMotion() noexcept { return motion; }
    const Motion& getMotion() const noexcept { return motion; }
    int getWave() const noexcept { return wave; }
    float getFrequency() const noexcept { return frequency; }
    float getPhaseIncrement() const noexcept { return motion.phaseIncrement; }
    const std::array<float, tableSize>& getTable (int waveIndex) const noexcept { return tables[(size_t) waveIndex]; }

private:
    double sampleRate = 44100.0;
    float frequency = 1.0f; // Hz
    int wave = sine;
    Motion motion;
    std::array<std::array<float, tableSize>, numWaves> tables {};
};

} // namespace veltrane
