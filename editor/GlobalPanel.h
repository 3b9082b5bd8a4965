#pragma once

#include "PanelLayout.h"

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane
{

class VeltraneAudioProcessor;

// The middle column: the last-parameter display (name and value text of whatever
// was set last, from any source), mix mode, dry/wet, Randomize, waveshaper and its
// amount ("Boost", shown only for the types that use it). Polls every 50 ms.
class GlobalPanel : public juce::Component,
                    public juce::Timer,
                    public juce::Slider::Listener,
                    public juce::Button::Listener
{
public:
    GlobalPanel();
    ~GlobalPanel() override;

    void setProcessor (VeltraneAudioProcessor* newProcessor) noexcept { processor = newProcessor; }

    void resized() override;
    void timerCallback() override;
    void sliderValueChanged (juce::Slider*) override;
    void buttonClicked (juce::Button*) override;

private:
    // Boost shows for "Hard Clipper" and "Dirt" only.
    void applyBoostRule();

    VeltraneAudioProcessor* processor = nullptr;
    juce::Font labelFont;
    float fontHeight = 12.4f;
    float lastHeight = 540.0f;
    bool defaultsPending = true;
    juce::Font displayFont;
    float displayFontHeight = 15.0f;

    juce::Label lastNameLabel;
    juce::Label lastValueLabel;
    juce::Slider mixModeSlider;
    juce::Label mixModeLabel;
    juce::Slider dryWetSlider;
    juce::Label dryWetLabel;
    juce::TextButton randomButton;
    juce::Label randomLabel;
    juce::Slider waveshaperSlider;
    juce::Label waveshaperLabel;
    juce::Slider boostSlider;
    juce::Label boostLabel;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (GlobalPanel)
};

} // namespace veltrane
