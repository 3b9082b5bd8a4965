// Whatever state the shipped VST2 plug-in writes, a new instance reads back: states
// holding the longest names and many attributes of other names.

#include "HostTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane::test;

TEST (StateLimits, EveryChunkThePluginWritesRestoresInANewInstance)
{
    juce::String unknown;
    juce::Array<float> values;
    for (int i = 0; i < 3000; ++i)
        unknown << " Unknown" << i << "=\"1\"";
    for (int i = 0; i < StateChunkFixture::numParameters; ++i)
        values.add (StateChunkFixture::valueFor (i));

    for (auto [name, extraAttributes] : { std::pair { juce::String::repeatedString (juce::String::fromUTF8 ("\xc3\xa9"), 200000), juce::String() },
                                          std::pair { juce::String ("Many"), unknown } })
    {
        auto writer = loadPlugin (Format::vst2), reader = loadPlugin (Format::vst2);
        ASSERT_TRUE (writer != nullptr && reader != nullptr);
        const auto plain = StateChunkFixture::makeChunk (identifiersOf (*writer), {}, {}, "Name", values);
        const auto text = juce::String::fromUTF8 (static_cast<const char*> (plain.getData()) + 8, (int) plain.getSize() - 9);
        // The name as other software writes it, in plain UTF-8 rather than escaped.
        setChunk (Format::vst2, *writer, wrapStateText (text.replace ("<VELTRANE_STATE PresetName=\"Name\"",
                                                                      "<VELTRANE_STATE" + extraAttributes + " PresetName=\"" + name + "\"")));
        const auto saved = getChunk (Format::vst2, *writer);
        setChunk (Format::vst2, *reader, saved);

        for (int i = 0; i < StateChunkFixture::numParameters; ++i)
            EXPECT_EQ (std::pair (writer->getParameters()[i]->getValue(), reader->getParameters()[i]->getValue()),
                       std::pair (values[i], values[i])) << i;

        EXPECT_EQ (getChunk (Format::vst2, *reader), saved);
        const auto state = parseStateChunk (saved);
        ASSERT_NE (state, nullptr);
        EXPECT_EQ (state->getStringAttribute ("PresetName"), name.substring (0, 10000));
    }
}
