#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace veltrane;

TEST (ProcessorAnswers, LayoutsAreJudgedByChannelCount)
{
    using Set = juce::AudioChannelSet;
    VeltraneAudioProcessor processor;
    auto accepts = [&processor] (Set in, Set out) {
        juce::AudioProcessor::BusesLayout layout { { in }, { out } };
        return processor.checkBusesLayoutSupported (layout);
    };
    EXPECT_TRUE (accepts (Set::discreteChannels (2), Set::channelSetWithChannels ({ Set::leftSurround, Set::rightSurround })));
    EXPECT_TRUE (accepts (Set::discreteChannels (1), Set::mono()));
    EXPECT_FALSE (accepts (Set::createLCR(), Set::createLCR()));
    EXPECT_FALSE (accepts (Set::disabled(), Set::disabled()));
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
    buffer.clear();
    buffer.setSample (1, 63, 0.5f);
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::controllerEvent (1, 7, 0), 10);
    processor.processBlockBypassed (buffer, midi);

    EXPECT_EQ (buffer.getSample (1, 63), 0.5f);   // fully wet, unbypassed, this would be silence
    EXPECT_EQ (processor.getParameterText (Param::Randomize), "Off");
    EXPECT_EQ (processor.getParameter (Param::DryWet), 0.0f);
}
