// One state chunk restored through each format's own state mechanism gives the
// same 33 values and the same bytes back: the VST2 bank and program chunks as a
// host hands them over, and the VST3 component state through JUCE's VST3 hosting.
// (The LV2 state interface is checked in Lv2HostTest.)

#include "HostTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane::test;

class FormatState : public ::testing::TestWithParam<Format> {};

TEST_P (FormatState, ChunkRestoresEveryValueAndSavesTheSameBytes)
{
    auto plugin = loadPlugin (GetParam());
    ASSERT_NE (plugin, nullptr);
    const auto chunk = StateChunkFixture::makeChunk (identifiersOf (*plugin));

    for (auto vst2ChunkKind : { 0, 1 })   // bank, program
    {
        setChunk (GetParam(), *plugin, chunk, vst2ChunkKind);

        for (int i = 0; i < StateChunkFixture::numParameters; ++i)
            EXPECT_FLOAT_EQ (plugin->getParameters()[i]->getValue(), StateChunkFixture::valueFor (i)) << i;

        const auto saved = getChunk (GetParam(), *plugin, vst2ChunkKind);
        ASSERT_GE (saved.getSize(), chunk.getSize());
        // JUCE's VST3 wrapper may append private data after the plug-in's own bytes.
        EXPECT_EQ (juce::MemoryBlock (saved.getData(), chunk.getSize()), chunk);
    }
}

INSTANTIATE_TEST_SUITE_P (Formats, FormatState, ::testing::Values (Format::vst2, Format::vst3),
                          [] (const auto& info) { return info.param == Format::vst2 ? "Vst2" : "Vst3"; });
