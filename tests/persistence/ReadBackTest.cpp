#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
juce::MemoryBlock utf8 (const juce::String& text, const char* prefix = "")
{
    juce::MemoryBlock bytes (prefix, std::strlen (prefix));
    bytes.append (text.toRawUTF8(), text.getNumBytesAsUTF8());
    return bytes;
}

// Byte-order mark and code units, each unit as its two bytes in the given order.
juce::MemoryBlock utf16 (const juce::String& text, bool bigEndian)
{
    juce::MemoryOutputStream out;
    const auto write = [&] (juce::uint16 unit) { out.writeShort ((short) (bigEndian ? juce::ByteOrder::swap (unit) : unit)); };
    write (0xfeff);

    for (auto c : juce::Array<juce::juce_wchar> (text.toUTF32().getAddress(), text.length()))
    {
        if (c < 0x10000)
        {
            write ((juce::uint16) c);
            continue;
        }

        write ((juce::uint16) (0xd800 + ((c - 0x10000) >> 10)));
        write ((juce::uint16) (0xdc00 + ((c - 0x10000) & 0x3ff)));
    }

    return out.getMemoryBlock();
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

    // The name's "W" (unit 29, after the mark) made a high surrogate before the "i".
    auto loneSurrogate = utf16 (body, false);
    static_cast<juce::uint8*> (loneSurrogate.getData())[60] = 0x00;
    static_cast<juce::uint8*> (loneSurrogate.getData())[61] = 0xd8;

    const struct { const char* what; juce::MemoryBlock bytes; bool loads; } cases[] = {
        { "UTF-8 with byte-order mark", utf8 (body, "\xef\xbb\xbf"), true },
        { "UTF-16 little-endian", utf16 ("<?xml version=\"1.0\" encoding=\"UTF-16\"?>\n" + body, false), true },
        { "UTF-16 big-endian", utf16 (body, true), true },
        { "internal DTD subset", utf8 ("<?xml version=\"1.0\"?>\n" + subset + body), true },
        { "billion laughs", utf8 (laughs + "]><VELTRANE_PRESET PresetName=\"&a9;\" Delay1Feedback=\"0.25\"/>"), false },
        { "declared entity in use", utf8 ("<!DOCTYPE VELTRANE_PRESET [<!ENTITY n \"x\">]><VELTRANE_PRESET PresetName=\"&n;\" Delay1Feedback=\"0.25\"/>"), false },
        { "bracket in a DTD literal", utf8 ("<!DOCTYPE VELTRANE_PRESET [<!ENTITY n \"a>b\">]>" + body), false },
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

// A name longer than a state can hold is cut where it comes in, so the state that
// carries it restores every setting in the next instance.
TEST (ReadBack, LongestNamesRoundTripThroughTheState)
{
    TemporaryHome home;
    presetFolder().createDirectory();
    const auto tooLong = juce::String::repeatedString (juce::String::fromUTF8 ("\xc3\xa9"), 200000);
    const auto widest = juce::String::repeatedString (juce::String::charToString (0x10ffff), 110000);   // ten bytes each
    presetFolder().getChildFile ("Long.vtp").replaceWithText ("<VELTRANE_PRESET PresetName=\"" + tooLong + "\" Delay1Feedback=\"0.25\"/>");

    for (const auto& source : { "preset", "typed" })
    {
        VeltraneAudioProcessor writer;
        writer.setParameter (Param::Delay1Feedback, 0.25f);
        if (juce::String (source) == "preset")
        {
            processBlock (writer, programChange (1, 0));
            processBlock (writer);
        }
        else
            writer.setPresetName (widest);

        const auto expected = (juce::String (source) == "preset" ? tooLong : widest).substring (0, maxPresetNameLength);
        EXPECT_EQ (writer.getPresetName(), expected) << source;

        const auto chunk = chunkOf (writer);
        VeltraneAudioProcessor reader;
        reader.setStateInformation (chunk.getData(), (int) chunk.getSize());
        EXPECT_EQ (reader.getPresetName(), expected) << source;
        EXPECT_EQ (reader.getParameter (Param::Delay1Feedback), 0.25f) << source;
    }
}
