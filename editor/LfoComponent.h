#pragma once

#include "PanelLayout.h"

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane
{

class VeltraneAudioProcessor;

// What sets the two LFO panels apart.
struct LfoPanelDifferences
{
    const char* componentName;
    const char* groupCaption;
    int firstParameter;   // LFO1Wave or LFO2Wave; rate, sync and synced rate follow
};

// Wave knob, Sync switch and one rate knob: the free rate ("Rate") while Sync is
// off, the tempo division while it is on. Polls the processor every 50 ms.
class LfoComponent : public juce::Component,
                     public juce::Timer,
                     public juce::Slider::Listener,
                     public juce::Button::Listener
{
public:
    ~LfoComponent() override;

    void setProcessor (VeltraneAudioProcessor* newProcessor) noexcept { processor = newProcessor; }

    void resized() override;
    void timerCallback() override;
    void sliderValueChanged (juce::Slider*) override;
    void buttonClicked (juce::Button*) override;

protected:
    explicit LfoComponent (const LfoPanelDifferences&);

private:
    // Exactly one of the two rate knobs and its caption shows, after the switch.
    void applySyncDisplayRule();

    const LfoPanelDifferences differences;
    VeltraneAudioProcessor* processor = nullptr;
    juce::Font labelFont;
    float fontHeight = 42.0f;
    float lastHeight = 400.0f;
    bool defaultsPending = true;

    juce::Slider rateSlider;
    juce::Slider syncedRateSlider;
    juce::Label rateLabel;
    juce::Label syncedRateLabel;
    juce::Slider waveSlider;
    juce::Label waveLabel;
    juce::Label groupLabel;
    juce::TextButton syncButton;
    juce::Label syncLabel;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (LfoComponent)
};

class Lfo1Component final : public LfoComponent
{
public:
    Lfo1Component();
};

class Lfo2Component final : public LfoComponent
{
public:
    Lfo2Component();
};

} // namespace veltrane
