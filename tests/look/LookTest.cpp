#include "look/VeltraneBackground.h"
#include "look/VeltraneLook.h"

#include <gtest/gtest.h>

using namespace veltrane;

namespace
{
const juce::Colour orange (0xFFF76029), grey (0xFF222222), clear (0x00000000);
// Orange laid at least half over the grey: a one-pixel line between pixel rows.
bool tinted (juce::Colour c) { return c.getRed() > grey.getRed() + 0x50; }
// What fn draws into an empty image of the given size.
template <typename Fn>
juce::Image drawn (int w, int h, Fn&& fn)
{
    juce::Image image (juce::Image::ARGB, w, h, true);
    juce::Graphics g (image);
    fn (g);
    return image;
}
juce::Colour ringPixel (const juce::Image& image, float radius, float angle)   // clockwise from twelve o'clock
{
    return image.getPixelAt (juce::roundToInt (52.0f + radius * std::sin (angle) - 0.5f), juce::roundToInt (52.0f - radius * std::cos (angle) - 0.5f));
}
}

TEST (VeltraneLook, SwitchIsAnOutlineATenthOfItsHeightWhenOffAndABlockWhenOn)
{
    VeltraneLook look;
    juce::TextButton button;
    for (auto [height, on, outline] : { std::tuple (30, false, 3), { 20, false, 2 }, { 19, false, 1 }, { 9, false, 0 }, { 9, true, -1 } })
    {
        button.setSize (40, height);
        button.setToggleState (on, juce::dontSendNotification);
        const auto image = drawn (40, height, [&] (juce::Graphics& g) { look.drawButtonBackground (g, button, orange, true, true); });
        for (int y = 0; y < height; ++y)
            EXPECT_EQ (image.getPixelAt (20, y), y < outline || y >= height - outline || outline < 0 ? orange : clear) << height << " at " << y;
    }
}

TEST (VeltraneLook, KnobRingsShowTheValueAndTheRestAndGreyWhenDisabled)
{
    VeltraneLook look;
    juce::Slider slider;
    slider.setColour (juce::Slider::rotarySliderFillColourId, orange);
    const auto start = juce::MathConstants<float>::pi * 1.2f, end = juce::MathConstants<float>::pi * 2.8f, middle = (start + end) / 2;
    auto knob = [&] (float proportion) { return drawn (104, 104, [&] (juce::Graphics& g) { look.drawRotarySlider (g, 0, 0, 104, 104, proportion, start, end, slider); }); };
    // Rings at radius 50 (value), 40 (rest), 20 (value), each a tenth of its radius thick.
    for (auto [proportion, outerAndInner, middleRing] : { std::tuple (0.0f, false, true), { 1.0f, true, false } })
    {
        const auto image = knob (proportion);
        for (auto [radius, lit] : { std::pair (48.5f, outerAndInner), { 38.5f, middleRing }, { 19.0f, outerAndInner }, { 44.0f, false }, { 30.0f, false } })
            EXPECT_EQ (ringPixel (image, radius, middle).getAlpha() > 100, lit) << proportion << " at " << radius;
        EXPECT_EQ (ringPixel (image, 48.5f, juce::MathConstants<float>::pi), clear);   // the gap at the bottom
    }
    slider.setEnabled (false);
    const auto grey = ringPixel (knob (1.0f), 48.5f, middle);   // half-transparent mid grey
    EXPECT_TRUE (grey.getAlpha() == 0x80 && std::abs (grey.getRed() - 0x80) <= 1 && std::abs (grey.getGreen() - 0x80) <= 1) << grey.toString();
}

TEST (VeltraneLook, ComboBoxShowsItsOrangeButtonAndArrowsOnlyWhenEnabled)
{
    VeltraneLook look;
    juce::ComboBox box;
    box.setColour (juce::ComboBox::backgroundColourId, grey);
    box.setColour (juce::ComboBox::outlineColourId, orange);
    box.setColour (juce::ComboBox::arrowColourId, juce::Colours::white);
    for (const auto enabled : { true, false })
    {
        box.setEnabled (enabled);
        const auto image = drawn (200, 40, [&] (juce::Graphics& g) { look.drawComboBox (g, 200, 40, false, 160, 0, 40, 40, box); });
        EXPECT_EQ (image.getPixelAt (80, 20), grey);
        EXPECT_EQ (image.getPixelAt (80, 0), orange);
        EXPECT_EQ (image.getPixelAt (180, 20), orange);   // the button block between the arrows
        EXPECT_EQ (image.getPixelAt (180, 15) == juce::Colours::white && image.getPixelAt (180, 25) == juce::Colours::white, enabled);
    }
}

TEST (Background, FramesGlowAndLogoAt800By400)
{
    VeltraneBackground background;
    const auto image = background.createComponentSnapshot ({ 800, 400 }, true, 1.0f);
    // Straight edges of the frames: Delay 1 at y 40 and 44, the small frames at 276, 280, 284,
    // Global at x 320 and 479 down to the bottom edge, Delay 2 on the right edge.
    for (auto [x, y, lit] : { std::tuple (100, 40, true), { 100, 44, true }, { 100, 42, false }, { 100, 48, false }, { 100, 276, true },
                              { 100, 280, true }, { 100, 284, true }, { 320, 300, true }, { 479, 200, true }, { 400, 399, true }, { 799, 100, true } })
        EXPECT_EQ (tinted (image.getPixelAt (x, y)), lit) << x << ", " << y;
    EXPECT_EQ (image.getPixelAt (400, 10), grey);   // the glow starts at 0.05 H, translucent
    EXPECT_NEAR (image.getPixelAt (600, 38).getRed(), 0x22 + 0.52 * (0xF7 - 0x22), 16);   // 0x91 of alpha at its end
    // The logo, 64 pixels square at (736, 208): its wide bar solid orange from a tenth to nine tenths of its height.
    for (auto [y, bar] : { std::pair (3, false), { 6, true }, { 32, true }, { 56, true }, { 60, false } })
        EXPECT_EQ (image.getPixelAt (742, 208 + y) == orange, bar) << y;
}
