// The shipped VST2 binary and VST3 bundle through JUCE's hosting: identity, sound, the state
// chunk through each format's own state mechanism, and the MIDI that reaches the plug-in.

#include "HostTestSupport.h"

#include <pluginterfaces/vst2.x/aeffectx.h>

#include <gtest/gtest.h>

using namespace veltrane::test;

namespace
{
// The plug-in's state chunk ("VC2!", the length, one line of XML, a zero byte) edited as XML.
juce::String textOf (const juce::MemoryBlock& chunk) { return juce::String::fromUTF8 ((const char*) chunk.getData() + 8, juce::jmax (0, (int) chunk.getSize() - 9)); }
juce::MemoryBlock wrapped (const juce::String& text)
{
    juce::MemoryOutputStream out;
    out.write ("VC2!", 4);
    out.writeInt ((int) text.getNumBytesAsUTF8());
    out.write (text.toRawUTF8(), text.getNumBytesAsUTF8() + 1);
    return out.getMemoryBlock();
}
juce::MemoryBlock edited (const juce::MemoryBlock& chunk, const std::function<void (juce::XmlElement&)>& edit)
{
    auto state = juce::parseXML (textOf (chunk));
    edit (*state);
    return wrapped (state->toString (juce::XmlElement::TextFormat().singleLine().withoutHeader()));
}
AEffect* effectOf (juce::AudioPluginInstance& plugin)
{
    struct Visitor final : juce::ExtensionsVisitor
    {
        void visitVSTClient (const VSTClient& client) override { effect = (AEffect*) client.getAEffectPtr(); }
        AEffect* effect = nullptr;
    } visitor;
    plugin.getExtensions (visitor);
    return visitor.effect;
}
// The plug-in's own chunk: VST2's bank (0) or program (1) chunk, VST3's component state in JUCE's host state.
void setChunk (Format format, juce::AudioPluginInstance& plugin, const juce::MemoryBlock& chunk, int vst2Kind = 0)
{
    if (auto* effect = format == Format::vst2 ? effectOf (plugin) : nullptr)
        effect->dispatcher (effect, effSetChunk, vst2Kind, (juce::pointer_sized_int) chunk.getSize(), (void*) chunk.getData(), 0.0f);
    else
    {
        juce::XmlElement state ("VST3PluginState");
        state.createNewChildElement ("IComponent")->addTextElement (chunk.toBase64Encoding());
        juce::MemoryBlock wrapped;
        juce::AudioProcessor::copyXmlToBinary (state, wrapped);
        plugin.setStateInformation (wrapped.getData(), (int) wrapped.getSize());
    }
}
juce::MemoryBlock getChunk (Format format, juce::AudioPluginInstance& plugin, int vst2Kind = 0)
{
    juce::MemoryBlock chunk;
    if (auto* effect = format == Format::vst2 ? effectOf (plugin) : nullptr)
    {
        void* data = nullptr;
        const auto size = effect->dispatcher (effect, effGetChunk, vst2Kind, 0, &data, 0.0f);
        chunk.append (data, (size_t) std::max<juce::int64> (0, size));
        return chunk;
    }
    juce::MemoryBlock saved;
    plugin.getStateInformation (saved);
    if (const auto state = juce::AudioProcessor::getXmlFromBinary (saved.getData(), (int) saved.getSize()))
        chunk.fromBase64Encoding (state->getChildElementAllSubText ("IComponent", {}));
    return chunk;
}
class Formats : public ::testing::TestWithParam<Format>
{
protected:
    void SetUp() override { ASSERT_NE (plugin, nullptr); }
    std::unique_ptr<juce::AudioPluginInstance> plugin = loadPlugin (GetParam());
};
}

TEST_P (Formats, ReportTheIdentityAndDelayByTheDefault120Ms)
{
    const auto description = plugin->getPluginDescription();
    EXPECT_EQ (plugin->getName() + "|" + description.manufacturerName + "|" + description.version.substring (0, 5), "Veltrane|Tarnwell_Audio|1.2.1");
    EXPECT_FALSE (description.isInstrument);
    EXPECT_EQ (plugin->getTotalNumInputChannels() * 10 + plugin->getTotalNumOutputChannels(), 22);
    EXPECT_TRUE (plugin->acceptsMidi() && ! plugin->producesMidi());
    if (GetParam() == Format::vst2)
        EXPECT_EQ (description.uniqueId, 0x54615665);   // "TaVe"
    const auto& parameters = plugin->getParameters();
    ASSERT_GE (parameters.size(), 33);
    for (auto [index, name, text] : { std::tuple (0, "Delay1Time", "120.00 Ms"), { 6, "Delay1Gain", "0.00 dB" }, { 28, "LFO1SyncedRate", "1/4" },
                                      { 32, "LFO2SyncedRate", "1/4" } })
        EXPECT_EQ (parameters[index]->getName (64) + " " + parameters[index]->getCurrentValueAsText(), juce::String (name) + " " + text);
    juce::AudioBuffer<float> audio (2, 512);
    int first = -1;
    for (int block = 0; block < 12 && first < 0; ++block)
    {
        audio.clear();
        audio.setSample (0, 0, block == 0 ? 1.0f : 0.0f);
        juce::MidiBuffer midi;
        plugin->processBlock (audio, midi);
        for (int j = 0; j < 512 && first < 0; ++j)
            first = std::abs (audio.getSample (0, j)) > 1.0e-6f ? block * 512 + j : -1;
    }
    EXPECT_EQ (first, 5292);
}

TEST_P (Formats, ChunkRestoresEveryValueAndSavesTheSameBytes)
{
    // Every parameter at (7 i + 3) % 64 / 64 but Randomize, a controller for two in three, a name needing escapes.
    const auto chunk = edited (getChunk (GetParam(), *plugin), [] (juce::XmlElement& state) {
        state.setAttribute ("PresetName", "Formats & \"Friends\"");
        for (int i = 0; i < 33; ++i)
        {
            const auto id = state.getAttributeName (1 + 2 * i);
            state.setAttribute (id, juce::String::formatted ("%.9g", id == "Randomize" ? 0.0 : (double) ((i * 7 + 3) % 64) / 64.0));
            state.setAttribute (id + "CC", i % 3 == 0 ? -1 : i + 10);
        }
    });
    for (auto vst2Kind : { 0, 1 })   // bank, program
    {
        setChunk (GetParam(), *plugin, chunk, vst2Kind);
        for (int i = 0; i < 33; ++i)
            EXPECT_FLOAT_EQ (plugin->getParameters()[i]->getValue(), i == 18 ? 0.0f : (float) ((i * 7 + 3) % 64) / 64.0f) << i;
        const auto saved = getChunk (GetParam(), *plugin, vst2Kind);
        ASSERT_GE (saved.getSize(), chunk.getSize());   // JUCE's VST3 wrapper may append data of its own
        EXPECT_EQ (juce::MemoryBlock (saved.getData(), chunk.getSize()), chunk);
    }
}

TEST_P (Formats, LearnedControllersProgramChangesAndNotesReachThePlugIn)
{
    const auto folder = juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Presets/Veltrane");
    for (const auto& factoryPreset : folder.findChildFiles (juce::File::findFiles, false, "*.vtp"))
        factoryPreset.deleteFile();   // Quiet alone is program 0
    ASSERT_TRUE (folder.createDirectory() && folder.getChildFile ("Quiet.vtp").replaceWithText ("<VELTRANE_PRESET PresetName=\"Quiet\" WaveshaperAmount=\"0.25\"/>"));
    std::vector<float> outputs[2];   // a note on MIDI channel 1 in block 30 for the second instance only
    for (int instance = 0; instance < 2; ++instance)
    {
        plugin = loadPlugin (GetParam());   // lists the preset
        // DryWet follows CC 74; LFO 1, a slow rising saw, swings Delay 1's time fully in "Solo 1".
        setChunk (GetParam(), *plugin, edited (getChunk (GetParam(), *plugin), [] (juce::XmlElement& state) {
            for (auto [id, value] : { std::pair ("DryWetCC", 74.0), { "Delay1TimeMod", 1.0 }, { "Delay1TimeModSource", 5.0 / 6.0 }, { "LFO1Wave", 0.4 },
                                      { "LFO1Rate", 0.1 }, { "MixMode", 0.5 } })
                state.setAttribute (id, value);
        }));
        juce::AudioBuffer<float> buffer (2, 512);
        juce::Random noise (11);
        for (int block = 0; block < 60; ++block)
        {
            for (int i = 0; i < 1024; ++i)
                buffer.setSample (i / 512, i % 512, noise.nextFloat() - 0.5f);
            juce::MidiBuffer midi;
            if (block == 0)
                midi.addEvent (juce::MidiMessage::controllerEvent (5, 74, 32), 100), midi.addEvent (juce::MidiMessage::programChange (1, 0), 10);
            if (block == 30 && instance == 1)
                midi.addEvent (juce::MidiMessage::noteOn (1, 60, (juce::uint8) 100), 100);
            plugin->processBlock (buffer, midi);
            outputs[instance].insert (outputs[instance].end(), buffer.getReadPointer (0), buffer.getReadPointer (0) + 512);
        }
        const auto state = juce::parseXML (juce::String::fromUTF8 ((const char*) getChunk (GetParam(), *plugin).getData() + 8));
        EXPECT_FLOAT_EQ ((float) state->getDoubleAttribute ("DryWet"), 32.0f / 127.0f);
        EXPECT_EQ (state->getStringAttribute ("PresetName") + " " + state->getStringAttribute ("WaveshaperAmount"), "Quiet 0.25");
    }
    // The note restarts LFO 1: the same input sounds the same up to it and differently after it.
    const auto note = 30 * 512 + 100;
    EXPECT_TRUE (std::equal (outputs[0].begin(), outputs[0].begin() + note, outputs[1].begin()));
    EXPECT_FALSE (std::equal (outputs[0].begin() + note, outputs[0].end(), outputs[1].begin() + note, [] (float a, float b) { return std::abs (a - b) < 0.01f; }));
}

INSTANTIATE_TEST_SUITE_P (Vst2AndVst3, Formats, ::testing::Values (Format::vst2, Format::vst3),
                          [] (const auto& info) { return info.param == Format::vst2 ? "Vst2" : "Vst3"; });

// Whatever state the plug-in writes, a new instance reads back: the longest names (here in plain
// UTF-8, as other software writes them, which the plug-in escapes to several times the size) and
// thousands of attributes of other names.
TEST (Formats, EveryChunkThePluginWritesRestoresInANewInstance)
{
    juce::String unknown;
    for (int i = 0; i < 3000; ++i)
        unknown << " Unknown" << i << "=\"1\"";
    const auto longName = juce::String::repeatedString (juce::String::fromUTF8 ("\xc3\xa9"), 200000);

    for (const auto& [name, extra] : { std::pair { longName, juce::String() }, std::pair { juce::String ("Many"), unknown } })
    {
        auto writer = loadPlugin (Format::vst2), reader = loadPlugin (Format::vst2);
        ASSERT_TRUE (writer != nullptr && reader != nullptr);
        writer->getParameters()[5]->setValue (0.5f);
        const auto text = textOf (getChunk (Format::vst2, *writer)).replace ("<VELTRANE_STATE PresetName=\"Init\"",
                                                                             "<VELTRANE_STATE" + extra + " PresetName=\"" + name + "\"");
        setChunk (Format::vst2, *writer, wrapped (text));
        const auto saved = getChunk (Format::vst2, *writer);
        setChunk (Format::vst2, *reader, saved);
        EXPECT_EQ (reader->getParameters()[5]->getValue(), 0.5f);
        EXPECT_EQ (getChunk (Format::vst2, *reader), saved);
        EXPECT_EQ (juce::parseXML (textOf (saved))->getStringAttribute ("PresetName"), name.substring (0, 10000));
    }
}
