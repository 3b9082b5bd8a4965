// The processor's audio path written plainly from its description, one sample of one channel at a
// time, in the precisions it states. Only the standard library: it cannot share the product's faults.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <vector>

namespace reference
{
// physical = minimum + (maximum - minimum) * law (normalised), by parameter index.
enum Law { straight, square, root };
struct Range { float minimum, maximum; Law law; };
inline constexpr Range ranges[33] {
    { 1, 2000, square }, { 0, 100, straight }, { 0, 100, straight }, { 0, 6, straight }, { 0, 100, straight }, { 0, 6, straight }, { -70, 6, root },
    { 1, 2000, square }, { 0, 100, straight }, { 0, 100, straight }, { 0, 6, straight }, { 0, 100, straight }, { 0, 6, straight }, { -70, 6, root },
    { 0, 6, straight }, { 0, 100, straight }, { 0, 3, straight }, { 0, 100, straight }, { 0, 1, straight },
    { -16, 6, root }, { 0, 12, square }, { 0, 12, square }, { -16, 6, root }, { 0, 12, square }, { 0, 12, square },
    { 0, 5, straight }, { 0, 40, square }, { 0, 1, straight }, { 0, 17, straight }, { 0, 5, straight }, { 0, 40, square }, { 0, 1, straight }, { 0, 17, straight } };

inline float physical (int index, float v)
{
    const auto [minimum, maximum, law] = ranges[index];
    const float range = maximum - minimum;
    return law == straight ? minimum + range * v : law == square ? minimum + range * v * v : minimum + range * std::sqrt (v);
}
inline float amplitude (float dB) { return dB <= -100.0f ? 0.0f : std::pow (10.0f, dB * 0.05f); }

// What a block reads of the parameters.
struct DelayKnobs { float timeMs, feedback, timeDepth; int timeSource; float feedbackDepth; int feedbackSource; float gain; };
struct FollowerKnobs { float sensitivity, attackMs, releaseMs; };
struct LfoKnobs { int wave; float rateHz; bool sync; int division; };
struct Knobs { DelayKnobs delay[2]; FollowerKnobs follower[2]; LfoKnobs lfo[2]; int mixMode; float dryWet; int shaper; float amount; };

inline Knobs knobsFrom (const float* v) // Delay 1, 2 from index 0, 7; followers from 19, 22; LFOs from 25, 29
{
    auto p = [v] (int i) { return physical (i, v[i]); };
    auto choice = [&p] (int i) { return (int) p (i); };
    auto delay = [&] (int d) { return DelayKnobs { p (d), v[d + 1], v[d + 2], choice (d + 3), v[d + 4], choice (d + 5), amplitude (p (d + 6)) }; };
    auto follower = [&] (int e) { return FollowerKnobs { amplitude (p (e)), p (e + 1), p (e + 2) }; };
    auto lfo = [&] (int l) { return LfoKnobs { choice (l), p (l + 1), choice (l + 2) != 0, choice (l + 3) }; };
    return { { delay (0), delay (7) }, { follower (19), follower (22) }, { lfo (25), lfo (29) }, choice (14), v[15], choice (16), v[17] };
}

// A note-on with velocity on MIDI channel 1 restarts LFO 1 (0), on channel 2 LFO 2 (1); else -1.
struct Midi { int position, status, data1, data2; };
inline int restartedLfo (const Midi& e) { return (e.status == 0x90 || e.status == 0x91) && e.data2 > 0 ? e.status - 0x90 : -1; }
// juce::Random's 48-bit linear congruential generator.
struct Random48
{
    int64_t seed;
    uint32_t next() { seed = (int64_t) (((uint64_t) seed * 25214903917ull + 11) % (1ull << 48)); return (uint32_t) (seed >> 16); }
    float nextFloat() { return (float) next() / 4294967296.0f; }   // exactly 1 for the top 128 draws
    int64_t nextInt64() { const uint64_t high = next(); return (int64_t) (high << 32 | next()); }
};

struct Lfo
{
    static constexpr int N = 1024;
    float table[6][N];
    double sampleRate = 44100.0;
    float frequency = 1.0f, phase = 0.0f, increment = 0.0f;
    int wave = 0, lastIndex = N - 1, holdIndex = 0;
    explicit Lfo (int64_t seed)
    {
        Random48 random { seed };
        const float w = (float) (6.283185307179586 / N), n = N, h = N / 2;
        for (int i = 0; i < N; ++i)
        {
            const float x = (float) i;
            table[0][i] = std::sin (x * w);
            table[1][i] = i < N / 2 ? 1.0f : -1.0f;
            table[2][i] = (x / n) * 2.0f - 1.0f;
            table[3][i] = (1.0f - x / n) * 2.0f - 1.0f;
            table[4][i] = i < N / 2 ? (x / h) * 2.0f - 1.0f : 3.0f - (x / h) * 2.0f;
            table[5][i] = random.nextFloat() * 2.0f - 1.0f;
        }
    }
    void set (const LfoKnobs& k, float tempo)
    {
        static const float bars[18] { 8, 4, 2, 1, 0.5f, 0.5f, 0.25f, 0.25f, 0.125f, 0.125f, 0.0625f, 0.0625f,
                                      0.03125f, 0.03125f, 0.015625f, 0.015625f, 0.0078125f, 0.0078125f };
        wave = k.wave < 6 ? k.wave : wave;
        if (! k.sync)
            frequency = k.rateHz;
        else if (k.division >= 0 && k.division <= 17) // the dotted ones (odd from 5) at 0.75 times the plain rate
            frequency = (float) ((double) (1000.0f / (60000.0f / tempo * 4.0f * bars[k.division])) * (k.division >= 5 && k.division % 2 == 1 ? 0.75 : 1.0));
        // The phase wraps once per tick: a cycle per sample or more folds back; a nonsense tempo stands still.
        increment = ((float) N / (float) sampleRate) * frequency;
        increment = ! (increment >= 0.0f && std::isfinite (increment)) ? 0.0f : increment >= N ? std::fmod (increment, (float) N) : increment;
    }

    void restart() { phase = 0.0f, holdIndex = 0, lastIndex = N - 1; }
    float tick()
    {
        const int i = (int) phase;
        phase += increment;
        phase = phase >= N ? phase - N : phase;
        if (wave == 5 && i < lastIndex) // wrapped
            holdIndex = (holdIndex + 1) % N;
        lastIndex = i;
        return table[wave][wave == 5 ? holdIndex : i];
    }
};

struct Follower
{
    double sampleRate = 44100.0;
    float attack = 0.0f, release = 0.0f, envelope = 0.0f; // coefficients and state
    void set (const FollowerKnobs& k) // a time of 0 gives a coefficient of 0: instant following
    {
        attack = std::exp (-1.0f / (float) (k.attackMs * 0.001 * (double) (float) sampleRate));
        release = std::exp (-1.0f / (float) (k.releaseMs * 0.001 * (double) (float) sampleRate));
    }
    float process (float input)
    {
        const float a = std::fabs (input), c = a > envelope ? attack : release;
        return envelope = (1.0f - c) * a + c * envelope;
    }
};

struct Line
{
    double sampleRate = 44100.0;
    int length = 88200, writeIndex = 0;
    std::vector<float> buffer = std::vector<float> (88200);
    float delay = 0.0f, feedback = 0.0f, baseFeedback = 0.0f; // delay in samples
    void prepare (double rate) // two seconds at any rate, always silent
    {
        length = rate != sampleRate ? (int) (rate / sampleRate * length) : length, sampleRate = rate;
        buffer.assign ((size_t) length, 0.0f), writeIndex = 0;
    }
    // The base delay from the smoothed time within [1, L] (NaN gives L), then both modulations (depth 0: none).
    void modulate (float timeMs, float timeDepth, float timeSource, float feedbackDepth, float feedbackSource)
    {
        const float d = (float) ((float) sampleRate * (double) timeMs * 0.001), L = (float) length, f = baseFeedback;
        const float b = d > L || std::isnan (d) ? L : d <= 0.0f ? 1.0f : d, h = b > length * 0.5 ? length - b : b;
        delay = timeDepth != 0.0f ? h * timeDepth * timeSource + b : b;
        feedback = feedbackDepth != 0.0f ? (f > 0.5f ? 1.0f - f : f) * feedbackDepth * feedbackSource + f : f;
    }
    float process (float input)
    {
        // Within [0, L] (NaN reads the oldest slot, as 0 and L do); a position rounding up to L wraps again.
        const float L = (float) length, d = delay > L ? L : delay >= 0.0f ? delay : 0.0f;
        float position = (float) writeIndex - d;
        position = position < 0.0f ? position + L : position;
        position = position >= L ? position - L : position;
        const int index = (int) std::floor (position);
        const float fraction = position - (float) index, now = buffer[(size_t) index];
        const float out = now + ((index == length - 1 ? buffer[0] : buffer[(size_t) index + 1]) - now) * fraction;
        buffer[(size_t) writeIndex] = (float) (feedback * 0.96 * out + input);
        writeIndex = (writeIndex + 1) % length;
        return out;
    }
};

// The delays heard per mix mode and channel: bit 0 Delay 1, bit 1 Delay 2.
inline constexpr unsigned wetOf[7][2] { { 3, 3 }, { 2, 2 }, { 1, 1 }, { 1, 1 }, { 2, 2 }, { 1, 2 }, { 2, 1 } };

inline float shape (float v, int shaper, float a)
{
    const float t = (10.0f + 390.0f * a) * v;
    return shaper == 1 ? v - v * v * v / 6.0f
         : shaper == 2 ? std::tanh ((1.0f + 9.0f * a) * v)
         : shaper == 3 ? std::tanh (std::sin (t / std::sqrt (t * t + 1.0f))) : v;
}

struct Model
{
    explicit Model (uint64_t seed) // the four LFO seeds, drawn from one: channel 0's LFO 1 and 2, then channel 1's
    {
        Random48 random { (int64_t) seed };
        for (int i = 0; i < 4; ++i)
            lfos.emplace_back (random.nextInt64());
    }
    Lfo& lfo (int channel, int index) { return lfos[(size_t) (2 * channel + index)]; }
    void prepare (double rate) // rates that are not finite or outside 1 kHz..768 kHz are ignored
    {
        sampleRate = rate >= 1000.0 && rate <= 768000.0 ? rate : sampleRate;
        for (int c = 0; c < 2; ++c)
            for (int u = 0; u < 2; ++u)
                line[c][u].prepare (sampleRate), follower[c][u].sampleRate = lfo (c, u).sampleRate = sampleRate, follower[c][u].envelope = 0.0f;
    }

    // values: the 33 normalised parameters; events at [0, n) are met during channel 0's pass.
    void block (const float* values, float* const* io, int numChannels, int n, float tempo, const std::vector<Midi>& events)
    {
        offset = -offset;
        const Knobs k = knobsFrom (values);
        const double quarter = sampleRate * 0.25, steps = (double) numChannels * n;
        for (int u = 0; u < 2; ++u)
        {
            // A block of at least twice a quarter second's steps lands on the target rather than swinging past
            // it; a step too small to move the time in single precision spans the block, or else snaps.
            const float distance = k.delay[u].timeMs - smoothed[u];
            step[u] = (float) (distance / (steps >= 2.0 * quarter ? steps : quarter));
            if (smoothed[u] + step[u] == smoothed[u] && distance != 0.0f)
                step[u] = steps > 0.0 ? (float) (distance / steps) : 0.0f;
            if (smoothed[u] + step[u] == smoothed[u] && distance != 0.0f)
                smoothed[u] = k.delay[u].timeMs, step[u] = 0.0f;
            for (int c = 0; c < 2; ++c)
                line[c][u].baseFeedback = k.delay[u].feedback, follower[c][u].set (k.follower[u]), lfo (c, u).set (k.lfo[u], tempo);
        }
        auto heard = [this] (int unit, float v) { return (silenced >> unit & 1) != 0 ? 0.0f : v; };
        for (int c = 0; c < numChannels; ++c)
            for (int j = 0; j < n; ++j)
            {
                const float x = std::isfinite (io[c][j]) ? io[c][j] + offset : offset;
                for (const auto& e : events)
                    if (c == 0 && e.position == j && restartedLfo (e) >= 0)
                        lfo (0, restartedLfo (e)).restart(), lfo (1, restartedLfo (e)).restart();
                smoothed[0] += step[0], smoothed[1] += step[1];
                const float e1 = heard (2, follower[c][0].process (k.follower[0].sensitivity * x));
                const float e2 = heard (3, follower[c][1].process (k.follower[1].sensitivity * x));
                const float l1 = heard (4, lfo (c, 0).tick()), l2 = heard (5, lfo (c, 1).tick());
                const float source[7] { 0.0f, e1, -e1, e2, -e2, l1, l2 };
                for (int u = 0; u < 2; ++u)
                    line[c][u].modulate (smoothed[u], k.delay[u].timeSource != 0 ? k.delay[u].timeDepth : 0.0f, source[k.delay[u].timeSource],
                                         k.delay[u].feedbackSource != 0 ? k.delay[u].feedbackDepth : 0.0f, source[k.delay[u].feedbackSource]);
                float o1, o2;
                if (k.mixMode == 2)
                    o2 = heard (1, line[c][1].process (x)), o1 = heard (0, line[c][0].process (o2));
                else
                    o1 = heard (0, line[c][0].process (x)), o2 = heard (1, line[c][1].process (k.mixMode == 1 ? o1 : x));
                const float w1 = k.delay[0].gain * o1, w2 = k.delay[1].gain * o2;
                const float wet = wetOf[k.mixMode][c] == 3 ? w1 + w2 : wetOf[k.mixMode][c] == 1 ? w1 : w2;
                io[c][j] = shape (wet * k.dryWet + (1.0f - k.dryWet) * x, k.shaper, k.amount);
            }
    }

    double sampleRate = 44100.0;
    float offset = 1.0e-25f;                          // denormal offset, negated every block
    float smoothed[2] { 120.0f, 220.0f }, step[2] {}; // glide of each delay time, ms
    Line line[2][2];                                  // [channel][delay]
    Follower follower[2][2];                          // [channel][follower]
    std::vector<Lfo> lfos;
    unsigned silenced = 0; // for tests: bits 0, 1 mute Delay 1, 2; bits 2..5 envelope 1, 2, LFO 1, 2
};
} // namespace reference
