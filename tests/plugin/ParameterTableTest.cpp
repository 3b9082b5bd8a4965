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

TEST (ParameterTable, TextsFollowTheLawsAndChoiceStepsLandOnTheirEntries)
{
    VeltraneAudioProcessor processor;
    const struct { int index; float value; const char* text; } cases[] {
        { Param::Delay1Time, 0.5f, "500.75 Ms" },         // square law: 1 + 1999 / 4
        { Param::Delay1Gain, 0.5f, "-16.26 dB" },         // root law: -70 + 76 * sqrt (0.5)
        { Param::Delay1Gain, 0.0f, "-70.00 dB" },         { Param::Envelope1Sensitivity, 1.0f, "6.00 dB" },
        { Param::LFO1Rate, 1.0f, "40.00 Hz" },            { Param::Envelope1Attack, 0.0f, "0.00 Ms" },
        { Param::MixMode, 0.999f, "Stereo Parallel" },    { Param::MixMode, 1.0f, "Reverse Stereo Parallel" },
        { Param::Waveshaper, 1.0f, "Dirt" },              { Param::LFO1Wave, 1.0f, "Sample & Hold" },
        { Param::LFO2SyncedRate, 1.0f, "1/128D" },        { Param::Randomize, 0.99f, "Off" },
    };
    for (const auto& c : cases)
    {
        processor.setParameter (c.index, c.value);
        EXPECT_EQ (processor.getParameterText (c.index), c.text) << processor.getParameterName (c.index) << " at " << c.value;
    }

    for (int i = 0; i < Param::count; ++i)
    {
        const auto& record = processor.getParameterRecord (i);
        for (int k = 0; k < record.numChoices(); ++k)
        {
            processor.setParameter (i, (float) k / (float) (record.numChoices() - 1));
            EXPECT_EQ (record.choiceIndex(), k) << record.name;
        }
    }
}

TEST (ParameterTable, OutOfRangeValuesAreIgnoredButNameTheLastParameter)
{
    VeltraneAudioProcessor processor;
    EXPECT_EQ (processor.getLastParameterName(), "");

    for (auto bad : { 1.5f, -0.001f, std::nanf (""), INFINITY, 1.0000001f })
    {
        processor.setParameter (Param::Delay1Feedback, 0.5f);
        processor.setParameter (Param::Delay1Time, bad);
        EXPECT_NEAR (processor.getParameter (Param::Delay1Time), 0.243987, 0.5e-6) << bad;
        EXPECT_EQ (processor.getLastParameterName() + " " + processor.getLastParameterText(), "Delay1Time 120.00 Ms");
    }
}
