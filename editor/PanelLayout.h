#pragma once

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane
{

// Shared conventions of the editor's control panels: widget set-up, proportional
// placement and caption fonts that follow the panel height.

// A child's bounds as fractions of its parent's width (x, width) and height (y, height).
struct RelativeBounds
{
    float x, y, width, height;
};

// Each product is formed in single precision and rounded to the nearest pixel.
void placeRelative (juce::Component& child, const RelativeBounds& bounds, int parentWidth, int parentHeight);

// "Helvetica", or the default sans-serif typeface on Linux, plain.
juce::Font makeCaptionFont (float height);

// Knob (or the given style) without a text box, in the accent colour, listened to by
// the panel. A continuous slider runs 0 to 1 in steps of 0.001 (its double-click value
// exactly), a choice slider 0 to choiceSteps in steps of 1.
void setUpSlider (juce::Component& panel, juce::Slider& slider, const juce::String& name,
                  juce::Slider::Listener& listener, int choiceSteps = 0,
                  juce::Slider::SliderStyle style = juce::Slider::RotaryVerticalDrag);

// Centred orange caption with an orange frame, not editable.
void setUpCaption (juce::Component& panel, juce::Label& label, const juce::String& name, const juce::String& text);

// Orange switch without text that toggles on click.
void setUpToggle (juce::Component& panel, juce::TextButton& button, const juce::String& name,
                  juce::Button::Listener& listener);

// Font scaling with the panel height: the factor newHeight / lastHeight, or 0 when
// either height is 0 (a panel laid out at zero size keeps its fonts and its
// lastHeight, so the next real layout scales from the last real height).
float fontScaleFactor (float lastHeight, float newHeight) noexcept;

// Scales font by factor and reads the height JUCE accepted back into fontHeight.
void scaleFont (juce::Font& font, float& fontHeight, float factor);

} // namespace veltrane
