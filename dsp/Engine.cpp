#include "Engine.h"

#include "SeededRandom.h"
#include "StaticDispatch.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <type_traits>
#include <utility>

namespace veltrane
{

namespace
{
    std::array<int64_t, 4> lfoSeedsFrom (uint64_t seed) noexcept
    {
        SeededRandom random ((int64_t) seed);
        std::array<int64_t, 4> seeds {};

        for (auto& s : seeds)
            s = random.nextInt64();

        return seeds;
    }

    // How the wet signal of one channel is formed from the two gained delay outputs.
    enum WetKind { bothDelays, delay1Only, delay2Only };

    WetKind wetKindFor (MixMode mode, int channel) noexcept
    {
        switch (mode)
        {
            case MixMode::parallel:              return bothDelays;
            case MixMode::chain:                 return delay2Only;
            case MixMode::reverseChain:          return delay1Only;
            case MixMode::solo1:                 return delay1Only;
            case MixMode::solo2:                 return delay2Only;
            case MixMode::stereoParallel:        return channel == 0 ? delay1Only : delay2Only;
            case MixMode::reverseStereoParallel: return channel == 0 ? delay2Only : delay1Only;
        }

        return bothDelays;
    }

    bool isFiniteSample (float x) noexcept { return std::fabs (x) <= std::numeric_limits<float>::max(); }
}

Engine::Engine (uint64_t seed) : Engine (lfoSeedsFrom (seed)) {}

Engine::Engine (const std::array<int64_t, 4>& lfoSeeds)
    : channels { Channel (lfoSeeds[0], lfoSeeds[1]), Channel (lfoSeeds[2], lfoSeeds[3]) }
{
}

void Engine::prepare (double newSampleRate)
{
    const auto usable = std::isfinite (newSampleRate) && newSampleRate >= minSampleRate && newSampleRate <= maxSampleRate;

    if (usable && newSampleRate != sampleRate)
    {
        sampleRate = newSampleRate;

        for (auto& channel : channels)
        {
            for (auto& line : channel.delay)
                line.resize (newSampleRate);

            for (auto& follower : channel.envelope)
                follower.setSampleRate (newSampleRate);

            for (auto& lfo : channel.lfo)
                lfo.setSampleRate (newSampleRate);
        }
    }

    for (auto& channel : channels)
    {
        for (auto& line : channel.delay)
            line.clear();

        for (auto& follower : channel.envelope)
            follower.reset();
    }
}

Engine::Modulation Engine::modulationFor (int sourceIndex, float depth) noexcept
{
    Modulation m;

    if (depth == 0.0f)
        return m;

    switch ((ModSource) sourceIndex)
    {
        case ModSource::envelope1:        m.source = 0; break;
        case ModSource::reverseEnvelope1: m.source = 0; m.sign = -1.0f; break;
        case ModSource::envelope2:        m.source = 1; break;
        case ModSource::reverseEnvelope2: m.source = 1; m.sign = -1.0f; break;
        case ModSource::lfo1:             m.source = 2; break;
        case ModSource::lfo2:             m.source = 3; break;
        case ModSource::none:
        default:                          return m;
    }

    m.depth = depth;
    return m;
}

void Engine::beginBlock (const EngineSettings& settings, int numChannelsInBlock, int numSamples,
                         const bool (&lfoRestarted)[2]) noexcept
{
    denormalOffset = -denormalOffset;
    channelsInUse = std::clamp (numChannelsInBlock, 1, numChannels);
    numSamples = std::max (numSamples, 0);

    // Each processed sample of each channel moves the glide one step, and the remaining
    // distance shrinks by 1 - k per block with k = steps / glideSteps. For k >= 2 that would
    // swing ever wider, so such a long block lands exactly on the target instead.
    const auto glideSteps = sampleRate * 0.25;
    const auto stepsInBlock = (double) channelsInUse * (double) numSamples;
    gliding = false;

    for (int d = 0; d < 2; ++d)
    {
        auto& glide = glides[d];
        glide.target = settings.delay[d].timeMs;
        const auto distance = glide.target - glide.smoothed;
        glide.step = (float) ((double) distance / (stepsInBlock >= 2.0 * glideSteps ? stepsInBlock : glideSteps));

        // In single precision the approach stalls short of the target once a step drops below
        // half a unit in the last place of the smoothed time (0.04 ms short of 120 ms, 0.7 ms
        // near 2 s). The rest is then covered in a straight line over this block, and what even
        // that cannot move (a few units in the last place) is snapped.
        if (glide.smoothed + glide.step == glide.smoothed && distance != 0.0f)
        {
            glide.step = stepsInBlock > 0.0 ? (float) ((double) distance / stepsInBlock) : 0.0f;

            if (glide.smoothed + glide.step == glide.smoothed)
            {
                glide.smoothed = glide.target;
                glide.step = 0.0f;
            }
        }

        // Channel 1 takes up the glide where channel 0's numSamples steps leave it.
        glideCursor[0][d] = glide.smoothed;
        glideCursor[1][d] = glide.smoothed;

        if (glide.smoothed + glide.step != glide.smoothed)
        {
            gliding = true;

            for (int i = 0; i < numSamples; ++i)
                glideCursor[1][d] += glide.step;
        }

        timeModulation[d] = modulationFor (settings.delay[d].timeModSource, settings.delay[d].timeModDepth);
        feedbackModulation[d] = modulationFor (settings.delay[d].feedbackModSource, settings.delay[d].feedbackModDepth);
        gain[d] = settings.delay[d].gain;
        sensitivity[d] = settings.envelope[d].sensitivity;
    }

    for (int source = 0; source < 4; ++source)
        sourceRead[source] = timeModulation[0].source == source || timeModulation[1].source == source
                          || feedbackModulation[0].source == source || feedbackModulation[1].source == source;

    mixMode = settings.mixMode >= 0 && settings.mixMode <= (int) MixMode::reverseStereoParallel ? settings.mixMode : 0;
    outputStage.balance = settings.dryWet;
    outputStage.shaper = settings.shaper >= 0 && settings.shaper <= (int) Shaper::dirt ? settings.shaper : 0;
    outputStage.amount = settings.shaperAmount;

    for (auto& channel : channels)
    {
        for (int d = 0; d < 2; ++d)
            channel.delay[d].setBaseFeedback (settings.delay[d].feedback);

        for (int e = 0; e < 2; ++e)
            channel.envelope[e].setTimes (settings.envelope[e].attackMs, settings.envelope[e].releaseMs);

        for (int l = 0; l < 2; ++l)
        {
            const auto& lfoSettings = settings.lfo[l];
            auto& lfo = channel.lfo[l];
            lfo.setWave (lfoSettings.wave);

            if (lfoSettings.sync)
                lfo.setSyncedFrequency (settings.tempoBpm, lfoSettings.syncedRate);
            else
                lfo.setFrequency (lfoSettings.rateHz);

            lfo.updateIncrement();
        }
    }

    for (int l = 0; l < 2; ++l)
        if (lfoRestarted[l])
            channels[1].lfo[l].restart();
}

void Engine::restartLfo (int lfoIndex) noexcept
{
    if (lfoIndex == 0 || lfoIndex == 1)
        channels[0].lfo[lfoIndex].restart();
}

void Engine::process (float* const* samples, int startSample, int endSample) noexcept
{
    if (samples == nullptr)
        return;

    for (int start = startSample; start < endSample; start += chunkSize)
        processChunk (samples, start, std::min (chunkSize, endSample - start));

    for (int d = 0; d < 2; ++d)
        glides[d].smoothed = glideCursor[channelsInUse - 1][d];
}

// The input of every channel for the chunk, with the denormal offset added; a stray inf or
// NaN counts as silence rather than poisoning the lines and followers.
void Engine::takeInputs (float* const* samples, int offset, int n) noexcept
{
    using namespace simd;
    const auto denormal = splat (denormalOffset);

    for (int c = 0; c < channelsInUse; ++c)
    {
        const float* const in = samples[c] + offset;
        float* const x = scratch.input[c];
        int j = 0;

        for (; j + 4 <= n; j += 4)
        {
            const auto v = load (in + j) + denormal;
            store (x + j, select (abs (v) <= splat (std::numeric_limits<float>::max()), v, denormal));
        }

        for (; j < n; ++j)
            x[j] = isFiniteSample (in[j] + denormalOffset) ? in[j] + denormalOffset : denormalOffset;
    }
}

// Envelopes, LFOs and glides of every channel in one loop. The envelopes' sample-to-sample
// chain is the slow part: the four followers (lane 2 * channel + index) share one chain, and
// the four LFOs run side by side in the same lanes next to it.
template <int inUse, bool lfosRead, bool moving, bool anyHolding>
void Engine::runSources (int n) noexcept
{
    using namespace simd;
    auto& f = channels;
    auto lanesOf = [&f] (auto getter)
    {
        return Float4 { getter (f[0].envelope[0]), getter (f[0].envelope[1]), getter (f[1].envelope[0]), getter (f[1].envelope[1]) };
    };

    const auto attackGain = lanesOf ([] (const EnvelopeFollower& e) { return e.getAttackGain(); });
    const auto attackCoefficient = lanesOf ([] (const EnvelopeFollower& e) { return e.getAttackCoefficient(); });
    const auto releaseGain = lanesOf ([] (const EnvelopeFollower& e) { return e.getReleaseGain(); });
    const auto releaseCoefficient = lanesOf ([] (const EnvelopeFollower& e) { return e.getReleaseCoefficient(); });
    const Float4 sensitivities { sensitivity[0], sensitivity[1], sensitivity[0], sensitivity[1] };
    auto envelope = lanesOf ([] (const EnvelopeFollower& e) { return e.getEnvelope(); });
    Float4 magnitude {};

    const Lfo* const lfo[4] = { &f[0].lfo[0], &f[0].lfo[1], &f[1].lfo[0], &f[1].lfo[1] };
    Lfo::Lanes lfoLanes;
    const float* table[4];

    for (int k = 0; k < 4; ++k)
    {
        const auto& m = lfo[k]->getMotion();
        const auto holding = lfo[k]->getWave() == Lfo::sampleAndHold;
        lfoLanes.phase[k] = m.phase;
        lfoLanes.phaseIncrement[k] = m.phaseIncrement;
        lfoLanes.lastIndex[k] = m.lastIndex;
        lfoLanes.holdIndex[k] = m.holdIndex;
        lfoLanes.holding[k] = holding ? -1 : 0;
        table[k] = lfo[k]->getTable (holding ? Lfo::sampleAndHold : lfo[k]->getWave()).data();
    }

    float cursor[numChannels][2] = { { glideCursor[0][0], glideCursor[0][1] }, { glideCursor[1][0], glideCursor[1][1] } };
    const float step[2] = { glides[0].step, glides[1].step };
    const float* const x0 = scratch.input[0];
    const float* const x1 = scratch.input[inUse - 1];

    for (int j = 0; j < n; ++j)
    {
        magnitude = EnvelopeFollower::magnitude (sensitivities * Float4 { x0[j], x0[j], x1[j], x1[j] });
        envelope = EnvelopeFollower::follow (magnitude, envelope, attackGain, attackCoefficient, releaseGain, releaseCoefficient);
        store (scratch.envelopes + 4 * j, envelope);

        const auto index = Lfo::tick<anyHolding> (lfoLanes);

        if constexpr (lfosRead)
            store (scratch.lfos + 4 * j, Float4 { table[0][index[0]], table[1][index[1]], table[2][index[2]], table[3][index[3]] });

        if constexpr (moving)
        {
            for (int c = 0; c < inUse; ++c)
            {
                for (int d = 0; d < 2; ++d)
                {
                    cursor[c][d] += step[d];
                    scratch.baseDelay[c][d][j] = f[c].delay[d].baseDelayFor (cursor[c][d]);
                }
            }
        }
    }

    for (int c = 0; c < inUse; ++c)
    {
        for (int l = 0; l < 2; ++l)
        {
            const auto k = 2 * c + l;
            f[c].envelope[l].setState (envelope[k], magnitude[k]);
            auto& m = f[c].lfo[l].getMotion();
            m.phase = lfoLanes.phase[k];
            m.lastIndex = lfoLanes.lastIndex[k];
            m.holdIndex = lfoLanes.holdIndex[k];
        }

        for (int d = 0; d < 2; ++d)
            glideCursor[c][d] = cursor[c][d];
    }
}

template <int wetKind, int shaper>
void Engine::runOutput (float* samples, const float* dry, int n) const noexcept
{
    using simd::Float4;
    const auto gain1 = gain[0];
    const auto gain2 = gain[1];
    const auto hardDrive = OutputStage::hardClipDrive (outputStage.amount);
    const auto dirtDrive = OutputStage::dirtDrive (outputStage.amount);
    const auto stage = outputStage;

    auto outputOf = [&] (Float4 out1, Float4 out2, Float4 x)
    {
        Float4 wet;

        if constexpr (wetKind == bothDelays)
            wet = out1 * gain1 + out2 * gain2;
        else if constexpr (wetKind == delay1Only)
            wet = out1 * gain1;
        else
            wet = out2 * gain2;

        const auto v = stage.blend (wet, x);

        if constexpr (shaper == (int) Shaper::softClipper)
            return OutputStage::softClip (v);
        else if constexpr (shaper == (int) Shaper::hardClipper)
            return OutputStage::hardClip (v, hardDrive);
        else if constexpr (shaper == (int) Shaper::dirt)
            return OutputStage::dirt (v, dirtDrive);
        else
            return v;
    };

    const float* const out1 = scratch.output[0];
    const float* const out2 = scratch.output[1];
    int j = 0;

    for (; j + 4 <= n; j += 4)
        simd::store (samples + j, outputOf (simd::load (out1 + j), simd::load (out2 + j), simd::load (dry + j)));

    if (j < n) // the last one to three samples, padded to four lanes
    {
        float a[4] {}, b[4] {}, c[4] {}, y[4];
        const auto rest = (size_t) (n - j);
        std::copy_n (out1 + j, rest, a);
        std::copy_n (out2 + j, rest, b);
        std::copy_n (dry + j, rest, c);
        simd::store (y, outputOf (simd::load (a), simd::load (b), simd::load (c)));
        std::copy_n (y, rest, samples + j);
    }
}

const float* Engine::sourceLanes (const Modulation& modulation, int channel) const noexcept
{
    const float* lanes = modulation.source < 2 ? scratch.envelopes : scratch.lfos;
    return lanes + 2 * channel + (modulation.source & 1);
}

void Engine::processChunk (float* const* samples, int offset, int n) noexcept
{
    takeInputs (samples, offset, n);

    // Only a modulation needs the LFOs' values; their phases move regardless, and
    // "Sample & Hold" keeps counting its cycles.
    const auto anyHolding = channels[0].lfo[0].getWave() == Lfo::sampleAndHold || channels[0].lfo[1].getWave() == Lfo::sampleAndHold;

    withChoice<2> (channelsInUse - 1, [&] (auto inUseLess1) {
        withFlag (sourceRead[2] || sourceRead[3], [&] (auto lfosRead) {
            withFlag (gliding, [&] (auto moving) {
                withFlag (anyHolding, [&] (auto holding) { runSources<inUseLess1 + 1, lfosRead, moving, holding> (n); });
            });
        });
    });

    for (int c = 0; c < channelsInUse; ++c)
        processChannel (c, samples[c] + offset, n);
}

// Modulation, the two lines in the mix mode's order and the output stage of one channel,
// after the sources loop has filled the chunk's inputs, sources and base delays.
void Engine::processChannel (int c, float* samples, int n) noexcept
{
    auto& channel = channels[(size_t) c];

    // Per-sample delays while a glide moves or a time modulation runs; otherwise the lines
    // use their steady base delay (a null array).
    const float* delays[2] = { nullptr, nullptr };
    const float* feedbacks[2] = { nullptr, nullptr };

    for (int d = 0; d < 2; ++d)
    {
        auto& line = channel.delay[d];
        const float* const base = gliding ? scratch.baseDelay[c][d] : nullptr;
        line.setBaseDelay (gliding ? base[n - 1] : line.baseDelayFor (glideCursor[c][d]));
        delays[d] = base;

        // Four samples at a time (the scratch arrays are whole groups of four long); a
        // source's lane holds one float in every four.
        auto laneOf = [] (const float* lane, int j) { return simd::Float4 { lane[4 * j], lane[4 * j + 4], lane[4 * j + 8], lane[4 * j + 12] }; };

        if (const auto& mod = timeModulation[d]; mod.source >= 0)
        {
            const float* const source = sourceLanes (mod, c);
            float* const modulated = scratch.modulatedDelay[d];
            const auto steadyBase = simd::splat (line.getBaseDelaySamples());

            for (int j = 0; j < n; j += 4)
            {
                const auto b = base != nullptr ? simd::load (base + j) : steadyBase;
                simd::store (modulated + j, line.modulatedDelay (b, mod.depth, laneOf (source, j) * mod.sign));
            }

            delays[d] = modulated;
        }

        if (const auto& mod = feedbackModulation[d]; mod.source >= 0)
        {
            const auto swing = line.feedbackSwing (mod.depth);
            const auto baseFeedback = line.getBaseFeedback();
            const float* const source = sourceLanes (mod, c);
            float* const modulated = scratch.modulatedFeedback[d];

            for (int j = 0; j < n; j += 4)
                simd::store (modulated + j, swing * (laneOf (source, j) * mod.sign) + baseFeedback);

            feedbacks[d] = modulated;
        }
    }

    // The lines run side by side; a line with per-sample feedbacks takes per-sample delays too.
    for (int d = 0; d < 2; ++d)
    {
        if (feedbacks[d] != nullptr && delays[d] == nullptr)
        {
            std::fill_n (scratch.modulatedDelay[d], n, channel.delay[d].getBaseDelaySamples());
            delays[d] = scratch.modulatedDelay[d];
        }
    }

    auto& line1 = channel.delay[0];
    auto& line2 = channel.delay[1];
    const float* const input = scratch.input[c];
    float* const out1 = scratch.output[0];
    float* const out2 = scratch.output[1];

    if ((MixMode) mixMode == MixMode::reverseChain)
        DelayLine::processPair (line2, line1, true, input, delays[1], feedbacks[1], out2, delays[0], feedbacks[0], out1, n);
    else
        DelayLine::processPair (line1, line2, (MixMode) mixMode == MixMode::chain, input,
                                delays[0], feedbacks[0], out1, delays[1], feedbacks[1], out2, n);

    withChoice<3> (wetKindFor ((MixMode) mixMode, c), [&] (auto wetKind) {
        withChoice<4> (outputStage.shaper, [&] (auto shaper) { runOutput<wetKind, shaper> (samples, input, n); });
    });
}
} // namespace veltrane
