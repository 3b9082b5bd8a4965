#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
juce::MemoryBlock bytes (const char* prefix, const juce::String& text)
{
    juce::MemoryBlock block (prefix, std::strlen (prefix));
    block.append (text.toRawUTF8(), text.getNumBytesAsUTF8());
    return block;
}

// Byte-order mark and text as JUCE encodes UTF-16 (surrogate pairs included).
juce::MemoryBlock utf16 (const juce::String& text, bool bigEndian)
{
    const auto marked = juce::String::charToString (0xfeff) + text;
    const auto units = marked.toUTF16();
    juce::MemoryBlock block (units.getAddress(), units.sizeInBytes() - 2);

    for (size_t i = 0; bigEndian && i < block.getSize(); i += 2)
        std::swap (block[i], block[i + 1]);

    return block;
}
}

TEST (ReadBack, PresetsInEveryEncodingJuceReadsLoadAndEntitiesStayRefused)
{
    TemporaryHome home;
    presetFolder().createDirectory();
    const auto name = juce::String::fromUTF8 ("Wide \xc3\xa9 \xf0\x9f\x98\x80");
    const auto body = "<VELTRANE_PRESET PresetName=\"" + name + "\" Delay1Feedback=\"0.25\"/>";
    const juce::String subset ("<!DOCTYPE VELTRANE_PRESET [\n <!-- the editor's own -->\n <!ELEMENT VELTRANE_PRESET EMPTY>\n"
                               " <!ATTLIST VELTRANE_PRESET PresetName CDATA \"x\">\n <!ENTITY unused 'a \"b\"'>\n]>\n");
    juce::String laughs ("<!DOCTYPE VELTRANE_PRESET [<!ENTITY a0 \"ha\">");
    for (int i = 1; i < 10; ++i)
        laughs << "<!ENTITY a" << i << " \"" << juce::String::repeatedString ("&a" + juce::String (i - 1) + ";", 10) << "\">";

    // The name's "W" (unit 29 after the mark) made a high surrogate before the "i".
    auto loneSurrogate = utf16 (body, false);
    loneSurrogate[60] = 0x00;
    loneSurrogate[61] = (char) 0xd8;

    const struct { const char* what; juce::MemoryBlock bytes; bool loads; } cases[] = {
        { "UTF-8 with byte-order mark", bytes ("\xef\xbb\xbf", body), true },
        { "UTF-16 little-endian", utf16 ("<?xml version=\"1.0\" encoding=\"UTF-16\"?>\n" + body, false), true },
        { "UTF-16 big-endian", utf16 (body, true), true },
        { "internal DTD subset", bytes ("<?xml version=\"1.0\"?>\n", subset + body), true },
        { "billion laughs", bytes ("", laughs + "]><VELTRANE_PRESET PresetName=\"&a9;\" Delay1Feedback=\"0.25\"/>"), false },
        { "declared entity in use", bytes ("<!DOCTYPE VELTRANE_PRESET [<!ENTITY n \"x\">]>", body.replace ("Wide", "&n;")), false },
        { "UTF-16 lone surrogate", loneSurrogate, false },
        { "UTF-16 odd length", [&] { auto b = utf16 (body, false); b.append ("<", 1); return b; }(), false },
    };

    for (const auto& c : cases)
    {
        const auto file = presetFolder().getChildFile ("Preset.vtp");
        ASSERT_TRUE (file.replaceWithData (c.bytes.getData(), c.bytes.getSize()));
        VeltraneAudioProcessor processor;
        processor.loadPreset (file.getFullPathName());

        EXPECT_EQ (processor.getParameter (Param::Delay1Feedback), c.loads ? 0.25f : 0.4f) << c.what;
        EXPECT_EQ (processor.getPresetName(), c.loads ? name : "Init") << c.what;
    }
}

// A name longer than a state can hold is cut where it comes in (a preset picked by
// program change, typing), so the state carrying it restores every setting.
TEST (ReadBack, LongestNamesRoundTripThroughTheState)
{
    TemporaryHome home;
    presetFolder().createDirectory();
    const auto tooLong = juce::String::repeatedString (juce::String::fromUTF8 ("\xc3\xa9"), 200000);
    presetFolder().getChildFile ("Long.vtp").replaceWithText ("<VELTRANE_PRESET PresetName=\"" + tooLong + "\" Delay1Feedback=\"0.25\"/>");
    VeltraneAudioProcessor writer, reader;
    processBlock (writer, programChange (1, 0));
    processBlock (writer);

    const auto chunk = chunkOf (writer);
    reader.setStateInformation (chunk.getData(), (int) chunk.getSize());
    EXPECT_EQ (reader.getPresetName(), tooLong.substring (0, maxPresetNameLength));
    EXPECT_EQ (reader.getParameter (Param::Delay1Feedback), 0.25f);
    writer.setPresetName (tooLong + "typed");
    EXPECT_EQ (writer.getPresetName(), reader.getPresetName());
}
