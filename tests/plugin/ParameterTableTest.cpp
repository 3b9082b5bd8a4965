#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

TEST (ParameterTable, IdentifiersLabelsAndDefaultsAsStoredFilesKnowThem)
{
    const struct { const char* identifier; const char* label; double value; const char* text; } rows[] {
        { "Delay1Time", "Ms", 0.243987, "120.00 Ms" },      { "Delay1Feedback", "%", 0.4, "40.00 %" },
        { "Delay1TimeMod", "%", 0, "0.00 %" },              { "Delay1TimeModSource", "", 0, "None" },
        { "Delay1FeedbackMod", "%", 0, "0.00 %" },          { "Delay1FeedbackModSource", "", 0, "None" },
        { "Delay1Gain", "dB", 0.848338, "0.00 dB" },        { "Delay2Time", "Ms", 0.243987, "120.00 Ms" },
        { "Delay2Feedback", "%", 0.4, "40.00 %" },          { "Delay2TimeMod", "%", 0, "0.00 %" },
        { "Delay2TimeModSource", "", 0, "None" },           { "Delay2FeedbackMod", "%", 0, "0.00 %" },
        { "Delay2FeedbackModSource", "", 0, "None" },       { "Delay2Gain", "dB", 0.848338, "0.00 dB" },
        { "MixMode", "", 0, "Parallel" },                   { "DryWet", "%", 1, "100.00 %" },
        { "Waveshaper", "", 0, "Dry" },                     { "WaveshaperAmount", "%", 0, "0.00 %" },
        { "Randomize", "", 0, "Off" },                      { "Envelope1Sensitivity", "dB", 0.528926, "0.00 dB" },
        { "Envelope1Attack", "Ms", 0.288675, "1.00 Ms" },   { "Envelope1Release", "Ms", 0.408248, "2.00 Ms" },
        { "Envelope2Sensitivity", "dB", 0.528926, "0.00 dB" }, { "Envelope2Attack", "Ms", 0.288675, "1.00 Ms" },
        { "Envelope2Release", "Ms", 0.408248, "2.00 Ms" },  { "LFO1Wave", "", 0, "Sine" },
        { "LFO1Rate", "Hz", 0.158114, "1.00 Hz" },          { "LFO1Sync", "", 0, "Off" },
        { "LFO1SyncedRate", "", 0.352941, "1/4" },          { "LFO2Wave", "", 0, "Sine" },
        { "LFO2Rate", "Hz", 0.158114, "1.00 Hz" },          { "LFO2Sync", "", 0, "Off" },
        { "LFO2SyncedRate", "", 0.352941, "1/4" },
    };
    VeltraneAudioProcessor processor;
    ASSERT_EQ (processor.getNumParameters(), (int) std::size (rows));
    for (int i = 0; i < Param::count; ++i)
    {
        EXPECT_EQ (processor.getParameterName (i), rows[i].identifier);
        EXPECT_EQ (processor.getParameterRecord (i).label, rows[i].label) << rows[i].identifier;
        EXPECT_NEAR (processor.getParameter (i), rows[i].value, 0.5e-6) << rows[i].identifier;
        EXPECT_EQ (processor.getParameterText (i), rows[i].text) << rows[i].identifier;
    }
}

TEST (ParameterTable, TextsFollowTheLawsChoicesLandOnTheirStepsAndOutOfRangeValuesAreIgnored)
{
    VeltraneAudioProcessor processor;
    for (auto [index, value, text] : { std::tuple (0, 0.5f, "500.75 Ms"), { 6, 0.5f, "-16.26 dB" }, { 6, 0.0f, "-70.00 dB" }, { 19, 1.0f, "6.00 dB" },
                                       { 26, 1.0f, "40.00 Hz" }, { 20, 0.0f, "0.00 Ms" }, { 14, 0.999f, "Stereo Parallel" }, { 14, 1.0f, "Reverse Stereo Parallel" },
                                       { 16, 1.0f, "Dirt" }, { 25, 1.0f, "Sample & Hold" }, { 32, 1.0f, "1/128D" }, { 18, 0.99f, "Off" } })
    {
        processor.setParameter (index, value);   // laws: 1 + 1999 v^2 ms, -70 + 76 sqrt (v) dB
        EXPECT_EQ (processor.getParameterText (index), text) << processor.getParameterName (index) << " at " << value;
    }
    for (int i = 0; i < Param::count; ++i)
        for (int k = 0, n = processor.getParameterRecord (i).numChoices(); k < n; ++k)
        {
            processor.setParameter (i, (float) k / (float) (n - 1));
            EXPECT_EQ (processor.getParameterRecord (i).choiceIndex(), k) << processor.getParameterName (i);
        }
    for (auto bad : { 1.5f, -0.001f, NAN, INFINITY, 1.0000001f })
    {
        processor.setParameter (Param::Delay1Feedback, 0.5f);
        processor.setParameter (Param::Delay1Time, bad);
        EXPECT_EQ (processor.getParameterText (Param::Delay1Time), "500.75 Ms") << bad;
        EXPECT_EQ (processor.getLastParameterName() + " " + processor.getLastParameterText(), "Delay1Time 500.75 Ms");
    }
}

namespace
{
// What the processor tells its listeners, as a host's wrapper hears it.
struct HostLog final : juce::AudioProcessorListener
{
    juce::StringArray calls;
    void audioProcessorParameterChanged (juce::AudioProcessor*, int i, float v) override { calls.add ("set " + juce::String (i) + " " + juce::String (v)); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
    void audioProcessorParameterChangeGestureBegin (juce::AudioProcessor*, int i) override { calls.add ("begin " + juce::String (i)); }
    void audioProcessorParameterChangeGestureEnd (juce::AudioProcessor*, int i) override { calls.add ("end " + juce::String (i)); }
};
}

TEST (Processor, ControlChangeIsOneGestureAndTheHostHearsTheValueKept)
{
    VeltraneAudioProcessor processor;
    HostLog host;
    processor.addListener (&host);
    processor.setParameterFromControl (Param::DryWet, 0.25f, true);
    processor.setParameterNotifyingHost (Param::Delay1Time, 2.0f);   // refused
    EXPECT_EQ (host.calls.joinIntoString ("|"), "begin 15|set 15 0.25|end 15|set 0 " + juce::String (processor.getParameter (0)));
    processor.removeListener (&host);
}

TEST (Processor, HostParametersTakeTextAsTheyShowIt)
{
    VeltraneAudioProcessor processor;
    const auto& parameters = processor.getParameters();
    const struct { int index; const char* text; float value; } cases[] {
        { Param::MixMode, "Solo 1", 0.5f }, { Param::LFO1SyncedRate, "1/4", 6.0f / 17.0f },
        { Param::LFO2Sync, "on", 1.0f },    { Param::Delay1Time, "120.00 Ms", 0.243987f }, { Param::DryWet, "250", 1.0f },
    };
    for (const auto& c : cases)
        EXPECT_NEAR (parameters[c.index]->getValueForText (c.text), c.value, 1e-6f) << c.text;
}
