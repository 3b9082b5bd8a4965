#include "DelayLine.h"

#include "Simd.h"

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
    if (delays != nullptr)
    {
        if (feedbacks != nullptr)
            run<true, true> (input, delays, feedbacks, output, n);
        else
            run<true, false> (input, delays, &feedback, output, n);
    }
    else
    {
        if (feedbacks != nullptr)
            run<false, true> (input, &delaySamples, feedbacks, output, n);
        else
            run<false, false> (input, &delaySamples, &feedback, output, n);
    }
}

template <bool perSampleDelay, bool perSampleFeedback>
void DelayLine::run (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept
{
    using namespace simd;

    if (n <= 0)
        return;

    float* const data = buffer.data();
    const int size = length;
    const auto sizeF = (float) size;
    const auto constantLoopGain = (double) feedbacks[0] * 0.96; // feedback * 0.96 caps the loop gain at 0.96
    constexpr auto largestFloat = (double) std::numeric_limits<float>::max();
    const auto size4 = splat (sizeF);
    const auto lanes = Int4 { 0, 1, 2, 3 };
    int w = writeIndex;
    float position = readPosition;

    // Clamped to [0, length]: a delay pushed past either end (a source above 1, NaN) reads
    // the oldest entry instead of memory outside the buffer.
    auto clamp = [size4] (Float4 d)
    {
        d = select (d > splat (0.0f), d, splat (0.0f));
        return select (d < size4, d, size4);
    };

    const auto steadyDelay = clamp (splat (delays[0]));
    const auto steadyDelayAllowsGroups = allTrue (steadyDelay > splat (4.0f));

    for (int j = 0; j < n;)
    {
        // Four samples at once where that is exact: the same operations lane by lane, with all
        // reads of the group before its writes. That matches the one-by-one order as long as no
        // lane reads a slot that an earlier lane writes (every delay above 4 samples) and the
        // writes stay short of the end of the buffer.
        if (j + 4 <= n && w <= size - 4)
        {
            const auto d = perSampleDelay ? clamp (load (delays + j)) : steadyDelay;

            if (perSampleDelay ? allTrue (d > splat (4.0f)) : steadyDelayAllowsGroups)
            {
                auto p = toFloat (w + lanes) - d;
                p += select (p < splat (0.0f), size4, splat (0.0f));
                p -= select (p >= size4, size4, splat (0.0f));
                const auto index = truncate (p);
                const auto fraction = p - toFloat (index);
                Float4 current, next;

                if (allTrue (index == index[0] + lanes)) // a steady delay reads neighbouring slots
                {
                    current = load (data + index[0]);
                    next = load (data + index[0] + 1);
                }
                else
                {
                    current = Float4 { data[index[0]], data[index[1]], data[index[2]], data[index[3]] };
                    next = Float4 { data[index[0] + 1], data[index[1] + 1], data[index[2] + 1], data[index[3] + 1] };
                }

                const auto out = current + (next - current) * fraction;
                auto gainLow = splat (constantLoopGain), gainHigh = gainLow;

                if constexpr (perSampleFeedback)
                {
                    const auto f = load (feedbacks + j);
                    gainLow = lowToDouble (f) * 0.96;
                    gainHigh = highToDouble (f) * 0.96;
                }

                const auto in = load (input + j);
                auto sumLow = gainLow * lowToDouble (out) + lowToDouble (in);
                auto sumHigh = gainHigh * highToDouble (out) + highToDouble (in);
                sumLow = select (abs (sumLow) <= splat (largestFloat), sumLow, Double2 {});
                sumHigh = select (abs (sumHigh) <= splat (largestFloat), sumHigh, Double2 {});
                store (data + w, toFloat (sumLow, sumHigh));

                if (w == 0)
                    data[size] = data[0];

                store (output + j, out);
                position = p[3];
                w += 4;
                j += 4;

                if (w == size)
                    w = 0;

                continue;
            }
        }

        position = (float) w - std::min (std::max (0.0f, delays[perSampleDelay ? j : 0]), sizeF);

        if (position < 0.0f)
            position += sizeF;

        if (position >= sizeF) // a tiny negative position plus the length can round up to it
            position -= sizeF;

        const auto index = (int) position;
        const auto fraction = position - (float) index;
        const auto current = data[index];
        const auto out = current + (data[index + 1] - current) * fraction;
        const auto loopGain = perSampleFeedback ? (double) feedbacks[j] * 0.96 : constantLoopGain;
        const auto sum = loopGain * (double) out + (double) input[j];

        // An overflowing loop (feedback pushed above 1) must not leave inf or NaN circulating
        // for ever; such a slot is dropped to silence instead.
        const auto written = std::fabs (sum) <= largestFloat ? (float) sum : 0.0f;
        data[w] = written;

        if (w == 0)
            data[size] = written;

        if (++w == size)
            w = 0;

        output[j] = out;
        ++j;
    }

    writeIndex = w;
    readPosition = position;

    if constexpr (perSampleDelay)
        delaySamples = delays[n - 1];

    if constexpr (perSampleFeedback)
        feedback = feedbacks[n - 1];
}

} // namespace veltrane
