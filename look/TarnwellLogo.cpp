#include "TarnwellLogo.h"

#include "VeltraneLook.h"

namespace veltrane
{

namespace
{
// A bar's left edge and width as fractions of the logo's width; every bar spans
// 0.1 to 0.9 of its height.
struct Bar
{
    float x, width;
};

constexpr Bar wideBar { 0.08f, 0.04f };
constexpr Bar narrowBars[] { { 0.68f, 0.02f }, { 0.73f, 0.015f }, { 0.775f, 0.02f },
                             { 0.83f, 0.01f }, { 0.87f, 0.015f } };

// The wedges' shared tip and the two corners of the lower one; the upper one mirrors
// it about the middle height.
constexpr float tipX = 0.4f, tipY = 0.5f;
constexpr float mouthX = 0.64f, mouthOuterY = 0.86f, mouthInnerY = 0.78f;
}

TarnwellLogo::TarnwellLogo()
{
    setInterceptsMouseClicks (false, false);
    setSize (200, 200);
}

void TarnwellLogo::resized()
{
    const auto w = (float) getWidth();
    const auto h = (float) getHeight();
    auto px = [w] (float fraction) { return (float) juce::roundToInt (fraction * w); };
    auto py = [h] (float fraction) { return (float) juce::roundToInt (fraction * h); };

    auto buildWedge = [&] (juce::Path& wedge, float outerY, float innerY) {
        wedge.clear();
        wedge.startNewSubPath (px (tipX), py (tipY));
        wedge.lineTo (px (mouthX), py (outerY));
        wedge.lineTo (px (mouthX), py (innerY));
        wedge.closeSubPath();
    };

    buildWedge (lowerWedge, mouthOuterY, mouthInnerY);
    buildWedge (upperWedge, 1.0f - mouthOuterY, 1.0f - mouthInnerY);
}

void TarnwellLogo::paint (juce::Graphics& g)
{
    const auto w = (float) getWidth();
    const auto h = (float) getHeight();
    const auto top = juce::roundToInt (0.1f * h);
    const auto height = juce::roundToInt (0.8f * h);

    auto fillBar = [&] (const Bar& bar) {
        g.fillRect (juce::roundToInt (bar.x * w), top, juce::roundToInt (bar.width * w), height);
    };

    g.setColour (juce::Colour (Palette::accent));
    fillBar (wideBar);
    fillBar (narrowBars[0]);
    g.fillPath (lowerWedge);
    for (int i = 1; i < 5; ++i)
        fillBar (narrowBars[i]);
    g.fillPath (upperWedge);
}

} // namespace veltrane
