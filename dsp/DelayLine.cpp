#include "DelayLine.h"

#include "StaticDispatch.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <type_traits>

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

namespace
{
    using namespace simd;

    const Int4 lanes { 0, 1, 2, 3 };

    // One sample exactly as described: the delay clamped to [0, length] (a delay pushed past
    // either end, by a source above 1 or NaN, reads the oldest entry instead of memory outside
    // the buffer), one wrap of the read position, straight-line interpolation.
    inline float readOne (const float* data, int w, float delay, float size, float& position) noexcept
    {
        position = (float) w - std::min (std::max (0.0f, delay), size);

        if (position < 0.0f)
            position += size;

        if (position >= size) // a tiny negative position plus the length can round up to it
            position -= size;

        const auto index = (int) position;
        const auto fraction = position - (float) index;
        const auto current = data[index];
        return current + (data[index + 1] - current) * fraction;
    }

    // feedback * 0.96 * out + input in double precision, stored as float, four samples at once.
    // An overflowing loop (feedback pushed above 1) must not leave inf or NaN circulating for
    // ever: such a slot is dropped to silence instead.
    inline Float4 writtenFour (Float4 out, Float4 input, Double2 gainLow, Double2 gainHigh) noexcept
    {
        const auto written = toFloat (gainLow * lowToDouble (out) + lowToDouble (input),
                                      gainHigh * highToDouble (out) + highToDouble (input));
        return select (abs (written) <= splat (std::numeric_limits<float>::max()), written, splat (0.0f));
    }

    // The same for one sample, through the same instructions.
    inline float writtenOne (float out, float input, double loopGain) noexcept
    {
        return writtenFour (splat (out), splat (input), splat (loopGain), splat (loopGain))[0];
    }

    inline Float4 clampDelays (Float4 d, Float4 size) noexcept
    {
        d = select (d > splat (0.0f), d, splat (0.0f));
        return select (d < size, d, size);
    }

    // readOne for four consecutive samples, lane by lane the same operations; the delays are
    // clamped and above 4 samples. A steady delay reads neighbouring slots, loaded at once.
    inline Float4 readFour (const float* data, Float4 writePositions, Float4 delays, Float4 size, Float4& positions) noexcept
    {
        auto p = writePositions - delays;
        p += select (p < splat (0.0f), size, splat (0.0f));
        p -= select (p >= size, size, splat (0.0f));
        const auto index = truncate (p);
        const auto fraction = p - toFloat (index);
        Float4 current, next;

        if (allTrue (index == index[0] + lanes))
        {
            current = load (data + index[0]);
            next = load (data + index[0] + 1);
        }
        else
        {
            current = Float4 { data[index[0]], data[index[1]], data[index[2]], data[index[3]] };
            next = Float4 { data[index[0] + 1], data[index[1] + 1], data[index[2] + 1], data[index[3] + 1] };
        }

        positions = p;
        return current + (next - current) * fraction;
    }

    // A line's view for one run: its delays and loop gains, each steady (one value) or per
    // sample.
    template <bool perSampleDelay, bool perSampleFeedback>
    struct Settings
    {
        const float* delays;
        const float* feedbacks;
        Float4 steadyDelay;
        Double2 steadyGain;
        bool steadyAllowsGroups;

        Settings (const float* d, const float* f, Float4 size)
            : delays (d), feedbacks (f), steadyDelay (clampDelays (splat (d[0]), size)),
              steadyGain (splat ((double) f[0] * 0.96)), steadyAllowsGroups (allTrue (steadyDelay > splat (4.0f))) {}

        float delay (int j) const noexcept { return delays[perSampleDelay ? j : 0]; }
        float feedback (int j) const noexcept { return feedbacks[perSampleFeedback ? j : 0]; }
        double gain (int j) const noexcept { return (double) feedback (j) * 0.96; }

        Float4 delayFour (int j, Float4 size) const noexcept { return perSampleDelay ? clampDelays (load (delays + j), size) : steadyDelay; }
        bool allowsGroup (Float4 d) const noexcept { return perSampleDelay ? allTrue (d > splat (4.0f)) : steadyAllowsGroups; }

        void gainFour (int j, Double2& low, Double2& high) const noexcept
        {
            if constexpr (perSampleFeedback)
            {
                const auto f = load (feedbacks + j);
                low = lowToDouble (f) * 0.96;
                high = highToDouble (f) * 0.96;
            }
            else
            {
                low = high = steadyGain;
            }
        }
    };
}

void DelayLine::process (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept
{
    if (n <= 0)
        return;

    withFlag (delays != nullptr, [&] (auto perSampleDelay) {
        withFlag (feedbacks != nullptr, [&] (auto perSampleFeedback) {
            run<perSampleDelay, perSampleFeedback> (input, perSampleDelay ? delays : &delaySamples,
                                                    perSampleFeedback ? feedbacks : &feedback, output, n);
        });
    });
}

template <bool perSampleDelay, bool perSampleFeedback>
void DelayLine::run (const float* input, const float* delays, const float* feedbacks, float* output, int n) noexcept
{
    float* const data = buffer.data();
    const auto size = splat ((float) length);
    const Settings<perSampleDelay, perSampleFeedback> line (delays, feedbacks, size);
    int w = writeIndex;
    auto positions = splat (readPosition); // lane 3: the latest read position

    for (int j = 0; j < n;)
    {
        // Runs of four samples at once where that is exact: all reads of a group happen before
        // its writes, which matches the one-by-one order as long as no lane reads a slot that
        // an earlier lane writes (every delay above 4 samples) and the writes stay short of the
        // buffer's end; one sample at a time where not.
        const auto groups = std::min (n - j, length - w) / 4;
        auto writePositions = toFloat (w + lanes);
        int g = 0;

        for (; g < groups; ++g, j += 4, w += 4, writePositions += 4.0f)
        {
            const auto d = line.delayFour (j, size);

            if (! line.allowsGroup (d))
                break;

            Double2 gainLow, gainHigh;
            line.gainFour (j, gainLow, gainHigh);
            const auto out = readFour (data, writePositions, d, size, positions);
            store (data + w, writtenFour (out, load (input + j), gainLow, gainHigh));
            store (output + j, out);

            if (w == 0) // before any later group reads it
                data[length] = data[0];
        }

        if (w == length)
            w = 0;

        if (g == groups && groups > 0)
            continue;

        float position;
        const auto out = readOne (data, w, line.delay (j), size[0], position);
        positions[3] = position;
        data[w] = writtenOne (out, input[j], line.gain (j));

        if (w == 0)
            data[length] = data[0];

        w = w + 1 == length ? 0 : w + 1;
        output[j] = out;
        ++j;
    }

    writeIndex = w;
    readPosition = positions[3];
    delaySamples = line.delay (n - 1);
    feedback = line.feedback (n - 1);
}

void DelayLine::processPair (DelayLine& first, DelayLine& second, bool chained, const float* input,
                             const float* firstDelays, const float* firstFeedbacks, float* firstOutput,
                             const float* secondDelays, const float* secondFeedbacks, float* secondOutput, int n) noexcept
{
    if (n <= 0)
        return;

    const auto steadyDelayWithFeedbacks = (firstDelays == nullptr && firstFeedbacks != nullptr)
                                       || (secondDelays == nullptr && secondFeedbacks != nullptr);

    if (first.length != second.length || first.writeIndex != second.writeIndex || steadyDelayWithFeedbacks)
    {
        first.process (input, firstDelays, firstFeedbacks, firstOutput, n);
        second.process (chained ? firstOutput : input, secondDelays, secondFeedbacks, secondOutput, n);
        return;
    }

    // Per line, a steady delay and feedback, per-sample delays, or both per sample.
    withFlag (firstDelays != nullptr, [&] (auto firstDelaysPerSample) {
        withFlag (firstFeedbacks != nullptr, [&] (auto firstFeedbacksPerSample) {
            withFlag (secondDelays != nullptr, [&] (auto secondDelaysPerSample) {
                withFlag (secondFeedbacks != nullptr, [&] (auto secondFeedbacksPerSample) {
                    withFlag (chained, [&] (auto chain) {
                        if constexpr ((firstDelaysPerSample || ! firstFeedbacksPerSample) && (secondDelaysPerSample || ! secondFeedbacksPerSample))
                            runPair<Settings<firstDelaysPerSample, firstFeedbacksPerSample>, Settings<secondDelaysPerSample, secondFeedbacksPerSample>, chain> (
                                first, second, input,
                                firstDelaysPerSample ? firstDelays : &first.delaySamples, firstFeedbacksPerSample ? firstFeedbacks : &first.feedback, firstOutput,
                                secondDelaysPerSample ? secondDelays : &second.delaySamples, secondFeedbacksPerSample ? secondFeedbacks : &second.feedback, secondOutput, n);
                    });
                });
            });
        });
    });
}

// Two lines with one write position: the first runs, then the second, sample by sample (or
// group by group), sharing the write position's bookkeeping and, side by side, their work.
template <typename FirstSettings, typename SecondSettings, bool chained>
void DelayLine::runPair (DelayLine& first, DelayLine& second, const float* input,
                         const float* firstDelays, const float* firstFeedbacks, float* firstOutput,
                         const float* secondDelays, const float* secondFeedbacks, float* secondOutput, int n) noexcept
{
    const int length = first.length;
    const auto size = splat ((float) length);
    float* const a = first.buffer.data();
    float* const b = second.buffer.data();
    const FirstSettings lineA (firstDelays, firstFeedbacks, size);
    const SecondSettings lineB (secondDelays, secondFeedbacks, size);
    int w = first.writeIndex;
    auto positionsA = splat (first.readPosition), positionsB = splat (second.readPosition);

    for (int j = 0; j < n;)
    {
        // As in run: runs of groups of four where both lines allow them, else one sample.
        const auto groups = std::min (n - j, length - w) / 4;
        auto writePositions = toFloat (w + lanes);
        int g = 0;

        for (; g < groups; ++g, j += 4, w += 4, writePositions += 4.0f)
        {
            const auto dA = lineA.delayFour (j, size);
            const auto dB = lineB.delayFour (j, size);

            if (! (lineA.allowsGroup (dA) && lineB.allowsGroup (dB)))
                break;

            Double2 gainLowA, gainHighA, gainLowB, gainHighB;
            lineA.gainFour (j, gainLowA, gainHighA);
            lineB.gainFour (j, gainLowB, gainHighB);
            const auto in = load (input + j);
            const auto outA = readFour (a, writePositions, dA, size, positionsA);
            const auto outB = readFour (b, writePositions, dB, size, positionsB);
            store (a + w, writtenFour (outA, in, gainLowA, gainHighA));
            store (b + w, writtenFour (outB, chained ? outA : in, gainLowB, gainHighB));
            store (firstOutput + j, outA);
            store (secondOutput + j, outB);

            if (w == 0) // before any later group reads them
            {
                a[length] = a[0];
                b[length] = b[0];
            }
        }

        if (w == length)
            w = 0;

        if (g == groups && groups > 0)
            continue;

        float positionA, positionB;
        const auto outA = readOne (a, w, lineA.delay (j), size[0], positionA);
        a[w] = writtenOne (outA, input[j], lineA.gain (j));
        const auto outB = readOne (b, w, lineB.delay (j), size[0], positionB);
        b[w] = writtenOne (outB, chained ? outA : input[j], lineB.gain (j));
        positionsA[3] = positionA;
        positionsB[3] = positionB;

        if (w == 0)
        {
            a[length] = a[0];
            b[length] = b[0];
        }

        w = w + 1 == length ? 0 : w + 1;
        firstOutput[j] = outA;
        secondOutput[j] = outB;
        ++j;
    }

    first.writeIndex = second.writeIndex = w;
    first.readPosition = positionsA[3];
    second.readPosition = positionsB[3];
    first.delaySamples = lineA.delay (n - 1);
    second.delaySamples = lineB.delay (n - 1);
    first.feedback = lineA.feedback (n - 1);
    second.feedback = lineB.feedback (n - 1);
}

} // namespace veltrane
