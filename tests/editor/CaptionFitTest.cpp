#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

// What JUCE lays out for text on one line of area: an ellipsis replaces what does not fit.
static juce::String laidOut (const juce::Font& font, const juce::String& text, juce::Rectangle<float> area)
{
    juce::GlyphArrangement glyphs;
    glyphs.addFittedText (font, text, area.getX(), area.getY(), area.getWidth(), area.getHeight(),
                          juce::Justification::centred, 1, 0.0f);
    juce::String shown;
    for (int i = 0; i < glyphs.getNumGlyphs(); ++i)
        shown += juce::String::charToString (glyphs.getGlyph (i).getCharacter());
    return shown;
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
