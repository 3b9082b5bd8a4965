#pragma once

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane
{

// The plug-in's two colours: everything is drawn in orange on dark grey.
namespace Palette
{
    constexpr juce::uint32 accent = 0xFFF76029;
    constexpr juce::uint32 ground = 0xFF222222;
}

// Flat drawing of buttons, popup menus, combo boxes and sliders in the palette above.
// JUCE's version-2 look draws every element not overridden here. Stateless; called by
// JUCE's painting on the message thread. Colours not fixed here come from the widget.
class VeltraneLook : public juce::LookAndFeel_V2
{
public:
    VeltraneLook() = default;
    ~VeltraneLook() override = default;

    // Orange outline when the toggle state is off, filled block when it is on.
    void drawButtonBackground (juce::Graphics&, juce::Button&, const juce::Colour& backgroundColour,
                               bool isMouseOverButton, bool isButtonDown) override;

    void drawPopupMenuBackground (juce::Graphics&, int width, int height) override;
    // The item's own area stands where the older interface passed a width and height.
    void drawPopupMenuItem (juce::Graphics&, const juce::Rectangle<int>& area,
                            bool isSeparator, bool isActive, bool isHighlighted, bool isTicked,
                            bool hasSubMenu, const juce::String& text, const juce::String& shortcutKeyText,
                            const juce::Drawable* icon, const juce::Colour* textColour) override;
    void drawPopupMenuUpDownArrow (juce::Graphics&, int width, int height, bool isScrollUpArrow) override;

    void drawComboBox (juce::Graphics&, int width, int height, bool isButtonDown,
                       int buttonX, int buttonY, int buttonW, int buttonH, juce::ComboBox&) override;

    // The label's own font, or, for a text wider than the label's text area, the
    // same font just small enough to show it whole (JUCE would squash it and then
    // cut it short with an ellipsis).
    juce::Font getLabelFont (juce::Label&) override;

    // A linear slider has no visible track.
    void drawLinearSliderBackground (juce::Graphics&, int x, int y, int width, int height,
                                     float sliderPos, float minSliderPos, float maxSliderPos,
                                     juce::Slider::SliderStyle, juce::Slider&) override;
    // Three bars: the outer two grow from the bottom (left) edge, the middle one from
    // the opposite edge by the same length.
    void drawLinearSliderThumb (juce::Graphics&, int x, int y, int width, int height,
                                float sliderPos, float minSliderPos, float maxSliderPos,
                                juce::Slider::SliderStyle, juce::Slider&) override;

    // Three concentric ring segments: outer and inner show the value, middle the rest.
    void drawRotarySlider (juce::Graphics&, int x, int y, int width, int height,
                           float sliderPosProportional, float rotaryStartAngle, float rotaryEndAngle,
                           juce::Slider&) override;

private:
    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (VeltraneLook)
};

} // namespace veltrane
