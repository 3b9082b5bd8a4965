// The shipped VST2 binary and VST3 bundle through JUCE's hosting: identity, sound, state and MIDI
// through each format, and the VST2 binary driven as demanding hosts and validators drive it.

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
// The plug-in's own chunk: VST2's bank chunk, VST3's component state in JUCE's host state.
void setChunk (Format format, juce::AudioPluginInstance& plugin, const juce::MemoryBlock& chunk)
{
    if (format == Format::vst2)
        juce::VSTPluginFormat::setChunkData (&plugin, chunk.getData(), (int) chunk.getSize(), false);
    else
    {
        juce::XmlElement state ("VST3PluginState");
        state.createNewChildElement ("IComponent")->addTextElement (chunk.toBase64Encoding());
        juce::MemoryBlock wrapped;
        juce::AudioProcessor::copyXmlToBinary (state, wrapped);
        plugin.setStateInformation (wrapped.getData(), (int) wrapped.getSize());
    }
}
juce::MemoryBlock getChunk (Format format, juce::AudioPluginInstance& plugin)
{
    juce::MemoryBlock chunk, saved;
    if (format == Format::vst2)
        juce::VSTPluginFormat::getChunkData (&plugin, chunk, false);
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

// The identity; an impulse echoes 120 ms later by default. Every parameter at (7 i + 3) % 64 / 64 but
// Randomize, controllers and an escaped name restore and save as the same bytes; the learned controller
// 15 (of parameter 5) and a program change (to Quiet) reach the plug-in.
TEST_P (Formats, ShowTheIdentityEchoAfter120MsRestoreEveryValueAndTakeMidi)
{
    const auto description = plugin->getPluginDescription();
    EXPECT_EQ (plugin->getName() + "|" + description.manufacturerName + "|" + description.version.substring (0, 5), "Veltrane|Tarnwell_Audio|1.2.1");
    EXPECT_TRUE (plugin->getTotalNumInputChannels() == 2 && plugin->getTotalNumOutputChannels() == 2 && plugin->acceptsMidi() && ! plugin->producesMidi());
    plugin->prepareToPlay (44100.0, 8192);
    juce::AudioBuffer<float> audio (2, 8192);
    juce::MidiBuffer midi;
    audio.clear();
    audio.setSample (0, 0, 1.0f);
    plugin->processBlock (audio, midi);
    int first = 0;
    while (first < 8192 && std::abs (audio.getSample (0, first)) <= 1.0e-6f)
        ++first;
    EXPECT_EQ (first, 5292);

    const auto chunk = edited (getChunk (GetParam(), *plugin), [] (juce::XmlElement& state) {
        state.setAttribute ("PresetName", "Formats & \"Friends\"");
        for (int i = 0; i < 33; ++i)
        {
            const auto id = state.getAttributeName (1 + 2 * i);
            state.setAttribute (id, juce::String::formatted ("%.9g", id == "Randomize" ? 0.0 : (double) ((i * 7 + 3) % 64) / 64.0));
            state.setAttribute (id + "CC", i % 3 == 0 ? -1 : i + 10);
        }
    });
    setChunk (GetParam(), *plugin, chunk);
    for (int i = 0; i < 33; ++i)
        EXPECT_FLOAT_EQ (plugin->getParameters()[i]->getValue(), i == 18 ? 0.0f : (float) ((i * 7 + 3) % 64) / 64.0f) << i;
    const auto saved = getChunk (GetParam(), *plugin);
    ASSERT_GE (saved.getSize(), chunk.getSize());   // JUCE's VST3 wrapper may append data of its own
    EXPECT_EQ (juce::MemoryBlock (saved.getData(), chunk.getSize()), chunk);

    midi.addEvent (juce::MidiMessage::controllerEvent (5, 15, 32), 100), midi.addEvent (juce::MidiMessage::programChange (1, 0), 10);
    plugin->processBlock (audio, midi);
    midi.clear();
    plugin->processBlock (audio, midi);   // the preset loads at the start of the next block
    const auto state = juce::parseXML (textOf (getChunk (GetParam(), *plugin)));
    EXPECT_FLOAT_EQ ((float) state->getDoubleAttribute (state->getAttributeName (1 + 2 * 5)), 32.0f / 127.0f);
    EXPECT_EQ (state->getStringAttribute ("PresetName") + " " + state->getStringAttribute ("WaveshaperAmount"), "Quiet 0.25");
}

INSTANTIATE_TEST_SUITE_P (Vst2AndVst3, Formats, ::testing::Values (Format::vst2, Format::vst3),
                          [] (const auto& info) { return info.param == Format::vst2 ? "Vst2" : "Vst3"; });

// Absurd rates and block sizes, MIDI of every kind on every channel (mostly beyond the shortest blocks): the
// output stays finite and bounded. (Mono, non-finite input, no tempo: among the reference scenarios.)
TEST (HostLifecycle, AbsurdRatesBlockSizesAndMidiOfEveryKind)
{
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
