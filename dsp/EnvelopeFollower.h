#pragma once

#include <cmath>
#include <limits>

namespace veltrane
{

// A one-pole peak follower with separate attack and release times. Its output, the envelope,
// is never negative; it exceeds 1 when the (already scaled) input exceeds full scale.
// Small and trivially copyable, so a caller may run it from a local copy. Audio thread only.
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
        auto a = std::fabs (input);

        if (! (a <= std::numeric_limits<float>::max())) // inf or NaN must not stick in the state
            a = 0.0f;

        lastInput = a;

        // Both candidates are formed before the comparison picks one, which keeps the
        // comparison off the sample-to-sample dependency chain; equality counts as falling.
        const auto rising = attackGain * a + attackCoefficient * envelope;
        const auto falling = releaseGain * a + releaseCoefficient * envelope;
        envelope = a > envelope ? rising : falling;
        return envelope;
    }

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
