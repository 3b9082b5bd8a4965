#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

namespace
{
    constexpr double rate = 44100.0;

    // Normalised value of a delay time (square law over 1..2000 ms).
    float timeValue (float ms) { return std::sqrt ((ms - 1.0f) / 1999.0f); }

    // Normalised value of choice k of a list with count entries.
    float choiceValue (int k, int count) { return (float) k / (float) (count - 1); }

    struct PlayHead final : juce::AudioPlayHead
    {
        juce::Optional<PositionInfo> getPosition() const override { return position; }
        juce::Optional<PositionInfo> position;
    };

    struct Rig
    {
        explicit Rig (int channels = 2)
        {
            const auto set = channels == 1 ? juce::AudioChannelSet::mono() : juce::AudioChannelSet::stereo();
            juce::AudioProcessor::BusesLayout layout;
            layout.inputBuses.add (set);
            layout.outputBuses.add (set);
            EXPECT_TRUE (processor.setBusesLayout (layout));
            processor.prepareToPlay (rate, 512);
        }

        void set (int index, float normalised) { processor.setParameter (index, normalised); }

        // Runs the whole buffer in blocks; midi (positions relative to the whole buffer) goes to
        // the blocks it falls in.
        void run (juce::AudioBuffer<float>& audio, int blockSize = 512, const juce::MidiBuffer& midi = {})
        {
            for (int start = 0; start < audio.getNumSamples(); start += blockSize)
            {
                const auto n = std::min (blockSize, audio.getNumSamples() - start);
                juce::AudioBuffer<float> block (audio.getArrayOfWritePointers(), audio.getNumChannels(), start, n);
                juce::MidiBuffer blockMidi;
                blockMidi.addEvents (midi, start, n, -start);
                processor.processBlock (block, blockMidi);
            }
        }

        // Lets the delay times glide to their targets, then silences the lines.
        void settle()
        {
            juce::AudioBuffer<float> silence (processor.getTotalNumInputChannels(), 44100 * 4);
            silence.clear();
            run (silence);
            processor.prepareToPlay (rate, 512);
        }

        VeltraneAudioProcessor processor;
    };

    juce::AudioBuffer<float> impulses (int channels, int length)
    {
        juce::AudioBuffer<float> audio (channels, length);
        audio.clear();

        for (int c = 0; c < channels; ++c)
            audio.setSample (c, 0, 1.0f);

        return audio;
    }

    float echoAt (const juce::AudioBuffer<float>& audio, int channel, int index)
    {
        return audio.getSample (channel, index) + audio.getSample (channel, index + 1);
    }

    // The first sample louder than the threshold, or -1.
    int firstAbove (const juce::AudioBuffer<float>& audio, int channel, float threshold = 1.0e-6f)
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
        EXPECT_EQ (firstAbove (audio, c), 5292) << "no direct sound, first echo at 120 ms";
        // The default time is 120 ms to within float rounding, so each echo may straddle two
        // samples, and the read position, a float near 88200, splits it with a coarse fraction.
        EXPECT_NEAR (echoAt (audio, c, 5292), 2.0f, 2e-3);

        for (int k = 2; k <= 4; ++k)
            EXPECT_NEAR (echoAt (audio, c, k * 5292) / echoAt (audio, c, (k - 1) * 5292), 0.384f, 1e-4);
    }
}

TEST (ProcessorBlock, EveryMixModeEchoesAtItsDelays)
{
    // Delay 1 at 100 ms (4410 samples), Delay 2 at 300 ms (13230) at -6 dB, no feedback.
    struct Case { int mode; std::vector<int> left; std::vector<int> right; };
    const Case cases[] = {
        { 0, { 4410, 13230 }, { 4410, 13230 } }, // "Parallel"
        { 1, { 17640 }, { 17640 } },             // "Chain": Delay 2 hears Delay 1
        { 2, { 17640 }, { 17640 } },             // "Reverse Chain"
        { 3, { 4410 }, { 4410 } },               // "Solo 1"
        { 4, { 13230 }, { 13230 } },             // "Solo 2"
        { 5, { 4410 }, { 13230 } },              // "Stereo Parallel"
        { 6, { 13230 }, { 4410 } },              // "Reverse Stereo Parallel"
    };

    for (const auto& c : cases)
    {
        Rig rig;
        rig.set (Param::MixMode, choiceValue (c.mode, 7));
        rig.set (Param::Delay1Time, timeValue (100.0f));
        rig.set (Param::Delay2Time, timeValue (300.0f));
        rig.set (Param::Delay1Feedback, 0.0f);
        rig.set (Param::Delay2Feedback, 0.0f);
        rig.set (Param::Delay2Gain, 0.709141f); // -6.0 dB
        rig.settle();

        const auto gain2 = decibelsToAmplitude (rig.processor.getPhysicalValue (Param::Delay2Gain));
        auto expectedGain = [&] (int at) { return at == 4410 || c.mode == 2 ? 1.0f : gain2; };

        auto audio = impulses (2, 20000);
        rig.run (audio);

        for (int channel = 0; channel < 2; ++channel)
        {
            const auto& echoes = channel == 0 ? c.left : c.right;
            EXPECT_EQ (firstAbove (audio, channel), echoes.front()) << "mode " << c.mode << " channel " << channel;

            float total = 0.0f;

            for (auto at : echoes)
            {
                EXPECT_NEAR (echoAt (audio, channel, at), expectedGain (at), 1e-4) << "mode " << c.mode << " at " << at;
                total += echoAt (audio, channel, at);
            }

            float sum = 0.0f;

            for (int i = 0; i < audio.getNumSamples(); ++i)
                sum += audio.getSample (channel, i);

            EXPECT_NEAR (sum, total, 1e-4) << "nothing else on channel " << channel << " in mode " << c.mode;
        }
    }
}

TEST (ProcessorBlock, ChainEchoesAt200MsWhateverDelay1Gain)
{
    juce::AudioBuffer<float> reference;

    for (auto gain : { 0.848338f, 0.3f, 0.0f })
    {
        Rig rig;
        rig.set (Param::MixMode, choiceValue (1, 7));
        rig.set (Param::Delay1Time, timeValue (100.0f));
        rig.set (Param::Delay2Time, timeValue (100.0f));
        rig.set (Param::Delay1Gain, gain);
        rig.settle();

        auto audio = impulses (2, 30000);
        rig.run (audio);
        EXPECT_EQ (firstAbove (audio, 0), 8820);

        if (reference.getNumSamples() == 0)
            reference = audio;
        else
            for (int i = 0; i < audio.getNumSamples(); ++i)
                ASSERT_EQ (audio.getSample (0, i), reference.getSample (0, i)) << "Delay1Gain " << gain << " at " << i;
    }
}

TEST (ProcessorBlock, MonoInputHearsOneDelayInTheStereoModes)
{
    for (auto [mode, expected] : { std::pair (5, 4410), std::pair (6, 13230) })
    {
        Rig rig (1);
        rig.set (Param::MixMode, choiceValue (mode, 7));
        rig.set (Param::Delay1Time, timeValue (100.0f));
        rig.set (Param::Delay2Time, timeValue (300.0f));
        rig.settle();

        auto audio = impulses (1, 15000);
        rig.run (audio);
        EXPECT_EQ (firstAbove (audio, 0), expected) << "mode " << mode;
    }
}

TEST (ProcessorBlock, DryBalancePassesAudioThrough)
{
    Rig rig;
    rig.set (Param::DryWet, 0.0f);
    juce::AudioBuffer<float> audio (2, 3000);

    for (int i = 0; i < audio.getNumSamples(); ++i)
        for (int c = 0; c < 2; ++c)
            audio.setSample (c, i, 0.5f * std::sin ((float) i * (c == 0 ? 0.02f : 0.05f)) + 0.001f);

    juce::AudioBuffer<float> input (audio);
    rig.run (audio);

    for (int c = 0; c < 2; ++c)
        for (int i = 0; i < audio.getNumSamples(); ++i)
            ASSERT_EQ (audio.getSample (c, i), input.getSample (c, i));
}

TEST (ProcessorBlock, RandomizeSparesItsSkipListAndTurnsItselfOff)
{
    Rig rig;
    rig.processor.seedRandomiser (2024);
    rig.set (Param::DryWet, 0.3f);
    rig.set (Param::Waveshaper, choiceValue (2, 4));
    rig.set (Param::LFO1Sync, 1.0f);

    const int spared[] = { Param::Delay1Gain, Param::Delay2Gain, Param::DryWet, Param::Waveshaper,
                           Param::WaveshaperAmount, Param::LFO1Sync, Param::LFO2Sync };
    std::vector<float> before;

    for (int i = 0; i < Param::count; ++i)
        before.push_back (rig.processor.getParameter (i));

    rig.set (Param::Randomize, 1.0f);
    juce::AudioBuffer<float> audio (2, 512);
    audio.clear();
    rig.run (audio);

    EXPECT_EQ (rig.processor.getParameterText (Param::Randomize), "Off");

    for (auto index : spared)
        EXPECT_EQ (rig.processor.getParameter (index), before[(size_t) index]) << index;

    int changed = 0;

    for (int i = 0; i < Param::count; ++i)
        changed += rig.processor.getParameter (i) != before[(size_t) i] ? 1 : 0;

    EXPECT_GE (changed, 20); // 25 drawn, a discrete one may land on its old entry
}

TEST (ProcessorBlock, ProgramChangeIsHeardFromTheNextBlock)
{
    Rig rig;
    rig.set (Param::DryWet, 0.0f);
    rig.processor.setPresetName ("Dry Only");
    rig.processor.savePreset();
    rig.set (Param::DryWet, 1.0f);
    const auto program = rig.processor.getPresetNames().indexOf ("Dry Only");
    ASSERT_GE (program, 0);

    juce::AudioBuffer<float> input (2, 1024);

    for (int i = 0; i < input.getNumSamples(); ++i)
        for (int c = 0; c < 2; ++c)
            input.setSample (c, i, 0.3f * std::sin ((float) i * 0.05f) + 0.01f);

    juce::AudioBuffer<float> audio (input);
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::programChange (1, program), 200);
    rig.run (audio, 512, midi);

    for (int i = 0; i < 512; ++i)
        ASSERT_LT (std::abs (audio.getSample (0, i)), 1.0e-6f) << "still wet (nothing echoes yet) at " << i;

    for (int i = 512; i < 1024; ++i)
        ASSERT_EQ (audio.getSample (0, i), input.getSample (0, i)) << "the preset's dry balance from the next block, at " << i;

    EXPECT_FALSE (rig.processor.presetLoadPending.load());
    EXPECT_EQ (rig.processor.getPresetName(), "Dry Only");
}

TEST (ProcessorBlock, LearnedControllerChangesTheSoundFromTheNextBlock)
{
    // Two identical processors, one of which receives DryWet = 0 through a learned controller
    // at sample 100 of the first block.
    Rig moved, untouched;
    juce::AudioBuffer<float> input (2, 1024);

    for (int i = 0; i < input.getNumSamples(); ++i)
        for (int c = 0; c < 2; ++c)
            input.setSample (c, i, 0.25f * std::sin ((float) i * 0.1f));

    for (auto* rig : { &moved, &untouched })
    {
        rig->processor.getParameterRecord (Param::DryWet).midiController.store (7);
        rig->set (Param::Delay1Time, 0.0f); // 1 ms: the wet signal is plainly not the input
        rig->set (Param::Delay2Time, 0.0f);
        rig->settle();
    }

    juce::AudioBuffer<float> movedAudio (input), untouchedAudio (input);
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::controllerEvent (1, 7, 0), 100);
    moved.run (movedAudio, 512, midi);
    untouched.run (untouchedAudio, 512);

    EXPECT_EQ (moved.processor.getParameter (Param::DryWet), 0.0f);

    for (int i = 0; i < 512; ++i)
        ASSERT_EQ (movedAudio.getSample (0, i), untouchedAudio.getSample (0, i)) << "the same wet block, at " << i;

    for (int i = 512; i < 1024; ++i)
        ASSERT_EQ (movedAudio.getSample (0, i), input.getSample (0, i)) << "dry from the next block, at " << i;
}

TEST (ProcessorBlock, NoteOnRestartsTheLeftLfoAtItsSampleAndTheRightAtZero)
{
    Rig rig;
    rig.set (Param::LFO1Rate, std::sqrt (3.0f / 40.0f)); // 3 Hz
    rig.set (Param::LFO2Rate, std::sqrt (5.0f / 40.0f));
    juce::AudioBuffer<float> audio (2, 512);
    audio.clear();
    rig.run (audio);

    const auto& engine = rig.processor.getEngine();
    const auto phase2Before = engine.getLfo (0, 1).getMotion().phase;
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::noteOn (1, 60, (juce::uint8) 100), 100);
    midi.addEvent (juce::MidiMessage::noteOff (2, 60), 50);                     // note-off: nothing
    midi.addEvent (juce::MidiMessage::noteOn (2, 61, (juce::uint8) 0), 60);     // velocity 0: a note-off
    midi.addEvent (juce::MidiMessage::noteOn (3, 62, (juce::uint8) 90), 70);    // MIDI channel 3: ignored
    rig.run (audio, 512, midi);

    const auto increment = engine.getLfo (0, 0).getPhaseIncrement();
    auto phaseAfter = [] (float start, float step, int ticks) { for (int i = 0; i < ticks; ++i) { start += step; if (start >= 1024.0f) start -= 1024.0f; } return start; };

    EXPECT_EQ (engine.getLfo (0, 0).getMotion().phase, phaseAfter (0.0f, increment, 412));
    EXPECT_EQ (engine.getLfo (1, 0).getMotion().phase, phaseAfter (0.0f, increment, 512));
    EXPECT_EQ (engine.getLfo (0, 1).getMotion().phase, phaseAfter (phase2Before, engine.getLfo (0, 1).getPhaseIncrement(), 512));
}

TEST (ProcessorBlock, PrepareWithTheSameRateSilencesTheLines)
{
    Rig rig;
    rig.set (Param::Delay1Feedback, 0.9f);
    auto audio = impulses (2, 2000);
    rig.run (audio);

    rig.processor.prepareToPlay (rate, 512);
    juce::AudioBuffer<float> silence (2, 20000);
    silence.clear();
    rig.run (silence);
    EXPECT_LT (silence.getMagnitude (0, silence.getNumSamples()), 1.0e-20f);
}

TEST (ProcessorBlock, LongBlocksStayStable)
{
    for (int blockSize : { 8192, 20000 })
    {
        Rig rig;
        rig.set (Param::Delay1Time, timeValue (1500.0f));
        rig.set (Param::Delay2Time, timeValue (30.0f));

        for (int block = 0; block < 20; ++block)
        {
            juce::AudioBuffer<float> audio (2, blockSize);

            for (int i = 0; i < blockSize; ++i)
                audio.setSample (0, i, (i % 4000) == 0 ? 0.9f : 0.0f), audio.setSample (1, i, 0.0f);

            rig.run (audio, blockSize);
            ASSERT_LT (audio.getMagnitude (0, blockSize), 4.0f) << blockSize << " block " << block;
        }

        EXPECT_NEAR (rig.processor.getEngine().getSmoothedTimeMs (0), rig.processor.getPhysicalValue (Param::Delay1Time), 0.01f);
        EXPECT_NEAR (rig.processor.getEngine().getSmoothedTimeMs (1), rig.processor.getPhysicalValue (Param::Delay2Time), 0.01f);
    }
}

TEST (ProcessorBlock, TempoComesFromThePlayHead)
{
    // "1/4" synced: 2 Hz at 120 bpm.
    auto frequencyWith = [] (PlayHead* playHead)
    {
        Rig rig;
        rig.set (Param::LFO1Sync, 1.0f);
        rig.processor.setPlayHead (playHead);
        juce::AudioBuffer<float> audio (2, 64);
        audio.clear();
        rig.run (audio);
        return rig.processor.getEngine().getLfo (0, 0).getFrequency();
    };

    EXPECT_FLOAT_EQ (frequencyWith (nullptr), 2.0f);

    PlayHead noPosition;
    EXPECT_FLOAT_EQ (frequencyWith (&noPosition), 2.0f);

    PlayHead at90;
    at90.position = juce::AudioPlayHead::PositionInfo {};
    at90.position->setBpm (90.0);
    EXPECT_FLOAT_EQ (frequencyWith (&at90), 1.5f);

    PlayHead withoutTempo;
    withoutTempo.position = juce::AudioPlayHead::PositionInfo {};
    EXPECT_EQ (frequencyWith (&withoutTempo), 0.0f);
}
