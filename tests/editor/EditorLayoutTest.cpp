#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
void dragCorner (juce::Component& editor, int dx, int dy)
{
    juce::Component& corner = find<juce::ResizableCornerComponent> (editor);
    const juce::Point<float> start (5.0f, 5.0f), end (5.0f + (float) dx, 5.0f + (float) dy);
    corner.mouseDown (mouseAt (corner, start, start));
    corner.mouseDrag (mouseAt (corner, end, start));
    corner.mouseUp (mouseAt (corner, end, start));
}
float fontOf (juce::Component& root, const char* label) { return find<juce::Label> (root, label).getFont().getHeight(); }
}

TEST (EditorLayout, ChildrenStackAndSitByTheTableAtDefaultAndSmallestSize)
{
    // Bottom to top: background, resize corner (unnamed), the panels in member order (MIDI unnamed).
    const struct { const char* name; juce::Rectangle<int> at1000, at800; } children[] {
        { "Veltrane Background", { 0, 0, 1000, 500 }, { 0, 0, 800, 400 } }, { "", { 980, 480, 20, 20 }, { 784, 384, 16, 16 } },
        { "Delay 1", { 0, 50, 400, 200 }, { 0, 40, 320, 160 } },             { "Delay 2", { 600, 50, 400, 200 }, { 480, 40, 320, 160 } },
        { "Envelope1 Component", { 0, 350, 200, 100 }, { 0, 280, 160, 80 } }, { "Envelope2 Component", { 200, 350, 200, 100 }, { 160, 280, 160, 80 } },
        { "Lfo1 Component", { 600, 350, 200, 100 }, { 480, 280, 160, 80 } }, { "Lfo2 Component", { 800, 350, 200, 100 }, { 640, 280, 160, 80 } },
        { "Global Panel", { 400, 50, 200, 450 }, { 320, 40, 160, 360 } },    { "", { 0, 460, 400, 30 }, { 0, 368, 320, 24 } },
        { "Preset Component", { 600, 250, 400, 100 }, { 480, 200, 320, 80 } },
    };
    for (const auto smallest : { false, true })
    {
        OpenEditor open (smallest ? 800.0f : 1000.0f, smallest ? 400.0f : 500.0f);
        ASSERT_EQ (open.editor->getNumChildComponents(), (int) std::size (children));
        for (int i = 0; i < (int) std::size (children); ++i)
        {
            const auto* child = open.editor->getChildComponent (i);
            EXPECT_EQ (child->getName(), children[i].name) << i;
            EXPECT_EQ (child->getBounds(), smallest ? children[i].at800 : children[i].at1000) << children[i].name;
        }
        EXPECT_EQ (find<juce::TextButton> (*open.editor, "Learn button").getBounds().getHeight(), smallest ? 10 : 12);
    }
}

TEST (EditorLayout, CaptionFontsFollowThePanelHeightEvenAfterAZeroSize)
{
    for (const auto smallest : { false, true })
    {
        OpenEditor open;
        if (smallest)
        {
            open.editor->setSize (0, 0);   // a damaged preferences file
            open.editor->setSize (800, 400);
        }
        const auto scale = smallest ? 0.8f : 1.0f;
        EXPECT_NEAR (fontOf (find (*open.editor, "Delay 2"), "Time Label"), 12.0f * scale, 1e-3f);
        EXPECT_NEAR (fontOf (find (*open.editor, "Envelope1 Component"), "Attack Label"), 10.5f * scale, 1e-3f);
        EXPECT_NEAR (fontOf (find (*open.editor, "Lfo2 Component"), "Sync Label"), 10.5f * scale, 1e-3f);
        EXPECT_NEAR (fontOf (find (*open.editor, "Global Panel"), "Boost Label"), 12.4f * 450.0f / 540.0f * scale, 1e-3f);
        EXPECT_NEAR (fontOf (find (*open.editor, "Global Panel"), "Last Parameter Name"), 12.5f * scale, 1e-3f);
        EXPECT_NEAR (fontOf (*open.editor, "Clear Label"), 9.0f * scale, 1e-3f);
    }
}

TEST (EditorLayout, CornerKeepsRatioAndLimitsAndTheNextEditorOpensAtTheLastSize)
{
    OpenEditor open;
    const struct { int dx, dy, width, height; } drags[] { { 200, 100, 1200, 600 }, { -500, -500, 800, 400 },
                                                          { 5000, 5000, 2000, 1000 }, { 300, 0, 1300, 650 }, { 400, 200, 1400, 700 } };
    for (const auto& d : drags)
    {
        open.editor->setSize (1000, 500);
        dragCorner (*open.editor, d.dx, d.dy);
        EXPECT_EQ (open.editor->getBounds(), juce::Rectangle<int> (d.width, d.height)) << d.dx << ", " << d.dy;
    }
    open.editor.reset();
    VeltraneAudioProcessorEditor reopened (open.processor);
    EXPECT_EQ (reopened.getBounds(), juce::Rectangle<int> (1400, 700));
}

TEST (EditorLayout, StoredSizeIsTakenAsItIsUnlessNoWindowCouldHaveIt)
{
    const struct { float width, height; int openWidth, openHeight; } cases[] {
        { 1234.9f, 617.7f, 1234, 617 }, { 3000.0f, 300.0f, 3000, 300 }, { 0.0f, 0.0f, 1000, 500 }, { -20.0f, 400.0f, 1000, 500 },
        { std::numeric_limits<float>::quiet_NaN(), 500.0f, 1000, 500 }, { 1.0e12f, 5.0e11f, 1000, 500 } };
    for (const auto& c : cases)
    {
        OpenEditor open (c.width, c.height);
        EXPECT_EQ (open.editor->getBounds(), juce::Rectangle<int> (c.openWidth, c.openHeight)) << c.width;
        dragCorner (*open.editor, 1, 1);   // the next drag brings it within the limits at the ratio 2
        EXPECT_TRUE (open.editor->getWidth() >= 800 && open.editor->getWidth() <= 2000) << c.width;
        EXPECT_EQ (open.editor->getWidth(), 2 * open.editor->getHeight()) << c.width;
    }
}
