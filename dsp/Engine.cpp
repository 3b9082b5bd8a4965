#include "Engine.h"

#include "SeededRandom.h"

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

    // Calls fn with a compile-time copy of flag (or of choice, 0 <= choice < count), so that a
    // setting fixed for the block picks a specialised loop instead of being tested on every
    // sample.
    template <typename Fn>
    void withFlag (bool flag, Fn&& fn)
    {
        if (flag)
            fn (std::true_type {});
        else
            fn (std::false_type {});
    }

    template <int count, int first = 0, typename Fn>
    void withChoice (int choice, Fn&& fn)
    {
        if constexpr (first + 1 < count)
        {
            if (choice != first)
                return withChoice<count, first + 1> (choice, std::forward<Fn> (fn));
        }

        fn (std::integral_constant<int, first> {});
    }
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

void Engine::beginBlock (const EngineSettings& settings, int numChannelsInBlock, int numSamples) noexcept
{
    denormalOffset = -denormalOffset;

    // Each processed sample of each channel moves the glide one step, and the remaining
    // distance shrinks by 1 - k per block with k = steps / glideSteps. For k >= 2 that would
    // swing ever wider, so such a long block lands exactly on the target instead.
    const auto glideSteps = sampleRate * 0.25;
    const auto stepsInBlock = (double) std::clamp (numChannelsInBlock, 0, numChannels) * (double) std::max (numSamples, 0);
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

        gliding = gliding || glide.smoothed + glide.step != glide.smoothed;

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
}

void Engine::restartLfo (int lfoIndex) noexcept
{
    if (lfoIndex < 0 || lfoIndex > 1)
        return;

    for (auto& channel : channels)
        channel.lfo[lfoIndex].restart();
}

void Engine::process (int channel, float* samples, int startSample, int endSample) noexcept
{
    if (channel < 0 || channel >= numChannels || samples == nullptr)
        return;

    for (int start = startSample; start < endSample; start += chunkSize)
        processChunk (channel, samples + start, std::min (chunkSize, endSample - start));
}

// Envelopes, LFOs and the glide each carry a sample-to-sample dependency; running them in one
// loop from local copies lets those chains overlap instead of following one another.
template <int lfo1Use, int lfo2Use, bool moving>
void Engine::runSources (Channel& channel, const float* samples, int n) noexcept
{
    using simd::Float4;

    // The two followers run side by side in the first two lanes.
    auto& follower1 = channel.envelope[0];
    auto& follower2 = channel.envelope[1];
    const Float4 attackGain { follower1.getAttackGain(), follower2.getAttackGain(), 0.0f, 0.0f };
    const Float4 attackCoefficient { follower1.getAttackCoefficient(), follower2.getAttackCoefficient(), 0.0f, 0.0f };
    const Float4 releaseGain { follower1.getReleaseGain(), follower2.getReleaseGain(), 0.0f, 0.0f };
    const Float4 releaseCoefficient { follower1.getReleaseCoefficient(), follower2.getReleaseCoefficient(), 0.0f, 0.0f };
    const Float4 sensitivities { sensitivity[0], sensitivity[1], 0.0f, 0.0f };
    Float4 envelope { follower1.getEnvelope(), follower2.getEnvelope(), 0.0f, 0.0f };
    Float4 magnitude {};

    const auto& lfo1 = channel.lfo[0];
    const auto& lfo2 = channel.lfo[1];
    auto motion1 = channel.lfo[0].getMotion();
    auto motion2 = channel.lfo[1].getMotion();
    const auto& line1 = channel.delay[0];
    const auto& line2 = channel.delay[1];
    auto smoothed1 = glides[0].smoothed;
    auto smoothed2 = glides[1].smoothed;
    const auto step1 = glides[0].step;
    const auto step2 = glides[1].step;
    const auto offset = denormalOffset;

    float* const input = scratch.input;
    float* const envelope1 = scratch.sources[0];
    float* const envelope2 = scratch.sources[1];
    float* const lfoOut1 = scratch.sources[2];
    float* const lfoOut2 = scratch.sources[3];
    float* const base1 = scratch.baseDelay[0];
    float* const base2 = scratch.baseDelay[1];

    for (int j = 0; j < n; ++j)
    {
        auto x = samples[j] + offset;

        if (! isFiniteSample (x)) // a stray inf or NaN counts as silence rather than poisoning the lines
            x = offset;

        input[j] = x;
        magnitude = EnvelopeFollower::magnitude (sensitivities * x);
        envelope = EnvelopeFollower::follow (magnitude, envelope, attackGain, attackCoefficient, releaseGain, releaseCoefficient);
        envelope1[j] = envelope[0];
        envelope2[j] = envelope[1];
        if constexpr (lfo1Use == lfoUnread)
            lfo1.advance (motion1);
        else
            lfoOut1[j] = lfo1.tick<lfo1Use == lfoHolding> (motion1);

        if constexpr (lfo2Use == lfoUnread)
            lfo2.advance (motion2);
        else
            lfoOut2[j] = lfo2.tick<lfo2Use == lfoHolding> (motion2);

        if constexpr (moving)
        {
            smoothed1 += step1;
            smoothed2 += step2;
            base1[j] = line1.baseDelayFor (smoothed1);
            base2[j] = line2.baseDelayFor (smoothed2);
        }
    }

    if (n > 0)
    {
        follower1.setState (envelope[0], magnitude[0]);
        follower2.setState (envelope[1], magnitude[1]);
    }

    channel.lfo[0].getMotion() = motion1;
    channel.lfo[1].getMotion() = motion2;
    glides[0].smoothed = smoothed1;
    glides[1].smoothed = smoothed2;
}

template <int wetKind, int shaper>
void Engine::runOutput (float* samples, int n) const noexcept
{
    using simd::Float4;
    const auto gain1 = gain[0];
    const auto gain2 = gain[1];
    const auto hardDrive = OutputStage::hardClipDrive (outputStage.amount);
    const auto dirtDrive = OutputStage::dirtDrive (outputStage.amount);
    const auto stage = outputStage;

    auto outputOf = [&] (Float4 out1, Float4 out2, Float4 dry)
    {
        Float4 wet;

        if constexpr (wetKind == bothDelays)
            wet = out1 * gain1 + out2 * gain2;
        else if constexpr (wetKind == delay1Only)
            wet = out1 * gain1;
        else
            wet = out2 * gain2;

        const auto v = stage.blend (wet, dry);

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
    const float* const dry = scratch.input;
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

void Engine::processChunk (int channelIndex, float* samples, int n) noexcept
{
    auto& channel = channels[(size_t) channelIndex];

    // An LFO that no modulation reads this block only moves its phase; "Sample & Hold" also
    // keeps counting its cycles.
    auto lfoUseOf = [this, &channel] (int index)
    {
        if (channel.lfo[index].getWave() == Lfo::sampleAndHold)
            return lfoHolding;

        return sourceRead[2 + index] ? lfoTable : lfoUnread;
    };

    withChoice<3> (lfoUseOf (0), [&] (auto lfo1Use) {
        withChoice<3> (lfoUseOf (1), [&] (auto lfo2Use) {
            withFlag (gliding, [&] (auto moving) { runSources<lfo1Use, lfo2Use, moving> (channel, samples, n); });
        });
    });

    // Per-sample delays while a glide moves or a time modulation runs; otherwise the lines
    // use their steady base delay (a null array).
    const float* delays[2] = { nullptr, nullptr };
    const float* feedbacks[2] = { nullptr, nullptr };

    for (int d = 0; d < 2; ++d)
    {
        auto& line = channel.delay[d];
        const float* const base = gliding ? scratch.baseDelay[d] : nullptr;
        line.setBaseDelay (gliding ? base[n - 1] : line.baseDelayFor (glides[d].smoothed));
        delays[d] = base;

        if (const auto& mod = timeModulation[d]; mod.source >= 0)
        {
            const float* const source = scratch.sources[mod.source];
            float* const modulated = scratch.modulatedDelay[d];

            if (base != nullptr)
            {
                for (int j = 0; j < n; ++j)
                    modulated[j] = line.modulatedDelay (base[j], mod.depth, mod.sign * source[j]);
            }
            else
            {
                const auto steadyBase = line.getBaseDelaySamples();

                for (int j = 0; j < n; ++j)
                    modulated[j] = line.modulatedDelay (steadyBase, mod.depth, mod.sign * source[j]);
            }

            delays[d] = modulated;
        }

        if (const auto& mod = feedbackModulation[d]; mod.source >= 0)
        {
            const auto swing = line.feedbackSwing (mod.depth);
            const auto baseFeedback = line.getBaseFeedback();
            const float* const source = scratch.sources[mod.source];
            float* const modulated = scratch.modulatedFeedback[d];

            for (int j = 0; j < n; ++j)
                modulated[j] = swing * (mod.sign * source[j]) + baseFeedback;

            feedbacks[d] = modulated;
        }
    }

    auto& line1 = channel.delay[0];
    auto& line2 = channel.delay[1];
    float* const out1 = scratch.output[0];
    float* const out2 = scratch.output[1];

    switch ((MixMode) mixMode)
    {
        case MixMode::chain:
            line1.process (scratch.input, delays[0], feedbacks[0], out1, n);
            line2.process (out1, delays[1], feedbacks[1], out2, n);
            break;

        case MixMode::reverseChain:
            line2.process (scratch.input, delays[1], feedbacks[1], out2, n);
            line1.process (out2, delays[0], feedbacks[0], out1, n);
            break;

        default:
            line1.process (scratch.input, delays[0], feedbacks[0], out1, n);
            line2.process (scratch.input, delays[1], feedbacks[1], out2, n);
            break;
    }

    using OutputRun = void (Engine::*) (float*, int) const noexcept;
    static constexpr OutputRun outputRuns[3][4] = {
        { &Engine::runOutput<bothDelays, 0>, &Engine::runOutput<bothDelays, 1>, &Engine::runOutput<bothDelays, 2>, &Engine::runOutput<bothDelays, 3> },
        { &Engine::runOutput<delay1Only, 0>, &Engine::runOutput<delay1Only, 1>, &Engine::runOutput<delay1Only, 2>, &Engine::runOutput<delay1Only, 3> },
        { &Engine::runOutput<delay2Only, 0>, &Engine::runOutput<delay2Only, 1>, &Engine::runOutput<delay2Only, 2>, &Engine::runOutput<delay2Only, 3> }
    };

    (this->*outputRuns[wetKindFor ((MixMode) mixMode, channelIndex)][outputStage.shaper]) (samples, n);
}

} // namespace veltrane
