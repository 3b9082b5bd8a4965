#pragma once

#include <juce_gui_basics/juce_gui_basics.h>

#include <memory>

namespace veltrane
{

class VeltraneAudioProcessor;

// Preset box (pick a preset or type a new name), "Save" and "Show". Keeps no preset
// data: the list and the current name belong to the processor, polled every 50 ms;
// loads are requested through the processor's flags and served by its next block.
class PresetComponent : public juce::Component,
                        public juce::Timer,
                        public juce::ComboBox::Listener,
                        public juce::Button::Listener
{
public:
    PresetComponent();
    ~PresetComponent() override;

    void setProcessor (VeltraneAudioProcessor* newProcessor) noexcept { processor = newProcessor; }

    void resized() override;
    void timerCallback() override;
    void comboBoxChanged (juce::ComboBox*) override;
    void buttonClicked (juce::Button*) override;

private:
    // True while the box's text editor is open, and after the user has confirmed a name
    // or picked an item until JUCE delivers the box's change message (the box then shows
    // something other than shownName).
    bool userIsEnteringName() const;

    VeltraneAudioProcessor* processor = nullptr;
    bool refreshRequested = true;   // the first tick fills the list
    juce::String shownName;         // the processor's name as the box last showed it
    std::unique_ptr<juce::ComboBox> presetBox;
    std::unique_ptr<juce::TextButton> saveButton;
    std::unique_ptr<juce::TextButton> revealButton;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (PresetComponent)
};

} // namespace veltrane
