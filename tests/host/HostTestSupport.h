#pragma once

// The shipped binaries loaded through JUCE's plug-in hosting, and the plug-in's state chunk as
// hosts hand it over.

#include <juce_audio_processors/juce_audio_processors.h>

namespace Vst2
{
#include <pluginterfaces/vst2.x/aeffectx.h>
}

namespace veltrane::test
{

enum class Format { vst2, vst3 };

inline std::unique_ptr<juce::AudioPluginInstance> loadPlugin (Format format)
{
    juce::VSTPluginFormat vst2;
    juce::VST3PluginFormat vst3;
    auto& pluginFormat = format == Format::vst2 ? static_cast<juce::AudioPluginFormat&> (vst2) : vst3;
    juce::OwnedArray<juce::PluginDescription> descriptions;
    pluginFormat.findAllTypesForFile (descriptions, format == Format::vst2 ? VELTRANE_VST2_BINARY : VELTRANE_VST3_BUNDLE);
    juce::String error;
    return descriptions.isEmpty() ? nullptr : pluginFormat.createInstanceFromDescription (*descriptions[0], 44100.0, 512, error);
}

// "VC2!", the text's length, the one-line text, a zero byte.
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
    return chunk.getSize() < 9 ? nullptr : juce::parseXML (juce::String::fromUTF8 ((const char*) chunk.getData() + 8, (int) chunk.getSize() - 9));
}

// A state chunk, edited as XML.
inline juce::MemoryBlock edited (const juce::MemoryBlock& chunk, const std::function<void (juce::XmlElement&)>& edit)
{
    auto state = parseStateChunk (chunk);
    edit (*state);
    return wrapStateText (state->toString (juce::XmlElement::TextFormat().singleLine().withoutHeader()));
}

} // namespace veltrane::test
