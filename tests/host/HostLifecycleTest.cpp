// The shipped VST2 binary driven the way demanding hosts and validators drive a
// plug-in: many instances, rate and block-size changes, odd transports, MIDI of
// every kind. Nothing may crash and the output must stay finite and bounded.

#include "HostTestSupport.h"

#include <gtest/gtest.h>

#include <optional>

namespace
{
std::unique_ptr<juce::AudioPluginInstance> loadVst2()
{
    return veltrane::test::loadPlugin (veltrane::test::Format::vst2);
}

// A transport that reports what a test asks for: nothing, a position without a
// tempo, or a position with a given tempo.
struct ScriptedPlayHead final : juce::AudioPlayHead
{
    enum class Mode { noPosition, noTempo, tempo } mode = Mode::tempo;
    double bpm = 120.0;

    juce::Optional<PositionInfo> getPosition() const override
    {
        if (mode == Mode::noPosition)
            return {};

        PositionInfo info;
        info.setIsPlaying (true);

        if (mode == Mode::tempo)
            info.setBpm (bpm);

        return info;
    }
};

juce::AudioProcessor::BusesLayout layoutOf (int channels)
{
    juce::AudioProcessor::BusesLayout layout;
    layout.inputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
    layout.outputBuses.add (juce::AudioChannelSet::canonicalChannelSet (channels));
    return layout;
}

// Runs blocks of a decaying noise signal through the plug-in and returns the
// largest output magnitude; fails the test on any non-finite sample.
float runBlocks (juce::AudioPluginInstance& plugin, int channels, int blockSize, int numBlocks,
                 const std::function<void (juce::MidiBuffer&, int block)>& addMidi = {})
{
    juce::AudioBuffer<float> buffer (channels, blockSize);
    juce::MidiBuffer midi;
    juce::Random random (42);
    float peak = 0.0f;

    for (int block = 0; block < numBlocks; ++block)
    {
        for (int c = 0; c < channels; ++c)
            for (int j = 0; j < blockSize; ++j)
                buffer.setSample (c, j, (random.nextFloat() * 2.0f - 1.0f) * 0.5f);

        midi.clear();
        if (addMidi)
            addMidi (midi, block);

        plugin.processBlock (buffer, midi);

        for (int c = 0; c < channels; ++c)
            for (int j = 0; j < blockSize; ++j)
            {
                const auto sample = buffer.getSample (c, j);
                EXPECT_TRUE (std::isfinite (sample)) << "channel " << c << " sample " << j << " block " << block;
                if (! std::isfinite (sample))
                    return INFINITY;
                peak = std::max (peak, std::abs (sample));
            }
    }

    return peak;
}
}

TEST (HostLifecycle, ManyInstancesInARowAndSideBySide)
{
    for (int i = 0; i < 20; ++i)
    {
        auto plugin = loadVst2();
        ASSERT_NE (plugin, nullptr);
        plugin->prepareToPlay (44100.0, 256);
        runBlocks (*plugin, 2, 256, 2);
        plugin->releaseResources();
    }

    std::vector<std::unique_ptr<juce::AudioPluginInstance>> instances;

    for (int i = 0; i < 8; ++i)
    {
        instances.push_back (loadVst2());
        ASSERT_NE (instances.back(), nullptr);
        instances.back()->prepareToPlay (48000.0, 128);
    }

    for (auto& plugin : instances)
        EXPECT_LT (runBlocks (*plugin, 2, 128, 4), 10.0f);

    // Destroyed in an order other than creation, as hosts close tracks.
    for (size_t i = 0; i < instances.size(); i += 2)
        instances[i].reset();
    instances.clear();
}

TEST (HostLifecycle, RatesAndBlockSizesBackAndForth)
{
    auto plugin = loadVst2();
    ASSERT_NE (plugin, nullptr);

    const double rates[] { 22050, 44100, 48000, 88200, 96000, 192000, 96000, 44100, 22050, 192000, 44100 };
    const int blockSizes[] { 1, 2, 3, 64, 511, 512, 4096, 8192 };

    for (auto channels : { 2, 1 })
    {
        ASSERT_TRUE (plugin->setBusesLayout (layoutOf (channels)));

        for (auto rate : rates)
            for (auto blockSize : blockSizes)
            {
                SCOPED_TRACE (juce::String (rate) + " Hz, block " + juce::String (blockSize) + ", channels " + juce::String (channels));
                plugin->prepareToPlay (rate, blockSize);
                const auto numBlocks = juce::jlimit (1, 64, 8192 / blockSize);
                EXPECT_LT (runBlocks (*plugin, channels, blockSize, numBlocks), 10.0f);
                plugin->releaseResources();
            }
    }
}

TEST (HostLifecycle, BlockSizeVariesFromBlockToBlock)
{
    auto plugin = loadVst2();
    ASSERT_NE (plugin, nullptr);
    plugin->prepareToPlay (44100.0, 4096);
    juce::Random random (7);

    for (int block = 0; block < 300; ++block)
    {
        const auto size = 1 + random.nextInt (4096);
        ASSERT_LT (runBlocks (*plugin, 2, size, 1), 10.0f);
    }
}

TEST (HostLifecycle, OddTransports)
{
    auto plugin = loadVst2();
    ASSERT_NE (plugin, nullptr);

    // Both LFOs tempo-synced and modulating both delays, so the tempo matters.
    auto& parameters = plugin->getParameters();
    for (auto index : { 27, 31 })
        parameters[index]->setValueNotifyingHost (1.0f);
    for (auto index : { 2, 4, 9, 11 })
        parameters[index]->setValueNotifyingHost (1.0f);
    for (auto index : { 3, 10 })
        parameters[index]->setValueNotifyingHost (0.84f);   // "LFO 1"
    for (auto index : { 5, 12 })
        parameters[index]->setValueNotifyingHost (1.0f);

    ScriptedPlayHead playHead;
    plugin->setPlayHead (&playHead);
    plugin->prepareToPlay (44100.0, 512);

    using Mode = ScriptedPlayHead::Mode;
    const std::pair<Mode, double> transports[] { { Mode::noPosition, 0.0 }, { Mode::noTempo, 0.0 },
                                                 { Mode::tempo, 0.0 }, { Mode::tempo, 1.0 }, { Mode::tempo, 999.0 } };

    for (const auto& [mode, bpm] : transports)
    {
        playHead.mode = mode;
        playHead.bpm = bpm;
        EXPECT_LT (runBlocks (*plugin, 2, 512, 40), 20.0f) << "bpm " << bpm;
    }

    plugin->setPlayHead (nullptr);
    EXPECT_LT (runBlocks (*plugin, 2, 512, 10), 20.0f);
}

TEST (HostLifecycle, MidiOfEveryKindOnEveryChannel)
{
    auto plugin = loadVst2();
    ASSERT_NE (plugin, nullptr);
    plugin->prepareToPlay (44100.0, 256);

    const auto peak = runBlocks (*plugin, 2, 256, 64, [] (juce::MidiBuffer& midi, int block) {
        const auto channel = block % 16 + 1;
        const auto last = 255;
        midi.addEvent (juce::MidiMessage::noteOn (channel, 60, (juce::uint8) 100), 0);
        midi.addEvent (juce::MidiMessage::noteOn (channel, 61, (juce::uint8) 0), 1);
        midi.addEvent (juce::MidiMessage::noteOff (channel, 60), 2);
        midi.addEvent (juce::MidiMessage::aftertouchChange (channel, 60, 30), 3);
        midi.addEvent (juce::MidiMessage::controllerEvent (channel, block % 128, 64), 4);
        midi.addEvent (juce::MidiMessage::programChange (channel, block % 128), 5);
        midi.addEvent (juce::MidiMessage::channelPressureChange (channel, 90), 6);
        midi.addEvent (juce::MidiMessage::pitchWheel (channel, 12000), 7);
        midi.addEvent (juce::MidiMessage::allNotesOff (channel), 8);
        midi.addEvent (juce::MidiMessage::midiClock(), 9);
        midi.addEvent (juce::MidiMessage::midiStart(), 10);
        const juce::uint8 sysex[] { 0x7e, 0x7f, 0x06, 0x01 };
        midi.addEvent (juce::MidiMessage::createSysExMessage (sysex, sizeof (sysex)), 11);
        midi.addEvent (juce::MidiMessage::noteOn (channel, 62, (juce::uint8) 127), last);
        midi.addEvent (juce::MidiMessage::controllerEvent (channel, 7, 127), last + 10);   // beyond the block
        midi.addEvent (juce::MidiMessage::programChange (channel, 3), last + 1000);
    });

    EXPECT_LT (peak, 20.0f);
}

TEST (HostLifecycle, AbsurdRatesAndNonFiniteInputThroughTheBinary)
{
    auto plugin = loadVst2();
    ASSERT_NE (plugin, nullptr);

    // Rates no engine can use keep the previous one: nothing crashes, nothing
    // allocates gigabytes, and the output stays finite.
    for (auto rate : { 0.0, -44100.0, std::numeric_limits<double>::quiet_NaN(), 1.0e12, 44100.0 })
    {
        plugin->prepareToPlay (rate, 512);
        EXPECT_LT (runBlocks (*plugin, 2, 512, 4), 10.0f) << rate;
    }

    // Non-finite samples in one block do not poison the lines or followers for
    // the blocks after it.
    plugin->getParameters()[1]->setValueNotifyingHost (1.0f);   // Delay 1 feedback 100 %
    juce::AudioBuffer<float> poisoned (2, 512);
    juce::MidiBuffer midi;
    poisoned.clear();
    poisoned.setSample (0, 10, std::numeric_limits<float>::quiet_NaN());
    poisoned.setSample (1, 20, std::numeric_limits<float>::infinity());
    poisoned.setSample (0, 30, -std::numeric_limits<float>::infinity());
    plugin->processBlock (poisoned, midi);

    EXPECT_LT (runBlocks (*plugin, 2, 512, 40), 50.0f);
}
