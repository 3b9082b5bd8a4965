#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
juce::TextButton& buttonOf (OpenEditor& open, const char* name)
{
    return *findChild<juce::TextButton> (*open.editor, name);
}
}

TEST (PresetPanel, FirstTickShowsTheCurrentNameAndClearsTheListFlag)
{
    OpenEditor open;
    auto& box = open.child<juce::ComboBox> ("Preset Box");

    EXPECT_FALSE (open.processor.presetListChanged.load());
    EXPECT_EQ (box.getNumItems(), open.processor.getPresetNames().size());
    EXPECT_EQ (box.getText(), open.processor.getPresetName());
    EXPECT_TRUE (box.isTextEditable());
    EXPECT_EQ (box.getTextWhenNoChoicesAvailable(), "(no choices)");
    EXPECT_EQ (box.getTextWhenNothingSelected(), "Init");
}

TEST (PresetPanel, PickingItemKRequestsIndexKMinusOne)
{
    OpenEditor open;
    auto& box = open.child<juce::ComboBox> ("Preset Box");
    const juce::StringArray names { "Ambient", "Slapback", "Wide" };
    for (int i = 0; i < names.size(); ++i)
        box.addItem (names[i], i + 1);   // as a list refresh fills it

    for (int id = 1; id <= names.size(); ++id)
    {
        open.processor.presetLoadPending = false;
        box.setSelectedId (id, juce::sendNotificationSync);
        EXPECT_TRUE (open.processor.presetLoadPending.load());
        EXPECT_EQ (open.processor.presetToLoad.load(), id - 1);
    }

    // The item already selected sends no change and reloads nothing.
    open.processor.presetLoadPending = false;
    box.setSelectedId (3, juce::sendNotificationSync);
    EXPECT_FALSE (open.processor.presetLoadPending.load());
}

TEST (PresetPanel, TypedNameRequestsIndexMinusOne)
{
    OpenEditor open;
    auto& box = open.child<juce::ComboBox> ("Preset Box");
    box.addItem ("Slapback", 1);

    for (const auto* typed : { "My new echo", "slapback" })
    {
        open.processor.presetToLoad = 5;
        open.processor.presetLoadPending = false;
        box.setText (typed, juce::sendNotificationSync);
        EXPECT_TRUE (open.processor.presetLoadPending.load()) << typed;
        EXPECT_EQ (open.processor.presetToLoad.load(), -1) << typed;
        EXPECT_EQ (box.getText(), typed);
    }
}

TEST (PresetPanel, SaveButtonSavesOnceAndTurnsOffOnTheNextTick)
{
    OpenEditor open;
    auto& save = buttonOf (open, "Save Button");
    EXPECT_EQ (save.getButtonText(), "Save");
    EXPECT_EQ (buttonOf (open, "Reveal Button").getButtonText(), "Show");

    click (save);
    EXPECT_TRUE (save.getToggleState());
    tick (*open.editor);
    EXPECT_FALSE (save.getToggleState());

    // Two clicks within one interval: on, then off again before the tick.
    click (save);
    click (save);
    EXPECT_FALSE (save.getToggleState());
    tick (*open.editor);
    EXPECT_FALSE (save.getToggleState());
}

TEST (MidiPanel, LearnAndUnlearnFollowTheirSwitches)
{
    OpenEditor open;
    auto& learn = buttonOf (open, "Learn button");
    auto& unlearn = buttonOf (open, "Unlearn Button");

    click (learn);
    EXPECT_TRUE (open.processor.midiLearnActive.load());
    EXPECT_FALSE (open.processor.midiUnlearnActive.load());

    // Touching a control while learning arms its parameter.
    findChild<juce::Slider> (open.child ("Delay 2"), "Feedback Slider")->setValue (0.7, juce::sendNotificationSync);
    EXPECT_TRUE (open.processor.getParameterRecord (Param::Delay2Feedback).learnArmed.load());
    EXPECT_FALSE (open.processor.getParameterRecord (Param::Delay1Feedback).learnArmed.load());

    click (unlearn);
    EXPECT_TRUE (open.processor.midiUnlearnActive.load());
    click (learn);
    EXPECT_FALSE (open.processor.midiLearnActive.load());
    EXPECT_TRUE (open.processor.midiUnlearnActive.load());

    open.processor.getParameterRecord (Param::Delay2Feedback).midiController = 12;
    findChild<juce::Slider> (open.child ("Delay 2"), "Feedback Slider")->setValue (0.2, juce::sendNotificationSync);
    EXPECT_EQ (open.processor.getParameterRecord (Param::Delay2Feedback).midiController.load(), -1);

    // The poll never switches the modes off.
    tick (*open.editor);
    EXPECT_TRUE (unlearn.getToggleState());
}

TEST (MidiPanel, ClearStaysLitUntilTheBlockHasCleared)
{
    OpenEditor open;
    auto& clear = buttonOf (open, "Clear Button");
    open.processor.getParameterRecord (Param::MixMode).midiController = 20;

    click (clear);
    EXPECT_TRUE (open.processor.midiClearPending.load());
    tick (*open.editor);
    EXPECT_TRUE (clear.getToggleState());   // no audio block yet

    // Clicked again while lit: off for a moment, the request raised again.
    click (clear);
    EXPECT_FALSE (clear.getToggleState());
    EXPECT_TRUE (open.processor.midiClearPending.load());
    tick (*open.editor);
    EXPECT_TRUE (clear.getToggleState());

    open.processor.serveBlockStartRequests();
    tick (*open.editor);
    EXPECT_FALSE (clear.getToggleState());
    EXPECT_EQ (open.processor.getParameterRecord (Param::MixMode).midiController.load(), -1);
}

TEST (MidiPanel, SmallestEditorGivesSmallSwitchesWithThinOutlines)
{
    OpenEditor open (800.0f, 400.0f);
    auto& learn = buttonOf (open, "Learn button");
    EXPECT_EQ (learn.getWidth(), 16);
    EXPECT_EQ (learn.getHeight(), 10);
    EXPECT_NEAR (findChild<juce::Label> (*open.editor, "Unlearn Label")->getFont().getHeight(), 7.2f, 1e-3f);
}
