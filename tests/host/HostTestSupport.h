#pragma once

// Loading the shipped plug-in binaries through JUCE's hosting, and handing them
// host state chunks the way hosts do.

#include <juce_audio_processors/juce_audio_processors.h>

#include <map>

namespace Vst2
{
#include <pluginterfaces/vst2.x/aeffectx.h>
}

namespace veltrane::test
{

enum class Format { vst2, vst3 };

inline std::unique_ptr<juce::AudioPluginInstance> loadPlugin (Format format, double sampleRate = 44100.0,
                                                              int blockSize = 512)
{
    juce::VSTPluginFormat vst2;
    juce::VST3PluginFormat vst3;
    auto& pluginFormat = format == Format::vst2 ? static_cast<juce::AudioPluginFormat&> (vst2) : vst3;
    juce::OwnedArray<juce::PluginDescription> descriptions;
    pluginFormat.findAllTypesForFile (descriptions, format == Format::vst2 ? VELTRANE_VST2_BINARY : VELTRANE_VST3_BUNDLE);

    if (descriptions.isEmpty())
        return nullptr;

    juce::String error;
    return pluginFormat.createInstanceFromDescription (*descriptions[0], sampleRate, blockSize, error);
}

// The VST 2.4 effect behind a plug-in JUCE's VST2 hosting loaded.
inline Vst2::AEffect* effectOf (juce::AudioPluginInstance& plugin)
{
    struct Visitor final : juce::ExtensionsVisitor
    {
        void visitVSTClient (const VSTClient& client) override { effect = reinterpret_cast<Vst2::AEffect*> (client.getAEffectPtr()); }
        Vst2::AEffect* effect = nullptr;
    } visitor;

    plugin.getExtensions (visitor);
    return visitor.effect;
}

// "VC2!", the text's length, the one-line text, a zero byte: the plug-in's chunk.
inline juce::MemoryBlock wrapStateText (const juce::String& text)
{
    juce::MemoryOutputStream chunk;
    chunk.write ("VC2!", 4);
    chunk.writeInt ((int) text.getNumBytesAsUTF8());
    chunk.write (text.toRawUTF8(), text.getNumBytesAsUTF8());
    chunk.writeByte (0);
    return chunk.getMemoryBlock();
}

inline std::unique_ptr<juce::XmlElement> parseStateChunk (const juce::MemoryBlock& chunk)
{
    if (chunk.getSize() < 9)
        return nullptr;

    return juce::parseXML (juce::String::fromUTF8 (static_cast<const char*> (chunk.getData()) + 8, (int) chunk.getSize() - 9));
}

// The state chunk in each format's own container: the VST2 bank chunk as the
// effect takes and gives it, the VST3 component state inside JUCE's host state.
inline void setChunk (Format format, juce::AudioPluginInstance& plugin, const juce::MemoryBlock& chunk, int vst2ChunkKind = 0)
{
    if (format == Format::vst2)
    {
        auto* effect = effectOf (plugin);
        effect->dispatcher (effect, Vst2::effSetChunk, vst2ChunkKind, (juce::pointer_sized_int) chunk.getSize(),
                            const_cast<void*> (chunk.getData()), 0.0f);
        return;
    }

    juce::XmlElement hostState ("VST3PluginState");
    hostState.createNewChildElement ("IComponent")->addTextElement (chunk.toBase64Encoding());
    juce::MemoryBlock wrapped;
    juce::AudioProcessor::copyXmlToBinary (hostState, wrapped);
    plugin.setStateInformation (wrapped.getData(), (int) wrapped.getSize());
}

inline juce::MemoryBlock getChunk (Format format, juce::AudioPluginInstance& plugin, int vst2ChunkKind = 0)
{
    juce::MemoryBlock chunk;

    if (format == Format::vst2)
    {
        auto* effect = effectOf (plugin);
        void* data = nullptr;
        const auto size = effect->dispatcher (effect, Vst2::effGetChunk, vst2ChunkKind, 0, &data, 0.0f);
        if (size > 0 && data != nullptr)
            chunk.append (data, (size_t) size);
        return chunk;
    }

    juce::MemoryBlock saved;
    plugin.getStateInformation (saved);
    const auto hostState = juce::AudioProcessor::getXmlFromBinary (saved.getData(), (int) saved.getSize());

    if (hostState != nullptr)
        if (auto* component = hostState->getChildByName ("IComponent"))
            chunk.fromBase64Encoding (component->getAllSubText());

    return chunk;
}

// A state chunk written as the plug-in writes it, with a distinct value and
// controller for every parameter, so a restore can be checked parameter by
// parameter and byte by byte.
struct StateChunkFixture
{
    static constexpr int numParameters = 33;
    static constexpr int randomizeIndex = 18;

    static float valueFor (int index) { return index == randomizeIndex ? 0.0f : (float) ((index * 7 + 3) % 64) / 64.0f; }
    static int controllerFor (int index) { return index % 3 == 0 ? -1 : index + 10; }

    static juce::MemoryBlock makeChunk (const juce::StringArray& identifiers)
    {
        std::map<juce::String, double> values;
        std::map<juce::String, int> controllers;

        for (int i = 0; i < identifiers.size(); ++i)
        {
            values[identifiers[i]] = valueFor (i);
            controllers[identifiers[i]] = controllerFor (i);
        }

        return makeChunk (identifiers, values, controllers, "Formats & \"Friends\"");
    }

    // Values not given are taken from 'others' (normalised, in identifier order);
    // controllers not given are -1.
    static juce::MemoryBlock makeChunk (const juce::StringArray& identifiers, const std::map<juce::String, double>& values,
                                        const std::map<juce::String, int>& controllers, const juce::String& presetName,
                                        const juce::Array<float>& others = {})
    {
        juce::XmlElement state ("VELTRANE_STATE");
        state.setAttribute ("PresetName", presetName);

        for (int i = 0; i < identifiers.size(); ++i)
        {
            const auto& id = identifiers[i];
            const auto value = values.count (id) != 0 ? values.at (id) : (double) others[i];
            state.setAttribute (id, juce::String::formatted ("%.9g", value));
            state.setAttribute (id + "CC", controllers.count (id) != 0 ? controllers.at (id) : -1);
        }

        return wrapStateText (state.toString (juce::XmlElement::TextFormat().singleLine().withoutHeader()));
    }
};

inline juce::StringArray identifiersOf (juce::AudioPluginInstance& plugin)
{
    juce::StringArray identifiers;
    for (int i = 0; i < StateChunkFixture::numParameters; ++i)
        identifiers.add (plugin.getParameters()[i]->getName (64));
    return identifiers;
}

} // namespace veltrane::test
