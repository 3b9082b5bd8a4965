// The shipped VST2 binary and VST3 bundle through JUCE's hosting: identity, sound, the state chunk
// through each format's own state mechanism, the MIDI that reaches the plug-in, and the VST2 binary
// driven as demanding hosts and validators drive it.

#include <juce_audio_processors/juce_audio_processors.h>

#include <gtest/gtest.h>

namespace
{
enum class Format { vst2, vst3 };

// The shipped binary of a format, loaded through JUCE's plug-in hosting.
std::unique_ptr<juce::AudioPluginInstance> loadPlugin (Format format)
{
    juce::VSTPluginFormat vst2;
    juce::VST3PluginFormat vst3;
    auto& pluginFormat = format == Format::vst2 ? static_cast<juce::AudioPluginFormat&> (vst2) : vst3;
    juce::OwnedArray<juce::PluginDescription> descriptions;
    pluginFormat.findAllTypesForFile (descriptions, format == Format::vst2 ? VELTRANE_VST2_BINARY : VELTRANE_VST3_BUNDLE);
    juce::String error;
    auto plugin = descriptions.isEmpty() ? nullptr : pluginFormat.createInstanceFromDescription (*descriptions[0], 44100.0, 512, error);
    if (plugin != nullptr)
        plugin->prepareToPlay (44100.0, 512);
    return plugin;
}
// The plug-in's state chunk ("VC2!", the length, one line of XML, a zero byte) edited as XML.
juce::String textOf (const juce::MemoryBlock& chunk) { return juce::String::fromUTF8 ((const char*) chunk.getData() + 8, juce::jmax (0, (int) chunk.getSize() - 9)); }
juce::MemoryBlock edited (const juce::MemoryBlock& chunk, const std::function<void (juce::XmlElement&)>& edit)
{
    auto state = juce::parseXML (textOf (chunk));
    edit (*state);
    const auto text = state->toString (juce::XmlElement::TextFormat().singleLine().withoutHeader());
    juce::MemoryOutputStream out;
    out.write ("VC2!", 4);
    out.writeInt ((int) text.getNumBytesAsUTF8());
    out.write (text.toRawUTF8(), text.getNumBytesAsUTF8() + 1);
    return out.getMemoryBlock();
}
// The plug-in's own chunk: VST2's bank or program (preset) chunk, VST3's component state in JUCE's host state.
void setChunk (Format format, juce::AudioPluginInstance& plugin, const juce::MemoryBlock& chunk, bool vst2Program = false)
{
    if (format == Format::vst2)
        juce::VSTPluginFormat::setChunkData (&plugin, chunk.getData(), (int) chunk.getSize(), vst2Program);
    else
    {
        juce::XmlElement state ("VST3PluginState");
        state.createNewChildElement ("IComponent")->addTextElement (chunk.toBase64Encoding());
        juce::MemoryBlock wrapped;
        juce::AudioProcessor::copyXmlToBinary (state, wrapped);
        plugin.setStateInformation (wrapped.getData(), (int) wrapped.getSize());
    }
}
juce::MemoryBlock getChunk (Format format, juce::AudioPluginInstance& plugin, bool vst2Program = false)
{
    juce::MemoryBlock chunk, saved;
    if (format == Format::vst2)
        juce::VSTPluginFormat::getChunkData (&plugin, chunk, vst2Program);
    else if (plugin.getStateInformation (saved); const auto state = juce::AudioProcessor::getXmlFromBinary (saved.getData(), (int) saved.getSize()))
        chunk.fromBase64Encoding (state->getChildElementAllSubText ("IComponent", {}));
    return chunk;
}
// The shipped binary of a format, opening with the preset Quiet alone in its folder (program 0).
std::unique_ptr<juce::AudioPluginInstance> loadWithQuietAlone (Format format)
{
    const auto folder = juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Presets/Veltrane");
    for (const auto& factoryPreset : folder.findChildFiles (juce::File::findFiles, false, "*.vtp"))
        factoryPreset.deleteFile();
    folder.createDirectory();
    folder.getChildFile ("Quiet.vtp").replaceWithText ("<VELTRANE_PRESET PresetName=\"Quiet\" WaveshaperAmount=\"0.25\"/>");
    return loadPlugin (format);
}
class Formats : public ::testing::TestWithParam<Format>
{
protected:
    void SetUp() override { ASSERT_NE (plugin, nullptr); }
    std::unique_ptr<juce::AudioPluginInstance> plugin = loadWithQuietAlone (GetParam());
};
}

// Identity as the host's scan shows it; an impulse echoes 120 ms later by default (fully wet: nothing
// before it); a learned controller (DryWet on 74) and a program change (to Quiet) reach the plug-in.
TEST_P (Formats, ShowTheIdentityEchoAfter120MsAndTakeLearnedControllersAndProgramChanges)
{
    const auto description = plugin->getPluginDescription();
    EXPECT_EQ (plugin->getName() + "|" + description.manufacturerName + "|" + description.version.substring (0, 5), "Veltrane|Tarnwell_Audio|1.2.1");
    EXPECT_TRUE (plugin->getTotalNumInputChannels() == 2 && plugin->getTotalNumOutputChannels() == 2 && plugin->acceptsMidi() && ! plugin->producesMidi());
    setChunk (GetParam(), *plugin, edited (getChunk (GetParam(), *plugin), [] (juce::XmlElement& state) { state.setAttribute ("DryWetCC", 74); }));
    plugin->prepareToPlay (44100.0, 8192);
    juce::AudioBuffer<float> audio (2, 8192);
    audio.clear();
    audio.setSample (0, 0, 1.0f);
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::controllerEvent (5, 74, 32), 100);
    midi.addEvent (juce::MidiMessage::programChange (1, 0), 10);
    plugin->processBlock (audio, midi);
    int first = 0;
    while (first < 8192 && std::abs (audio.getSample (0, first)) <= 1.0e-6f)
        ++first;
    EXPECT_EQ (first, 5292);
    midi.clear();
    plugin->processBlock (audio, midi);   // the preset loads at the start of the next block
    const auto state = juce::parseXML (textOf (getChunk (GetParam(), *plugin)));
    EXPECT_FLOAT_EQ ((float) state->getDoubleAttribute ("DryWet"), 32.0f / 127.0f);
    EXPECT_EQ (state->getStringAttribute ("PresetName") + " " + state->getStringAttribute ("WaveshaperAmount"), "Quiet 0.25");
}

// Every parameter at (7 i + 3) % 64 / 64 but Randomize, a controller for two in three, a name needing
// escapes: restored through the bank and program chunks and saved as the same bytes.
TEST_P (Formats, ChunkRestoresEveryValueAndSavesTheSameBytes)
{
    const auto chunk = edited (getChunk (GetParam(), *plugin), [] (juce::XmlElement& state) {
        state.setAttribute ("PresetName", "Formats & \"Friends\"");
        for (int i = 0; i < 33; ++i)
        {
            const auto id = state.getAttributeName (1 + 2 * i);
            state.setAttribute (id, juce::String::formatted ("%.9g", id == "Randomize" ? 0.0 : (double) ((i * 7 + 3) % 64) / 64.0));
            state.setAttribute (id + "CC", i % 3 == 0 ? -1 : i + 10);
        }
    });
    for (auto vst2Program : { false, true })
    {
        setChunk (GetParam(), *plugin, chunk, vst2Program);
        for (int i = 0; i < 33; ++i)
            EXPECT_FLOAT_EQ (plugin->getParameters()[i]->getValue(), i == 18 ? 0.0f : (float) ((i * 7 + 3) % 64) / 64.0f) << i;
        const auto saved = getChunk (GetParam(), *plugin, vst2Program);
        ASSERT_GE (saved.getSize(), chunk.getSize());   // JUCE's VST3 wrapper may append data of its own
        EXPECT_EQ (juce::MemoryBlock (saved.getData(), chunk.getSize()), chunk);
    }
}

INSTANTIATE_TEST_SUITE_P (Vst2AndVst3, Formats, ::testing::Values (Format::vst2, Format::vst3),
                          [] (const auto& info) { return info.param == Format::vst2 ? "Vst2" : "Vst3"; });

// Many instances side by side, absurd rates and block sizes, MIDI of every kind on every channel
// (most of it beyond the shortest blocks): nothing crashes, the output stays finite and bounded.
// (Mono, non-finite input and a tempo without position are among the reference scenarios.)
TEST (HostLifecycle, ManyInstancesAbsurdRatesBlockSizesAndMidi)
{
    std::vector<std::unique_ptr<juce::AudioPluginInstance>> instances;
    for (int i = 0; i < 16; ++i)   // side by side, closed in another order than opened
        ASSERT_NE (instances.emplace_back (loadPlugin (Format::vst2)), nullptr);
    for (size_t i = 0; i < instances.size(); ++i)
        instances[(i * 7) % instances.size()].reset();

    auto plugin = loadPlugin (Format::vst2);
    for (auto [index, value] : { std::pair (27, 1.0f), { 31, 1.0f }, { 2, 1.0f }, { 9, 1.0f }, { 3, 0.84f }, { 10, 1.0f }, { 1, 1.0f } })
        plugin->getParameters()[index]->setValueNotifyingHost (value);   // synced LFOs swing both delays, Delay 1 at full feedback
    juce::MidiBuffer midi;
    const juce::uint8 sysex[] { 0x7e, 0x7f, 0x06, 0x01 };
    for (int channel = 1; channel <= 16; ++channel)
        for (const auto& m : { juce::MidiMessage::noteOn (channel, 60, (juce::uint8) 100), juce::MidiMessage::noteOff (channel, 60), juce::MidiMessage::pitchWheel (channel, 12000),
                               juce::MidiMessage::controllerEvent (channel, channel * 7, 64), juce::MidiMessage::programChange (channel, channel * 8),
                               juce::MidiMessage::channelPressureChange (channel, 90), juce::MidiMessage::midiClock(), juce::MidiMessage::createSysExMessage (sysex, 4) })
            midi.addEvent (m, channel * 3);
    juce::Random random (42);
    for (auto rate : { 22050.0, 192000.0, 0.0, -44100.0, (double) NAN, 1.0e12, 44100.0 })
        for (auto blockSize : { 1, 3, 511, 8192 })
        {
            plugin->prepareToPlay (rate, blockSize);
            juce::AudioBuffer<float> buffer (2, blockSize);
            for (int block = 0; block < juce::jlimit (1, 32, 8192 / blockSize); ++block)
            {
                for (int i = 0; i < 2 * blockSize; ++i)
                    buffer.setSample (i / blockSize, i % blockSize, random.nextFloat() - 0.5f);
                auto events = midi;
                plugin->processBlock (buffer, events);
                for (int i = 0; i < 2 * blockSize; ++i)
                    ASSERT_LT (std::abs (buffer.getSample (i / blockSize, i % blockSize)), 50.0f) << rate << " Hz, " << blockSize;   // NaN fails too
            }
        }
}
