// Which MIDI features reach the plug-in in each format, through JUCE's hosting:
// learned controllers, program changes selecting presets, and notes restarting
// the LFOs. VST2 passes every MIDI message as it is. VST3 has no controller
// events: JUCE's wrapper offers controllers as hidden parameters through VST3's
// MIDI mapping, which hosts fill from incoming controllers. Program changes reach
// a VST3 plug-in without programs only from hosts that forward them as legacy
// MIDI events, as JUCE's host does.

#include "HostTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

namespace
{
using namespace veltrane::test;

std::unique_ptr<juce::AudioPluginInstance> load (Format format)
{
    auto plugin = loadPlugin (format);

    if (plugin != nullptr)
        plugin->prepareToPlay (44100.0, 512);

    return plugin;
}

// The plug-in's current values (its defaults, on a fresh instance) but for those
// given, and no controller but those given.
juce::MemoryBlock chunkWith (Format format, juce::AudioPluginInstance& plugin, const std::map<juce::String, double>& values,
                             const std::map<juce::String, int>& controllers)
{
    const auto current = parseStateChunk (getChunk (format, plugin));
    const auto identifiers = identifiersOf (plugin);
    juce::Array<float> currentValues;

    for (const auto& id : identifiers)
        currentValues.add ((float) current->getDoubleAttribute (id));

    return StateChunkFixture::makeChunk (identifiers, values, controllers, "Init", currentValues);
}

std::unique_ptr<juce::XmlElement> getState (Format format, juce::AudioPluginInstance& plugin)
{
    return parseStateChunk (getChunk (format, plugin));
}

juce::AudioBuffer<float> runBlocks (juce::AudioPluginInstance& plugin, int numBlocks,
                                    const std::function<void (juce::MidiBuffer&, int)>& midiForBlock)
{
    juce::AudioBuffer<float> output (2, 512 * numBlocks);
    juce::AudioBuffer<float> block (2, 512);
    juce::MidiBuffer midi;
    juce::Random noise (11);

    for (int b = 0; b < numBlocks; ++b)
    {
        for (int c = 0; c < 2; ++c)
            for (int j = 0; j < 512; ++j)
                block.setSample (c, j, noise.nextFloat() - 0.5f);

        midi.clear();
        midiForBlock (midi, b);
        plugin.processBlock (block, midi);

        for (int c = 0; c < 2; ++c)
            output.copyFrom (c, b * 512, block, c, 0, 512);
    }

    return output;
}

class FormatMidi : public ::testing::TestWithParam<Format>
{
protected:
    veltrane::test::TemporaryHome home;
};
}

TEST_P (FormatMidi, LearnedControllerDrivesItsParameter)
{
    auto plugin = load (GetParam());
    ASSERT_NE (plugin, nullptr);
    setChunk (GetParam(), *plugin, chunkWith (GetParam(), *plugin, {}, { { "DryWet", 74 } }));

    runBlocks (*plugin, 2, [] (juce::MidiBuffer& midi, int block) {
        if (block == 0)
            midi.addEvent (juce::MidiMessage::controllerEvent (5, 74, 32), 100);
    });

    const auto state = getState (GetParam(), *plugin);
    ASSERT_NE (state, nullptr);
    EXPECT_EQ (state->getIntAttribute ("DryWetCC"), 74);
    EXPECT_FLOAT_EQ ((float) state->getDoubleAttribute ("DryWet"), 32.0f / 127.0f);
}

TEST_P (FormatMidi, ProgramChangeLoadsAPresetAtTheNextBlock)
{
    const auto folder = juce::File::getSpecialLocation (juce::File::userHomeDirectory)
                            .getChildFile (".Tarnwell_Audio/Presets/Veltrane");
    ASSERT_TRUE (folder.createDirectory());
    ASSERT_TRUE (folder.getChildFile ("Quiet.vtp").replaceWithText (
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<VELTRANE_PRESET PresetName=\"Quiet\" DryWet=\"0.25\"/>\n"));

    auto plugin = load (GetParam());
    ASSERT_NE (plugin, nullptr);

    runBlocks (*plugin, 3, [] (juce::MidiBuffer& midi, int block) {
        if (block == 0)
            midi.addEvent (juce::MidiMessage::programChange (1, 0), 10);
    });

    const auto state = getState (GetParam(), *plugin);
    ASSERT_NE (state, nullptr);

    EXPECT_EQ (state->getStringAttribute ("PresetName"), "Quiet");
    EXPECT_EQ (state->getDoubleAttribute ("DryWet"), 0.25);
}

TEST_P (FormatMidi, NoteOnChannelOneRestartsLfo1)
{
    // LFO 1, a slow rising saw, swings Delay 1's time fully: restarting it moves
    // the echoes, so a restart shows as a different output from the same input.
    auto settings = [this] (juce::AudioPluginInstance& plugin) {
        return chunkWith (GetParam(), plugin,
                          { { "Delay1TimeMod", 1.0 }, { "Delay1TimeModSource", 0.84 }, { "LFO1Wave", 0.4 },
                            { "LFO1Rate", 0.1 }, { "MixMode", 0.5 } },
                          {});
    };

    auto plain = load (GetParam());
    auto restarted = load (GetParam());
    ASSERT_NE (plain, nullptr);
    ASSERT_NE (restarted, nullptr);
    setChunk (GetParam(), *plain, settings (*plain));
    setChunk (GetParam(), *restarted, settings (*restarted));

    const auto noteAt = [] (int noteChannel) {
        return [noteChannel] (juce::MidiBuffer& midi, int block) {
            if (block == 30)
                midi.addEvent (juce::MidiMessage::noteOn (noteChannel, 60, (juce::uint8) 100), 100);
        };
    };

    const auto reference = runBlocks (*plain, 60, [] (juce::MidiBuffer&, int) {});
    const auto withNote = runBlocks (*restarted, 60, noteAt (1));

    // Identical up to the note, different after it.
    for (int j = 0; j < 30 * 512; ++j)
        ASSERT_EQ (reference.getSample (0, j), withNote.getSample (0, j)) << j;

    float difference = 0.0f;
    for (int j = 30 * 512; j < reference.getNumSamples(); ++j)
        difference = std::max (difference, std::abs (reference.getSample (0, j) - withNote.getSample (0, j)));

    EXPECT_GT (difference, 0.01f);
}

INSTANTIATE_TEST_SUITE_P (Formats, FormatMidi, ::testing::Values (Format::vst2, Format::vst3),
                          [] (const auto& info) { return info.param == Format::vst2 ? "Vst2" : "Vst3"; });
