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
//
// The reference order is channel by channel: all of channel 0's block, then channel 1's, with
// MIDI handled during channel 0's pass. The engine runs both channels side by side (their
// envelope chains then overlap) and gives exactly the results of that order: channel 1's glide
// continues where channel 0's ends, and channel 1's LFOs, which would meet a restart before
// their own pass, restart at the block start.
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

    // Start of every block of numSamples samples of numChannels (1 or 2) channels: flips the
    // sign of the denormal offset, computes the glide steps and hands the settings to every
    // object. lfoRestarted[k]: a MIDI note restarts LFO k somewhere in this block.
    void beginBlock (const EngineSettings& settings, int numChannels, int numSamples,
                     const bool (&lfoRestarted)[2] = { false, false }) noexcept;

    // Processes samples [startSample, endSample) of every channel in place; the calls of a block
    // cover [0, numSamples) in order, split where MIDI events fall.
    void process (float* const* channels, int startSample, int endSample) noexcept;

    // A MIDI note at the current position: channel 0's LFO 0 or 1 restarts here (channel 1's
    // restarted at the block start, see beginBlock).
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
        float smoothed; // ms, after the last processed sample of the last channel
        float step;     // ms per processed sample
    };

    // Where a modulation reads its source, maybe negated: the envelope lanes (source 0 and 1)
    // or the LFO lanes (2 and 3) of Scratch.
    struct Modulation
    {
        int source = -1; // -1 = none
        float sign = 1.0f;
        float depth = 0.0f;
    };

    static constexpr int chunkSize = 256; // a multiple of 4

    struct Scratch
    {
        float input[numChannels][chunkSize]; // denormal offset added, inf and NaN silenced
        // Four lanes per sample, lane 2 * channel + index: envelope 1 and 2, LFO 1 and 2.
        float envelopes[chunkSize * 4];
        float lfos[chunkSize * 4];
        float baseDelay[numChannels][2][chunkSize]; // while gliding
        float modulatedDelay[2][chunkSize];
        float modulatedFeedback[2][chunkSize];
        float output[2][chunkSize];
    };

    explicit Engine (const std::array<int64_t, 4>& lfoSeeds);

    void processChunk (float* const* samples, int offset, int n) noexcept;
    void processChannel (int channel, float* samples, int n) noexcept;

    void takeInputs (float* const* samples, int offset, int n) noexcept;

    template <int channelsInUse, bool lfosRead, bool gliding, bool anyHolding>
    void runSources (int n) noexcept;

    template <int wetKind, int shaper>
    void runOutput (float* samples, const float* dry, int n) const noexcept;

    const float* sourceLanes (const Modulation& modulation, int channel) const noexcept;
    static Modulation modulationFor (int sourceIndex, float depth) noexcept;

    std::array<Channel, numChannels> channels;
    double sampleRate = 44100.0;
    float denormalOffset = 1.0e-25f; // added to every input sample, sign flipped every block
    Glide glides[2] = { { 120.0f, 120.0f, 0.0f }, { 220.0f, 220.0f, 0.0f } };
    float glideCursor[numChannels][2] = {}; // each channel's own smoothed times within the block
    bool gliding = false;                   // true while a smoothed time still moves within the block

    // Per-block settings.
    int channelsInUse = 2;
    float sensitivity[2] = { 1.0f, 1.0f };
    float gain[2] = { 1.0f, 1.0f };
    Modulation timeModulation[2];
    Modulation feedbackModulation[2];
    bool sourceRead[4] = {}; // whether any modulation reads source i this block
    int mixMode = 0;
    OutputStage outputStage;

    Scratch scratch {}; // zeroed, so that a chunk's last group of four never reads garbage
};

} // namespace veltrane
