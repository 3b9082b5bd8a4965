#include "dsp/Engine.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

using namespace veltrane;

namespace
{
    constexpr double rate = 44100.0;

    struct Rig
    {
        Rig() { engine.prepare (rate); }

        // Runs the buffers through the engine in blocks, one channel after the other per block;
        // right == nullptr runs mono.
        void run (std::vector<float>& left, std::vector<float>* right, int blockSize = 512)
        {
            const auto total = (int) left.size();
            const auto channels = right != nullptr ? 2 : 1;

            for (int start = 0; start < total; start += blockSize)
            {
                const auto n = std::min (blockSize, total - start);
                float* samples[2] = { left.data() + start, right != nullptr ? right->data() + start : nullptr };
                engine.beginBlock (settings, channels, n);
                engine.process (samples, 0, n);
            }
        }

        // Lets the delay times glide to their targets, then silences lines and followers.
        void settle (int channels = 2)
        {
            std::vector<float> left (512), right (512);

            for (int block = 0; block < 20000; ++block)
            {
                const auto before1 = engine.getSmoothedTimeMs (0);
                const auto before2 = engine.getSmoothedTimeMs (1);
                std::fill (left.begin(), left.end(), 0.0f);
                run (left, channels == 2 ? &right : nullptr);

                if (engine.getSmoothedTimeMs (0) == before1 && engine.getSmoothedTimeMs (1) == before2)
                    break;
            }

            engine.prepare (engine.getSampleRate());
        }

        Engine engine { 42 };
        EngineSettings settings;
    };

    std::vector<float> impulse (int length)
    {
        std::vector<float> v ((size_t) length, 0.0f);
        v[0] = 1.0f;
        return v;
    }

    // Energy of an echo that may straddle two samples.
    float echoAt (const std::vector<float>& v, int index)
    {
        return v[(size_t) index] + v[(size_t) index + 1];
    }

    // Everything outside the listed echo positions (and their next sample) is silent.
    void expectSilentOutside (const std::vector<float>& v, std::initializer_list<int> echoes, const char* what)
    {
        for (int i = 0; i < (int) v.size(); ++i)
        {
            const auto isEcho = std::any_of (echoes.begin(), echoes.end(), [i] (int e) { return i == e || i == e + 1; });

            if (! isEcho)
                ASSERT_LT (std::fabs (v[(size_t) i]), 1.0e-6f) << what << " at " << i;
        }
    }
}

TEST (Engine, DefaultsEchoEvery120MsFromBothDelays)
{
    Rig rig;
    rig.settle();

    auto left = impulse (5 * 5292 + 10);
    auto right = impulse (5 * 5292 + 10);
    rig.run (left, &right);

    for (auto* out : { &left, &right })
    {
        expectSilentOutside (*out, { 5292, 2 * 5292, 3 * 5292, 4 * 5292, 5 * 5292 }, "defaults");
        EXPECT_NEAR (echoAt (*out, 5292), 2.0f, 1e-5);

        for (int k = 2; k <= 5; ++k)
            EXPECT_NEAR (echoAt (*out, k * 5292) / echoAt (*out, (k - 1) * 5292), 0.384f, 1e-5) << "repeat " << k;
    }
}

TEST (Engine, EveryMixModeRoutesAndGainsTheDelays)
{
    // Delay 1 at 100 ms (4410 samples) with gain 0.5, Delay 2 at 300 ms (13230) with gain 0.25,
    // no feedback: each path gives one echo.
    struct Echo { int at; float gain; };
    struct Case { MixMode mode; std::vector<Echo> left; std::vector<Echo> right; };
    const Case cases[] = {
        { MixMode::parallel, { { 4410, 0.5f }, { 13230, 0.25f } }, { { 4410, 0.5f }, { 13230, 0.25f } } },
        { MixMode::chain, { { 17640, 0.25f } }, { { 17640, 0.25f } } },
        { MixMode::reverseChain, { { 17640, 0.5f } }, { { 17640, 0.5f } } },
        { MixMode::solo1, { { 4410, 0.5f } }, { { 4410, 0.5f } } },
        { MixMode::solo2, { { 13230, 0.25f } }, { { 13230, 0.25f } } },
        { MixMode::stereoParallel, { { 4410, 0.5f } }, { { 13230, 0.25f } } },
        { MixMode::reverseStereoParallel, { { 13230, 0.25f } }, { { 4410, 0.5f } } },
    };

    for (const auto& c : cases)
    {
        Rig rig;
        rig.settings.mixMode = (int) c.mode;
        rig.settings.delay[0].timeMs = 100.0f;
        rig.settings.delay[1].timeMs = 300.0f;
        rig.settings.delay[0].feedback = rig.settings.delay[1].feedback = 0.0f;
        rig.settings.delay[0].gain = 0.5f;
        rig.settings.delay[1].gain = 0.25f;
        rig.settle();

        auto left = impulse (20000);
        auto right = impulse (20000);
        rig.run (left, &right);

        for (const auto& [out, echoes] : { std::pair (&left, c.left), std::pair (&right, c.right) })
        {
            for (const auto& e : echoes)
                EXPECT_NEAR (echoAt (*out, e.at), e.gain, 1e-5) << "mode " << (int) c.mode << " at " << e.at;

            if (echoes.size() == 1)
                expectSilentOutside (*out, { echoes[0].at }, "single echo");
            else
                expectSilentOutside (*out, { echoes[0].at, echoes[1].at }, "two echoes");
        }
    }
}

TEST (Engine, ChainFirstEchoAt200MsAndDelay1GainHasNoEffect)
{
    std::vector<float> reference;

    for (auto gain1 : { 1.0f, 0.3f, 0.0f })
    {
        Rig rig;
        rig.settings.mixMode = (int) MixMode::chain;
        rig.settings.delay[0].timeMs = rig.settings.delay[1].timeMs = 100.0f;
        rig.settings.delay[0].gain = gain1;
        rig.settle();

        auto left = impulse (30000);
        auto right = impulse (30000);
        rig.run (left, &right);

        const auto first = std::find_if (left.begin(), left.end(), [] (float v) { return std::fabs (v) > 1.0e-6f; });
        EXPECT_EQ (first - left.begin(), 8820);

        if (reference.empty())
            reference = left;
        else
            EXPECT_EQ (left, reference) << "Delay1Gain " << gain1;
    }
}

TEST (Engine, MonoInputHearsDelay1InStereoParallel)
{
    for (auto [mode, expected] : { std::pair (MixMode::stereoParallel, 4410), std::pair (MixMode::reverseStereoParallel, 13230) })
    {
        Rig rig;
        rig.settings.mixMode = (int) mode;
        rig.settings.delay[0].timeMs = 100.0f;
        rig.settings.delay[1].timeMs = 300.0f;
        rig.settings.delay[0].feedback = rig.settings.delay[1].feedback = 0.0f;
        rig.settle (1);

        auto mono = impulse (20000);
        rig.run (mono, nullptr);
        EXPECT_NEAR (echoAt (mono, expected), 1.0f, 1e-5);
        expectSilentOutside (mono, { expected }, "mono");
    }
}

TEST (Engine, EachModulationSourceMovesTheDelay)
{
    // A constant input of 0.5 with instant followers, Delay 1 alone at 500 ms (22050 samples,
    // swinging by up to 22050): the step arrives after the modulated delay.
    struct Case { ModSource source; float depth; int expected; };
    const Case cases[] = {
        { ModSource::envelope1, 1.0f, 33075 },          // m = 0.5
        { ModSource::reverseEnvelope1, 1.0f, 11025 },   // m = -0.5
        { ModSource::envelope2, 1.0f, 26460 },          // sensitivity 0.4: m = 0.2
        { ModSource::reverseEnvelope2, 1.0f, 17640 },
        { ModSource::lfo1, 0.8f, 39690 },               // "Square" standing at +1
        { ModSource::lfo2, 0.5f, 33075 },               // "Saw Down" standing at +1
        { ModSource::none, 1.0f, 22050 },
        { ModSource::lfo1, 0.0f, 22050 },
    };

    for (const auto& c : cases)
    {
        Rig rig;
        rig.settings.mixMode = (int) MixMode::solo1;
        rig.settings.delay[0].timeMs = 500.0f;
        rig.settings.delay[0].feedback = 0.0f;
        rig.settings.delay[0].timeModSource = (int) c.source;
        rig.settings.delay[0].timeModDepth = c.depth;
        rig.settings.envelope[0] = { 1.0f, 0.0f, 0.0f };
        rig.settings.envelope[1] = { 0.4f, 0.0f, 0.0f };
        rig.settings.lfo[0] = { Lfo::square, 0.0f, false, 6 };
        rig.settings.lfo[1] = { Lfo::sawDown, 0.0f, false, 6 };
        rig.settle();

        std::vector<float> left (45000, 0.5f), right (45000, 0.5f);
        rig.run (left, &right);

        for (const auto* out : { &left, &right })
        {
            const auto step = std::find_if (out->begin(), out->end(), [] (float v) { return v > 0.25f; }) - out->begin();
            EXPECT_NEAR ((double) step, (double) c.expected, 1.0) << "source " << (int) c.source;
        }
    }
}

TEST (Engine, FeedbackModulationFromAnLfo)
{
    Rig rig;
    rig.settings.mixMode = (int) MixMode::solo1;
    rig.settings.delay[0].timeMs = 100.0f;
    rig.settings.delay[0].feedbackModSource = (int) ModSource::lfo1;
    rig.settings.delay[0].feedbackModDepth = 1.0f;
    rig.settings.lfo[0] = { Lfo::square, 0.0f, false, 6 }; // +1: feedback 0.4 swings to 0.8
    rig.settle();

    auto left = impulse (10000);
    auto right = impulse (10000);
    rig.run (left, &right);
    EXPECT_NEAR (echoAt (left, 8820) / echoAt (left, 4410), 0.8f * 0.96f, 1e-5);
}

TEST (Engine, GlideMovesBy46_44MsInTheFirstStereoBlock)
{
    Rig rig;
    rig.settings.delay[0].timeMs = 620.0f;
    std::vector<float> left (512), right (512);
    rig.run (left, &right);
    EXPECT_NEAR (rig.engine.getSmoothedTimeMs (0) - 120.0f, 46.44f, 0.005f);
}

TEST (Engine, LongBlocksStayStable)
{
    // k = 2 * block / 11025: 8192 overshoots and swings back with a shrinking swing; 20000
    // would swing ever wider and lands on the target instead.
    for (int blockSize : { 8192, 20000 })
    {
        Rig rig;
        rig.settings.delay[0].timeMs = 1500.0f;
        std::vector<float> left ((size_t) blockSize, 0.1f), right ((size_t) blockSize, 0.1f);
        auto distance = std::fabs (1500.0f - rig.engine.getSmoothedTimeMs (0));

        for (int block = 0; block < 30; ++block)
        {
            std::fill (left.begin(), left.end(), 0.1f);
            std::fill (right.begin(), right.end(), 0.1f);
            rig.run (left, &right, blockSize);
            const auto now = std::fabs (1500.0f - rig.engine.getSmoothedTimeMs (0));
            EXPECT_LE (now, distance) << blockSize << " block " << block;
            distance = now;

            for (auto v : left)
                ASSERT_TRUE (std::isfinite (v) && std::fabs (v) < 10.0f) << v << " block size " << blockSize << " block " << block;
        }

        EXPECT_NEAR (rig.engine.getSmoothedTimeMs (0), 1500.0f, 0.01f) << blockSize;
    }

    Rig overshooting;
    overshooting.settings.delay[0].timeMs = 620.0f;
    std::vector<float> left (8192), right (8192);
    overshooting.run (left, &right, 8192);
    EXPECT_GT (overshooting.engine.getSmoothedTimeMs (0), 620.0f); // documented overshoot kept
}

TEST (Engine, DryBalancePassesTheInputWithTheDenormalOffset)
{
    Rig rig;
    rig.settings.dryWet = 0.0f;
    std::vector<float> left (512), right (512);

    for (size_t i = 0; i < left.size(); ++i)
        left[i] = right[i] = std::sin ((float) i * 0.05f) * 0.8f + 0.01f;

    const auto input = left;
    rig.run (left, &right);
    EXPECT_EQ (left, input);
    EXPECT_EQ (right, input);

    std::vector<float> silence (4, 0.0f);
    rig.run (silence, nullptr);
    EXPECT_EQ (silence[0], 1.0e-25f); // the first block added -1e-25, this second one +1e-25
    std::fill (silence.begin(), silence.end(), 0.0f);
    rig.run (silence, nullptr);
    EXPECT_EQ (silence[0], -1.0e-25f);
}

TEST (Engine, PrepareWithTheSameRateSilencesTheLines)
{
    Rig rig;
    rig.settings.delay[0].feedback = rig.settings.delay[1].feedback = 0.9f;
    auto left = impulse (3000);
    auto right = impulse (3000);
    rig.run (left, &right);

    rig.engine.prepare (rate);
    std::vector<float> silenceLeft (30000), silenceRight (30000);
    rig.run (silenceLeft, &silenceRight);

    for (auto v : silenceLeft)
        ASSERT_LT (std::fabs (v), 1.0e-20f);
}

TEST (Engine, NewRateResizesAndBadRatesKeepThePreviousOne)
{
    Rig rig;
    rig.engine.prepare (48000.0);
    EXPECT_EQ (rig.engine.getDelayLine (0, 0).getLength(), 96000);
    EXPECT_EQ (rig.engine.getDelayLine (1, 1).getLength(), 96000);

    for (double bad : { 0.0, -44100.0, std::nan (""), std::numeric_limits<double>::infinity(), 1.0e12, 10.0 })
    {
        rig.engine.prepare (bad);
        EXPECT_EQ (rig.engine.getSampleRate(), 48000.0) << bad;
        EXPECT_EQ (rig.engine.getDelayLine (0, 1).getLength(), 96000) << bad;
    }

    auto left = impulse (6000);
    auto right = impulse (6000);
    rig.settings.delay[1].timeMs = 120.0f;
    rig.settle();
    left = impulse (6000);
    rig.run (left, &right);
    EXPECT_NEAR (echoAt (left, 5760), 2.0f, 1e-4); // 120 ms at 48000 Hz
}

TEST (Engine, NonFiniteInputCountsAsSilence)
{
    const float bad[] = { std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity(),
                          -std::numeric_limits<float>::infinity() };

    for (auto value : bad)
    {
        Rig clean, dirty;

        for (auto* rig : { &clean, &dirty })
        {
            rig->settings.delay[0].timeModSource = (int) ModSource::envelope1;
            rig->settings.delay[0].timeModDepth = 0.5f;
            rig->settings.delay[1].feedbackModSource = (int) ModSource::reverseEnvelope2;
            rig->settings.delay[1].feedbackModDepth = 1.0f;
        }

        std::vector<float> cleanLeft (20000, 0.0f), cleanRight (20000, 0.0f);
        cleanLeft[0] = cleanRight[0] = 0.7f;
        auto dirtyLeft = cleanLeft, dirtyRight = cleanRight;
        dirtyLeft[100] = value;
        dirtyRight[3] = value;

        clean.run (cleanLeft, &cleanRight);
        dirty.run (dirtyLeft, &dirtyRight);
        EXPECT_EQ (dirtyLeft, cleanLeft);
        EXPECT_EQ (dirtyRight, cleanRight);
    }
}

TEST (Engine, LoudEnvelopeAtFullDepthStaysInsideTheLines)
{
    // +6 dB sensitivity on an input of 8 gives an envelope near 16: the unclamped delay would lie
    // far outside the buffer. Under the address sanitizer any stray read would fail here.
    for (auto source : { ModSource::envelope1, ModSource::reverseEnvelope1 })
    {
        Rig rig;
        rig.settings.envelope[0].sensitivity = 1.995262f;
        rig.settings.delay[0].timeMs = 200.0f;
        rig.settings.delay[1].timeMs = 1800.0f;

        for (auto& delay : rig.settings.delay)
        {
            delay.timeModSource = (int) source;
            delay.timeModDepth = 1.0f;
            delay.feedbackModSource = (int) source;
            delay.feedbackModDepth = 1.0f;
            delay.feedback = 0.9f;
        }

        std::vector<float> left (88200), right (88200);

        for (size_t i = 0; i < left.size(); ++i)
            left[i] = right[i] = (i / 300) % 2 == 0 ? 8.0f : -8.0f;

        rig.run (left, &right);

        std::vector<float> quiet (88200 * 2, 0.0f), quietRight (88200 * 2, 0.0f);
        rig.settings.delay[0].feedback = rig.settings.delay[1].feedback = 0.0f;
        rig.run (quiet, &quietRight);

        for (auto v : quiet)
            ASSERT_TRUE (std::isfinite (v));
    }
}

TEST (Engine, SplittingTheBlockChangesNothing)
{
    Rig whole, split;

    for (auto* rig : { &whole, &split })
    {
        rig->settings.lfo[0] = { Lfo::sampleAndHold, 7.0f, false, 6 };
        rig->settings.delay[0].timeModSource = (int) ModSource::lfo1;
        rig->settings.delay[0].timeModDepth = 0.3f;
        rig->settings.delay[0].timeMs = 700.0f;
        rig->settings.shaper = (int) Shaper::dirt;
    }

    std::vector<float> a (2048), b (2048);

    for (size_t i = 0; i < a.size(); ++i)
    {
        a[i] = std::sin ((float) i * 0.01f);
        b[i] = std::cos ((float) i * 0.013f);
    }

    auto c = a, d = b;

    for (int start = 0; start < 2048; start += 512)
    {
        float* wholeSamples[2] = { a.data() + start, b.data() + start };
        whole.engine.beginBlock (whole.settings, 2, 512);
        whole.engine.process (wholeSamples, 0, 512);

        float* splitSamples[2] = { c.data() + start, d.data() + start };
        split.engine.beginBlock (split.settings, 2, 512);

        for (auto [from, to] : { std::pair (0, 1), std::pair (1, 100), std::pair (100, 303), std::pair (303, 512) })
            split.engine.process (splitSamples, from, to);
    }

    EXPECT_EQ (a, c);
    EXPECT_EQ (b, d);
}

TEST (Engine, LfoRestartMidBlockLeavesTheRightChannelAhead)
{
    Rig rig;
    rig.settings.lfo[0] = { Lfo::sine, 3.0f, false, 6 };
    std::vector<float> left (512), right (512);
    rig.run (left, &right);

    float* samples[2] = { left.data(), right.data() };
    const bool restarts[2] = { true, false };
    rig.engine.beginBlock (rig.settings, 2, 512, restarts);
    rig.engine.process (samples, 0, 100);
    rig.engine.restartLfo (0);
    rig.engine.process (samples, 100, 512);

    const auto increment = rig.engine.getLfo (0, 0).getPhaseIncrement();
    auto phaseAfter = [increment] (int ticks) { float p = 0.0f; for (int i = 0; i < ticks; ++i) p += increment; return p; };

    EXPECT_EQ (rig.engine.getLfo (0, 0).getMotion().phase, phaseAfter (412));
    EXPECT_EQ (rig.engine.getLfo (1, 0).getMotion().phase, phaseAfter (512));
    EXPECT_NE (rig.engine.getLfo (0, 1).getMotion().phase, 0.0f); // LFO 2 not restarted
}

TEST (Engine, SampleAndHoldDiffersBetweenChannels)
{
    Rig rig;
    EXPECT_NE (rig.engine.getLfo (0, 0).getTable (Lfo::sampleAndHold), rig.engine.getLfo (1, 0).getTable (Lfo::sampleAndHold));
    EXPECT_NE (rig.engine.getLfo (0, 0).getTable (Lfo::sampleAndHold), rig.engine.getLfo (0, 1).getTable (Lfo::sampleAndHold));

    Engine same (42);
    EXPECT_EQ (rig.engine.getLfo (1, 1).getTable (Lfo::sampleAndHold), same.getLfo (1, 1).getTable (Lfo::sampleAndHold));
}

TEST (Engine, LfosNobodyReadsKeepMovingExactly)
{
    // Whether or not a modulation reads an LFO in a block, its phase, last index and hold
    // position move the same way.
    for (int wave : { (int) Lfo::triangle, (int) Lfo::sampleAndHold })
    {
        Rig read, unread;

        for (auto* rig : { &read, &unread })
            rig->settings.lfo[0] = { wave, 37.0f, false, 6 };

        read.settings.delay[0].timeModSource = (int) ModSource::lfo1;
        read.settings.delay[0].timeModDepth = 0.2f;

        std::vector<float> a (3000, 0.1f), b (3000, 0.1f), c (3000, 0.1f), d (3000, 0.1f);
        read.run (a, &b, 300);
        unread.run (c, &d, 300);

        for (int channel = 0; channel < 2; ++channel)
        {
            const auto& x = read.engine.getLfo (channel, 0).getMotion();
            const auto& y = unread.engine.getLfo (channel, 0).getMotion();
            EXPECT_EQ (x.phase, y.phase) << wave;
            EXPECT_EQ (x.lastIndex, y.lastIndex) << wave;
            EXPECT_EQ (x.holdIndex, y.holdIndex) << wave;
        }
    }
}
