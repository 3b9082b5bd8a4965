// The sound is checked against the reference model through the shipped binary (tests/host), identifiers
// and defaults in the state chunk (tests/persistence); these are the processor's and parameters' own duties.

#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cmath>
#include <thread>

using namespace veltrane;

TEST (ParameterTable, TextsFollowTheLawsAndOutOfRangeValuesAreIgnored)
{
    VeltraneAudioProcessor processor;
    for (auto [index, value, text] : { std::tuple (0, 0.5f, "500.75 Ms"), { 6, 0.5f, "-16.26 dB" }, { 6, 0.0f, "-70.00 dB" }, { 19, 1.0f, "6.00 dB" },
                                       { 26, 1.0f, "40.00 Hz" }, { 20, 0.0f, "0.00 Ms" }, { 14, 0.999f, "Stereo Parallel" }, { 14, 1.0f, "Reverse Stereo Parallel" },
                                       { 16, 1.0f, "Dirt" }, { 25, 1.0f, "Sample & Hold" }, { 32, 1.0f, "1/128D" }, { 18, 0.99f, "Off" } })
    {
        processor.setParameter (index, value);   // laws: 1 + 1999 v^2 ms, -70 + 76 sqrt (v) dB
        EXPECT_EQ (processor.getParameterText (index), text) << processor.getParameterName (index) << " at " << value;
    }
    for (auto bad : { 1.5f, -0.001f, NAN, INFINITY, 1.0000001f })
    {
        processor.setParameter (Param::Delay1Feedback, 0.5f);
        processor.setParameter (Param::Delay1Time, bad);
        EXPECT_EQ (processor.getLastParameterName() + " " + processor.getLastParameterText(), "Delay1Time 500.75 Ms") << bad;
    }
}

namespace
{
// What the processor tells its listeners, as a host's wrapper hears it.
struct HostLog final : juce::AudioProcessorListener
{
    juce::StringArray calls;
    void audioProcessorParameterChanged (juce::AudioProcessor*, int i, float v) override { calls.add ("set " + juce::String (i) + " " + juce::String (v)); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
    void audioProcessorParameterChangeGestureBegin (juce::AudioProcessor*, int i) override { calls.add ("begin " + juce::String (i)); }
    void audioProcessorParameterChangeGestureEnd (juce::AudioProcessor*, int i) override { calls.add ("end " + juce::String (i)); }
};
}

TEST (ParameterTable, ControlChangeIsOneGestureAndHostTextIsReadAsShown)
{
    VeltraneAudioProcessor processor;
    HostLog host;
    processor.addListener (&host);
    processor.setParameterFromControl (Param::DryWet, 0.25f, true);
    processor.setParameterNotifyingHost (Param::Delay1Time, 2.0f);   // refused
    EXPECT_EQ (host.calls.joinIntoString ("|"), "begin 15|set 15 0.25|end 15|set 0 " + juce::String (processor.getParameter (0)));
    processor.removeListener (&host);
    const struct { int index; const char* text; float value; } cases[] {
        { Param::MixMode, "Solo 1", 0.5f }, { Param::LFO1SyncedRate, "1/4", 6.0f / 17.0f },
        { Param::LFO2Sync, "on", 1.0f },    { Param::Delay1Time, "120.00 Ms", 0.243987f }, { Param::DryWet, "250", 1.0f },
        { Param::Delay1Feedback, "loud", 0.4f },   // no number: the value stays
    };
    for (const auto& c : cases)
        EXPECT_NEAR (processor.getParameters()[c.index]->getValueForText (c.text), c.value, 1e-6f) << c.text;
}

TEST (ProcessorBlock, RandomizeDrawsFromTheDocumentedGeneratorUpToTheLastChoiceAndSparesItsList)
{
    VeltraneAudioProcessor processor;
    for (auto [index, value] : { std::pair (Param::DryWet, 0.3f), { Param::Waveshaper, 1.0f }, { Param::LFO1Sync, 1.0f } })
        processor.setParameter (index, value);
    std::vector<float> before;
    for (int i = 0; i < Param::count; ++i)
        before.push_back (processor.getParameter (i));
    // The fourth draw from this seed has its top 32 bits set, a draw of exactly 1.0 for Delay1TimeModSource.
    const juce::int64 seed = 161453191811632LL;
    processor.seedRandomiser (seed);
    processor.setParameter (Param::Randomize, 1.0f);
    processor.serveBlockStartRequests();   // as every block starts
    const juce::StringArray spared { "Delay1Gain", "Delay2Gain", "DryWet", "Waveshaper", "WaveshaperAmount", "LFO1Sync", "LFO2Sync" };
    auto state = (juce::uint64) seed;
    for (int i = 0; i < Param::count; ++i)
    {
        const auto name = processor.getParameterName (i);
        if (name != "Randomize" && ! spared.contains (name))
            state = (state * 0x5deece66dULL + 11) & 0xffffffffffffULL;
        const auto expected = name == "Randomize" ? 0.0f : spared.contains (name) ? before[(size_t) i] : (float) (juce::uint32) (state >> 16) * 2.3283064e-10f;
        EXPECT_EQ (processor.getParameter (i), expected) << name;
    }
    EXPECT_EQ (processor.getParameterText (Param::Delay1TimeModSource), "LFO 2");
}

TEST (ProcessorBlock, BypassedBlockPassesTheInputAndServesRequests)
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

TEST (ProcessorBlock, LayoutsAreJudgedByChannelCount)
{
    using Set = juce::AudioChannelSet;
    VeltraneAudioProcessor processor;
    auto accepts = [&processor] (Set in, Set out) { return processor.checkBusesLayoutSupported ({ { in }, { out } }); };
    EXPECT_TRUE (accepts (Set::discreteChannels (2), Set::channelSetWithChannels ({ Set::leftSurround, Set::rightSurround })));
    EXPECT_TRUE (accepts (Set::discreteChannels (1), Set::mono()));
    EXPECT_FALSE (accepts (Set::discreteChannels (2), Set::mono()));
    EXPECT_FALSE (accepts (Set::createLCR(), Set::createLCR()));
    EXPECT_FALSE (accepts (Set::disabled(), Set::disabled()));
}

// Half a second of reads while three threads keep setting a time and a choice.
TEST (ProcessorBlock, LastParameterNameAndTextAreOnePair)
{
    VeltraneAudioProcessor processor;
    std::atomic<bool> running { true };
    auto write = [&] { for (int i = 0; running; ++i) processor.setParameter (i % 2 == 0 ? Param::Delay1Time : Param::MixMode, (float) (i % 7) / 6.0f); };
    std::thread writers[] = { std::thread (write), std::thread (write), std::thread (write) };
    int reads = 0, mismatches = 0;
    for (const auto end = juce::Time::getMillisecondCounter() + 500; juce::Time::getMillisecondCounter() < end; ++reads)
    {
        const auto last = processor.getLastParameter();
        mismatches += last.name.isNotEmpty() && last.text.endsWith (" Ms") != (last.name == "Delay1Time") ? 1 : 0;
    }
    running = false;
    for (auto& writer : writers)
        writer.join();
    EXPECT_EQ (mismatches, 0) << "of " << reads << " reads";
}
