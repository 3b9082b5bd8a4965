#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

// The user types a name while polls run and confirms it, and a poll runs before JUCE
// delivers the box's asynchronous change message: the typed name must reach the
// processor, and the preset shown before must not be requested again.
TEST (PresetPoll, TypedNameSurvivesPollsBeforeItsChangeMessage)
{
    OpenEditor open;
    auto& box = find<juce::ComboBox> (*open.editor, "Preset Box");
    box.addItem ("Init", 1);   // as a list refresh fills it
    box.addItem ("Slapback", 2);
    tick (*open.editor);
    ASSERT_EQ (box.getSelectedId(), 1);

    auto typeAndConfirm = [&] (const char* name, const char* nameFromElsewhere) {
        auto& text = find<juce::Label> (box);
        text.showEditor();
        text.getCurrentTextEditor()->setText (name);
        if (nameFromElsewhere != nullptr)
            open.processor.setPresetName (nameFromElsewhere);   // say, a program change
        tick (*open.editor);
        EXPECT_TRUE (text.isBeingEdited());
        text.hideEditor (false);   // return pressed: the box posts its change message
        tick (*open.editor);
        EXPECT_EQ (box.getText(), name);

        // Delivers the change message now (ComboBox is privately an AsyncUpdater).
        ((juce::AsyncUpdater&) box).handleUpdateNowIfNeeded();
        EXPECT_EQ (open.processor.getPresetName(), name);
        EXPECT_EQ (open.processor.presetToLoad.load(), -1);
        tick (*open.editor);
        EXPECT_EQ (box.getText(), name);
    };

    typeAndConfirm ("My Echo", nullptr);
    typeAndConfirm ("Tape", "Slapback");

    // A name the processor takes from elsewhere shows at the next poll.
    open.processor.setPresetName ("Slapback");
    tick (*open.editor);
    EXPECT_EQ (box.getSelectedId(), 2);
}
