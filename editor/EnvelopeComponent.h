#pragma once

#include "PanelLayout.h"

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane
{

class VeltraneAudioProcessor;

// What sets the two envelope-follower panels apart.
struct EnvelopePanelDifferences
{
    const char* componentName;
    const char* groupCaption;
    int attack, release, sensitivity;   // parameter indices
};

// Attack, release and sensitivity knobs of one envelope follower. Polls the
// processor every 50 ms.
class EnvelopeComponent : public juce::Component, public juce::Timer, public juce::Slider::Listener
{
public:
    ~EnvelopeComponent() override;

    void setProcessor (VeltraneAudioProcessor* newProcessor) noexcept { processor = newProcessor; }

    void resized() override;
    void timerCallback() override;
    void sliderValueChanged (juce::Slider*) override;

protected:
    explicit EnvelopeComponent (const EnvelopePanelDifferences&);

private:
    const EnvelopePanelDifferences differences;
    VeltraneAudioProcessor* processor = nullptr;
    juce::Font labelFont;
    float fontHeight = 42.0f;
    float lastHeight = 400.0f;
    bool defaultsPending = true;

    juce::Slider attackSlider;
    juce::Label attackLabel;
    juce::Slider releaseSlider;
    juce::Label releaseLabel;
    juce::Slider sensitivitySlider;
    juce::Label sensitivityLabel;
    juce::Label groupLabel;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (EnvelopeComponent)
};

class Envelope1Component final : public EnvelopeComponent
{
public:
    Envelope1Component();
};

class Envelope2Component final : public EnvelopeComponent
{
public:
    Envelope2Component();
};

} // namespace veltrane
