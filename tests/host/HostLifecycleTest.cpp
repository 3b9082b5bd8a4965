// The shipped VST2 binary driven the way demanding hosts and validators drive a plug-in: many
// instances, absurd rates and block sizes, odd transports, MIDI of every kind, non-finite
// input. Nothing may crash, and the output stays finite and bounded.

#include "HostTestSupport.h"

#include <gtest/gtest.h>

namespace
{
using namespace veltrane::test;

// The peak of numBlocks blocks of noise at half scale (infinity for a non-finite sample).
float peakOf (juce::AudioPluginInstance& plugin, int channels, int blockSize, int numBlocks,
              const std::function<void (juce::MidiBuffer&, int)>& midiFor = {}, float poison = 0.0f)
{
    juce::AudioBuffer<float> buffer (channels, blockSize);
    juce::Random random (42);
    float peak = 0.0f;
    for (int block = 0; block < numBlocks; ++block)
    {
        for (int c = 0; c < channels; ++c)
            for (int j = 0; j < blockSize; ++j)
                buffer.setSample (c, j, j == 7 && block == 0 && poison != 0.0f ? poison : random.nextFloat() - 0.5f);
        juce::MidiBuffer midi;
        if (midiFor)
            midiFor (midi, block);
        plugin.processBlock (buffer, midi);
        for (int c = 0; c < channels; ++c)
            for (int j = 0; j < blockSize; ++j)
                peak = std::isfinite (buffer.getSample (c, j)) ? std::max (peak, std::abs (buffer.getSample (c, j))) : INFINITY;
    }
    return peak;
}
}

TEST (HostLifecycle, ManyInstancesInARowAndSideBySide)
{
    std::vector<std::unique_ptr<juce::AudioPluginInstance>> instances;
    for (int i = 0; i < 24; ++i)
    {
        instances.push_back (loadPlugin (Format::vst2));
        ASSERT_NE (instances.back(), nullptr);
        EXPECT_LT (peakOf (*instances.back(), 2, 128, 4), 10.0f);
        if (i % 3 != 2)
            instances.back().reset();   // most closed at once, the others at the end in another order
    }
    for (size_t i = instances.size(); i-- > 0;)
        instances[(i * 7) % instances.size()].reset();
}

TEST (HostLifecycle, AbsurdRatesBlockSizesTransportsMidiAndInput)
{
    auto plugin = loadPlugin (Format::vst2);
    ASSERT_NE (plugin, nullptr);
    auto& parameters = plugin->getParameters();
    for (auto [index, value] : { std::pair (27, 1.0f), { 31, 1.0f }, { 2, 1.0f }, { 9, 1.0f }, { 3, 0.84f }, { 10, 1.0f }, { 1, 1.0f } })
        parameters[index]->setValueNotifyingHost (value);   // synced LFOs swing both delays, Delay 1 at full feedback

    for (auto channels : { 2, 1 })
    {
        juce::AudioProcessor::BusesLayout layout;
        layout.inputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
        layout.outputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
        ASSERT_TRUE (plugin->setBusesLayout (layout));
        for (auto rate : { 22050.0, 192000.0, 0.0, -44100.0, std::nan (""), 1.0e12, 44100.0 })
            for (auto blockSize : { 1, 3, 511, 8192 })
            {
                plugin->prepareToPlay (rate, blockSize);
                EXPECT_LT (peakOf (*plugin, channels, blockSize, juce::jlimit (1, 32, 8192 / blockSize)), 50.0f) << rate << " Hz, " << blockSize;
            }
    }

    struct PlayHead final : juce::AudioPlayHead
    {
        juce::Optional<PositionInfo> getPosition() const override
        {
            PositionInfo info;
            if (bpm > 0.0)
                info.setBpm (bpm);
            return bpm < 0.0 ? juce::Optional<PositionInfo>() : info;
        }
        double bpm = 0.0;   // no tempo; below 0: no position
    } playHead;
    plugin->setPlayHead (&playHead);
    juce::Random random (7);
    for (auto bpm : { -1.0, 0.0, 1.0, 999.0, 120.0 })
    {
        playHead.bpm = bpm;
        for (int block = 0; block < 40; ++block)   // every MIDI kind on every channel, a new block size each time
            EXPECT_LT (peakOf (*plugin, 1, 1 + random.nextInt (4096), 1, [block] (juce::MidiBuffer& midi, int) {
                const auto channel = block % 16 + 1;
                const juce::uint8 sysex[] { 0x7e, 0x7f, 0x06, 0x01 };
                for (const auto& m : { juce::MidiMessage::noteOn (channel, 60, (juce::uint8) 100), juce::MidiMessage::noteOff (channel, 60),
                                       juce::MidiMessage::controllerEvent (channel, block % 128, 64), juce::MidiMessage::programChange (channel, block),
                                       juce::MidiMessage::pitchWheel (channel, 12000), juce::MidiMessage::channelPressureChange (channel, 90),
                                       juce::MidiMessage::midiClock(), juce::MidiMessage::createSysExMessage (sysex, 4) })
                    midi.addEvent (m, midi.getNumEvents() * 3);
                midi.addEvent (juce::MidiMessage::programChange (channel, 3), 100000);   // beyond the block
            }), 50.0f) << bpm;
    }
    plugin->setPlayHead (nullptr);

    // Non-finite samples do not poison the lines or followers for the blocks after them.
    for (auto poison : { std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity() })
        EXPECT_LT (peakOf (*plugin, 1, 512, 40, {}, poison), 50.0f);
}
