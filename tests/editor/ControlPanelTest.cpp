#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
struct Knob
{
    const char* panel;
    const char* slider;
    int parameter;
    int steps;   // 0: continuous
};

// Every slider of the editor with its parameter and its choice steps.
const Knob knobs[] {
    { "Delay 1", "Time Slider", Param::Delay1Time, 0 },
    { "Delay 1", "Feedback Slider", Param::Delay1Feedback, 0 },
    { "Delay 1", "TimeMod Slider", Param::Delay1TimeMod, 0 },
    { "Delay 1", "FeedbackMod Slider", Param::Delay1FeedbackMod, 0 },
    { "Delay 1", "TimeModSrc Slider", Param::Delay1TimeModSource, 6 },
    { "Delay 1", "FeedbackModSrc Slider", Param::Delay1FeedbackModSource, 6 },
    { "Delay 1", "Gain Slider", Param::Delay1Gain, 0 },
    { "Delay 2", "Time Slider", Param::Delay2Time, 0 },
    { "Delay 2", "FeedbackModSrc Slider", Param::Delay2FeedbackModSource, 6 },
    { "Delay 2", "Gain Slider", Param::Delay2Gain, 0 },
    { "Envelope1 Component", "Attack Slider", Param::Envelope1Attack, 0 },
    { "Envelope1 Component", "Release Slider", Param::Envelope1Release, 0 },
    { "Envelope1 Component", "Sensitivity Slider", Param::Envelope1Sensitivity, 0 },
    { "Envelope2 Component", "Attack Slider", Param::Envelope2Attack, 0 },
    { "Envelope2 Component", "Sensitivity Slider", Param::Envelope2Sensitivity, 0 },
    { "Lfo1 Component", "Wave Slider", Param::LFO1Wave, 5 },
    { "Lfo1 Component", "Rate Slider", Param::LFO1Rate, 0 },
    { "Lfo1 Component", "Synced Rate Slider", Param::LFO1SyncedRate, 17 },
    { "Lfo2 Component", "Wave Slider", Param::LFO2Wave, 5 },
    { "Lfo2 Component", "Synced Rate Slider", Param::LFO2SyncedRate, 17 },
    { "Global Panel", "Mix Mode Slider", Param::MixMode, 6 },
    { "Global Panel", "Dry Wet Slider", Param::DryWet, 0 },
    { "Global Panel", "Waveshaper Slider", Param::Waveshaper, 3 },
    { "Global Panel", "Boost Slider", Param::WaveshaperAmount, 0 },
};

juce::Slider& sliderOf (OpenEditor& open, const Knob& knob)
{
    return *findChild<juce::Slider> (open.child (knob.panel), knob.slider);
}

template <typename T>
T& widget (OpenEditor& open, const char* panel, const char* name)
{
    return *findChild<T> (open.child (panel), name);
}

juce::String setCall (int index, float value)
{
    return "set " + juce::String (index) + " " + juce::String (value, 6);
}

juce::StringArray gesture (int index, float value)
{
    return { "begin " + juce::String (index), setCall (index, value), "end " + juce::String (index) };
}
}

TEST (ControlPanels, FirstPollShowsTheFactoryDefaults)
{
    OpenEditor open;

    for (const auto& knob : knobs)
    {
        const auto expected = open.processor.getParameterRecord (knob.parameter).defaultValue * (float) juce::jmax (1, knob.steps);
        EXPECT_NEAR (sliderOf (open, knob).getValue(), expected, 0.0005) << knob.panel << " " << knob.slider;
    }

    EXPECT_EQ (widget<juce::Label> (open, "Delay 1", "TimeModSrc Label").getText(), "None");
    EXPECT_EQ (widget<juce::Label> (open, "Lfo1 Component", "Wave Label").getText(), "Sine");
    EXPECT_EQ (widget<juce::Label> (open, "Global Panel", "Mix Mode Label").getText(), "Parallel");
    EXPECT_EQ (widget<juce::Label> (open, "Global Panel", "Waveshaper Label").getText(), "Dry");
}

TEST (ControlPanels, EachChangeIsOneGestureWithTheNormalisedValue)
{
    OpenEditor open;
    RecordingListener host;
    open.processor.addListener (&host);

    for (const auto& knob : knobs)
    {
        auto& slider = sliderOf (open, knob);
        const auto step = knob.steps > 0 ? 1.0 : 0.001;
        const auto first = knob.steps > 0 ? 2.0 : 0.25;

        host.calls.clear();
        slider.setValue (first, juce::sendNotificationSync);
        slider.setValue (first + step, juce::sendNotificationSync);

        const auto n = (float) juce::jmax (1, knob.steps);
        auto expected = gesture (knob.parameter, (float) first / n);
        expected.addArray (gesture (knob.parameter, (float) (first + step) / n));
        EXPECT_EQ (host.calls, expected) << knob.panel << " " << knob.slider;
        EXPECT_EQ (open.processor.getLastParameterName(), open.processor.getParameterName (knob.parameter));
    }

    open.processor.removeListener (&host);
}

TEST (ControlPanels, PollShowsHostChangesWithoutCallingBack)
{
    OpenEditor open;
    RecordingListener host;

    for (const auto& knob : knobs)
        open.processor.setParameter (knob.parameter, knob.steps > 0 ? 1.0f : 0.5f);

    open.processor.addListener (&host);
    tick (*open.editor);
    tick (*open.editor);
    open.processor.removeListener (&host);

    EXPECT_TRUE (host.calls.isEmpty()) << host.calls.joinIntoString (", ");
    for (const auto& knob : knobs)
        EXPECT_EQ (sliderOf (open, knob).getValue(), knob.steps > 0 ? (double) knob.steps : 0.5) << knob.slider;
    EXPECT_EQ (widget<juce::Label> (open, "Delay 2", "FeedbackModSrc Label").getText(), "LFO 2");
}

TEST (ControlPanels, HostValueBetweenStepsShowsRoundedStepAndTruncatedText)
{
    OpenEditor open;
    open.processor.setParameter (Param::Delay1TimeModSource, 0.59f);   // 3.54 steps
    open.processor.setParameter (Param::Delay1Feedback, 0.4567f);
    tick (*open.editor);

    EXPECT_EQ (widget<juce::Slider> (open, "Delay 1", "TimeModSrc Slider").getValue(), 4.0);
    EXPECT_EQ (widget<juce::Label> (open, "Delay 1", "TimeModSrc Label").getText(), "Envelope 2");
    EXPECT_NEAR (widget<juce::Slider> (open, "Delay 1", "Feedback Slider").getValue(), 0.457, 1e-9);
    EXPECT_EQ (open.processor.getParameter (Param::Delay1TimeModSource), 0.59f);
    EXPECT_EQ (open.processor.getParameter (Param::Delay1Feedback), 0.4567f);
}

TEST (ControlPanels, DoubleClickReturnsToTheDefaultInOneGesture)
{
    OpenEditor open;
    RecordingListener host;

    for (const auto& knob : knobs)
    {
        auto& slider = sliderOf (open, knob);
        slider.setValue (knob.steps > 0 ? 1.0 : 0.9, juce::sendNotificationSync);

        open.processor.addListener (&host);
        host.calls.clear();
        doubleClick (slider);
        open.processor.removeListener (&host);

        // A continuous knob lands on the 0.001 step nearest the default.
        const auto& record = open.processor.getParameterRecord (knob.parameter);
        EXPECT_NEAR (open.processor.getParameter (knob.parameter), record.defaultValue, 0.0005f) << knob.slider;
        ASSERT_EQ (host.calls.size(), 3) << knob.slider;
        EXPECT_EQ (host.calls[0], "begin " + juce::String (knob.parameter));
        EXPECT_EQ (host.calls[2], "end " + juce::String (knob.parameter));
    }

    EXPECT_EQ (open.processor.getParameterText (Param::LFO1SyncedRate), "1/4");
    EXPECT_EQ (open.processor.getParameterText (Param::LFO1Wave), "Sine");
    EXPECT_EQ (open.processor.getParameterText (Param::DryWet), "100.00 %");
}

TEST (ControlPanels, SyncSwitchShowsOneRateKnob)
{
    OpenEditor open;
    auto& button = widget<juce::TextButton> (open, "Lfo1 Component", "Sync Button");
    auto& rate = widget<juce::Slider> (open, "Lfo1 Component", "Rate Slider");
    auto& rateLabel = widget<juce::Label> (open, "Lfo1 Component", "Rate Label");
    auto& synced = widget<juce::Slider> (open, "Lfo1 Component", "Synced Rate Slider");
    auto& syncedLabel = widget<juce::Label> (open, "Lfo1 Component", "Synced Rate Label");

    auto expectSynced = [&] (bool on) {
        EXPECT_EQ (button.getToggleState(), on);
        EXPECT_EQ (rate.isVisible(), ! on);
        EXPECT_EQ (rateLabel.isVisible(), ! on);
        EXPECT_EQ (synced.isVisible(), on);
        EXPECT_EQ (syncedLabel.isVisible(), on);
    };

    expectSynced (false);
    EXPECT_NEAR (rate.getValue(), 0.158114, 1e-6);   // the default, exactly

    RecordingListener host;
    open.processor.addListener (&host);
    click (button);
    open.processor.removeListener (&host);
    expectSynced (true);
    EXPECT_EQ (host.calls, gesture (Param::LFO1Sync, 1.0f));
    tick (*open.editor);
    EXPECT_EQ (synced.getValue(), 6.0);
    EXPECT_EQ (syncedLabel.getText(), "1/4");

    // A host value below 1 truncates to Off, as the engine reads it.
    open.processor.setParameter (Param::LFO1Sync, 0.7f);
    tick (*open.editor);
    expectSynced (false);

    open.processor.setParameter (Param::LFO1Sync, 1.0f);
    tick (*open.editor);
    expectSynced (true);
    expectSynced (true);
    EXPECT_FALSE (widget<juce::TextButton> (open, "Lfo2 Component", "Sync Button").getToggleState());
}

TEST (ControlPanels, BoostFollowsTheWaveshaperOneTickLateAfterAHostChange)
{
    OpenEditor open;
    auto& boost = widget<juce::Slider> (open, "Global Panel", "Boost Slider");
    auto& boostLabel = widget<juce::Label> (open, "Global Panel", "Boost Label");
    auto& waveshaper = widget<juce::Slider> (open, "Global Panel", "Waveshaper Slider");
    EXPECT_FALSE (boost.isVisible());

    open.processor.setParameter (Param::Waveshaper, 1.0f);   // "Dirt"
    tick (*open.editor);
    EXPECT_EQ (waveshaper.getValue(), 3.0);
    EXPECT_FALSE (boost.isVisible());
    tick (*open.editor);
    EXPECT_TRUE (boost.isVisible());
    EXPECT_TRUE (boostLabel.isVisible());

    waveshaper.setValue (1.0, juce::sendNotificationSync);   // "Soft Clipper" by hand
    EXPECT_TRUE (boost.isVisible());
    tick (*open.editor);
    EXPECT_FALSE (boost.isVisible());

    waveshaper.setValue (2.0, juce::sendNotificationSync);   // "Hard Clipper"
    tick (*open.editor);
    EXPECT_TRUE (boost.isVisible());
    EXPECT_EQ (open.processor.getParameterText (Param::Waveshaper), "Hard Clipper");
}

TEST (ControlPanels, RandomButtonStaysOnUntilTheBlockHasRandomized)
{
    OpenEditor open;
    open.processor.seedRandomiser (7);
    auto& random = widget<juce::TextButton> (open, "Global Panel", "Random Button");
    const auto dryWet = open.processor.getParameter (Param::DryWet);

    click (random);
    EXPECT_TRUE (random.getToggleState());
    EXPECT_EQ (open.processor.getParameterText (Param::Randomize), "On");

    tick (*open.editor);   // no audio block yet
    EXPECT_TRUE (random.getToggleState());

    open.processor.serveBlockStartRequests();
    tick (*open.editor);
    EXPECT_FALSE (random.getToggleState());
    EXPECT_EQ (open.processor.getParameter (Param::DryWet), dryWet);
    EXPECT_NEAR (widget<juce::Slider> (open, "Delay 1", "Time Slider").getValue(),
                 open.processor.getParameter (Param::Delay1Time), 0.0005);

    // A second click while it is on cancels the request.
    click (random);
    click (random);
    EXPECT_EQ (open.processor.getParameter (Param::Randomize), 0.0f);
    tick (*open.editor);
    EXPECT_FALSE (random.getToggleState());
}

TEST (ControlPanels, LastParameterDisplayNamesTheLastChange)
{
    OpenEditor open;
    auto& name = widget<juce::Label> (open, "Global Panel", "Last Parameter Name");
    auto& value = widget<juce::Label> (open, "Global Panel", "Last Parameter Value");
    EXPECT_EQ (name.getText(), "");

    widget<juce::Slider> (open, "Envelope2 Component", "Attack Slider").setValue (0.5, juce::sendNotificationSync);
    tick (*open.editor);
    EXPECT_EQ (name.getText(), "Envelope2Attack");
    EXPECT_EQ (value.getText(), "3.00 Ms");
    EXPECT_EQ (open.processor.getParameter (Param::Envelope1Attack),
               open.processor.getParameterRecord (Param::Envelope1Attack).defaultValue);

    open.processor.setParameter (Param::MixMode, 1.0f);
    tick (*open.editor);
    EXPECT_EQ (name.getText(), "MixMode");
    EXPECT_EQ (value.getText(), "Reverse Stereo Parallel");
}
