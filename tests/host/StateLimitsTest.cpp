// Whatever state the shipped VST2 plug-in writes, a new instance reads back: states
// holding the longest names and many attributes of other names.

#include "HostTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane::test;

TEST (StateLimits, EveryChunkThePluginWritesRestoresInANewInstance)
{
    juce::String unknown;
    for (int i = 0; i < 3000; ++i)
        unknown << " Unknown" << i << "=\"1\"";

    const struct { juce::String name, extraAttributes; } cases[] = {
        { juce::String::repeatedString (juce::String::fromUTF8 ("\xc3\xa9"), 200000), {} },
        { "Many", unknown },
    };

    for (const auto& c : cases)
    {
        auto writer = loadPlugin (Format::vst2), reader = loadPlugin (Format::vst2);
        ASSERT_TRUE (writer != nullptr && reader != nullptr);
        const auto identifiers = identifiersOf (*writer);
        const auto plain = StateChunkFixture::makeChunk (identifiers, {}, {}, "Name", [] {
            juce::Array<float> values;
            for (int i = 0; i < StateChunkFixture::numParameters; ++i)
                values.add (StateChunkFixture::valueFor (i));
            return values;
        }());
        const auto text = juce::String::fromUTF8 (static_cast<const char*> (plain.getData()) + 8, (int) plain.getSize() - 9);
        // The name as other software writes it, in plain UTF-8 rather than escaped.
        setChunk (Format::vst2, *writer, wrapStateText (text.replace ("<VELTRANE_STATE PresetName=\"Name\"",
                                                                      "<VELTRANE_STATE" + c.extraAttributes + " PresetName=\"" + c.name + "\"")));

        const auto saved = getChunk (Format::vst2, *writer);
        setChunk (Format::vst2, *reader, saved);

        for (int i = 0; i < StateChunkFixture::numParameters; ++i)
        {
            EXPECT_EQ (writer->getParameters()[i]->getValue(), StateChunkFixture::valueFor (i)) << i;
            EXPECT_EQ (reader->getParameters()[i]->getValue(), StateChunkFixture::valueFor (i)) << i;
        }

        EXPECT_EQ (getChunk (Format::vst2, *reader), saved);
        const auto state = parseStateChunk (saved);
        ASSERT_NE (state, nullptr);
        EXPECT_EQ (state->getStringAttribute ("PresetName"), c.name.substring (0, 10000));
    }
}
