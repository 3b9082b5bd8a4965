#pragma once

#include "Simd.h"

#include <cmath>
#include <limits>

namespace veltrane
{

// A one-pole peak follower with separate attack and release times. Its output, the envelope,
// is never negative; it exceeds 1 when the (already scaled) input exceeds full scale.
// Audio thread only.
class EnvelopeFollower
{
public:
    void setSampleRate (double newSampleRate) noexcept { sampleRate = newSampleRate; }

    // Once per block. Times in ms; 0 gives a coefficient of 0, i.e. instant following.
    void setTimes (float attackMs, float releaseMs) noexcept
    {
        const auto rate = (double) (float) sampleRate;
        attackSamples = (float) ((double) attackMs * 0.001 * rate);
        releaseSamples = (float) ((double) releaseMs * 0.001 * rate);
        attackCoefficient = std::exp (-1.0f / attackSamples);
        releaseCoefficient = std::exp (-1.0f / releaseSamples);
        attackGain = 1.0f - attackCoefficient;
        releaseGain = 1.0f - releaseCoefficient;
    }

    void reset() noexcept
    {
        lastInput = 0.0f;
        envelope = 0.0f;
    }

    float process (float input) noexcept
    {
        lastInput = magnitude (input);
        envelope = follow (lastInput, envelope, attackGain, attackCoefficient, releaseGain, releaseCoefficient);
        return envelope;
    }

    // |input|, with inf and NaN counted as silence so that they cannot stick in the state.
    // T is float, or simd::Float4 for followers side by side.
    template <typename T>
    static T magnitude (T input) noexcept
    {
        const T a = simd::abs (input);
        return simd::select (a <= T {} + std::numeric_limits<float>::max(), a, T {});
    }

    // One step: both candidates are formed before the comparison picks one, which keeps the
    // comparison off the sample-to-sample dependency chain; equality counts as falling.
    template <typename T>
    static T follow (T a, T previous, T attackGain, T attackCoefficient, T releaseGain, T releaseCoefficient) noexcept
    {
        const T rising = attackGain * a + attackCoefficient * previous;
        const T falling = releaseGain * a + releaseCoefficient * previous;
        return simd::select (a > previous, rising, falling);
    }

    // For callers that run several followers side by side from local copies of their state.
    void setState (float newEnvelope, float newLastInput) noexcept
    {
        envelope = newEnvelope;
        lastInput = newLastInput;
    }

    float getAttackGain() const noexcept { return attackGain; }
    float getReleaseGain() const noexcept { return releaseGain; }
    float getEnvelope() const noexcept { return envelope; }
    float getAttackSamples() const noexcept { return attackSamples; }
    float getReleaseSamples() const noexcept { return releaseSamples; }
    float getAttackCoefficient() const noexcept { return attackCoefficient; }
    float getReleaseCoefficient() const noexcept { return releaseCoefficient; }

private:
    float attackSamples = 0.0f;
    float releaseSamples = 0.0f;
    float attackCoefficient = 0.0f;
    float releaseCoefficient = 0.0f;
    float attackGain = 1.0f;  // 1 - attackCoefficient
    float releaseGain = 1.0f; // 1 - releaseCoefficient
    float lastInput = 0.0f;
    float envelope = 0.0f;
    double sampleRate = 44100.0;
};

} // namespace veltrane
