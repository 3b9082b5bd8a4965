#include "VeltraneBackground.h"

#include "VeltraneLook.h"

namespace veltrane
{

namespace
{
// A rectangle in fractions of the background's width (x, width) and height (y, height).
struct Fractions
{
    float x, y, width, height;
};

juce::Rectangle<int> toPixels (const Fractions& f, float w, float h)
{
    return { juce::roundToInt (f.x * w), juce::roundToInt (f.y * h),
             juce::roundToInt (f.width * w), juce::roundToInt (f.height * h) };
}

// Panel frames in drawing order. The glow is painted after the first ten, so the
// Global frame and the later copies lie on top of it.
constexpr Fractions framesBeforeGlow[] {
    { 0.0f, 0.71f, 0.2f, 0.2f },   // Envelope 1
    { 0.2f, 0.71f, 0.2f, 0.2f },   // Envelope 2
    { 0.8f, 0.69f, 0.2f, 0.2f },   // LFO 2
    { 0.6f, 0.71f, 0.2f, 0.2f },   // LFO 1
    { 0.6f, 0.10f, 0.4f, 0.4f },   // Delay 2
    { 0.6f, 0.11f, 0.4f, 0.4f },
    { 0.0f, 0.10f, 0.4f, 0.4f },   // Delay 1
    { 0.0f, 0.11f, 0.4f, 0.4f },
};

constexpr Fractions framesAfterGlow[] {
    { 0.4f, 0.10f, 0.2f, 0.9f },   // Global
    { 0.0f, 0.70f, 0.2f, 0.2f },   // Envelope 1, Envelope 2, LFO 1, LFO 2
    { 0.2f, 0.70f, 0.2f, 0.2f },
    { 0.6f, 0.70f, 0.2f, 0.2f },
    { 0.8f, 0.70f, 0.2f, 0.2f },
    { 0.0f, 0.69f, 0.2f, 0.2f },   // Envelope 1, Envelope 2, LFO 1 high; LFO 2 low
    { 0.2f, 0.69f, 0.2f, 0.2f },
    { 0.6f, 0.69f, 0.2f, 0.2f },
    { 0.8f, 0.71f, 0.2f, 0.2f },
};

constexpr float frameCornerSize = 10.0f;   // pixels at every size
constexpr float frameThickness = 1.0f;

// Wordmark strokes on one grid: verticals 0.005 W wide, horizontals 0.01 W x 0.02 H,
// letters 0.11 H tall from 0.54 H.
constexpr float stem = 0.005f, bar = 0.01f, barHeight = 0.02f;
constexpr float top = 0.54f, middle = 0.58f, bottom = 0.63f;
constexpr float fullHeight = 0.11f, upperPart = 0.06f, lowerPartTop = 0.61f, lowerPart = 0.04f;

constexpr Fractions leftFull (float x) { return { x, top, stem, fullHeight }; }
constexpr Fractions leftUpper (float x) { return { x, top, stem, upperPart }; }
constexpr Fractions rightFull (float x) { return { x + 0.02f, top, stem, fullHeight }; }
constexpr Fractions rightUpper (float x) { return { x + 0.02f, top, stem, upperPart }; }
constexpr Fractions rightLower (float x) { return { x + 0.02f, lowerPartTop, stem, lowerPart }; }
constexpr Fractions barAt (float x, float y) { return { x + 0.01f, y, bar, barHeight }; }

constexpr float v = 0.02f, e1 = 0.06f, l = 0.10f, t = 0.13f, r = 0.16f, a = 0.20f, n = 0.24f, e2 = 0.28f;

// V E L T R A N E in 27 rectangles.
constexpr Fractions wordmark[] {
    leftUpper (v), rightUpper (v), barAt (v, bottom),
    leftFull (e1), barAt (e1, top), barAt (e1, middle), barAt (e1, bottom),
    leftFull (l), barAt (l, bottom),
    barAt (t, top), rightFull (t),
    leftFull (r), barAt (r, top), barAt (r, middle), rightUpper (r), rightLower (r),
    leftFull (a), rightFull (a), barAt (a, top), barAt (a, middle),
    leftFull (n), rightFull (n), barAt (n, top),
    leftFull (e2), barAt (e2, top), barAt (e2, middle), barAt (e2, bottom),
};
static_assert (std::size (wordmark) == 27);

constexpr Fractions logoArea { 0.92f, 0.52f, 0.08f, 0.16f };
}

VeltraneBackground::VeltraneBackground()
{
    setName ("Veltrane Background");
    logo = std::make_unique<TarnwellLogo>();
    addAndMakeVisible (*logo);
    setSize (800, 400);
}

VeltraneBackground::~VeltraneBackground() = default;

void VeltraneBackground::resized()
{
    logo->setBounds (toPixels (logoArea, (float) getWidth(), (float) getHeight()));
}

void VeltraneBackground::paint (juce::Graphics& g)
{
    const auto w = (float) getWidth();
    const auto h = (float) getHeight();
    const juce::Colour accent (Palette::accent);

    g.fillAll (juce::Colour (Palette::ground));

    auto drawFrames = [&] (const auto& frames) {
        g.setColour (accent);
        for (const auto& frame : frames)
            g.drawRoundedRectangle (toPixels (frame, w, h).toFloat(), frameCornerSize, frameThickness);
    };

    drawFrames (framesBeforeGlow);

    const auto glowX = (float) juce::roundToInt (0.5f * w);
    g.setGradientFill (juce::ColourGradient (juce::Colour (0x00FFFFFF), glowX, (float) juce::roundToInt (0.05f * h),
                                             accent.withAlpha ((juce::uint8) 0x91), glowX, (float) juce::roundToInt (0.1f * h),
                                             false));
    g.fillRect (0, 0, getWidth(), juce::roundToInt (0.1f * h));

    drawFrames (framesAfterGlow);

    g.setColour (accent);
    for (const auto& stroke : wordmark)
        g.fillRect (toPixels (stroke, w, h));
}

} // namespace veltrane
