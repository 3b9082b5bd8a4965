#include "EditorTestSupport.h"
#include "tests/support/TemporaryHome.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
// Every text a label of the editor can show: each parameter's identifier, the texts
// of every choice and of both ends of every continuous range, the preset names and
// the labels' own captions.
juce::StringArray everyText (VeltraneAudioProcessor& processor, const juce::Array<juce::Label*>& labels)
{
    juce::StringArray texts (processor.getPresetNames());

    for (int i = 0; i < Param::count; ++i)
    {
        const auto* choices = parameterTable[(size_t) i].choices;
        const auto last = choices != nullptr ? choices->size - 1 : 1;
        texts.add (processor.getParameterName (i));

        for (int k = 0; k <= last; ++k)
        {
            processor.setParameter (i, (float) k / (float) last);
            texts.add (processor.getParameterText (i));
        }
    }

    for (auto* label : labels)
        texts.add (label->getText());

    texts.removeDuplicates (false);
    return texts;
}

// The characters JUCE lays out for text in area with font on one line: an ellipsis
// replaces whatever does not fit.
juce::String laidOut (const juce::Font& font, const juce::String& text, juce::Rectangle<int> area)
{
    juce::GlyphArrangement glyphs;
    glyphs.addFittedText (font, text, (float) area.getX(), (float) area.getY(), (float) area.getWidth(),
                          (float) area.getHeight(), juce::Justification::centred, 1, 0.0f);
    juce::String shown;

    for (int i = 0; i < glyphs.getNumGlyphs(); ++i)
        shown += juce::String::charToString (glyphs.getGlyph (i).getCharacter());

    return shown;
}
}

TEST (CaptionFit, EveryTextShowsWholeAndOnlyTextsThatDoNotFitShrink)
{
    const TemporaryHome home;   // a first run: the factory presets are the preset names

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
        ASSERT_GE (labels.size(), 40);   // 39 captions and the preset box's

        auto& look = static_cast<juce::LookAndFeel_V2&> (open.editor->getLookAndFeel());
        const auto texts = everyText (open.processor, labels);

        for (auto* label : labels)
        {
            const auto design = label->getFont();
            const auto area = look.getLabelBorderSize (*label).subtractedFrom (label->getLocalBounds());

            for (const auto& text : texts)
            {
                label->setText (text, juce::dontSendNotification);
                const auto font = look.getLabelFont (*label);
                const auto width = font.getStringWidthFloat (text.trim());
                const auto where = label->getName() + " at " + juce::String (size.x) + ": \"" + text + "\"";

                EXPECT_EQ (laidOut (font, text, area), text.trim()) << where;
                EXPECT_LE (width, (float) area.getWidth() + 0.01f) << where;   // not squashed either

                if (design.getStringWidthFloat (text.trim()) <= (float) area.getWidth())
                    EXPECT_EQ (font.getHeight(), design.getHeight()) << where;
                else
                    EXPECT_GE (width, 0.99f * (float) area.getWidth()) << where;   // no smaller than needed
            }
        }
    }
}
