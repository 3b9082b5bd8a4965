// The shipped VST2 binary driven as demanding hosts and validators drive it: many instances, absurd rates and
// block sizes, odd transports, MIDI of every kind, non-finite input. Nothing crashes; the output stays bounded.

#include "HostTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane::test;

namespace
{
// The peak of blocks of noise at half scale (infinity for a non-finite sample), the first
// sample replaced by poison.
float peakOf (juce::AudioPluginInstance& plugin, int channels, int blockSize, int blocks, const juce::MidiBuffer& midi = {}, float poison = 0.0f)
{
    juce::AudioBuffer<float> buffer (channels, blockSize);
    juce::Random random (42);
    float peak = 0.0f;
    for (int block = 0; block < blocks; ++block)
    {
        for (int i = 0; i < channels * blockSize; ++i)
            buffer.setSample (i / blockSize, i % blockSize, i == 0 && poison != 0.0f ? poison : random.nextFloat() - 0.5f);
        auto events = midi;
        plugin.processBlock (buffer, events);
        for (int i = 0; i < channels * blockSize; ++i)
            peak = std::isfinite (buffer.getSample (i / blockSize, i % blockSize)) ? std::max (peak, std::abs (buffer.getSample (i / blockSize, i % blockSize))) : INFINITY;
    }
    return peak;
}
}

TEST (HostLifecycle, ManyInstancesAbsurdRatesBlockSizesTransportsMidiAndInput)
{
    std::vector<std::unique_ptr<juce::AudioPluginInstance>> instances;
    for (int i = 0; i < 16; ++i)   // side by side, closed in another order than opened
        ASSERT_NE (instances.emplace_back (loadPlugin (Format::vst2)), nullptr);
    for (size_t i = 0; i < instances.size(); ++i)
        instances[(i * 7) % instances.size()].reset();

    auto plugin = loadPlugin (Format::vst2);
    for (auto [index, value] : { std::pair (27, 1.0f), { 31, 1.0f }, { 2, 1.0f }, { 9, 1.0f }, { 3, 0.84f }, { 10, 1.0f }, { 1, 1.0f } })
        plugin->getParameters()[index]->setValueNotifyingHost (value);   // synced LFOs swing both delays, Delay 1 at full feedback
    for (auto channels : { 2, 1 })
    {
        juce::AudioProcessor::BusesLayout layout;
        layout.inputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
        layout.outputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
        ASSERT_TRUE (plugin->setBusesLayout (layout));
        for (auto rate : { 22050.0, 192000.0, 0.0, -44100.0, (double) NAN, 1.0e12, 44100.0 })
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
            info.setBpm (bpm > 0.0 ? juce::Optional<double> (bpm) : juce::nullopt);
            return bpm < 0.0 ? juce::Optional<PositionInfo>() : info;
        }
        double bpm = 0.0;   // 0: no tempo, below 0: no position
    } playHead;
    plugin->setPlayHead (&playHead);
    juce::MidiBuffer midi;   // every kind of message on every channel, and one beyond the block
    const juce::uint8 sysex[] { 0x7e, 0x7f, 0x06, 0x01 };
    for (int channel = 1; channel <= 16; ++channel)
        for (const auto& m : { juce::MidiMessage::noteOn (channel, 60, (juce::uint8) 100), juce::MidiMessage::noteOff (channel, 60), juce::MidiMessage::pitchWheel (channel, 12000),
                               juce::MidiMessage::controllerEvent (channel, channel * 7, 64), juce::MidiMessage::programChange (channel, channel * 8),
                               juce::MidiMessage::channelPressureChange (channel, 90), juce::MidiMessage::midiClock(), juce::MidiMessage::createSysExMessage (sysex, 4) })
            midi.addEvent (m, channel * 3);
    midi.addEvent (juce::MidiMessage::programChange (1, 3), 100000);
    juce::Random random (7);
    for (auto bpm : { -1.0, 0.0, 1.0, 999.0, 120.0 })
    {
        playHead.bpm = bpm;
        for (int block = 0; block < 20; ++block)
            EXPECT_LT (peakOf (*plugin, 1, 1 + random.nextInt (4096), 1, midi), 50.0f) << bpm;
    }

    for (auto poison : { NAN, INFINITY })   // non-finite samples do not poison the lines or followers
        EXPECT_LT (peakOf (*plugin, 1, 512, 40, {}, poison), 50.0f);
}
