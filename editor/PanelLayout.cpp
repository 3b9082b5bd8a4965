#include "PanelLayout.h"

#include "../look/VeltraneLook.h"

namespace veltrane
{

namespace
{
constexpr double continuousStep = 0.001;
}

void placeRelative (juce::Component& child, const RelativeBounds& bounds, int parentWidth, int parentHeight)
{
    const auto w = (float) parentWidth;
    const auto h = (float) parentHeight;
    child.setBounds (juce::roundToInt (bounds.x * w), juce::roundToInt (bounds.y * h),
                     juce::roundToInt (bounds.width * w), juce::roundToInt (bounds.height * h));
}

juce::Font makeCaptionFont (float height)
{
    const auto onLinux = (juce::SystemStats::getOperatingSystemType() & juce::SystemStats::Linux) != 0;
    return juce::Font (onLinux ? juce::Font::getDefaultSansSerifFontName() : juce::String ("Helvetica"),
                       height, juce::Font::plain);
}

void setUpSlider (juce::Component& panel, juce::Slider& slider, const juce::String& name,
                  juce::Slider::Listener& listener, int choiceSteps, juce::Slider::SliderStyle style)
{
    slider.setName (name);
    panel.addAndMakeVisible (slider);
    if (choiceSteps > 0)
    {
        slider.setRange (0.0, (double) choiceSteps, 1.0);
    }
    else
    {
        // Every value snaps to the step except the double-click value, which is kept
        // whole: a double click gives the host the parameter's exact default, such as
        // 0.243987 for 120 ms, which the step would round to 0.244.
        juce::NormalisableRange<double> range (0.0, 1.0, {}, {}, [&slider] (double start, double end, double value) {
            if (slider.isDoubleClickReturnEnabled() && value == slider.getDoubleClickReturnValue())
                return value;
            return juce::jlimit (start, end, start + continuousStep * std::floor ((value - start) / continuousStep + 0.5));
        });
        range.interval = continuousStep;
        slider.setNormalisableRange (range);
    }
    slider.setSliderStyle (style);
    slider.setTextBoxStyle (juce::Slider::NoTextBox, false, 0, 0);
    slider.setColour (juce::Slider::thumbColourId, juce::Colour (Palette::accent));
    slider.setColour (juce::Slider::rotarySliderFillColourId, juce::Colour (Palette::accent));
    slider.addListener (&listener);
}

void setUpCaption (juce::Component& panel, juce::Label& label, const juce::String& name, const juce::String& text)
{
    label.setName (name);
    label.setText (text, juce::dontSendNotification);
    panel.addAndMakeVisible (label);
    label.setJustificationType (juce::Justification::centred);
    label.setEditable (false, false, false);
    label.setColour (juce::Label::textColourId, juce::Colour (Palette::accent));
    label.setColour (juce::Label::outlineColourId, juce::Colour (Palette::accent));
    label.setColour (juce::TextEditor::textColourId, juce::Colour (0xFF000000));
    label.setColour (juce::TextEditor::backgroundColourId, juce::Colour (0x00000000));
}

void setUpToggle (juce::Component& panel, juce::TextButton& button, const juce::String& name,
                  juce::Button::Listener& listener)
{
    button.setName (name);
    button.setTooltip ({});
    panel.addAndMakeVisible (button);
    button.setButtonText ({});
    button.setClickingTogglesState (true);
    button.setColour (juce::TextButton::buttonColourId, juce::Colour (Palette::accent));
    button.setColour (juce::TextButton::buttonOnColourId, juce::Colour (Palette::accent));
    button.addListener (&listener);
}

float fontScaleFactor (float lastHeight, float newHeight) noexcept
{
    return lastHeight > 0.0f && newHeight > 0.0f ? newHeight / lastHeight : 0.0f;
}

void scaleFont (juce::Font& font, float& fontHeight, float factor)
{
    font.setHeight (factor * fontHeight);
    fontHeight = font.getHeight();
}

} // namespace veltrane
