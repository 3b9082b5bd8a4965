#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

namespace
{
struct ExpectedRow
{
    const char* identifier;
    const char* label;
    double defaultNormalised;
    const char* defaultText;
};

// Identifiers, labels, defaults and default texts as users and stored files know them.
const ExpectedRow expectedRows[] {
    { "Delay1Time", "Ms", 0.243987, "120.00 Ms" },
    { "Delay1Feedback", "%", 0.4, "40.00 %" },
    { "Delay1TimeMod", "%", 0.0, "0.00 %" },
    { "Delay1TimeModSource", "", 0.0, "None" },
    { "Delay1FeedbackMod", "%", 0.0, "0.00 %" },
    { "Delay1FeedbackModSource", "", 0.0, "None" },
    { "Delay1Gain", "dB", 0.848338, "0.00 dB" },
    { "Delay2Time", "Ms", 0.243987, "120.00 Ms" },
    { "Delay2Feedback", "%", 0.4, "40.00 %" },
    { "Delay2TimeMod", "%", 0.0, "0.00 %" },
    { "Delay2TimeModSource", "", 0.0, "None" },
    { "Delay2FeedbackMod", "%", 0.0, "0.00 %" },
    { "Delay2FeedbackModSource", "", 0.0, "None" },
    { "Delay2Gain", "dB", 0.848338, "0.00 dB" },
    { "MixMode", "", 0.0, "Parallel" },
    { "DryWet", "%", 1.0, "100.00 %" },
    { "Waveshaper", "", 0.0, "Dry" },
    { "WaveshaperAmount", "%", 0.0, "0.00 %" },
    { "Randomize", "", 0.0, "Off" },
    { "Envelope1Sensitivity", "dB", 0.528926, "0.00 dB" },
    { "Envelope1Attack", "Ms", 0.288675, "1.00 Ms" },
    { "Envelope1Release", "Ms", 0.408248, "2.00 Ms" },
    { "Envelope2Sensitivity", "dB", 0.528926, "0.00 dB" },
    { "Envelope2Attack", "Ms", 0.288675, "1.00 Ms" },
    { "Envelope2Release", "Ms", 0.408248, "2.00 Ms" },
    { "LFO1Wave", "", 0.0, "Sine" },
    { "LFO1Rate", "Hz", 0.158114, "1.00 Hz" },
    { "LFO1Sync", "", 0.0, "Off" },
    { "LFO1SyncedRate", "", 0.352941, "1/4" },
    { "LFO2Wave", "", 0.0, "Sine" },
    { "LFO2Rate", "Hz", 0.158114, "1.00 Hz" },
    { "LFO2Sync", "", 0.0, "Off" },
    { "LFO2SyncedRate", "", 0.352941, "1/4" },
};

static_assert (std::size (expectedRows) == Param::count);

// The generator Randomize must reproduce: a 48-bit linear congruential draw.
float referenceNextFloat (juce::int64& seed)
{
    seed = (juce::int64) (((juce::uint64) seed * 0x5deece66dULL + 11) & 0xffffffffffffULL);
    return (float) (juce::uint32) (seed >> 16) * 2.3283064e-10f;
}
}

TEST (ParameterTable, IdentifiersLabelsDefaultsAndTexts)
{
    VeltraneAudioProcessor processor;
    ASSERT_EQ (processor.getNumParameters(), 33);

    for (int i = 0; i < Param::count; ++i)
    {
        const auto& row = expectedRows[i];
        const auto& record = processor.getParameterRecord (i);
        SCOPED_TRACE (row.identifier);

        EXPECT_EQ (processor.getParameterName (i), row.identifier);
        EXPECT_EQ (record.label, row.label);
        EXPECT_NEAR (processor.getParameter (i), row.defaultNormalised, 0.5e-6);
        EXPECT_EQ (record.defaultValue, processor.getParameter (i));
        EXPECT_EQ (processor.getParameterText (i), row.defaultText);
        EXPECT_EQ (record.midiController.load(), -1);
        EXPECT_FALSE (record.learnArmed.load());
    }
}

TEST (ParameterTable, TextsAtRepresentativeValues)
{
    VeltraneAudioProcessor processor;

    const struct { int index; float value; const char* text; } cases[] {
        { Param::Delay1Time, 0.0f, "1.00 Ms" },
        { Param::Delay1Time, 1.0f, "2000.00 Ms" },
        { Param::Delay1Time, 0.5f, "500.75 Ms" },          // square law: 1 + 1999 / 4
        { Param::Delay1Gain, 0.0f, "-70.00 dB" },
        { Param::Delay1Gain, 0.5f, "-16.26 dB" },          // root law: -70 + 76 * sqrt (0.5)
        { Param::Delay1Gain, 1.0f, "6.00 dB" },
        { Param::Envelope1Attack, 0.0f, "0.00 Ms" },
        { Param::Envelope1Sensitivity, 0.0f, "-16.00 dB" },
        { Param::LFO1Rate, 1.0f, "40.00 Hz" },
        { Param::WaveshaperAmount, 0.25f, "25.00 %" },
        { Param::MixMode, 0.999f, "Stereo Parallel" },
        { Param::MixMode, 1.0f, "Reverse Stereo Parallel" },
        { Param::Waveshaper, 1.0f, "Dirt" },
        { Param::LFO1Wave, 1.0f, "Sample & Hold" },
        { Param::LFO2SyncedRate, 1.0f, "1/128D" },
        { Param::LFO2SyncedRate, 0.0f, "8 Bars" },
        { Param::Randomize, 0.99f, "Off" },
        { Param::LFO1Sync, 1.0f, "On" },
    };

    for (const auto& c : cases)
    {
        processor.setParameter (c.index, c.value);
        EXPECT_EQ (processor.getParameterText (c.index), c.text) << processor.getParameterName (c.index) << " at " << c.value;
    }
}

TEST (ParameterTable, EveryChoiceStepLandsOnItsEntry)
{
    VeltraneAudioProcessor processor;

    for (int i = 0; i < Param::count; ++i)
    {
        auto& record = processor.getParameterRecord (i);

        if (! record.isDiscrete)
            continue;

        const auto count = record.numChoices();

        for (int k = 0; k < count; ++k)
        {
            processor.setParameter (i, (float) k / (float) (count - 1));
            EXPECT_EQ (record.choiceIndex(), k) << record.name;
            EXPECT_EQ (processor.getParameterText (i), record.choices->entries[k]);
        }

        // Just below the top the last entry is not reached yet.
        processor.setParameter (i, 0.999f);
        EXPECT_EQ (record.choiceIndex(), count - 2) << record.name;
    }
}

TEST (ParameterTable, LawsMapNormalisedToPhysical)
{
    VeltraneAudioProcessor processor;
    const auto& time = processor.getParameterRecord (Param::Delay1Time);
    const auto& gain = processor.getParameterRecord (Param::Delay1Gain);
    const auto& feedback = processor.getParameterRecord (Param::Delay1Feedback);

    for (auto v : { 0.0f, 0.1f, 0.25f, 0.5f, 0.9f, 1.0f })
    {
        EXPECT_FLOAT_EQ (time.normalisedToPhysical (v), 1.0f + 1999.0f * v * v);
        EXPECT_FLOAT_EQ (gain.normalisedToPhysical (v), -70.0f + 76.0f * std::sqrt (v));
        EXPECT_FLOAT_EQ (feedback.normalisedToPhysical (v), 100.0f * v);
    }

    EXPECT_FLOAT_EQ (processor.getPhysicalValue (Param::Delay1Time), 120.0f);
    EXPECT_NEAR (decibelsToAmplitude (-70.0f), 0.000316228f, 1e-9f);
    EXPECT_EQ (decibelsToAmplitude (-100.0f), 0.0f);
    EXPECT_FLOAT_EQ (decibelsToAmplitude (6.0f), 1.9952623f);
}

TEST (ParameterTable, OutOfRangeValuesAreIgnoredButBecomeTheLastParameter)
{
    VeltraneAudioProcessor processor;
    EXPECT_EQ (processor.getLastParameterName(), "");
    EXPECT_EQ (processor.getLastParameterText(), "");

    const auto before = processor.getParameter (Param::Delay1Time);

    for (auto bad : { 1.5f, -0.001f, std::nanf (""), INFINITY, -INFINITY, 1.0000001f })
    {
        processor.setParameter (Param::Delay1Feedback, 0.5f);
        processor.setParameter (Param::Delay1Time, bad);
        EXPECT_EQ (processor.getParameter (Param::Delay1Time), before);
        EXPECT_FLOAT_EQ (processor.getPhysicalValue (Param::Delay1Time), 120.0f);
        EXPECT_EQ (processor.getLastParameterName(), "Delay1Time");
        EXPECT_EQ (processor.getLastParameterText(), "120.00 Ms");
    }

    processor.setParameter (Param::MixMode, 1.0f);
    EXPECT_EQ (processor.getLastParameterName(), "MixMode");
    EXPECT_EQ (processor.getLastParameterText(), "Reverse Stereo Parallel");

    processor.setParameter (Param::DryWet, 0.0f);
    EXPECT_EQ (processor.getParameter (Param::DryWet), 0.0f);
    EXPECT_EQ (processor.getLastParameterText(), "0.00 %");
}

TEST (Randomize, DrawsTwentyFiveParametersFromTheSeededGenerator)
{
    VeltraneAudioProcessor processor;
    std::vector<float> before;

    for (int i = 0; i < Param::count; ++i)
        before.push_back (processor.getParameter (i));

    const juce::int64 seed = 1234567;
    processor.seedRandomiser (seed);
    processor.setParameter (Param::Randomize, 1.0f);
    processor.randomize();

    auto reference = seed;
    int drawn = 0;

    for (int i = 0; i < Param::count; ++i)
    {
        if (! isRandomized (i))
        {
            if (i != Param::Randomize)
            {
                EXPECT_EQ (processor.getParameter (i), before[(size_t) i]) << processor.getParameterName (i);
            }
            continue;
        }

        ++drawn;
        EXPECT_EQ (processor.getParameter (i), referenceNextFloat (reference)) << processor.getParameterName (i);
    }

    EXPECT_EQ (drawn, 25);
    EXPECT_EQ (processor.getParameterText (Param::Randomize), "Off");
    EXPECT_EQ (processor.getLastParameterName(), "Randomize");
}

TEST (Randomize, SkipListNamesTheEightKeptParameters)
{
    VeltraneAudioProcessor processor;
    juce::StringArray kept;

    for (int i = 0; i < Param::count; ++i)
        if (! isRandomized (i))
            kept.add (processor.getParameterName (i));

    EXPECT_EQ (kept.joinIntoString (","),
               "Delay1Gain,Delay2Gain,DryWet,Waveshaper,WaveshaperAmount,Randomize,LFO1Sync,LFO2Sync");
}
