#include "PersistenceTestSupport.h"
#include "persistence/SafeXml.h"
#include "persistence/StateChunk.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

#include <clocale>
#include <cstdlib>
#include <cstring>
#include <locale>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
juce::String textOf (const juce::MemoryBlock& chunk)
{
    return juce::String::fromUTF8 (static_cast<const char*> (chunk.getData()) + 8, (int) chunk.getSize() - 9);
}

// Values that must come back bit for bit: the ends, small normal numbers, values
// whose nine-digit form is at the edge of rounding.
constexpr float roundTripValues[] = { 0.0f, 1.0f, 1.17549435e-38f, 1.0e-30f, 2.5e-9f, 0.1f, 0.4f,
                                      0.99999994f, 0.50000006f, 0.333333343f, 0.123456791f };
}

TEST (StateChunk, FreshProcessorWritesTheDocumentedBytes)
{
    VeltraneAudioProcessor processor;
    const auto chunk = chunkOf (processor);
    const auto* bytes = static_cast<const unsigned char*> (chunk.getData());

    ASSERT_GT (chunk.getSize(), 9u);
    EXPECT_EQ (std::memcmp (bytes, "VC2!", 4), 0);
    const auto length = (size_t) juce::ByteOrder::littleEndianInt (bytes + 4);
    EXPECT_EQ (length + 9, chunk.getSize());
    EXPECT_EQ (bytes[8 + length], 0);
    EXPECT_EQ (std::memchr (bytes + 8, 0, length), nullptr);

    const auto text = textOf (chunk);
    EXPECT_TRUE (text.startsWith ("<VELTRANE_STATE PresetName=\"Init\" Delay1Time=\""));
    EXPECT_TRUE (text.endsWith (" LFO2SyncedRate=\"0.352941185\" LFO2SyncedRateCC=\"-1\"/>"));
    EXPECT_FALSE (text.containsAnyOf ("\r\n"));
    EXPECT_TRUE (text.contains (" Delay1Feedback=\"0.400000006\" Delay1FeedbackCC=\"-1\" "));
    EXPECT_TRUE (text.contains (" DryWet=\"1\" DryWetCC=\"-1\" "));
    EXPECT_TRUE (text.contains (" Delay1TimeMod=\"0\" "));

    // 67 attributes: the name, then value and controller per parameter in index order.
    int position = text.indexOf ("PresetName=");

    for (int i = 0; i < Param::count; ++i)
    {
        const juce::String identifier (parameterTable[(size_t) i].identifier);
        const auto valueAt = text.indexOf (" " + identifier + "=\"");
        const auto controllerAt = text.indexOf (" " + identifier + "CC=\"-1\"");
        EXPECT_GT (valueAt, position) << identifier;
        EXPECT_GT (controllerAt, valueAt) << identifier;
        position = controllerAt;
    }

    EXPECT_EQ (juce::StringArray::fromTokens (text, " ", "\"").size(), 68);
}

TEST (StateChunk, RoundTripRestoresEveryValueBitExactly)
{
    VeltraneAudioProcessor source;

    for (int i = 0; i < Param::count; ++i)
    {
        source.setParameter (i, roundTripValues[(size_t) i % std::size (roundTripValues)]);
        source.getParameterRecord (i).midiController.store (i == 5 ? -1 : (i * 7) % 128);
    }

    source.setPresetName ("Tom & Jerry's \"best\" <echo>");
    const auto chunk = chunkOf (source);

    VeltraneAudioProcessor restored;
    restored.setStateInformation (chunk.getData(), (int) chunk.getSize());

    const auto expected = valuesOf (source);
    const auto actual = valuesOf (restored);
    EXPECT_EQ (std::memcmp (expected.data(), actual.data(), sizeof (expected)), 0);
    EXPECT_EQ (controllersOf (restored), controllersOf (source));
    EXPECT_EQ (restored.getPresetName(), "Tom & Jerry's \"best\" <echo>");
    EXPECT_TRUE (textOf (chunk).contains ("PresetName=\"Tom &amp; Jerry's &quot;best&quot; &lt;echo&gt;\""));
    EXPECT_EQ (chunkOf (restored), chunk);
}

TEST (StateChunk, MalformedBlocksChangeNothing)
{
    const juce::String valid ("<VELTRANE_STATE PresetName=\"Other\" Delay1Time=\"0.5\" Delay1TimeCC=\"3\"/>");
    const auto wrongMagic = [&] { auto block = wrapState (valid); static_cast<char*> (block.getData())[3] = '?'; return block; }();
    const auto eightBytes = [&] { auto block = wrapState (valid); block.setSize (8); return block; }();

    // Raw bytes that are not UTF-8: a bad lead byte before the end, an overlong zero.
    const auto rawState = [] (const char* text, size_t size) {
        juce::MemoryBlock block ("VC2!", 4);
        const auto length = juce::ByteOrder::swapIfBigEndian ((juce::uint32) size);
        block.append (&length, 4);
        block.append (text, size);
        return block;
    };

    const struct { const char* what; juce::MemoryBlock block; } cases[] = {
        { "bad UTF-8 lead byte", rawState ("<VELTRANE_STATE PresetName=\"\xfe\x05", 30) },
        { "cut-off character reference", wrapState ("<VELTRANE_STATE PresetName=\"&#x41") },
        { "overlong zero", rawState ("<VELTRANE_STATE PresetName=\"\xc0\x80\"/>", 33) },
        { "empty", {} },
        { "eight bytes", eightBytes },
        { "wrong magic", wrongMagic },
        { "length 0", wrapState (valid, 0) },
        { "negative length", wrapState (valid, -16) },
        { "not XML", wrapState ("this is not XML") },
        { "other root tag", wrapState ("<VELTRANE_PRESET PresetName=\"Other\" Delay1Time=\"0.5\"/>") },
        { "text longer than 1 MiB", wrapState ("<VELTRANE_STATE PresetName=\"" + juce::String::repeatedString ("x", 1 << 20) + "\"/>") },
        { "elements nested 100000 deep", wrapState ("<VELTRANE_STATE>" + juce::String::repeatedString ("<a>", 100000)) },
        { "entity declarations", wrapState ("<!DOCTYPE VELTRANE_STATE [<!ENTITY a \"&a;&a;\">]><VELTRANE_STATE PresetName=\"&a;\"/>") },
    };

    for (const auto& c : cases)
    {
        VeltraneAudioProcessor processor;
        processor.getParameterRecord (4).midiController.store (9);
        const auto before = chunkOf (processor);
        ParameterChangeRecorder recorder;
        processor.addListener (&recorder);

        processor.setStateInformation (c.block.getData(), (int) c.block.getSize());

        EXPECT_EQ (chunkOf (processor), before) << c.what;
        EXPECT_TRUE (recorder.changedIndices.isEmpty()) << c.what;
        processor.removeListener (&recorder);
    }
}

TEST (StateChunk, LoadingFollowsTheDocumentedDefaults)
{
    // A length beyond the data is clipped; tag and attribute names match in any case.
    VeltraneAudioProcessor clipped;
    const auto block = wrapState ("<veltrane_state presetname=\"Low\" delay1time=\"0.25\" DELAY1TIMECC=\"74\"/>", 5000);
    clipped.setStateInformation (block.getData(), (int) block.getSize() - 1);
    EXPECT_EQ (clipped.getParameter (0), 0.25f);
    EXPECT_EQ (clipped.getParameterRecord (0).midiController.load(), 74);
    EXPECT_EQ (clipped.getPresetName(), "Low");

    // No attributes: values stay, controllers clear, the name is one space, and the
    // host still hears about all 33 parameters.
    VeltraneAudioProcessor bare;
    bare.setParameter (1, 0.75f);
    bare.getParameterRecord (3).midiController.store (12);
    ParameterChangeRecorder recorder;
    bare.addListener (&recorder);
    const auto empty = wrapState ("<VELTRANE_STATE/>");
    bare.setStateInformation (empty.getData(), (int) empty.getSize());
    EXPECT_EQ (bare.getParameter (1), 0.75f);
    EXPECT_EQ (controllersOf (bare), noControllers());
    EXPECT_EQ (bare.getPresetName(), " ");
    EXPECT_EQ (recorder.changedIndices.size(), Param::count);
    bare.removeListener (&recorder);

    // Out of range is ignored but notified; text that is no number reads as 0.
    VeltraneAudioProcessor odd;
    const auto before = odd.getParameter (0);
    ParameterChangeRecorder oddRecorder;
    odd.addListener (&oddRecorder);
    const auto oddBlock = wrapState ("<VELTRANE_STATE Delay1Time=\"2\" Delay1Feedback=\"loud\" Delay1TimeModCC=\"x\" DryWet=\"nan\"/>");
    odd.setStateInformation (oddBlock.getData(), (int) oddBlock.getSize());
    EXPECT_EQ (odd.getParameter (0), before);
    EXPECT_EQ (oddRecorder.changedIndices[0], 0);
    EXPECT_EQ (odd.getParameter (1), 0.0f);
    EXPECT_EQ (odd.getParameterRecord (2).midiController.load(), 0);
    EXPECT_EQ (odd.getParameter (Param::DryWet), 1.0f);
    odd.removeListener (&oddRecorder);
}

TEST (StateChunk, ChildElementsAreIgnored)
{
    VeltraneAudioProcessor processor;
    const auto block = wrapState ("<VELTRANE_STATE Delay1Time=\"0.5\"><a><b><c Delay1Time=\"0.1\"/></b></a></VELTRANE_STATE>");
    processor.setStateInformation (block.getData(), (int) block.getSize());
    EXPECT_EQ (processor.getParameter (0), 0.5f);
}

namespace
{
// A decimal comma for C++ streams, for when no such C locale is installed.
struct CommaDecimals final : std::numpunct<char>
{
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

// Switches the C locale to German, compiling it into a temporary folder with the
// system's localedef when it is not installed. Returns whether it succeeded.
bool useGermanCLocale (const TemporaryHome& scratch)
{
    if (std::setlocale (LC_ALL, "de_DE.UTF-8") != nullptr)
        return true;

    const auto folder = scratch.path() + "/locales";
    const auto command = "localedef -i de_DE -f UTF-8 '" + folder + "/de_DE.UTF-8' >/dev/null 2>&1";

    if (std::system (("mkdir -p '" + folder + "' && " + command).c_str()) != 0)
        return false;

    ::setenv ("LOCPATH", folder.c_str(), 1);
    return std::setlocale (LC_ALL, "de_DE.UTF-8") != nullptr;
}
}

TEST (StateChunk, CommaDecimalLocaleChangesNothing)
{
    VeltraneAudioProcessor reference;
    reference.setParameter (0, 0.123456791f);
    reference.setParameter (1, 2.5e-9f);
    const auto expected = chunkOf (reference);

    TemporaryHome scratch;
    const auto previousGlobal = std::locale::global (std::locale (std::locale::classic(), new CommaDecimals));
    const auto germanC = useGermanCLocale (scratch);

    char printed[32];
    std::snprintf (printed, sizeof (printed), "%.1f", 1.5);
    if (germanC)
    {
        EXPECT_STREQ (printed, "1,5");
    }

    const auto written = [&] { VeltraneAudioProcessor p; p.setParameter (0, 0.123456791f); p.setParameter (1, 2.5e-9f); return chunkOf (p); }();
    VeltraneAudioProcessor loaded;
    loaded.setStateInformation (expected.getData(), (int) expected.getSize());
    const auto loadedValues = valuesOf (loaded);

    std::setlocale (LC_ALL, "C");
    ::unsetenv ("LOCPATH");
    std::locale::global (previousGlobal);

    EXPECT_EQ (written, expected);
    EXPECT_EQ (loadedValues[0], 0.123456791f);
    EXPECT_EQ (loadedValues[1], 2.5e-9f);

    if (! germanC)
        GTEST_SKIP() << "no German C locale could be made; only the C++ locale had a decimal comma";
}

TEST (StateChunk, FormatsValuesWithNineSignificantDigits)
{
    const struct { double value; const char* text; } cases[] = {
        { 0.0, "0" }, { 1.0, "1" }, { (double) 0.4f, "0.400000006" }, { (double) 1.0e-30f, "1e-30" }, { (double) 0.1f, "0.100000001" },
        { (double) 0.243987486f, "0.243987486" }, { -1.0, "-1" },
    };

    for (const auto& c : cases)
        EXPECT_EQ (formatValue (c.value), c.text) << c.text;
}
