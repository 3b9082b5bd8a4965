#include "EditorTestSupport.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
// Every knob of the editor: its panel, its parameter and its choice steps (0: continuous).
const struct Knob { const char* panel; const char* slider; int parameter; int steps; } knobs[] {
    { "Delay 1", "Time Slider", Param::Delay1Time, 0 },                   { "Delay 1", "Feedback Slider", Param::Delay1Feedback, 0 },
    { "Delay 1", "TimeMod Slider", Param::Delay1TimeMod, 0 },             { "Delay 1", "FeedbackMod Slider", Param::Delay1FeedbackMod, 0 },
    { "Delay 1", "TimeModSrc Slider", Param::Delay1TimeModSource, 6 },    { "Delay 1", "FeedbackModSrc Slider", Param::Delay1FeedbackModSource, 6 },
    { "Delay 1", "Gain Slider", Param::Delay1Gain, 0 },                   { "Delay 2", "Time Slider", Param::Delay2Time, 0 },
    { "Delay 2", "Feedback Slider", Param::Delay2Feedback, 0 },           { "Delay 2", "TimeMod Slider", Param::Delay2TimeMod, 0 },
    { "Delay 2", "FeedbackMod Slider", Param::Delay2FeedbackMod, 0 },     { "Delay 2", "TimeModSrc Slider", Param::Delay2TimeModSource, 6 },
    { "Delay 2", "Gain Slider", Param::Delay2Gain, 0 },                   { "Envelope1 Component", "Attack Slider", Param::Envelope1Attack, 0 },
    { "Envelope1 Component", "Release Slider", Param::Envelope1Release, 0 }, { "Envelope1 Component", "Sensitivity Slider", Param::Envelope1Sensitivity, 0 },
    { "Envelope2 Component", "Attack Slider", Param::Envelope2Attack, 0 }, { "Envelope2 Component", "Release Slider", Param::Envelope2Release, 0 },
    { "Envelope2 Component", "Sensitivity Slider", Param::Envelope2Sensitivity, 0 }, { "Lfo1 Component", "Wave Slider", Param::LFO1Wave, 5 },
    { "Lfo1 Component", "Rate Slider", Param::LFO1Rate, 0 },             { "Lfo2 Component", "Rate Slider", Param::LFO2Rate, 0 },
    { "Lfo2 Component", "Synced Rate Slider", Param::LFO2SyncedRate, 17 }, { "Global Panel", "Mix Mode Slider", Param::MixMode, 6 },
    { "Global Panel", "Dry Wet Slider", Param::DryWet, 0 },               { "Global Panel", "Waveshaper Slider", Param::Waveshaper, 3 },
    { "Global Panel", "Boost Slider", Param::WaveshaperAmount, 0 },
};
// The normalised default worked out from the table's physical default and law.
float tableDefault (int index)
{
    const auto& row = parameterTable[(size_t) index];
    const auto n = (row.defaultPhysical - row.minimum) / (row.maximum - row.minimum);
    return row.law == Law::square ? std::sqrt (n) : row.law == Law::root ? n * n : n;
}
// What the processor tells its listeners, as a host's wrapper hears it.
struct HostLog final : juce::AudioProcessorListener
{
    explicit HostLog (juce::AudioProcessor& p) : processor (p) { processor.addListener (this); }
    ~HostLog() override { processor.removeListener (this); }
    void audioProcessorParameterChanged (juce::AudioProcessor*, int i, float v) override { calls.add ("set " + juce::String (i) + " " + juce::String (v, 4)); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
    void audioProcessorParameterChangeGestureBegin (juce::AudioProcessor*, int i) override { calls.add ("begin " + juce::String (i)); }
    void audioProcessorParameterChangeGestureEnd (juce::AudioProcessor*, int i) override { calls.add ("end " + juce::String (i)); }
    juce::AudioProcessor& processor;
    juce::StringArray calls;
};
juce::String gesture (int index, double value) { return "begin " + juce::String (index) + "|set " + juce::String (index) + " " + juce::String (value, 4) + "|end " + juce::String (index); }
}

// A drag moves a continuous knob by steps of 0.001; a double click gives the host the exact default.
TEST (ControlPanels, KnobsShowTheParameterSendOneGesturePerChangeAndDoubleClickGivesTheExactDefault)
{
    OpenEditor open;
    for (const auto& knob : knobs)
    {
        auto& slider = open.in<juce::Slider> (knob.panel, knob.slider);
        const auto n = juce::jmax (1, knob.steps);
        EXPECT_NEAR (slider.getValue(), tableDefault (knob.parameter) * n, 0.0005) << knob.slider;
        HostLog host (open.processor);
        slider.setValue (knob.steps > 0 ? 2.0 : 0.2504, juce::sendNotificationSync);
        EXPECT_EQ (host.calls.joinIntoString ("|"), gesture (knob.parameter, knob.steps > 0 ? 2.0 / n : 0.25)) << knob.slider;
        EXPECT_EQ (open.processor.getLastParameterName(), open.processor.getParameterName (knob.parameter));
        // A host change shows at the next poll, rounded to the knob's step, and goes back nowhere.
        host.calls.clear();
        open.processor.setParameter (knob.parameter, 0.59f);
        tick (*open.editor);
        EXPECT_NEAR (slider.getValue(), knob.steps > 0 ? std::round (0.59 * n) : 0.59, 1e-9) << knob.slider;
        EXPECT_TRUE (host.calls.isEmpty()) << knob.slider;
        const auto centre = slider.getLocalBounds().getCentre().toFloat();
        slider.mouseDoubleClick (mouseAt (slider, centre, centre, 2));
        EXPECT_EQ (open.processor.getParameter (knob.parameter), tableDefault (knob.parameter)) << knob.slider;
        EXPECT_EQ (host.calls.size(), 3) << knob.slider;
    }
}

TEST (ControlPanels, SyncSwitchShowsOneRateKnobAndFollowsTheHostAsTheEngineReadsIt)
{
    OpenEditor open;
    auto& button = open.in<juce::TextButton> ("Lfo1 Component", "Sync Button");
    auto expectSynced = [&] (bool on) {
        EXPECT_EQ (button.getToggleState(), on);
        for (auto [name, showsWhenOn] : { std::pair ("Rate Slider", false), { "Rate Label", false }, { "Synced Rate Slider", true }, { "Synced Rate Label", true } })
            EXPECT_EQ (open.in ("Lfo1 Component", name).isVisible(), on == showsWhenOn) << name << " with sync " << on;
    };
    expectSynced (false);
    HostLog host (open.processor);
    click (button);
    expectSynced (true);
    EXPECT_EQ (host.calls.joinIntoString ("|"), gesture (Param::LFO1Sync, 1.0));
    tick (*open.editor);
    EXPECT_EQ (open.in<juce::Label> ("Lfo1 Component", "Synced Rate Label").getText(), "1/4");
    for (auto [value, on] : { std::pair (0.7f, false), { 1.0f, true } })
    {
        open.processor.setParameter (Param::LFO1Sync, value);
        tick (*open.editor);
        expectSynced (on);
    }
}

// Boost shows one poll after the waveshaper for the curves that use it; Random stays lit until a
// block has randomized; the display names the last change.
TEST (GlobalPanel, BoostFollowsTheCurveRandomStaysLitUntilServedAndTheDisplayNamesTheLastChange)
{
    OpenEditor open;
    auto& boost = open.in ("Global Panel", "Boost Slider");
    for (auto [step, visible] : { std::pair (3, true), { 1, false }, { 2, true }, { 0, false } })
    {
        open.processor.setParameter (Param::Waveshaper, (float) step / 3.0f);
        tick (*open.editor);
        EXPECT_EQ (open.in<juce::Slider> ("Global Panel", "Waveshaper Slider").getValue(), step);
        EXPECT_EQ (boost.isVisible(), ! visible) << step;
        tick (*open.editor);
        EXPECT_EQ (boost.isVisible() && open.in ("Global Panel", "Boost Label").isVisible(), visible) << step;
    }
    auto& random = open.in<juce::TextButton> ("Global Panel", "Random Button");
    auto shown = [&] { return open.in<juce::Label> ("Global Panel", "Last Parameter Name").getText() + " " + open.in<juce::Label> ("Global Panel", "Last Parameter Value").getText(); };
    click (random);
    tick (*open.editor);   // no audio block yet
    EXPECT_TRUE (random.getToggleState());
    EXPECT_EQ (shown(), "Randomize On");
    open.processor.serveBlockStartRequests();
    tick (*open.editor);
    EXPECT_FALSE (random.getToggleState());
    EXPECT_NEAR (open.in<juce::Slider> ("Delay 1", "Time Slider").getValue(), open.processor.getParameter (Param::Delay1Time), 0.0005);
    open.in<juce::Slider> ("Envelope2 Component", "Attack Slider").setValue (0.5, juce::sendNotificationSync);
    tick (*open.editor);
    EXPECT_EQ (shown(), "Envelope2Attack 3.00 Ms");
}

// A name typed while polls run, confirmed, then a poll before JUCE delivers the box's asynchronous
// change message: the typed name reaches the processor and nothing loads. Save lists it; item k
// loads preset k - 1; a name the processor takes from elsewhere shows at the next poll.
TEST (PresetPanel, TypedNamesSurviveThePollSaveListsThemAndItemKLoadsPresetKMinusOne)
{
    OpenEditor open;
    auto& box = find<juce::ComboBox> (*open.editor, "Preset Box");
    box.addItem ("Init", 1);   // as a list refresh fills it
    box.addItem ("Slapback", 2);
    tick (*open.editor);
    ASSERT_EQ (box.getSelectedId(), 1);
    for (auto [name, nameFromElsewhere] : { std::pair ("My Echo", ""), { "slapback", "Slapback" } })
    {
        auto& text = find<juce::Label> (box);
        text.showEditor();
        text.getCurrentTextEditor()->setText (name);
        if (*nameFromElsewhere != 0)
            open.processor.setPresetName (nameFromElsewhere);   // say, a program change
        tick (*open.editor);
        EXPECT_TRUE (text.isBeingEdited());
        text.hideEditor (false);   // return pressed: the box posts its change message
        tick (*open.editor);
        EXPECT_EQ (box.getText(), name);
        ((juce::AsyncUpdater&) box).handleUpdateNowIfNeeded();   // ComboBox is privately an AsyncUpdater
        EXPECT_EQ (open.processor.getPresetName() + " " + juce::String (open.processor.presetToLoad.load()), juce::String (name) + " -1");
        tick (*open.editor);
        EXPECT_EQ (box.getText(), name);
    }
    auto& save = open.in<juce::TextButton> ("Preset Component", "Save Button");
    click (save);
    EXPECT_TRUE (open.processor.presetListChanged.load());
    tick (*open.editor);
    EXPECT_FALSE (save.getToggleState());
    const auto names = open.processor.getPresetNames();
    ASSERT_TRUE (names.contains ("slapback") && names.size() >= 2);
    EXPECT_EQ (box.getItemText (names.indexOf ("slapback")) + " " + box.getText(), "slapback slapback");
    for (int id : { 1, 2 })
    {
        box.setSelectedId (id, juce::sendNotificationSync);
        EXPECT_TRUE (open.processor.presetLoadPending.exchange (false));
        EXPECT_EQ (open.processor.presetToLoad.load(), id - 1);
    }
    open.processor.setPresetName (names[0]);
    tick (*open.editor);
    EXPECT_EQ (box.getSelectedId(), 1);
}

TEST (MidiPanel, SwitchesSetTheModesAndClearStaysLitUntilTheBlockHasCleared)
{
    OpenEditor open;
    click (find (*open.editor, "Unlearn Button"));
    EXPECT_TRUE (open.processor.midiUnlearnActive.load() && ! open.processor.midiLearnActive.load());
    click (find (*open.editor, "Learn button"));
    EXPECT_TRUE (open.processor.midiLearnActive.load());
    open.in<juce::Slider> ("Delay 2", "Feedback Slider").setValue (0.7, juce::sendNotificationSync);
    EXPECT_TRUE (open.processor.getParameterRecord (Param::Delay2Feedback).learnArmed.load());
    auto& clear = find<juce::TextButton> (*open.editor, "Clear Button");
    open.processor.getParameterRecord (Param::MixMode).midiController = 20;
    click (clear);
    click (clear);   // clicked again while lit: off for a moment, the request raised again
    tick (*open.editor);
    EXPECT_TRUE (clear.getToggleState());
    open.processor.serveBlockStartRequests();
    tick (*open.editor);
    EXPECT_FALSE (clear.getToggleState());
    EXPECT_EQ (open.processor.getParameterRecord (Param::MixMode).midiController.load(), -1);
}
