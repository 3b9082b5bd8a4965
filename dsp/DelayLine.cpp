#include "DelayLine.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace veltrane
{

DelayLine::DelayLine (double initialSampleRate)
    : delaySamples ((float) (initialSampleRate * 0.1)),
      sampleRate (initialSampleRate),
      buffer ((size_t) initialLength + 1, 0.0f)
{
}

void DelayLine::resize (double newSampleRate)
{
    if (newSampleRate == sampleRate)
        return;

    length = (int) (newSampleRate / sampleRate * (double) length);
    buffer.assign ((size_t) length + 1, 0.0f);
    buffer.shrink_to_fit();
    writeIndex = 0;
    sampleRate = newSampleRate;
}

void DelayLine::clear() noexcept
{
    std::fill (buffer.begin(), buffer.end(), 0.0f);
    writeIndex = 0;
    readPosition = 0.0f;
}

void DelayLine::process (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept
{
    if (feedbacks != nullptr)
        run<true> (input, delays, feedbacks, output, n);
    else
        run<false> (input, delays, &feedback, output, n);
}

template <bool perSampleFeedback>
void DelayLine::run (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept
{
    if (n <= 0)
        return;

    float* const data = buffer.data();
    const int size = length;
    const auto sizeF = (float) size;
    const auto constantFeedback = (double) feedbacks[0] * 0.96;
    int w = writeIndex;
    float position = readPosition;

    for (int j = 0; j < n; ++j)
    {
        // Clamped to [0, length]: a delay pushed past either end (a source above 1, NaN)
        // reads the oldest entry instead of memory outside the buffer.
        const auto d = std::min (std::max (0.0f, delays[j]), sizeF);

        position = (float) w - d;

        if (position < 0.0f)
            position += sizeF;

        if (position >= sizeF) // a tiny negative position plus the length can round up to it
            position -= sizeF;

        const auto index = (int) position;
        const auto fraction = position - (float) index;
        const auto current = data[index];
        const auto out = current + (data[index + 1] - current) * fraction;

        // feedback * 0.96 caps the loop gain at 0.96 for 100 % feedback.
        const auto loopGain = perSampleFeedback ? (double) feedbacks[j] * 0.96 : constantFeedback;
        const auto sum = loopGain * (double) out + (double) input[j];

        // An overflowing loop (feedback pushed above 1) must not leave inf or NaN circulating
        // for ever; such a slot is dropped to silence instead.
        const auto written = std::fabs (sum) <= (double) std::numeric_limits<float>::max() ? (float) sum : 0.0f;

        data[w] = written;

        if (w == 0)
            data[size] = written;

        if (++w == size)
            w = 0;

        output[j] = out;
    }

    writeIndex = w;
    readPosition = position;
    delaySamples = delays[n - 1];

    if constexpr (perSampleFeedback)
        feedback = feedbacks[n - 1];
}

} // namespace veltrane
