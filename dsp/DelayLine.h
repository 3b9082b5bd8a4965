#pragma once

#include "Simd.h"

#include <vector>

namespace veltrane
{

// One channel of one feedback delay: a circular buffer two seconds long, read (with
// straight-line interpolation) before it is written, so the loop hears the previous output.
// Resize and clear run on the message thread (prepareToPlay); everything else on the audio
// thread, allocation-free.
class DelayLine
{
public:
    static constexpr int initialLength = 88200; // two seconds at 44100 Hz

    explicit DelayLine (double initialSampleRate = 44100.0);

    // Allocates a zeroed buffer that keeps the two seconds at the new rate; does nothing when
    // the rate is unchanged.
    void resize (double newSampleRate);
    void clear() noexcept;

    int getLength() const noexcept { return length; }
    double getSampleRate() const noexcept { return sampleRate; }

    // Delay in samples for a smoothed time in ms, clamped to [1, length]; NaN gives length.
    float baseDelayFor (float timeMs) const noexcept
    {
        auto d = (float) ((double) (float) sampleRate * (double) timeMs * 0.001);

        if (! (d <= (float) length))
            d = (float) length;
        else if (d <= 0.0f)
            d = 1.0f;

        return d;
    }

    void setBaseDelay (float samples) noexcept { delaySamples = baseDelaySamples = samples; }
    void setBaseFeedback (float factor) noexcept { feedback = baseFeedback = factor; }

    // Swing the delay around its base by up to the distance to the nearer end of the buffer;
    // depth in [0, 1], source value m normally in [-1, 1].
    void modulateTime (float depth, float m) noexcept { delaySamples = modulatedDelay (baseDelaySamples, depth, m); }

    // T is float, or simd::Float4 for four samples at once.
    template <typename T>
    T modulatedDelay (T base, float depth, T m) const noexcept
    {
        const auto size = T {} + (float) length;
        const T headroom = simd::select (base > size * 0.5f, size - base, base);
        return headroom * depth * m + base;
    }

    // Likewise for the feedback factor, swinging it by up to its distance to 0 or 1. Not
    // clamped: a source above 1 may push the factor above 1.
    void modulateFeedback (float depth, float m) noexcept { feedback = feedbackSwing (depth) * m + baseFeedback; }

    // headroom * depth: the factor swings by this times the source value around its base.
    float feedbackSwing (float depth) const noexcept
    {
        const auto headroom = baseFeedback > 0.5f ? 1.0f - baseFeedback : baseFeedback;
        return headroom * depth;
    }

    float process (float input) noexcept
    {
        float out;
        process (&input, &delaySamples, &feedback, &out, 1);
        return out;
    }

    // n samples: input[j] in, output[j] out, with the delay delays[j] and the feedback factor
    // feedbacks[j]; a null delays or feedbacks uses the current delaySamples or feedback for
    // every sample. The delay is kept within [0, length] so that the line never reads outside
    // its buffer. Leaves delaySamples and feedback at the last values used.
    void process (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept;

    // Both lines of a channel over the same n samples, exactly as first.process and then
    // second.process would run them sample by sample: the first line takes input; the second
    // takes input too, or, chained, the first's output of the same sample. The lines share
    // their write position (they are resized, cleared and run together), and run side by side.
    static void processPair (DelayLine& first, DelayLine& second, bool chained, const float* input,
                             const float* firstDelays, const float* firstFeedbacks, float* firstOutput,
                             const float* secondDelays, const float* secondFeedbacks, float* secondOutput, int n) noexcept;

    float getDelaySamples() const noexcept { return delaySamples; }
    float getBaseDelaySamples() const noexcept { return baseDelaySamples; }
    float getFeedback() const noexcept { return feedback; }
    float getBaseFeedback() const noexcept { return baseFeedback; }
    float getReadPosition() const noexcept { return readPosition; }
    int getWriteIndex() const noexcept { return writeIndex; }

private:
    template <bool perSampleDelay, bool perSampleFeedback>
    void run (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept;

    template <typename FirstSettings, typename SecondSettings, bool chained>
    static void runPair (DelayLine& first, DelayLine& second, const float* input,
                         const float* firstDelays, const float* firstFeedbacks, float* firstOutput,
                         const float* secondDelays, const float* secondFeedbacks, float* secondOutput, int n) noexcept;

    int length = initialLength;
    float delaySamples;
    float feedback = 0.0f;
    double sampleRate;
    std::vector<float> buffer; // length + 1 entries: the last mirrors the first for the interpolation
    float readPosition = 0.0f;
    int writeIndex = 0;
    float baseDelaySamples = 0.0f;
    float baseFeedback = 0.0f;
};

} // namespace veltrane
