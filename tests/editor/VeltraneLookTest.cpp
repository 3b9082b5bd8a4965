#include "EditorTestSupport.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
const juce::Colour accent (Palette::accent);
const juce::Colour ground (Palette::ground);
const juce::Colour clear (0x00000000);

bool isAccent (juce::Colour c) { return c == accent; }

// Orange laid over the ground at least half way: a one-pixel line on integer
// coordinates covers two pixel rows at half strength.
bool tinted (juce::Colour c) { return c.getRed() > ground.getRed() + 0x50; }

// Opaque and close to the accent: covers antialiased ring edges measured inside.
bool nearAccent (juce::Colour c)
{
    return c.getAlpha() > 200 && std::abs (c.getRed() - accent.getRed()) < 8
           && std::abs (c.getGreen() - accent.getGreen()) < 8 && std::abs (c.getBlue() - accent.getBlue()) < 8;
}

juce::Image blankImage (int w, int h)
{
    return juce::Image (juce::Image::ARGB, w, h, true);
}

// Colour of the ring pixel at radius r and angle a (radians clockwise from twelve).
juce::Colour ringPixel (const juce::Image& image, float cx, float cy, float r, float a)
{
    return image.getPixelAt (juce::roundToInt (cx + r * std::sin (a) - 0.5f), juce::roundToInt (cy - r * std::cos (a) - 0.5f));
}

struct Knob
{
    VeltraneLook look;
    juce::Slider slider;

    Knob()
    {
        slider.setLookAndFeel (&look);
        slider.setColour (juce::Slider::rotarySliderFillColourId, accent);
    }
    ~Knob() { slider.setLookAndFeel (nullptr); }

    juce::Image draw (float proportion)
    {
        auto image = blankImage (104, 104);
        juce::Graphics g (image);
        look.drawRotarySlider (g, 0, 0, 104, 104, proportion, juce::MathConstants<float>::pi * 1.2f,
                               juce::MathConstants<float>::pi * 2.8f, slider);
        return image;
    }
};
}

TEST (VeltraneLook, ButtonIsAnOutlineWhenOffAndABlockWhenOn)
{
    VeltraneLook look;
    juce::TextButton button;

    struct Case
    {
        int height;
        bool on;
        int outline;   // expected thickness of the outline; -1: filled
    };
    const Case cases[] { { 30, false, 3 }, { 20, false, 2 }, { 19, false, 1 }, { 10, false, 1 },
                         { 9, false, 0 }, { 9, true, -1 }, { 30, true, -1 } };

    for (const auto& c : cases)
    {
        button.setSize (40, c.height);
        button.setToggleState (c.on, juce::dontSendNotification);
        auto image = blankImage (40, c.height);
        {
            juce::Graphics g (image);
            look.drawButtonBackground (g, button, accent, true, true);
        }

        const auto centre = image.getPixelAt (20, c.height / 2);
        EXPECT_EQ (isAccent (centre), c.outline < 0) << c.height << " " << c.on;
        if (c.outline >= 0)
        {
            EXPECT_EQ (isAccent (image.getPixelAt (20, 0)), c.outline > 0) << c.height;
            if (c.outline > 0)
            {
                EXPECT_TRUE (isAccent (image.getPixelAt (20, c.outline - 1))) << c.height;
                EXPECT_FALSE (isAccent (image.getPixelAt (20, c.outline))) << c.height;
                EXPECT_TRUE (isAccent (image.getPixelAt (0, c.height / 2)));
                EXPECT_TRUE (isAccent (image.getPixelAt (39, c.height / 2)));
            }
        }
        else
        {
            EXPECT_TRUE (isAccent (image.getPixelAt (0, 0)));
            EXPECT_TRUE (isAccent (image.getPixelAt (39, c.height - 1)));
        }
    }
}

TEST (VeltraneLook, RotaryRingsShowValueAndRemainder)
{
    Knob knob;
    const auto cx = 52.0f, cy = 52.0f, radius = 50.0f;   // min (52, 52) - 2
    const auto start = juce::MathConstants<float>::pi * 1.2f;
    const auto end = juce::MathConstants<float>::pi * 2.8f;
    const auto middleOfRange = (start + end) * 0.5f;

    // Minimum: only the middle ring, over the whole range.
    auto atMinimum = knob.draw (0.0f);
    EXPECT_FALSE (nearAccent (ringPixel (atMinimum, cx, cy, 0.97f * radius, middleOfRange)));
    EXPECT_TRUE (nearAccent (ringPixel (atMinimum, cx, cy, 0.77f * radius, start + 0.1f)));
    EXPECT_TRUE (nearAccent (ringPixel (atMinimum, cx, cy, 0.77f * radius, end - 0.1f)));
    EXPECT_FALSE (nearAccent (ringPixel (atMinimum, cx, cy, 0.38f * radius, middleOfRange)));

    // Maximum: only the outer and inner rings.
    auto atMaximum = knob.draw (1.0f);
    EXPECT_TRUE (nearAccent (ringPixel (atMaximum, cx, cy, 0.95f * radius, start + 0.1f)));
    EXPECT_TRUE (nearAccent (ringPixel (atMaximum, cx, cy, 0.95f * radius, end - 0.1f)));
    EXPECT_FALSE (nearAccent (ringPixel (atMaximum, cx, cy, 0.77f * radius, middleOfRange)));
    EXPECT_TRUE (ringPixel (atMaximum, cx, cy, 0.38f * radius, middleOfRange).getAlpha() > 0);

    // Nothing between the rings, nothing in the gap at the bottom, no pointer, no body.
    for (auto* image : { &atMinimum, &atMaximum })
    {
        EXPECT_EQ (ringPixel (*image, cx, cy, 0.86f * radius, middleOfRange), clear);
        EXPECT_EQ (ringPixel (*image, cx, cy, 0.95f * radius, juce::MathConstants<float>::pi), clear);
        EXPECT_EQ (image->getPixelAt (52, 52), clear);
    }
}

TEST (VeltraneLook, DisabledKnobIsGreyWhateverItsColour)
{
    Knob knob;
    knob.slider.setEnabled (false);
    const auto image = knob.draw (1.0f);
    const auto pixel = ringPixel (image, 52.0f, 52.0f, 0.95f * 50.0f, juce::MathConstants<float>::pi * 2.0f);
    // 0x80808080 after the round trip through a premultiplied image.
    EXPECT_EQ (pixel.getAlpha(), 0x80);
    for (const auto component : { pixel.getRed(), pixel.getGreen(), pixel.getBlue() })
        EXPECT_NEAR (component, 0x80, 1);
}

TEST (VeltraneLook, VerticalFaderBarsGrowFromOppositeEdges)
{
    VeltraneLook look;
    juce::Slider fader (juce::Slider::LinearVertical, juce::Slider::NoTextBox);
    fader.setColour (juce::Slider::thumbColourId, accent);

    auto draw = [&] (float sliderPos) {
        auto image = blankImage (50, 100);
        juce::Graphics g (image);
        look.drawLinearSliderBackground (g, 0, 0, 50, 100, sliderPos, 0.0f, 0.0f, juce::Slider::LinearVertical, fader);
        look.drawLinearSliderThumb (g, 0, 0, 50, 100, sliderPos, 0.0f, 0.0f, juce::Slider::LinearVertical, fader);
        return image;
    };

    const auto atBottom = draw (100.0f);
    for (int y = 0; y < 100; y += 11)
        for (int x = 0; x < 50; x += 7)
            ASSERT_EQ (atBottom.getPixelAt (x, y), clear) << x << ", " << y;

    const auto atTop = draw (0.0f);
    for (const auto y : { 0, 50, 99 })
        for (const auto x : { 2, 22, 42 })
            EXPECT_TRUE (isAccent (atTop.getPixelAt (x, y))) << x << ", " << y;
    EXPECT_EQ (atTop.getPixelAt (12, 50), clear);
    EXPECT_EQ (atTop.getPixelAt (32, 50), clear);

    // A quarter up: the outer bars fill the bottom quarter, the middle one the top quarter.
    const auto quarter = draw (75.0f);
    EXPECT_TRUE (isAccent (quarter.getPixelAt (2, 90)));
    EXPECT_EQ (quarter.getPixelAt (2, 60), clear);
    EXPECT_TRUE (isAccent (quarter.getPixelAt (22, 10)));
    EXPECT_EQ (quarter.getPixelAt (22, 90), clear);
}

TEST (VeltraneLook, ComboBoxShowsArrowsOnlyWhenEnabled)
{
    VeltraneLook look;
    juce::ComboBox box;
    box.setColour (juce::ComboBox::backgroundColourId, ground);
    box.setColour (juce::ComboBox::outlineColourId, accent);
    box.setColour (juce::ComboBox::arrowColourId, juce::Colours::white);
    box.setSize (200, 40);

    for (const auto enabled : { true, false })
    {
        box.setEnabled (enabled);
        auto image = blankImage (200, 40);
        {
            juce::Graphics g (image);
            look.drawComboBox (g, 200, 40, false, 160, 0, 40, 40, box);
        }
        EXPECT_EQ (image.getPixelAt (80, 20), ground);
        EXPECT_TRUE (isAccent (image.getPixelAt (80, 0)));
        EXPECT_TRUE (isAccent (image.getPixelAt (162, 2)));
        EXPECT_EQ (image.getPixelAt (180, 15) == juce::Colours::white, enabled);   // up arrow
        EXPECT_EQ (image.getPixelAt (180, 25) == juce::Colours::white, enabled);   // down arrow
        EXPECT_TRUE (isAccent (image.getPixelAt (180, 20)));                        // gap between them
    }
}

TEST (VeltraneLook, PopupItemsHighlightedAndInactive)
{
    VeltraneLook look;
    const juce::Rectangle<int> area (0, 0, 120, 24);

    auto draw = [&] (bool active, bool highlighted) {
        auto image = blankImage (120, 24);
        juce::Graphics g (image);
        look.drawPopupMenuItem (g, area, false, active, highlighted, false, false, "Wide", {}, nullptr, nullptr);
        return image;
    };

    const auto highlighted = draw (true, true);
    EXPECT_TRUE (isAccent (highlighted.getPixelAt (110, 12)));
    EXPECT_EQ (highlighted.getPixelAt (0, 0), clear);

    // The text's darkest pixel on the orange bar is the dark grey.
    auto hasPixel = [] (const juce::Image& image, auto predicate) {
        for (int y = 0; y < image.getHeight(); ++y)
            for (int x = 0; x < image.getWidth(); ++x)
                if (predicate (image.getPixelAt (x, y)))
                    return true;
        return false;
    };
    EXPECT_TRUE (hasPixel (highlighted, [] (juce::Colour c) { return c == ground; }));

    const auto inactive = draw (false, false);
    EXPECT_TRUE (hasPixel (inactive, [] (juce::Colour c) { return c.getAlpha() > 0; }));
    EXPECT_FALSE (hasPixel (inactive, [] (juce::Colour c) { return c.getAlpha() > 0.3f * 255.0f + 1.0f; }));
}

TEST (VeltraneLook, PopupBackgroundIsStripedWithAFadedOutline)
{
    VeltraneLook look;
    auto image = blankImage (60, 30);
    {
        juce::Graphics g (image);
        look.drawPopupMenuBackground (g, 60, 30);
    }
    EXPECT_EQ (image.getPixelAt (30, 3), juce::Colour (0xFF394143));
    EXPECT_EQ (image.getPixelAt (30, 4), ground);
    const auto outline = juce::Colour (0xFF394143).overlaidWith (accent.withAlpha (0.6f));   // over the first stripe
    EXPECT_NEAR (image.getPixelAt (30, 0).getRed(), outline.getRed(), 2);
    EXPECT_NEAR (image.getPixelAt (30, 0).getGreen(), outline.getGreen(), 2);
    EXPECT_NEAR (image.getPixelAt (0, 20).getRed(), ground.overlaidWith (accent.withAlpha (0.6f)).getRed(), 2);
}

TEST (Background, FramesGlowWordmarkAndLogoAt800By400)
{
    VeltraneBackground background;
    ASSERT_EQ (background.getWidth(), 800);
    auto image = background.createComponentSnapshot (background.getLocalBounds(), true, 1.0f);

    // Straight edges of the frames (their corners are rounded): the Delay frames at y
    // 40 and 44, the small frames at 276, 280, 284, the Global frame at x 320.
    for (const auto y : { 40, 44, 276, 280, 284 })
        EXPECT_TRUE (tinted (image.getPixelAt (100, y))) << y;
    EXPECT_EQ (image.getPixelAt (100, 48), ground);
    EXPECT_EQ (image.getPixelAt (100, 42), ground);
    for (const auto y : { 100, 300 })
        EXPECT_TRUE (tinted (image.getPixelAt (320, y))) << y;
    EXPECT_TRUE (tinted (image.getPixelAt (479, 200)));   // right edge of the Global frame
    EXPECT_TRUE (tinted (image.getPixelAt (799, 100)));   // right edge of Delay 2
    EXPECT_TRUE (tinted (image.getPixelAt (400, 399)));   // upper half of the Global frame's bottom line

    // Glow: ground above 0.05 H, orange-tinted towards 0.1 H.
    EXPECT_EQ (image.getPixelAt (400, 10), ground);
    const auto glow = image.getPixelAt (600, 38);
    EXPECT_GT (glow.getRed(), ground.getRed() + 40);
    EXPECT_LT (glow.getRed(), accent.getRed());

    // Wordmark: orange only inside its band 0.02..0.30 W, 0.54..0.65 H.
    const juce::Rectangle<int> band (16, 216, 224, 44);
    int inside = 0;
    for (int y = 200; y < 276; ++y)
        for (int x = 4; x < 316; ++x)
            if (isAccent (image.getPixelAt (x, y)))
            {
                EXPECT_TRUE (band.contains (x, y)) << x << ", " << y;
                ++inside;
            }
    EXPECT_GT (inside, 600);

    // Logo: its square at (736, 208), 64 x 64.
    auto* logo = findChild<TarnwellLogo> (background);
    ASSERT_NE (logo, nullptr);
    EXPECT_EQ (logo->getBounds(), juce::Rectangle<int> (736, 208, 64, 64));
}

TEST (Logo, DrawsInsideItsSquareAndNothingAtZeroSize)
{
    TarnwellLogo logo;
    logo.setSize (64, 64);
    auto image = logo.createComponentSnapshot (logo.getLocalBounds(), true, 1.0f);

    int orange = 0;
    for (int y = 0; y < 64; ++y)
        for (int x = 0; x < 64; ++x)
        {
            const auto c = image.getPixelAt (x, y);
            if (c.getAlpha() == 0)
                continue;
            EXPECT_TRUE (y >= 6 && y < 58) << x << ", " << y;   // bars span 0.1 H to 0.9 H
            if (c.getAlpha() == 255)
            {
                EXPECT_EQ (c, accent);
            }
            ++orange;
        }
    EXPECT_GT (orange, 300);
    for (const auto y : { 6, 32, 56 })
        EXPECT_TRUE (isAccent (image.getPixelAt (6, y))) << y;   // the wide bar

    logo.setSize (0, 0);
    auto empty = blankImage (4, 4);
    {
        juce::Graphics g (empty);
        logo.paint (g);
    }
    for (int y = 0; y < 4; ++y)
        for (int x = 0; x < 4; ++x)
            EXPECT_EQ (empty.getPixelAt (x, y), clear);
}

TEST (DelayPanel, PaintsItsNumeralInBars)
{
    for (const auto second : { false, true })
    {
        std::unique_ptr<juce::Component> panel;
        if (second)
            panel = std::make_unique<Delay2Component>();
        else
            panel = std::make_unique<Delay1Component>();
        panel->setSize (500, 250);

        auto image = blankImage (500, 250);
        {
            juce::Graphics g (image);
            panel->paint (g);
        }
        EXPECT_TRUE (isAccent (image.getPixelAt (447, 40)));          // stem at 0.89 W
        EXPECT_EQ (isAccent (image.getPixelAt (437, 40)), second);    // second stem at 0.87 W
        EXPECT_TRUE (isAccent (image.getPixelAt (452, 20)));          // right serif
        EXPECT_EQ (image.getPixelAt (447, 10), clear);
    }
}
