// One state chunk restored through each format's own state mechanism gives the
// same 33 values: the VST2 bank chunk as a host hands it over (effSetChunk), and
// the VST3 component state through JUCE's VST3 hosting.

#include "StateChunkFixture.h"

#include <gtest/gtest.h>

namespace Vst2
{
#include <pluginterfaces/vst2.x/aeffectx.h>
}

using veltrane::test::StateChunkFixture;

namespace
{
std::unique_ptr<juce::AudioPluginInstance> loadPlugin (juce::AudioPluginFormat& format, const juce::String& path)
{
    juce::OwnedArray<juce::PluginDescription> descriptions;
    format.findAllTypesForFile (descriptions, path);

    if (descriptions.isEmpty())
        return nullptr;

    juce::String error;
    return format.createInstanceFromDescription (*descriptions[0], 44100.0, 512, error);
}

juce::StringArray identifiersOf (juce::AudioPluginInstance& plugin)
{
    juce::StringArray identifiers;

    for (int i = 0; i < StateChunkFixture::numParameters; ++i)
        identifiers.add (plugin.getParameters()[i]->getName (64));

    return identifiers;
}

void expectFixtureValues (juce::AudioPluginInstance& plugin)
{
    for (int i = 0; i < StateChunkFixture::numParameters; ++i)
        EXPECT_FLOAT_EQ (plugin.getParameters()[i]->getValue(), StateChunkFixture::valueFor (i))
            << plugin.getParameters()[i]->getName (64);
}
}

TEST (FormatState, Vst2ChunkRestoresEveryValueAndSavesTheSameBytes)
{
    juce::VSTPluginFormat format;
    auto plugin = loadPlugin (format, VELTRANE_VST2_BINARY);
    ASSERT_NE (plugin, nullptr);

    const auto chunk = StateChunkFixture::makeChunk (identifiersOf (*plugin));
    auto* effect = static_cast<Vst2::AEffect*> (plugin->getPlatformSpecificData());

    for (auto isProgramChunk : { 0, 1 })
    {
        effect->dispatcher (effect, Vst2::effSetChunk, isProgramChunk, (juce::pointer_sized_int) chunk.getSize(),
                            const_cast<void*> (chunk.getData()), 0.0f);

        for (int i = 0; i < StateChunkFixture::numParameters; ++i)
            EXPECT_FLOAT_EQ (effect->getParameter (effect, i), StateChunkFixture::valueFor (i)) << i;

        void* data = nullptr;
        const auto size = effect->dispatcher (effect, Vst2::effGetChunk, isProgramChunk, 0, &data, 0.0f);
        ASSERT_NE (data, nullptr);
        EXPECT_EQ (juce::MemoryBlock (data, (size_t) size), chunk);
    }
}

TEST (FormatState, Vst3ComponentStateRestoresEveryValue)
{
    juce::VST3PluginFormat format;
    auto plugin = loadPlugin (format, VELTRANE_VST3_BUNDLE);
    ASSERT_NE (plugin, nullptr);

    const auto chunk = StateChunkFixture::makeChunk (identifiersOf (*plugin));

    // JUCE's VST3 hosting keeps the component's state as base64 inside its own XML.
    juce::XmlElement hostState ("VST3PluginState");
    hostState.createNewChildElement ("IComponent")->addTextElement (chunk.toBase64Encoding());
    juce::MemoryBlock wrapped;
    juce::AudioProcessor::copyXmlToBinary (hostState, wrapped);

    plugin->setStateInformation (wrapped.getData(), (int) wrapped.getSize());
    expectFixtureValues (*plugin);

    juce::MemoryBlock saved;
    plugin->getStateInformation (saved);
    const auto savedXml = juce::AudioProcessor::getXmlFromBinary (saved.getData(), (int) saved.getSize());
    ASSERT_NE (savedXml, nullptr);
    juce::MemoryBlock component;
    ASSERT_TRUE (component.fromBase64Encoding (savedXml->getChildByName ("IComponent")->getAllSubText()));
    ASSERT_GE (component.getSize(), chunk.getSize());
    EXPECT_EQ (juce::MemoryBlock (component.getData(), chunk.getSize()), chunk);
}
