#pragma once

#include "PanelLayout.h"

#include <juce_gui_basics/juce_gui_basics.h>

#include <array>

namespace veltrane
{

class VeltraneAudioProcessor;

// What sets the two delay panels apart.
struct DelayPanelDifferences
{
    const char* componentName;
    int firstParameter;   // Delay1Time or Delay2Time; the other six follow in table order
    int numeral;          // 1 or 2, painted as I or II in orange bars
};

// The seven controls of one delay line: time, feedback, the depths and sources of
// the time and feedback modulation (knobs), and the output gain (fader). Polls the
// processor every 50 ms; every user change goes to setParameterFromControl.
class DelayComponent : public juce::Component, public juce::Timer, public juce::Slider::Listener
{
public:
    ~DelayComponent() override;

    void setProcessor (VeltraneAudioProcessor* newProcessor) noexcept { processor = newProcessor; }

    void paint (juce::Graphics&) override;
    void resized() override;
    void timerCallback() override;
    void sliderValueChanged (juce::Slider*) override;

protected:
    explicit DelayComponent (const DelayPanelDifferences&);

private:
    struct Binding
    {
        juce::Slider* slider;
        int parameter;
        int choiceSteps;   // 0 for a continuous slider
    };

    const DelayPanelDifferences differences;
    VeltraneAudioProcessor* processor = nullptr;
    juce::Font labelFont;
    float fontHeight = 15.0f;
    float lastHeight = 250.0f;
    bool defaultsPending = true;

    juce::Slider timeSlider;
    juce::Label timeLabel;
    juce::Slider feedbackSlider;
    juce::Label feedbackLabel;
    juce::Slider timeModSlider;
    juce::Label timeModLabel;
    juce::Slider feedbackModSlider;
    juce::Label feedbackModLabel;
    juce::Slider timeModSrcSlider;
    juce::Label timeModSrcLabel;
    juce::Slider feedbackModSrcSlider;
    juce::Label feedbackModSrcLabel;
    juce::Slider gainSlider;
    juce::Label gainLabel;

    // In the order sliderValueChanged tests them.
    const std::array<Binding, 7> bindings;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (DelayComponent)
};

class Delay1Component final : public DelayComponent
{
public:
    Delay1Component();
};

class Delay2Component final : public DelayComponent
{
public:
    Delay2Component();
};

} // namespace veltrane
