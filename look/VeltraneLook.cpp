#include "VeltraneLook.h"

namespace veltrane
{

namespace
{
const juce::Colour accent { Palette::accent };
const juce::Colour ground { Palette::ground };
const juce::Colour disabledKnob { 0x80808080 };
}

void VeltraneLook::drawButtonBackground (juce::Graphics& g, juce::Button& button, const juce::Colour& backgroundColour,
                                         bool, bool)
{
    const auto width = button.getWidth();
    const auto height = button.getHeight();
    g.setColour (backgroundColour);

    if (button.getToggleState())
        g.fillRect (0, 0, width, height);
    else
        g.drawRect (0, 0, width, height, (int) ((float) height * 0.1f));   // 0 below 10 px: only the text shows
}

void VeltraneLook::drawPopupMenuBackground (juce::Graphics& g, int width, int height)
{
    g.fillAll (ground);

    g.setColour (ground.overlaidWith (juce::Colour (0x2BADD8E6)));
    for (int y = 0; y < height; y += 3)
        g.fillRect (0, y, width, 1);

    g.setColour (accent.withAlpha (0.6f));
    g.drawRect (0, 0, width, height);
}

void VeltraneLook::drawPopupMenuItem (juce::Graphics& g, const juce::Rectangle<int>& area,
                                      bool isSeparator, bool isActive, bool isHighlighted, bool isTicked,
                                      bool hasSubMenu, const juce::String& text, const juce::String& shortcutKeyText,
                                      const juce::Drawable* icon, const juce::Colour* textColour)
{
    const juce::Graphics::ScopedSaveState saved (g);
    g.setOrigin (area.getPosition());

    const auto width = area.getWidth();
    const auto height = area.getHeight();
    const auto halfH = (float) height * 0.5f;

    if (isSeparator)
    {
        g.setColour (juce::Colour (0x33000000));
        g.drawLine (5.5f, halfH, (float) width - 5.5f, halfH);
        g.setColour (juce::Colour (0x66FFFFFF));
        g.drawLine (5.5f, halfH + 1.0f, (float) width - 5.5f, halfH + 1.0f);
        return;
    }

    const auto itemTextColour = textColour != nullptr ? *textColour : accent;

    if (isHighlighted)
    {
        g.setColour (accent);
        g.fillRect (1, 1, width - 2, height - 2);
        g.setColour (ground);
    }
    else
    {
        g.setColour (itemTextColour);
    }

    if (! isActive)
        g.setOpacity (0.3f);

    auto font = getPopupMenuFont();
    if (font.getHeight() > (float) height / 1.3f)
        font.setHeight ((float) height / 1.3f);
    g.setFont (font);

    const auto leftBorder = (height * 5) / 4;
    const auto rightBorder = 4;

    if (icon != nullptr)
    {
        icon->drawWithin (g, juce::Rectangle<int> (2, 1, leftBorder - 4, height - 2).toFloat(),
                          juce::RectanglePlacement::centred | juce::RectanglePlacement::onlyReduceInSize, 1.0f);
    }
    else if (isTicked)
    {
        const auto ascent = font.getAscent();
        const auto tick = getTickShape (1.0f);
        g.fillPath (tick, tick.getTransformToScaleToFit (2.0f, halfH - ascent * 0.5f,
                                                         (float) (leftBorder - 4), ascent, true));
    }

    g.drawFittedText (text, leftBorder, 0, width - (leftBorder + rightBorder), height,
                      juce::Justification::centredLeft, 1, 0.7f);

    if (shortcutKeyText.isNotEmpty())
    {
        auto shortcutFont = font;
        shortcutFont.setHeight (font.getHeight() * 0.75f);
        shortcutFont.setHorizontalScale (0.95f);
        g.setFont (shortcutFont);
        g.drawText (shortcutKeyText, leftBorder, 0, width - (leftBorder + 8), height,
                    juce::Justification::centredRight, true);
    }

    if (hasSubMenu)
    {
        const auto arrowH = 0.6f * getPopupMenuFont().getAscent();
        const auto ax = (float) width - (float) height * 0.6f;
        juce::Path arrow;
        arrow.addTriangle (ax, halfH - arrowH * 0.5f, ax, halfH + arrowH * 0.5f, ax + arrowH * 0.6f, halfH);
        g.fillPath (arrow);
    }
}

void VeltraneLook::drawPopupMenuUpDownArrow (juce::Graphics& g, int width, int height, bool isScrollUpArrow)
{
    const auto w = (float) width;
    const auto h = (float) height;

    g.setGradientFill (juce::ColourGradient (ground, 0.0f, h * 0.5f,
                                             ground.withAlpha (0.0f), 0.0f, isScrollUpArrow ? h : 0.0f,
                                             false));
    g.fillRect (1, 1, width - 2, height - 2);

    const auto hw = w * 0.5f;
    const auto aw = h * 0.3f;
    const auto y1 = h * (isScrollUpArrow ? 0.6f : 0.3f);
    const auto y2 = h * (isScrollUpArrow ? 0.3f : 0.6f);

    juce::Path arrow;
    arrow.addTriangle (hw - aw, y1, hw + aw, y1, hw, y2);
    g.setColour (accent.withAlpha (0.5f));
    g.fillPath (arrow);
}

void VeltraneLook::drawComboBox (juce::Graphics& g, int width, int height, bool,
                                 int buttonX, int buttonY, int buttonW, int buttonH, juce::ComboBox& box)
{
    g.fillAll (box.findColour (juce::ComboBox::backgroundColourId));

    if (box.isEnabled() && box.hasKeyboardFocus (false))
    {
        g.setColour (box.findColour (juce::ComboBox::buttonColourId));
        g.drawRect (0, 0, width, height, 2);
    }
    else
    {
        g.setColour (box.findColour (juce::ComboBox::outlineColourId));
        g.drawRect (0, 0, width, height, 1);
    }

    g.setColour (accent);
    g.fillRect (buttonX, buttonY, buttonW, buttonH);

    if (! box.isEnabled())
        return;

    const auto bx = (float) buttonX;
    const auto by = (float) buttonY;
    const auto bw = (float) buttonW;
    const auto bh = (float) buttonH;

    juce::Path arrows;
    arrows.addTriangle (bx + 0.5f * bw, by + 0.25f * bh, bx + 0.7f * bw, by + 0.45f * bh, bx + 0.3f * bw, by + 0.45f * bh);
    arrows.addTriangle (bx + 0.5f * bw, by + 0.75f * bh, bx + 0.7f * bw, by + 0.55f * bh, bx + 0.3f * bw, by + 0.55f * bh);
    g.setColour (box.findColour (juce::ComboBox::arrowColourId));
    g.fillPath (arrows);
}

juce::Font VeltraneLook::getLabelFont (juce::Label& label)
{
    const auto font = label.getFont();
    const auto available = (float) getLabelBorderSize (label).subtractedFrom (label.getLocalBounds()).getWidth();
    const auto needed = font.getStringWidthFloat (label.getText().trim());   // JUCE draws the trimmed text

    // Text widths grow in proportion to the font height.
    if (needed <= available || available <= 0.0f)
        return font;

    return font.withHeight (font.getHeight() * available / needed);
}

void VeltraneLook::drawLinearSliderBackground (juce::Graphics&, int, int, int, int, float, float, float,
                                               juce::Slider::SliderStyle, juce::Slider&)
{
}

void VeltraneLook::drawLinearSliderThumb (juce::Graphics& g, int x, int y, int width, int height,
                                          float sliderPos, float minSliderPos, float maxSliderPos,
                                          juce::Slider::SliderStyle style, juce::Slider& slider)
{
    const auto colour = slider.findColour (juce::Slider::thumbColourId);
    const auto fx = (float) x;
    const auto fy = (float) y;
    const auto w = (float) width;
    const auto h = (float) height;

    if (style == juce::Slider::LinearVertical)
    {
        const auto bottom = fy + h;
        const auto length = bottom - sliderPos;
        juce::Path bars;
        bars.addRectangle (fx, bottom - length, 0.2f * w, length);
        bars.addRectangle (fx + 0.8f * w, bottom - length, 0.2f * w, length);
        bars.addRectangle (fx + 0.4f * w, fy, 0.2f * w, length);
        g.setColour (colour);
        g.fillPath (bars);
        return;
    }

    if (style == juce::Slider::LinearHorizontal)
    {
        const auto length = sliderPos - fx;
        juce::Path bars;
        bars.addRectangle (fx, fy, length, 0.2f * h);
        bars.addRectangle (fx, fy + 0.8f * h, length, 0.2f * h);
        bars.addRectangle (fx + w - length, fy + 0.4f * h, length, 0.2f * h);
        g.setColour (colour);
        g.fillPath (bars);
        return;
    }

    // Two- and three-value styles keep JUCE's glass sphere and pointers, in the plain colour.
    const auto radius = (float) (getSliderThumbRadius (slider) - 2);
    const auto outline = slider.isEnabled() ? 0.8f : 0.3f;

    if (style == juce::Slider::ThreeValueVertical)
        drawGlassSphere (g, fx + w * 0.5f - radius, sliderPos - radius, radius * 2.0f, colour, outline);
    else if (style == juce::Slider::ThreeValueHorizontal)
        drawGlassSphere (g, sliderPos - radius, fy + h * 0.5f - radius, radius * 2.0f, colour, outline);

    if (style == juce::Slider::TwoValueVertical || style == juce::Slider::ThreeValueVertical)
    {
        const auto sr = juce::jmin (radius, w * 0.4f);
        drawGlassPointer (g, juce::jmax (0.0f, fx + w * 0.5f - radius * 2.0f), minSliderPos - radius,
                          radius * 2.0f, colour, outline, 1);
        drawGlassPointer (g, juce::jmin (fx + w - radius * 2.0f, fx + w * 0.5f), maxSliderPos - sr,
                          radius * 2.0f, colour, outline, 3);
    }
    else if (style == juce::Slider::TwoValueHorizontal || style == juce::Slider::ThreeValueHorizontal)
    {
        const auto sr = juce::jmin (radius, h * 0.4f);
        drawGlassPointer (g, minSliderPos - sr, juce::jmax (0.0f, fy + h * 0.5f - radius * 2.0f),
                          radius * 2.0f, colour, outline, 2);
        drawGlassPointer (g, maxSliderPos - radius, juce::jmin (fy + h - radius * 2.0f, fy + h * 0.5f),
                          radius * 2.0f, colour, outline, 4);
    }
}

void VeltraneLook::drawRotarySlider (juce::Graphics& g, int x, int y, int width, int height,
                                     float sliderPosProportional, float rotaryStartAngle, float rotaryEndAngle,
                                     juce::Slider& slider)
{
    const auto angle = rotaryStartAngle + sliderPosProportional * (rotaryEndAngle - rotaryStartAngle);
    const auto radius = (float) (juce::jmin (width / 2, height / 2) - 2);

    if (radius <= 0.0f)
        return;

    const auto centreX = (float) x + (float) width * 0.5f;
    const auto centreY = (float) y + (float) height * 0.5f;

    g.setColour (slider.isEnabled() ? slider.findColour (juce::Slider::rotarySliderFillColourId) : disabledKnob);

    auto fillRing = [&] (float ringRadius, float from, float to) {
        juce::Path ring;
        ring.addPieSegment (centreX - ringRadius, centreY - ringRadius, ringRadius * 2.0f, ringRadius * 2.0f,
                            from, to, 0.9f);
        g.fillPath (ring);
    };

    fillRing (radius, rotaryStartAngle, angle);
    fillRing (0.8f * radius, angle, rotaryEndAngle);
    fillRing (0.4f * radius, rotaryStartAngle, angle);
}

} // namespace veltrane
