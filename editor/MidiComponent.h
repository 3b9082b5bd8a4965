#pragma once

#include <juce_gui_basics/juce_gui_basics.h>

#include <memory>

namespace veltrane
{

class VeltraneAudioProcessor;

// LEARN, UNLEARN and CLEAR switches for MIDI learn. The panel only sets the
// processor's flags; CLEAR stays lit until the audio block has served the clear.
class MidiComponent : public juce::Component, public juce::Timer, public juce::Button::Listener
{
public:
    MidiComponent();
    ~MidiComponent() override;

    void setProcessor (VeltraneAudioProcessor* newProcessor) noexcept { processor = newProcessor; }

    void resized() override;
    void timerCallback() override;
    void buttonClicked (juce::Button*) override;

private:
    VeltraneAudioProcessor* processor = nullptr;
    juce::Font labelFont;
    float fontHeight = 15.0f;
    float lastHeight = 50.0f;
    std::unique_ptr<juce::TextButton> learnButton;
    std::unique_ptr<juce::Label> learnLabel;
    std::unique_ptr<juce::TextButton> unlearnButton;
    std::unique_ptr<juce::Label> unlearnLabel;
    std::unique_ptr<juce::TextButton> clearButton;
    std::unique_ptr<juce::Label> clearLabel;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (MidiComponent)
};

} // namespace veltrane
