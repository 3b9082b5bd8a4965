#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

using namespace veltrane;

namespace
{
float ms (float time) { return std::sqrt ((time - 1.0f) / 1999.0f); }   // square law over 1..2000 ms
float choice (int k, int count) { return (float) k / (float) (count - 1); }
using Settings = std::vector<std::pair<int, float>>;
juce::AudioBuffer<float> filled (int channels, int length, std::function<float (int)> sample)
{
    juce::AudioBuffer<float> audio (channels, length);
    for (int i = 0; i < length * channels; ++i)
        audio.setSample (i / length, i % length, sample (i % length));
    return audio;
}
struct Rig
{
    explicit Rig (const Settings& settings = {}, int channels = 2)
    {
        juce::AudioProcessor::BusesLayout layout;
        layout.inputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
        layout.outputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
        EXPECT_TRUE (processor.setBusesLayout (layout));
        for (auto [index, value] : settings)
            processor.setParameter (index, value);
        auto silence = filled (channels, 4 * 44100, [] (int) { return 0.0f; });
        run (silence);   // the delay times glide to their targets; then the lines are cleared
        processor.prepareToPlay (44100.0, 512);
    }
    // In blocks of 512; MIDI positions count from the buffer's start.
    juce::AudioBuffer<float>& run (juce::AudioBuffer<float>& audio, const juce::MidiBuffer& midi = {})
    {
        for (int start = 0; start < audio.getNumSamples(); start += 512)
        {
            juce::AudioBuffer<float> block (audio.getArrayOfWritePointers(), audio.getNumChannels(), start, std::min (512, audio.getNumSamples() - start));
            juce::MidiBuffer blockMidi;
            blockMidi.addEvents (midi, start, block.getNumSamples(), -start);
            processor.processBlock (block, blockMidi);
        }
        return audio;
    }
    const tools::PrivateHome home;   // presets and preferences of its own
    VeltraneAudioProcessor processor;
};
int firstAbove (const juce::AudioBuffer<float>& audio, int channel, float threshold)
{
    int i = 0;
    while (i < audio.getNumSamples() && std::abs (audio.getSample (channel, i)) <= threshold)
        ++i;
    return i;
}
}

TEST (ProcessorBlock, EveryMixModeRoutesGainsAndRepeatsTheDelays)
{
    // Unless defaults: Delay 1 at 100 ms (4410 samples) and +6 dB, Delay 2 at 300 ms (13230) and -6 dB, no feedback.
    const float g1 = 1.995262f, g2 = 0.501187f;
    using Echoes = std::vector<std::pair<int, float>>;   // position, amplitude (an echo may straddle two samples)
    const struct { int mode, channels; Echoes left, right; } cases[] {
        { -1, 2, { { 5292, 2.0f }, { 10584, 0.768f }, { 15876, 0.294912f } }, { { 5292, 2.0f }, { 10584, 0.768f }, { 15876, 0.294912f } } },
        { 0, 2, { { 4410, g1 }, { 13230, g2 } }, { { 4410, g1 }, { 13230, g2 } } },   // "Parallel"
        { 1, 2, { { 17640, g2 } }, { { 17640, g2 } } },   // "Chain": Delay 1 unscaled into Delay 2
        { 2, 2, { { 17640, g1 } }, { { 17640, g1 } } },   // "Reverse Chain"
        { 3, 2, { { 4410, g1 } }, { { 4410, g1 } } },     // "Solo 1"
        { 4, 2, { { 13230, g2 } }, { { 13230, g2 } } },   // "Solo 2"
        { 5, 2, { { 4410, g1 } }, { { 13230, g2 } } },    // "Stereo Parallel"
        { 6, 2, { { 13230, g2 } }, { { 4410, g1 } } },    // "Reverse Stereo Parallel"
        { 5, 1, { { 4410, g1 } }, {} }, { 6, 1, { { 13230, g2 } }, {} },   // mono hears the left channel's delay
    };
    for (const auto& c : cases)
    {
        Rig rig (c.mode < 0 ? Settings {} : Settings { { Param::MixMode, choice (c.mode, 7) }, { Param::Delay1Time, ms (100.0f) }, { Param::Delay2Time, ms (300.0f) },
                                                       { Param::Delay1Feedback, 0.0f }, { Param::Delay2Feedback, 0.0f }, { Param::Delay1Gain, 1.0f }, { Param::Delay2Gain, 0.709141f } },
                 c.channels);
        auto audio = filled (c.channels, 20000, [] (int i) { return i == 0 ? 1.0f : 0.0f; });
        rig.run (audio);
        for (int channel = 0; channel < c.channels; ++channel)
        {
            float sum = 0.0f, expectedSum = 0.0f;
            for (auto [at, gain] : channel == 0 ? c.left : c.right)
            {
                EXPECT_NEAR (audio.getSample (channel, at) + audio.getSample (channel, at + 1), gain, 2e-3) << "mode " << c.mode << " at " << at;
                expectedSum += gain;
            }
            for (int i = 0; i < 20000; ++i)
                sum += audio.getSample (channel, i);
            EXPECT_EQ (firstAbove (audio, channel, 1.0e-6f), (channel == 0 ? c.left : c.right).front().first) << "mode " << c.mode;
            EXPECT_NEAR (sum, expectedSum, 2e-3) << "nothing else in mode " << c.mode << " on channel " << channel;
        }
    }
}

TEST (ProcessorBlock, EachModulationSourceMovesTheDelayOrTheFeedback)
{
    // A constant 0.5 through Delay 1 alone at 500 ms (22050 samples, swinging by up to 22050)
    // with instant followers: the step arrives after the modulated delay. Follower 2 at -16 dB
    // sees 0.5 * 0.158489; LFO 1 "Square" and LFO 2 "Saw Down" stand at +1 (0 Hz).
    const Settings sources { { Param::MixMode, choice (3, 7) }, { Param::Envelope1Attack, 0.0f }, { Param::Envelope1Release, 0.0f },
                             { Param::Envelope2Attack, 0.0f }, { Param::Envelope2Release, 0.0f }, { Param::Envelope2Sensitivity, 0.0f },
                             { Param::LFO1Wave, choice (1, 6) }, { Param::LFO1Rate, 0.0f }, { Param::LFO2Wave, choice (3, 6) }, { Param::LFO2Rate, 0.0f } };
    const struct { int source; float depth; double expected; } cases[] { { 1, 1.0f, 33075 }, { 2, 1.0f, 11025 }, { 3, 1.0f, 22050 * (1 + 0.5 * 0.158489) },
                                                                          { 4, 1.0f, 22050 * (1 - 0.5 * 0.158489) }, { 5, 0.8f, 39690 }, { 6, 0.5f, 33075 }, { 0, 1.0f, 22050 } };
    for (const auto& c : cases)
    {
        auto settings = sources;
        settings.insert (settings.end(), { { Param::Delay1Time, ms (500.0f) }, { Param::Delay1Feedback, 0.0f }, { Param::Delay1TimeModSource, choice (c.source, 7) },
                                           { Param::Delay1TimeMod, c.depth } });
        Rig rig (settings);
        auto audio = filled (2, 45000, [] (int) { return 0.5f; });
        rig.run (audio);
        EXPECT_NEAR (firstAbove (audio, 0, 0.25f), c.expected, 1.0) << "source " << c.source;
        EXPECT_NEAR (firstAbove (audio, 1, 0.25f), c.expected, 1.0) << "source " << c.source;
    }
    // Feedback 0.4 swung by LFO 1 at +1 to 0.8: each repeat is 0.8 * 0.96 of the last.
    auto settings = sources;
    settings.insert (settings.end(), { { Param::Delay1Time, ms (100.0f) }, { Param::Delay1FeedbackModSource, choice (5, 7) }, { Param::Delay1FeedbackMod, 1.0f } });
    Rig rig (settings);
    auto audio = filled (2, 10000, [] (int i) { return i == 0 ? 1.0f : 0.0f; });
    rig.run (audio);
    EXPECT_NEAR ((audio.getSample (1, 8820) + audio.getSample (1, 8821)) / (audio.getSample (1, 4410) + audio.getSample (1, 4411)), 0.768f, 1e-4);
}

TEST (ProcessorBlock, RandomizeDrawsFromTheDocumentedGeneratorAndSparesItsList)
{
    Rig rig ({ { Param::DryWet, 0.3f }, { Param::Waveshaper, 1.0f }, { Param::LFO1Sync, 1.0f } });
    std::vector<float> before;
    for (int i = 0; i < Param::count; ++i)
        before.push_back (rig.processor.getParameter (i));
    rig.processor.seedRandomiser (2024);
    rig.processor.setParameter (Param::Randomize, 1.0f);
    auto audio = filled (2, 64, [] (int) { return 0.0f; });
    rig.run (audio);
    const juce::StringArray spared { "Delay1Gain", "Delay2Gain", "DryWet", "Waveshaper", "WaveshaperAmount", "LFO1Sync", "LFO2Sync" };
    auto seed = (juce::uint64) 2024;
    for (int i = 0; i < Param::count; ++i)
    {
        const auto name = rig.processor.getParameterName (i);
        if (name != "Randomize" && ! spared.contains (name))
            seed = (seed * 0x5deece66dULL + 11) & 0xffffffffffffULL;
        const auto expected = name == "Randomize" ? 0.0f : spared.contains (name) ? before[(size_t) i] : (float) (juce::uint32) (seed >> 16) * 2.3283064e-10f;
        EXPECT_EQ (rig.processor.getParameter (i), expected) << name;
    }
}

TEST (ProcessorBlock, ProgramChangesAndLearnedControllersAreHeardFromTheNextBlock)
{
    for (const bool byProgram : { true, false })
    {
        const Settings shortDelays { { Param::Delay1Time, 0.0f }, { Param::Delay2Time, 0.0f } };   // 1 ms: the wet sound is plainly not the input
        Rig rig (shortDelays), untouched (shortDelays);
        for (auto [name, dryWet] : { std::pair ("Dry", 0.0f), { "Wet", 1.0f } })
        {
            rig.processor.setPresetName (name);
            rig.processor.setParameter (Param::DryWet, dryWet);
            rig.processor.savePreset();
        }
        rig.processor.getParameterRecord (Param::DryWet).midiController = 7;
        const auto input = filled (2, 1024, [] (int i) { return 0.3f * std::sin ((float) i * 0.05f) + 0.01f; });
        auto audio = input, reference = input;
        juce::MidiBuffer midi;
        midi.addEvent (byProgram ? juce::MidiMessage::programChange (1, rig.processor.getPresetNames().indexOf ("Dry"))
                                 : juce::MidiMessage::controllerEvent (3, 7, 0), 200);
        rig.run (audio, midi);
        untouched.run (reference);
        for (int i = 0; i < 1024; ++i)
            ASSERT_EQ (audio.getSample (0, i), (i < 512 ? reference : input).getSample (0, i)) << i << (byProgram ? " program" : " controller");
    }
}

TEST (ProcessorBlock, NoteOnRestartsTheLfoOnTheLeftAtItsSampleAndOnTheRightAtTheBlockStart)
{
    Rig rig ({ { Param::LFO1Rate, std::sqrt (3.0f / 40.0f) }, { Param::LFO2Rate, std::sqrt (5.0f / 40.0f) } });
    const auto& engine = rig.processor.getEngine();
    const auto lfo2Before = engine.getLfo (0, 1).getMotion().phase;
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::noteOn (1, 60, (juce::uint8) 100), 100);
    midi.addEvent (juce::MidiMessage::noteOff (2, 60), 50);   // note-offs, velocity 0 and MIDI channel 3 change nothing
    midi.addEvent (juce::MidiMessage::noteOn (2, 61, (juce::uint8) 0), 60);
    midi.addEvent (juce::MidiMessage::noteOn (3, 62, (juce::uint8) 90), 70);
    auto audio = filled (2, 512, [] (int) { return 0.0f; });
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
    } none, at90, withoutTempo;
    at90.position.emplace().setBpm (90.0);
    withoutTempo.position.emplace();
    // "1/4": 2 Hz at the 120 bpm assumed without a position, 1.5 Hz at 90 bpm, still at 0 bpm.
    for (auto [playHead, hz] : { std::pair<PlayHead*, float> (nullptr, 2.0f), { &none, 2.0f }, { &at90, 1.5f }, { &withoutTempo, 0.0f } })
    {
        Rig rig ({ { Param::LFO1Sync, 1.0f } });
        rig.processor.setPlayHead (playHead);
        auto audio = filled (2, 64, [] (int) { return 0.0f; });
        rig.run (audio);
        EXPECT_FLOAT_EQ (rig.processor.getEngine().getLfo (1, 0).getFrequency(), hz);
    }
}
