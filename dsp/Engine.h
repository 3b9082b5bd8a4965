#pragma once

#include "DelayLine.h"
#include "EnvelopeFollower.h"
#include "Lfo.h"
#include "OutputStage.h"

#include <array>
#include <cstdint>

namespace veltrane
{

// What the engine reads of the parameters, taken once at the start of every block.
struct DelaySettings
{
    float timeMs = 120.0f;          // target time, 1..2000
    float feedback = 0.4f;          // factor 0..1
    float timeModDepth = 0.0f;      // 0..1
    int timeModSource = 0;          // ModSource index
    float feedbackModDepth = 0.0f;  // 0..1
    int feedbackModSource = 0;      // ModSource index
    float gain = 1.0f;              // amplitude
};

struct EnvelopeSettings
{
    float sensitivity = 1.0f;       // amplitude applied to the input
    float attackMs = 1.0f;          // 0..12
    float releaseMs = 2.0f;         // 0..12
};

struct LfoSettings
{
    int wave = Lfo::sine;
    float rateHz = 1.0f;            // free rate, 0..40
    bool sync = false;
    int syncedRate = 6;             // division index 0..17 ("1/4" = 6)
};

struct EngineSettings
{
    DelaySettings delay[2];
    EnvelopeSettings envelope[2];
    LfoSettings lfo[2];
    int mixMode = 0;                // MixMode index
    float dryWet = 1.0f;            // 0 = dry, 1 = wet
    int shaper = 0;                 // Shaper index
    float shaperAmount = 0.0f;      // 0..1
    float tempoBpm = 120.0f;        // host tempo; 0 freezes synced LFOs
};

// Index of the modulation-source choice list.
enum class ModSource { none, envelope1, reverseEnvelope1, envelope2, reverseEnvelope2, lfo1, lfo2 };

// The whole signal path of the effect: for each of two channels (always two, whatever the
// host's layout) a delay line per delay, an envelope follower per follower and an LFO per LFO,
// plus the glide of the two delay times, which both channels share. prepare runs on the
// message thread; everything else on the audio thread, without allocation or locks.
class Engine
{
public:
    static constexpr int numChannels = 2;

    // seed: the four LFOs' "Sample & Hold" tables are drawn from generators seeded from it,
    // each differently.
    explicit Engine (uint64_t seed);

    // From prepareToPlay. Resizes the lines when the rate changes (rates that are not finite
    // or outside [minSampleRate, maxSampleRate] keep the previous one), and always silences
    // the lines and the followers. LFO phases and the glide carry on.
    void prepare (double newSampleRate);

    // Start of every block: flips the sign of the denormal offset, computes the glide steps for
    // numChannels * numSamples steps and hands the settings to every object.
    void beginBlock (const EngineSettings& settings, int numChannels, int numSamples) noexcept;

    // Processes samples [startSample, endSample) of one channel in place. A block is processed
    // channel by channel; channel 0's pass may be split at MIDI event positions.
    void process (int channel, float* samples, int startSample, int endSample) noexcept;

    // MIDI note-on: both channels' objects of LFO 0 or 1 restart.
    void restartLfo (int lfoIndex) noexcept;

    static constexpr double minSampleRate = 1000.0;
    static constexpr double maxSampleRate = 768000.0;

    double getSampleRate() const noexcept { return sampleRate; }
    float getDenormalOffset() const noexcept { return denormalOffset; }
    float getSmoothedTimeMs (int delayIndex) const noexcept { return glides[delayIndex].smoothed; }
    float getGlideStep (int delayIndex) const noexcept { return glides[delayIndex].step; }

    DelayLine& getDelayLine (int channel, int delayIndex) noexcept { return channels[(size_t) channel].delay[delayIndex]; }
    const DelayLine& getDelayLine (int channel, int delayIndex) const noexcept { return channels[(size_t) channel].delay[delayIndex]; }
    EnvelopeFollower& getEnvelopeFollower (int channel, int index) noexcept { return channels[(size_t) channel].envelope[index]; }
    const EnvelopeFollower& getEnvelopeFollower (int channel, int index) const noexcept { return channels[(size_t) channel].envelope[index]; }
    Lfo& getLfo (int channel, int index) noexcept { return channels[(size_t) channel].lfo[index]; }
    const Lfo& getLfo (int channel, int index) const noexcept { return channels[(size_t) channel].lfo[index]; }

private:
    struct Channel
    {
        Channel (int64_t lfo1Seed, int64_t lfo2Seed) : lfo { Lfo (lfo1Seed), Lfo (lfo2Seed) } {}

        DelayLine delay[2];
        EnvelopeFollower envelope[2];
        Lfo lfo[2];
    };

    struct Glide
    {
        float target;   // ms
        float smoothed; // ms
        float step;     // ms per processed sample
    };

    // Where a modulation reads its source: one of the per-sample source arrays, maybe negated.
    struct Modulation
    {
        int source = -1; // index into Scratch::sources, -1 = none
        float sign = 1.0f;
        float depth = 0.0f;
    };

    static constexpr int chunkSize = 256;

    struct Scratch
    {
        float input[chunkSize];
        float sources[4][chunkSize]; // envelope 1, envelope 2, LFO 1, LFO 2
        float baseDelay[2][chunkSize];
        float modulatedDelay[2][chunkSize];
        float modulatedFeedback[2][chunkSize];
        float output[2][chunkSize];
    };

    explicit Engine (const std::array<int64_t, 4>& lfoSeeds);

    void processChunk (int channel, float* samples, int n) noexcept;

    // How the sources loop runs an LFO.
    enum LfoUse { lfoUnread, lfoTable, lfoHolding };

    template <int lfo1Use, int lfo2Use, bool gliding>
    void runSources (Channel& channel, const float* samples, int n) noexcept;

    template <int wetKind, int shaper>
    void runOutput (float* samples, int n) const noexcept;

    static Modulation modulationFor (int sourceIndex, float depth) noexcept;

    std::array<Channel, numChannels> channels;
    double sampleRate = 44100.0;
    float denormalOffset = 1.0e-25f; // added to every input sample, sign flipped every block
    Glide glides[2] = { { 120.0f, 120.0f, 0.0f }, { 220.0f, 220.0f, 0.0f } };
    bool gliding = false; // true while a smoothed time still moves within the block

    // Per-block settings.
    float sensitivity[2] = { 1.0f, 1.0f };
    float gain[2] = { 1.0f, 1.0f };
    Modulation timeModulation[2];
    Modulation feedbackModulation[2];
    bool sourceRead[4] = {}; // whether any modulation reads Scratch::sources[i] this block
    int mixMode = 0;
    OutputStage outputStage;

    Scratch scratch;
};

} // namespace veltrane
