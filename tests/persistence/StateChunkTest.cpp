#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <cstring>
#include <locale>

using namespace veltrane;

namespace
{
juce::MemoryBlock chunkOf (VeltraneAudioProcessor& processor) { juce::MemoryBlock block; processor.getStateInformation (block); return block; }
// "VC2!", a length field (the text's own unless given), the text, a zero byte.
juce::MemoryBlock wrap (const std::string& text, std::optional<int> length = {})
{
    juce::MemoryOutputStream out;
    out.write ("VC2!", 4);
    out.writeInt (length.value_or ((int) text.size()));
    out.write (text.c_str(), text.size() + 1);
    return out.getMemoryBlock();
}
void load (VeltraneAudioProcessor& processor, const juce::MemoryBlock& block) { processor.setStateInformation (block.getData(), (int) block.getSize()); }
struct ChangeCount final : juce::AudioProcessorListener
{
    int changes = 0;
    void audioProcessorParameterChanged (juce::AudioProcessor*, int, float) override { ++changes; }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
};
}

// The identifiers and default values as hosts' saved projects and preset files hold them.
const char* const defaults[][2] {
    { "Delay1Time", "0.243987232" }, { "Delay1Feedback", "0.400000006" }, { "Delay1TimeMod", "0" }, { "Delay1TimeModSource", "0" },
    { "Delay1FeedbackMod", "0" }, { "Delay1FeedbackModSource", "0" }, { "Delay1Gain", "0.848337948" }, { "Delay2Time", "0.243987232" },
    { "Delay2Feedback", "0.400000006" }, { "Delay2TimeMod", "0" }, { "Delay2TimeModSource", "0" }, { "Delay2FeedbackMod", "0" },
    { "Delay2FeedbackModSource", "0" }, { "Delay2Gain", "0.848337948" }, { "MixMode", "0" }, { "DryWet", "1" }, { "Waveshaper", "0" },
    { "WaveshaperAmount", "0" }, { "Randomize", "0" }, { "Envelope1Sensitivity", "0.528925657" }, { "Envelope1Attack", "0.288675129" },
    { "Envelope1Release", "0.408248305" }, { "Envelope2Sensitivity", "0.528925657" }, { "Envelope2Attack", "0.288675129" },
    { "Envelope2Release", "0.408248305" }, { "LFO1Wave", "0" }, { "LFO1Rate", "0.158113882" }, { "LFO1Sync", "0" },
    { "LFO1SyncedRate", "0.352941185" }, { "LFO2Wave", "0" }, { "LFO2Rate", "0.158113882" }, { "LFO2Sync", "0" }, { "LFO2SyncedRate", "0.352941185" },
};

TEST (StateChunk, FreshProcessorWritesTheDocumentedBytes)
{
    const tools::PrivateHome home;   // no bindings left by other tests
    VeltraneAudioProcessor processor;
    const auto chunk = chunkOf (processor);
    const auto* bytes = static_cast<const char*> (chunk.getData());
    juce::String expected ("<VELTRANE_STATE PresetName=\"Init\"");
    for (const auto& [identifier, value] : defaults)
        expected << " " << identifier << "=\"" << value << "\" " << identifier << "CC=\"-1\"";
    EXPECT_EQ (std::memcmp (bytes, "VC2!", 4), 0);
    EXPECT_EQ ((size_t) juce::ByteOrder::littleEndianInt (bytes + 4) + 9, chunk.getSize());
    EXPECT_EQ (bytes[chunk.getSize() - 1], 0);
    EXPECT_EQ (juce::String::fromUTF8 (bytes + 8, (int) chunk.getSize() - 9), expected + "/>");
}

TEST (StateChunk, RoundTripRestoresEveryValueBindingAndNameExactly)
{
    const tools::PrivateHome home;
    const float values[] { 0.0f, 1.0f, 1.17549435e-38f, 2.5e-9f, 0.1f, 0.4f, 0.99999994f, 0.50000006f, 0.333333343f, 0.123456791f };
    VeltraneAudioProcessor source, restored;
    for (int i = 0; i < Param::count; ++i)
    {
        source.setParameter (i, values[(size_t) i % std::size (values)]);
        source.getParameterRecord (i).midiController = i == 5 ? -1 : (i * 7) % 128;
    }
    source.setPresetName ("Tom & Jerry's \"best\" <echo>");
    const auto chunk = chunkOf (source);
    load (restored, chunk);
    EXPECT_EQ (chunkOf (restored), chunk);
    for (int i = 0; i < Param::count; ++i)
        EXPECT_EQ (std::pair (restored.getParameter (i), restored.getParameterRecord (i).midiController.load()),
                   std::pair (source.getParameter (i), i == 5 ? -1 : (i * 7) % 128)) << i;
    EXPECT_EQ (restored.getPresetName(), "Tom & Jerry's \"best\" <echo>");
    // A decimal comma in the user's locale changes nothing either way.
    struct Comma final : std::numpunct<char> { char do_decimal_point() const override { return ','; } };
    const auto previous = std::locale::global (std::locale (std::locale::classic(), new Comma));
    VeltraneAudioProcessor underComma;
    load (underComma, chunk);
    const auto written = chunkOf (underComma);
    std::locale::global (previous);
    EXPECT_EQ (written, chunk);
}

TEST (StateChunk, MalformedBlocksChangeNothingAndTellTheHostNothing)
{
    const std::string valid ("<VELTRANE_STATE PresetName=\"Other\" Delay1Time=\"0.5\" Delay1TimeCC=\"3\"/>");
    auto wrongMagic = wrap (valid), eightBytes = wrap (valid);
    static_cast<char*> (wrongMagic.getData())[3] = '?';
    eightBytes.setSize (8);
    const std::pair<const char*, juce::MemoryBlock> cases[] {
        { "empty", {} }, { "eight bytes", eightBytes }, { "wrong magic", wrongMagic }, { "length 0", wrap (valid, 0) },
        { "negative length", wrap (valid, -16) }, { "not XML", wrap ("this is not XML") },
        { "other root tag", wrap ("<VELTRANE_PRESET PresetName=\"Other\" Delay1Time=\"0.5\"/>") },
        { "bad UTF-8", wrap ("<VELTRANE_STATE PresetName=\"\xfe\x05\"/>") }, { "overlong zero", wrap ("<VELTRANE_STATE PresetName=\"\xc0\x80\"/>") },
        { "cut-off reference", wrap ("<VELTRANE_STATE PresetName=\"&#x41") },
        { "over 1 MiB", wrap ("<VELTRANE_STATE PresetName=\"" + std::string (1 << 20, 'x') + "\"/>") }, { "nested 100000 deep", wrap ("<VELTRANE_STATE>" + juce::String::repeatedString ("<a>", 100000).toStdString()) },
        { "entity expansion", wrap ("<!DOCTYPE VELTRANE_STATE [<!ENTITY a \"&a;&a;\">]><VELTRANE_STATE PresetName=\"&a;\"/>") },
        // JUCE's parser would never return from these.
        { "instruction before text", wrap ("<VELTRANE_STATE Delay1Time=\"0.5\"><a><?pi?> <!-- c --><?pi?>text</a></VELTRANE_STATE>") },
    };
    for (const auto& [what, block] : cases)
    {
        VeltraneAudioProcessor processor;
        processor.getParameterRecord (4).midiController = 9;
        const auto before = chunkOf (processor);
        ChangeCount host;
        processor.addListener (&host);
        load (processor, block);
        processor.removeListener (&host);
        EXPECT_EQ (chunkOf (processor), before) << what;
        EXPECT_EQ (host.changes, 0) << what;
    }
}

TEST (StateChunk, MissingAndOddAttributesTakeTheDocumentedDefaults)
{
    VeltraneAudioProcessor processor;
    processor.setParameter (Param::Delay1Feedback, 0.75f);
    processor.getParameterRecord (3).midiController = 12;
    ChangeCount host;
    processor.addListener (&host);
    // No attributes: values stay, bindings clear, the name is one space; the host hears all 33.
    load (processor, wrap ("<VELTRANE_STATE/>"));
    EXPECT_EQ (std::tuple (processor.getParameter (Param::Delay1Feedback), processor.getParameterRecord (3).midiController.load(), processor.getPresetName(), host.changes),
               std::tuple (0.75f, -1, juce::String (" "), (int) Param::count));
    processor.removeListener (&host);
    // Any case, a length beyond the data (clipped); out of range ignored, no number reads as 0, unknown attributes ignored.
    std::string unknown;
    for (int i = 0; i < 3000; ++i)
        unknown += " Other" + std::to_string (i) + "=\"1\"";
    const auto text = "<veltrane_state presetname=\"Low\" delay1time=\"2\" DELAY1FEEDBACK=\"loud\" Delay2Time=\"0.25\"" + unknown + " dryWetCC=\"74\"/>";
    load (processor, wrap (text, (int) text.size() + 5000));
    EXPECT_EQ (std::tuple (processor.getParameter (Param::Delay1Time), processor.getParameter (Param::Delay1Feedback), processor.getParameter (Param::Delay2Time)),
               std::tuple (0.243987232f, 0.0f, 0.25f));
    EXPECT_EQ (processor.getParameterRecord (Param::DryWet).midiController.load(), 74);
    EXPECT_EQ (processor.getPresetName(), "Low");
}
