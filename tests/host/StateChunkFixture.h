#pragma once

#include <juce_audio_processors/juce_audio_processors.h>

namespace veltrane::test
{

// A host state chunk as the plug-in itself writes it, with a distinct value and
// controller for every parameter, so a format that restores it can be checked
// parameter by parameter and byte by byte.
struct StateChunkFixture
{
    static constexpr int numParameters = 33;
    static constexpr int randomizeIndex = 18;

    static float valueFor (int index) { return index == randomizeIndex ? 0.0f : (float) ((index * 7 + 3) % 64) / 64.0f; }
    static int controllerFor (int index) { return index % 3 == 0 ? -1 : index + 10; }

    static juce::MemoryBlock makeChunk (const juce::StringArray& identifiers)
    {
        juce::XmlElement state ("VELTRANE_STATE");
        state.setAttribute ("PresetName", "Formats & \"Friends\"");

        for (int i = 0; i < identifiers.size(); ++i)
        {
            state.setAttribute (identifiers[i], juce::String::formatted ("%.9g", (double) valueFor (i)));
            state.setAttribute (identifiers[i] + "CC", controllerFor (i));
        }

        // "VC2!", the text's length, the one-line text without XML header, a zero byte.
        const auto text = state.toString (juce::XmlElement::TextFormat().singleLine().withoutHeader());
        const auto length = (juce::uint32) text.getNumBytesAsUTF8();
        juce::MemoryOutputStream chunk;
        chunk.write ("VC2!", 4);
        chunk.writeInt ((int) length);
        chunk.write (text.toRawUTF8(), length);
        chunk.writeByte (0);
        return chunk.getMemoryBlock();
    }
};

} // namespace veltrane::test
