#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

namespace
{
float timeValue (float ms) { return std::sqrt ((ms - 1.0f) / 1999.0f); }   // square law over 1..2000 ms
float choice (int k, int count) { return (float) k / (float) (count - 1); }

struct Rig
{
    explicit Rig (std::initializer_list<std::pair<int, float>> values = {}, int channels = 2)
    {
        const auto set = channels == 1 ? juce::AudioChannelSet::mono() : juce::AudioChannelSet::stereo();
        juce::AudioProcessor::BusesLayout layout;
        layout.inputBuses.add (set);
        layout.outputBuses.add (set);
        EXPECT_TRUE (processor.setBusesLayout (layout));
        processor.prepareToPlay (44100.0, 512);
        for (auto [index, value] : values)
            processor.setParameter (index, value);
    }

    // The whole buffer in blocks of 512; the MIDI positions count from the buffer's start.
    void run (juce::AudioBuffer<float>& audio, const juce::MidiBuffer& midi = {})
    {
        for (int start = 0; start < audio.getNumSamples(); start += 512)
        {
            const auto n = std::min (512, audio.getNumSamples() - start);
            juce::AudioBuffer<float> block (audio.getArrayOfWritePointers(), audio.getNumChannels(), start, n);
            juce::MidiBuffer blockMidi;
            blockMidi.addEvents (midi, start, n, -start);
            processor.processBlock (block, blockMidi);
        }
    }

    // Lets the delay times glide to their targets, then silences the lines.
    Rig& settle()
    {
        juce::AudioBuffer<float> silence (processor.getTotalNumInputChannels(), 4 * 44100);
        silence.clear();
        run (silence);
        processor.prepareToPlay (44100.0, 512);
        return *this;
    }

    const tools::PrivateHome home;   // presets and preferences of its own
    VeltraneAudioProcessor processor;
};

juce::AudioBuffer<float> filled (int channels, int length, std::function<float (int)> sample)
{
    juce::AudioBuffer<float> audio (channels, length);
    for (int c = 0; c < channels; ++c)
        for (int i = 0; i < length; ++i)
            audio.setSample (c, i, sample (i));
    return audio;
}

juce::AudioBuffer<float> impulses (int channels, int length) { return filled (channels, length, [] (int i) { return i == 0 ? 1.0f : 0.0f; }); }

// An echo may straddle two samples.
float echoAt (const juce::AudioBuffer<float>& audio, int channel, int i) { return audio.getSample (channel, i) + audio.getSample (channel, i + 1); }

int firstAbove (const juce::AudioBuffer<float>& audio, int channel, float threshold)
{
    for (int i = 0; i < audio.getNumSamples(); ++i)
        if (std::abs (audio.getSample (channel, i)) > threshold)
            return i;
    return -1;
}
}

TEST (ProcessorBlock, DefaultsEchoEvery120MsAt0_384OfThePrevious)
{
    Rig rig;
    rig.settle();
    auto audio = impulses (2, 4 * 5292 + 10);
    rig.run (audio);

    for (int c = 0; c < 2; ++c)
    {
        EXPECT_EQ (firstAbove (audio, c, 1.0e-6f), 5292) << "no direct sound";
        EXPECT_NEAR (echoAt (audio, c, 5292), 2.0f, 2e-3);   // both delays
        for (int k = 2; k <= 4; ++k)
            EXPECT_NEAR (echoAt (audio, c, k * 5292) / echoAt (audio, c, (k - 1) * 5292), 0.384f, 1e-4);
    }
}

TEST (ProcessorBlock, EveryMixModeRoutesAndGainsTheDelays)
{
    // Delay 1 at 100 ms (4410 samples) and +6 dB, Delay 2 at 300 ms (13230) and -6 dB, no feedback.
    const float g1 = 1.995262f, g2 = 0.501187f;
    using Echoes = std::vector<std::pair<int, float>>;
    const struct { int mode, channels; Echoes left, right; } cases[] {
        { 0, 2, { { 4410, g1 }, { 13230, g2 } }, { { 4410, g1 }, { 13230, g2 } } },   // "Parallel"
        { 1, 2, { { 17640, g2 } }, { { 17640, g2 } } },                               // "Chain": Delay 1 unscaled into Delay 2
        { 2, 2, { { 17640, g1 } }, { { 17640, g1 } } },                               // "Reverse Chain"
        { 3, 2, { { 4410, g1 } }, { { 4410, g1 } } },                                 // "Solo 1"
        { 4, 2, { { 13230, g2 } }, { { 13230, g2 } } },                               // "Solo 2"
        { 5, 2, { { 4410, g1 } }, { { 13230, g2 } } },                                // "Stereo Parallel"
        { 6, 2, { { 13230, g2 } }, { { 4410, g1 } } },                                // "Reverse Stereo Parallel"
        { 5, 1, { { 4410, g1 } }, {} }, { 6, 1, { { 13230, g2 } }, {} },              // mono: the left channel's delay
    };

    for (const auto& c : cases)
    {
        Rig rig ({ { Param::MixMode, choice (c.mode, 7) }, { Param::Delay1Time, timeValue (100.0f) }, { Param::Delay2Time, timeValue (300.0f) },
                   { Param::Delay1Feedback, 0.0f }, { Param::Delay2Feedback, 0.0f }, { Param::Delay1Gain, 1.0f }, { Param::Delay2Gain, 0.709141f } },
                 c.channels);
        rig.settle();
        auto audio = impulses (c.channels, 20000);
        rig.run (audio);

        for (int channel = 0; channel < c.channels; ++channel)
        {
            const auto& echoes = channel == 0 ? c.left : c.right;
            EXPECT_EQ (firstAbove (audio, channel, 1.0e-6f), echoes.front().first) << "mode " << c.mode << " channel " << channel;
            float expectedSum = 0.0f;
            for (auto [at, gain] : echoes)
            {
                EXPECT_NEAR (echoAt (audio, channel, at), gain, 1e-3) << "mode " << c.mode << " at " << at;
                expectedSum += gain;
            }
            float sum = 0.0f;
            for (int i = 0; i < audio.getNumSamples(); ++i)
                sum += audio.getSample (channel, i);
            EXPECT_NEAR (sum, expectedSum, 1e-3) << "nothing else, mode " << c.mode << " channel " << channel;
        }
    }
}

TEST (ProcessorBlock, EachModulationSourceMovesTheDelay)
{
    // A constant 0.5 through Delay 1 alone at 500 ms (22050 samples, swinging by up to 22050)
    // with instant followers: the step arrives after the modulated delay. Follower 2 at -16 dB
    // sees 0.5 * 0.158489; LFO 1 "Square" and LFO 2 "Saw Down" stand at +1 (0 Hz).
    const struct { int source; float depth; double expected; } cases[] {
        { 1, 1.0f, 33075 }, { 2, 1.0f, 11025 }, { 3, 1.0f, 22050 * (1 + 0.5 * 0.158489) }, { 4, 1.0f, 22050 * (1 - 0.5 * 0.158489) },
        { 5, 0.8f, 39690 }, { 6, 0.5f, 33075 }, { 0, 1.0f, 22050 },
    };

    for (const auto& c : cases)
    {
        Rig rig ({ { Param::MixMode, choice (3, 7) }, { Param::Delay1Time, timeValue (500.0f) }, { Param::Delay1Feedback, 0.0f },
                   { Param::Delay1TimeModSource, choice (c.source, 7) }, { Param::Delay1TimeMod, c.depth },
                   { Param::Envelope1Attack, 0.0f }, { Param::Envelope1Release, 0.0f }, { Param::Envelope2Attack, 0.0f },
                   { Param::Envelope2Release, 0.0f }, { Param::Envelope2Sensitivity, 0.0f }, { Param::LFO1Wave, choice (1, 6) },
                   { Param::LFO1Rate, 0.0f }, { Param::LFO2Wave, choice (3, 6) }, { Param::LFO2Rate, 0.0f } });
        rig.settle();
        auto audio = filled (2, 45000, [] (int) { return 0.5f; });
        rig.run (audio);
        for (int channel = 0; channel < 2; ++channel)
            EXPECT_NEAR (firstAbove (audio, channel, 0.25f), c.expected, 1.0) << "source " << c.source;
    }

    // Feedback 0.4 swung by LFO 1 at +1 with full depth: 0.8, so each repeat is 0.8 * 0.96 of the last.
    Rig rig ({ { Param::MixMode, choice (3, 7) }, { Param::Delay1Time, timeValue (100.0f) }, { Param::Delay1FeedbackModSource, choice (5, 7) },
               { Param::Delay1FeedbackMod, 1.0f }, { Param::LFO1Wave, choice (1, 6) }, { Param::LFO1Rate, 0.0f } });
    rig.settle();
    auto audio = impulses (2, 10000);
    rig.run (audio);
    EXPECT_NEAR (echoAt (audio, 1, 8820) / echoAt (audio, 1, 4410), 0.8f * 0.96f, 1e-4);
}

TEST (ProcessorBlock, RandomizeDrawsFromTheDocumentedGeneratorAndSparesItsList)
{
    Rig rig ({ { Param::DryWet, 0.3f }, { Param::Waveshaper, 1.0f }, { Param::LFO1Sync, 1.0f }, { Param::Randomize, 1.0f } });
    rig.processor.seedRandomiser (2024);
    std::vector<float> before;
    for (int i = 0; i < Param::count; ++i)
        before.push_back (rig.processor.getParameter (i));

    auto audio = impulses (2, 64);
    rig.run (audio);

    const juce::StringArray spared { "Delay1Gain", "Delay2Gain", "DryWet", "Waveshaper", "WaveshaperAmount", "LFO1Sync", "LFO2Sync" };
    juce::int64 seed = 2024;
    for (int i = 0; i < Param::count; ++i)
    {
        const auto name = rig.processor.getParameterName (i);
        if (name == "Randomize")
            EXPECT_EQ (rig.processor.getParameterText (i), "Off");
        else if (spared.contains (name))
            EXPECT_EQ (rig.processor.getParameter (i), before[(size_t) i]) << name;
        else
        {
            seed = (juce::int64) (((juce::uint64) seed * 0x5deece66dULL + 11) & 0xffffffffffffULL);
            EXPECT_EQ (rig.processor.getParameter (i), (float) (juce::uint32) (seed >> 16) * 2.3283064e-10f) << name;
        }
    }
}

TEST (ProcessorBlock, ProgramChangeAndLearnedControllerAreHeardFromTheNextBlock)
{
    for (const bool byProgram : { true, false })
    {
        Rig rig ({ { Param::Delay1Time, 0.0f }, { Param::Delay2Time, 0.0f } });   // 1 ms: the wet sound is plainly not the input
        rig.processor.setPresetName ("Dry");
        rig.processor.setParameter (Param::DryWet, 0.0f);
        rig.processor.savePreset();
        rig.processor.setPresetName ("Wet");
        rig.processor.setParameter (Param::DryWet, 1.0f);
        rig.processor.savePreset();
        rig.processor.getParameterRecord (Param::DryWet).midiController.store (7);
        rig.settle();

        Rig untouched ({ { Param::Delay1Time, 0.0f }, { Param::Delay2Time, 0.0f } });
        untouched.settle();

        const auto input = filled (2, 1024, [] (int i) { return 0.3f * std::sin ((float) i * 0.05f) + 0.01f; });
        auto audio = input, reference = input;
        juce::MidiBuffer midi;
        midi.addEvent (byProgram ? juce::MidiMessage::programChange (1, rig.processor.getPresetNames().indexOf ("Dry"))
                                 : juce::MidiMessage::controllerEvent (3, 7, 0), 200);
        rig.run (audio, midi);
        untouched.run (reference);

        for (int i = 0; i < 1024; ++i)
            ASSERT_EQ (audio.getSample (0, i), (i < 512 ? reference : input).getSample (0, i)) << "at " << i << ", program " << byProgram;
    }
}

TEST (ProcessorBlock, NoteOnRestartsTheLeftLfoAtItsSampleAndTheRightAtTheBlockStart)
{
    Rig rig ({ { Param::LFO1Rate, std::sqrt (3.0f / 40.0f) }, { Param::LFO2Rate, std::sqrt (5.0f / 40.0f) } });
    auto audio = impulses (2, 512);
    rig.run (audio);

    const auto& engine = rig.processor.getEngine();
    const auto lfo2Before = engine.getLfo (0, 1).getMotion().phase;
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::noteOn (1, 60, (juce::uint8) 100), 100);
    midi.addEvent (juce::MidiMessage::noteOff (2, 60), 50);                    // note-offs, velocity 0 and
    midi.addEvent (juce::MidiMessage::noteOn (2, 61, (juce::uint8) 0), 60);    // MIDI channel 3 change nothing
    midi.addEvent (juce::MidiMessage::noteOn (3, 62, (juce::uint8) 90), 70);
    rig.run (audio, midi);

    auto phaseAfter = [] (float phase, float step, int ticks) {
        for (int i = 0; i < ticks; ++i)
            phase = phase + step >= 1024.0f ? phase + step - 1024.0f : phase + step;
        return phase;
    };
    const auto step1 = engine.getLfo (0, 0).getPhaseIncrement(), step2 = engine.getLfo (0, 1).getPhaseIncrement();
    EXPECT_EQ (engine.getLfo (0, 0).getMotion().phase, phaseAfter (0.0f, step1, 412));
    EXPECT_EQ (engine.getLfo (1, 0).getMotion().phase, phaseAfter (0.0f, step1, 512));
    EXPECT_EQ (engine.getLfo (0, 1).getMotion().phase, phaseAfter (lfo2Before, step2, 512));
    EXPECT_EQ (engine.getLfo (1, 1).getMotion().phase, phaseAfter (lfo2Before, step2, 512));
}

TEST (ProcessorBlock, SyncedLfosTakeTheTempoFromThePlayHead)
{
    struct PlayHead final : juce::AudioPlayHead
    {
        juce::Optional<PositionInfo> getPosition() const override { return position; }
        juce::Optional<PositionInfo> position;
    };
    PlayHead none, at90, withoutTempo;
    at90.position.emplace().setBpm (90.0);
    withoutTempo.position.emplace();

    // "1/4": 2 Hz at the 120 bpm assumed without a position, 1.5 Hz at 90 bpm, standing still at 0 bpm.
    for (auto [playHead, hz] : { std::pair<PlayHead*, float> (nullptr, 2.0f), { &none, 2.0f }, { &at90, 1.5f }, { &withoutTempo, 0.0f } })
    {
        Rig rig ({ { Param::LFO1Sync, 1.0f } });
        rig.processor.setPlayHead (playHead);
        auto audio = impulses (2, 64);
        rig.run (audio);
        EXPECT_FLOAT_EQ (rig.processor.getEngine().getLfo (1, 0).getFrequency(), hz);
    }
}
