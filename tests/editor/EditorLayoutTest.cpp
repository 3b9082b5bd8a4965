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
// What JUCE lays out for text on one line of area: an ellipsis replaces what does not fit.
juce::String laidOut (const juce::Font& font, const juce::String& text, juce::Rectangle<float> area)
{
    juce::GlyphArrangement glyphs;
    glyphs.addFittedText (font, text, area.getX(), area.getY(), area.getWidth(), area.getHeight(),
                          juce::Justification::centred, 1, 0.0f);
    juce::String shown;
    for (int i = 0; i < glyphs.getNumGlyphs(); ++i)
        shown += juce::String::charToString (glyphs.getGlyph (i).getCharacter());
    return shown;
}
}

// Opened at the default size, then resized through zero (a damaged preferences file) to the smallest.
TEST (EditorLayout, ChildrenAndCaptionFontsFollowTheSizeEvenAfterAZeroSize)
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
    OpenEditor open;
    ASSERT_EQ (open.editor->getNumChildComponents(), (int) std::size (children));
    for (const auto smallest : { false, true })
    {
        if (smallest)
        {
            open.editor->setSize (0, 0);
            open.editor->setSize (800, 400);
        }
        for (int i = 0; i < (int) std::size (children); ++i)
        {
            const auto* child = open.editor->getChildComponent (i);
            EXPECT_EQ (child->getName(), children[i].name) << i;
            EXPECT_EQ (child->getBounds(), smallest ? children[i].at800 : children[i].at1000) << children[i].name;
        }
        EXPECT_EQ (find<juce::TextButton> (*open.editor, "Learn button").getBounds().getHeight(), smallest ? 10 : 12);
        const auto scale = smallest ? 0.8f : 1.0f;
        for (auto [panel, label, size] : { std::tuple ("Delay 2", "Time Label", 12.0f), { "Envelope1 Component", "Attack Label", 10.5f },
                                           { "Lfo2 Component", "Sync Label", 10.5f }, { "Global Panel", "Boost Label", 12.4f * 450.0f / 540.0f },
                                           { "Global Panel", "Last Parameter Name", 12.5f }, { "", "Clear Label", 9.0f } })
            EXPECT_NEAR (find<juce::Label> (*panel ? find (*open.editor, panel) : *open.editor, label).getFont().getHeight(), size * scale, 1e-3f) << label;
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

// Every text a label can show (identifiers, every choice, both ends of every range,
// the factory preset names, the captions), tried in every label of the editor.
TEST (CaptionFit, EveryTextShowsWholeAndOnlyTextsThatDoNotFitShrink)
{
    for (const auto size : { juce::Point<float> (1000.0f, 500.0f), juce::Point<float> (800.0f, 400.0f) })
    {
        OpenEditor open (size.x, size.y);
        juce::Array<juce::Label*> labels;
        std::function<void (juce::Component&)> collect = [&] (juce::Component& c) {
            if (auto* label = dynamic_cast<juce::Label*> (&c))
                labels.add (label);
            for (auto* child : c.getChildren())
                collect (*child);
        };
        collect (*open.editor);
        juce::StringArray texts (open.processor.getPresetNames());
        for (auto* label : labels)
            texts.add (label->getText());
        for (int i = 0; i < Param::count; ++i)
        {
            const auto* choices = parameterTable[(size_t) i].choices;
            const auto last = choices != nullptr ? choices->size - 1 : 1;
            texts.add (open.processor.getParameterName (i));
            for (int k = 0; k <= last; ++k)
            {
                open.processor.setParameter (i, (float) k / (float) last);
                texts.add (open.processor.getParameterText (i));
            }
        }
        ASSERT_GE (labels.size(), 40);   // the captions and the preset box's text
        ASSERT_GE (texts.size(), 200);

        auto& look = static_cast<juce::LookAndFeel_V2&> (open.editor->getLookAndFeel());
        for (auto* label : labels)
        {
            const auto design = label->getFont();
            const auto area = look.getLabelBorderSize (*label).subtractedFrom (label->getLocalBounds()).toFloat();
            for (const auto& text : texts)
            {
                label->setText (text, juce::dontSendNotification);
                const auto font = look.getLabelFont (*label);
                const auto width = font.getStringWidthFloat (text.trim());
                const auto where = label->getName() + " at " + juce::String (size.x) + ": " + text;
                EXPECT_EQ (laidOut (font, text, area), text.trim()) << where;
                EXPECT_LE (width, area.getWidth() + 0.01f) << where;   // whole, and not squashed either
                if (design.getStringWidthFloat (text.trim()) <= area.getWidth())
                    EXPECT_EQ (font.getHeight(), design.getHeight()) << where;
                else
                    EXPECT_GE (width, 0.99f * area.getWidth()) << where;   // no smaller than it must be
            }
        }
    }
}
