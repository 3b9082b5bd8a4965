#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace veltrane;

TEST (ProcessorAnswers, LayoutsAreJudgedByChannelCount)
{
    using Set = juce::AudioChannelSet;
    const Set surroundPair = Set::channelSetWithChannels ({ Set::leftSurround, Set::rightSurround });
    const struct { Set in, out; bool accepted; } cases[] = {
        { Set::discreteChannels (2), Set::discreteChannels (2), true },
        { Set::stereo(), Set::discreteChannels (2), true },
        { surroundPair, surroundPair, true },
        { Set::discreteChannels (1), Set::mono(), true },
        { Set::createLCR(), Set::createLCR(), false },
        { Set::discreteChannels (2), Set::mono(), false },
        { Set::disabled(), Set::disabled(), false },
    };

    VeltraneAudioProcessor processor;
    for (const auto& c : cases)
    {
        juce::AudioProcessor::BusesLayout layout;
        layout.inputBuses.add (c.in);
        layout.outputBuses.add (c.out);
        EXPECT_EQ (processor.checkBusesLayoutSupported (layout), c.accepted) << c.in.getDescription() << " / " << c.out.getDescription();
    }
}

TEST (ProcessorAnswers, RandomizeReachesTheLastChoice)
{
    // The fourth draw from this seed has its top 32 bits set, a draw of exactly 1.0;
    // the fourth parameter drawn is Delay1TimeModSource.
    VeltraneAudioProcessor processor;
    processor.seedRandomiser (161453191811632LL);
    processor.setParameter (Param::Randomize, 1.0f);
    processor.serveBlockStartRequests();

    EXPECT_EQ (processor.getParameter (Param::Delay1TimeModSource), 1.0f);
    EXPECT_EQ (processor.getParameterText (Param::Delay1TimeModSource), "LFO 2");
    EXPECT_NEAR (processor.getParameter (Param::Delay1TimeMod), 0.2718491f, 1e-7f);
}

TEST (ProcessorAnswers, LastParameterNameAndTextAreOnePair)
{
    VeltraneAudioProcessor processor;
    std::atomic<bool> running { true };
    auto write = [&] {
        for (int i = 0; running.load(); ++i)
            processor.setParameter (i % 2 == 0 ? Param::Delay1Time : Param::MixMode, (float) (i % 7) / 6.0f);
    };
    std::thread writers[] = { std::thread (write), std::thread (write), std::thread (write) };

    // Reads for half a second while three threads keep setting parameters.
    int reads = 0, mismatches = 0;
    for (const auto end = juce::Time::getMillisecondCounter() + 500; juce::Time::getMillisecondCounter() < end; ++reads)
    {
        const auto last = processor.getLastParameter();
        if (last.name.isNotEmpty() && last.text.endsWith (" Ms") != (last.name == "Delay1Time"))
            ++mismatches;
    }

    running.store (false);
    for (auto& writer : writers)
        writer.join();
    EXPECT_EQ (mismatches, 0) << "of " << reads << " reads";
}

TEST (ProcessorAnswers, BypassedBlockPassesTheInputAndServesRequests)
{
    VeltraneAudioProcessor processor;
    processor.prepareToPlay (48000.0, 64);
    processor.getParameterRecord (Param::DryWet).midiController = 7;
    processor.setParameter (Param::Randomize, 1.0f);

    juce::AudioBuffer<float> buffer (2, 64);
    for (int i = 0; i < 64; ++i)
        for (int c = 0; c < 2; ++c)
            buffer.setSample (c, i, 0.01f * (float) i);
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::controllerEvent (1, 7, 0), 10);
    processor.processBlockBypassed (buffer, midi);

    EXPECT_EQ (buffer.getSample (1, 63), 0.01f * 63.0f);   // fully wet, unbypassed, this would be silence
    EXPECT_EQ (processor.getParameterText (Param::Randomize), "Off");
    EXPECT_EQ (processor.getParameter (Param::DryWet), 0.0f);
}
