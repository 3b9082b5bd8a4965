#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
struct Placement
{
    const char* panel;
    juce::Rectangle<int> at1000, at800;
};

// The placement table in pixels at the default and at the smallest size.
const Placement placements[] {
    { "Veltrane Background", { 0, 0, 1000, 500 }, { 0, 0, 800, 400 } },
    { "Delay 1", { 0, 50, 400, 200 }, { 0, 40, 320, 160 } },
    { "Delay 2", { 600, 50, 400, 200 }, { 480, 40, 320, 160 } },
    { "Envelope1 Component", { 0, 350, 200, 100 }, { 0, 280, 160, 80 } },
    { "Envelope2 Component", { 200, 350, 200, 100 }, { 160, 280, 160, 80 } },
    { "Lfo1 Component", { 600, 350, 200, 100 }, { 480, 280, 160, 80 } },
    { "Lfo2 Component", { 800, 350, 200, 100 }, { 640, 280, 160, 80 } },
    { "Global Panel", { 400, 50, 200, 450 }, { 320, 40, 160, 360 } },
    { "Preset Component", { 600, 250, 400, 100 }, { 480, 200, 320, 80 } },
};

juce::ResizableCornerComponent& cornerOf (juce::Component& editor)
{
    return *findChild<juce::ResizableCornerComponent> (editor);
}

void dragCorner (juce::Component& editor, int dx, int dy)
{
    auto& corner = cornerOf (editor);
    auto& asComponent = static_cast<juce::Component&> (corner);   // the handlers are protected in the corner
    const juce::Point<float> start (5.0f, 5.0f);
    const auto end = start + juce::Point<float> ((float) dx, (float) dy);
    asComponent.mouseDown (mouseEvent (corner, start, start));
    asComponent.mouseDrag (mouseEvent (corner, end, start));
    asComponent.mouseUp (mouseEvent (corner, end, start));
}

float fontHeightOf (juce::Component& panel, const juce::String& labelName)
{
    return findChild<juce::Label> (panel, labelName)->getFont().getHeight();
}
}

TEST (EditorLayout, PlacesEveryChildByTheTableAtDefaultAndSmallestSize)
{
    for (const auto smallest : { false, true })
    {
        OpenEditor open (smallest ? 800.0f : 1000.0f, smallest ? 400.0f : 500.0f);
        auto& editor = *open.editor;

        for (const auto& p : placements)
            EXPECT_EQ (open.child (p.panel).getBounds(), smallest ? p.at800 : p.at1000) << p.panel;

        EXPECT_EQ (findChild<MidiComponent> (editor)->getBounds(),
                   smallest ? juce::Rectangle<int> (0, 368, 320, 24) : juce::Rectangle<int> (0, 460, 400, 30));
        EXPECT_EQ (cornerOf (editor).getBounds(),
                   smallest ? juce::Rectangle<int> (784, 384, 16, 16) : juce::Rectangle<int> (980, 480, 20, 20));
    }
}

TEST (EditorLayout, StacksBackgroundThenCornerThenPanelsInMemberOrder)
{
    OpenEditor open;
    const auto& children = open.editor->getChildren();
    ASSERT_EQ (children.size(), 11);

    EXPECT_EQ (children[0]->getName(), "Veltrane Background");
    EXPECT_NE (dynamic_cast<juce::ResizableCornerComponent*> (children[1]), nullptr);
    const char* panels[] { "Delay 1", "Delay 2", "Envelope1 Component", "Envelope2 Component",
                           "Lfo1 Component", "Lfo2 Component", "Global Panel" };
    for (int i = 0; i < 7; ++i)
        EXPECT_EQ (children[i + 2]->getName(), panels[i]);
    EXPECT_NE (dynamic_cast<MidiComponent*> (children[9]), nullptr);
    EXPECT_EQ (children[10]->getName(), "Preset Component");
}

TEST (EditorLayout, CaptionFontsFollowThePanelHeight)
{
    struct Case
    {
        float width, height;
        float delay, envelope, lfo, globalCaption, globalDisplay, midi;
    };
    const Case cases[] { { 1000.0f, 500.0f, 12.0f, 10.5f, 10.5f, 12.4f * 450.0f / 540.0f, 12.5f, 9.0f },
                         { 800.0f, 400.0f, 9.6f, 8.4f, 8.4f, 12.4f * 360.0f / 540.0f, 10.0f, 7.2f } };

    for (const auto& c : cases)
    {
        OpenEditor open (c.width, c.height);
        EXPECT_NEAR (fontHeightOf (open.child ("Delay 2"), "Time Label"), c.delay, 1e-3f);
        EXPECT_NEAR (fontHeightOf (open.child ("Envelope1 Component"), "Attack Label"), c.envelope, 1e-3f);
        EXPECT_NEAR (fontHeightOf (open.child ("Lfo2 Component"), "Sync Label"), c.lfo, 1e-3f);
        EXPECT_NEAR (fontHeightOf (open.child ("Global Panel"), "Boost Label"), c.globalCaption, 1e-3f);
        EXPECT_NEAR (fontHeightOf (open.child ("Global Panel"), "Last Parameter Name"), c.globalDisplay, 1e-3f);
        EXPECT_NEAR (fontHeightOf (*open.editor, "Clear Label"), c.midi, 1e-3f);
    }
}

TEST (EditorLayout, CornerDragKeepsRatioAndLimits)
{
    OpenEditor open;
    auto& editor = *open.editor;

    struct Drag
    {
        int dx, dy;
        int width, height;
    };
    // From 1000 x 500 each time: the ratio 2 and the limits 800 x 400 .. 2000 x 1000 bind.
    const Drag drags[] { { 200, 100, 1200, 600 }, { -500, -500, 800, 400 }, { 5000, 5000, 2000, 1000 },
                         { 300, 0, 1300, 650 }, { -100, -50, 900, 450 } };

    for (const auto& d : drags)
    {
        editor.setSize (1000, 500);
        dragCorner (editor, d.dx, d.dy);
        EXPECT_EQ (editor.getWidth(), d.width) << d.dx << ", " << d.dy;
        EXPECT_EQ (editor.getHeight(), d.height) << d.dx << ", " << d.dy;
        EXPECT_EQ (open.processor.lastEditorWidth, (float) d.width);
        EXPECT_EQ (open.processor.lastEditorHeight, (float) d.height);
    }
}

TEST (EditorLayout, ANewEditorOpensAtTheSizeTheLastOneLeft)
{
    VeltraneAudioProcessor processor;
    {
        VeltraneAudioProcessorEditor editor (processor);
        EXPECT_EQ (editor.getBounds(), juce::Rectangle<int> (0, 0, 1000, 500));
        dragCorner (editor, 400, 200);
        EXPECT_EQ (editor.getWidth(), 1400);
    }
    EXPECT_EQ (processor.lastEditorWidth, 1400.0f);
    EXPECT_EQ (processor.lastEditorHeight, 700.0f);

    VeltraneAudioProcessorEditor reopened (processor);
    EXPECT_EQ (reopened.getWidth(), 1400);
    EXPECT_EQ (reopened.getHeight(), 700);
}

TEST (EditorLayout, StoredSizeIsTruncatedAndTakenOutsideTheLimits)
{
    struct Case
    {
        float width, height;
        int openWidth, openHeight;
    };
    const Case cases[] { { 1234.9f, 617.7f, 1234, 617 }, { 3000.0f, 300.0f, 3000, 300 }, { 500.0f, 250.0f, 500, 250 },
                         // no usable window: the default size instead
                         { 0.0f, 0.0f, 1000, 500 }, { -20.0f, 400.0f, 1000, 500 },
                         { std::numeric_limits<float>::quiet_NaN(), 500.0f, 1000, 500 },
                         { std::numeric_limits<float>::infinity(), 500.0f, 1000, 500 },
                         { 1.0e12f, 5.0e11f, 1000, 500 } };

    for (const auto& c : cases)
    {
        VeltraneAudioProcessor processor;
        processor.setLastEditorSize (c.width, c.height);
        VeltraneAudioProcessorEditor editor (processor);
        EXPECT_EQ (editor.getWidth(), c.openWidth) << c.width;
        EXPECT_EQ (editor.getHeight(), c.openHeight) << c.height;

        // The next drag brings any size within the limits at the ratio 2.
        dragCorner (editor, 1, 1);
        EXPECT_GE (editor.getWidth(), 800);
        EXPECT_LE (editor.getWidth(), 2000);
        EXPECT_EQ (editor.getWidth(), 2 * editor.getHeight()) << c.width;
    }
}

TEST (EditorLayout, PanelLaidOutAtZeroHeightKeepsItsFontsForTheNextLayout)
{
    OpenEditor open;
    auto& editor = *open.editor;

    editor.setSize (0, 0);
    for (const auto* name : { "Delay 1", "Lfo1 Component", "Global Panel" })
        EXPECT_EQ (open.child (name).getHeight(), 0);

    editor.setSize (800, 400);
    EXPECT_NEAR (fontHeightOf (open.child ("Delay 1"), "Time Label"), 9.6f, 1e-3f);
    EXPECT_NEAR (fontHeightOf (open.child ("Lfo1 Component"), "Rate Label"), 8.4f, 1e-3f);
    EXPECT_NEAR (fontHeightOf (open.child ("Global Panel"), "Last Parameter Value"), 10.0f, 1e-3f);
    EXPECT_NEAR (fontHeightOf (editor, "Learn label"), 7.2f, 1e-3f);
}
