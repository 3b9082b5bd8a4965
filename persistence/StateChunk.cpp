#include "StateChunk.h"

#include "SafeXml.h"

#include <cstring>

namespace veltrane
{

namespace
{
    constexpr char stateTag[] = "VELTRANE_STATE";
    constexpr char presetNameAttribute[] = "PresetName";
    constexpr juce::uint32 stateMagic = 0x21324356;   // "VC2!" read as a little-endian integer
    constexpr int headerBytes = 8;

    // Attribute names in the order the state looks them up: the values, then the
    // controllers, then the preset name.
    juce::StringArray stateAttributeNames()
    {
        juce::StringArray names;

        for (const auto& row : parameterTable)
            names.add (row.identifier);

        for (int i = 0; i < Param::count; ++i)
            names.add (controllerKey (i));

        names.add (presetNameAttribute);
        return names;
    }
}

juce::String limitPresetName (const juce::String& name)
{
    return name.length() > maxPresetNameLength ? name.substring (0, maxPresetNameLength) : name;
}

juce::String controllerKey (int index)
{
    return juce::String (parameterTable[(size_t) index].identifier) + "CC";
}

juce::String createStateText (const juce::String& presetName,
                              const ParameterValues& values,
                              const MidiControllers& midiControllers)
{
    juce::XmlElement element (stateTag);
    element.setAttribute (presetNameAttribute, presetName);

    for (int i = 0; i < Param::count; ++i)
    {
        element.setAttribute (parameterTable[(size_t) i].identifier, formatValue ((double) values[(size_t) i]));
        element.setAttribute (controllerKey (i), midiControllers[(size_t) i]);
    }

    return element.toString (juce::XmlElement::TextFormat().singleLine().withoutHeader());
}

juce::MemoryBlock writeStateChunk (const juce::String& presetName,
                                   const ParameterValues& values,
                                   const MidiControllers& midiControllers)
{
    const auto text = createStateText (presetName, values, midiControllers);
    const auto textBytes = text.getNumBytesAsUTF8();

    juce::MemoryBlock block (textBytes + headerBytes + 1, true);
    auto* bytes = static_cast<char*> (block.getData());
    const auto magic = juce::ByteOrder::swapIfBigEndian (stateMagic);
    const auto length = juce::ByteOrder::swapIfBigEndian ((juce::uint32) textBytes);
    std::memcpy (bytes, &magic, 4);
    std::memcpy (bytes + 4, &length, 4);
    std::memcpy (bytes + headerBytes, text.toRawUTF8(), textBytes);
    return block;   // the last byte stays 0
}

std::optional<StateContents> readStateChunk (const void* data, int sizeInBytes)
{
    if (data == nullptr || sizeInBytes < headerBytes + 1)
        return {};

    const auto* bytes = static_cast<const char*> (data);

    if (juce::ByteOrder::littleEndianInt (bytes) != stateMagic)
        return {};

    const auto length = (int) juce::ByteOrder::littleEndianInt (bytes + 4);

    if (length <= 0)
        return {};

    const auto textBytes = juce::jmin (length, sizeInBytes - headerBytes);

    if (textBytes > maxDocumentBytes)
        return {};

    const auto element = parseDocument (bytes + headerBytes, (size_t) textBytes);

    if (element == nullptr || ! element->getTagName().equalsIgnoreCase (stateTag))
        return {};

    static const auto names = stateAttributeNames();
    const auto found = takeAttributes (*element, names);

    StateContents contents;

    for (size_t i = 0; i < (size_t) Param::count; ++i)
    {
        if (const auto& value = found[i])
            contents.values[i] = value->getDoubleValue();

        const auto& controller = found[i + (size_t) Param::count];
        contents.midiControllers[i] = controller.has_value() ? controller->getIntValue() : -1;
    }

    contents.presetName = limitPresetName (found.back().value_or (" "));
    return contents;
}

} // namespace veltrane
