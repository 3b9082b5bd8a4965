#include "MidiComponent.h"

#include "PanelLayout.h"
#include "../look/VeltraneLook.h"
#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

MidiComponent::MidiComponent()
{
    const juce::Colour accent (Palette::accent);

    auto makeSwitch = [&] (std::unique_ptr<juce::TextButton>& button, const juce::String& buttonName,
                           std::unique_ptr<juce::Label>& label, const juce::String& labelName,
                           const juce::String& caption) {
        button = std::make_unique<juce::TextButton> (buttonName, juce::String());
        addAndMakeVisible (*button);
        button->setButtonText ({});
        button->addListener (this);
        button->setColour (juce::TextButton::buttonColourId, accent);
        button->setColour (juce::TextButton::buttonOnColourId, accent);

        label = std::make_unique<juce::Label> (labelName, caption);
        addAndMakeVisible (*label);
        label->setFont (juce::Font (15.0f, juce::Font::plain));
        label->setJustificationType (juce::Justification::centredLeft);
        label->setEditable (false, false, false);
        label->setColour (juce::Label::textColourId, accent);
        label->setColour (juce::Label::outlineColourId, juce::Colour (0x00FF7F50));
        label->setColour (juce::TextEditor::textColourId, juce::Colour (0xFF000000));
        label->setColour (juce::TextEditor::backgroundColourId, juce::Colour (0x00000000));
    };

    makeSwitch (learnButton, "Learn button", learnLabel, "Learn label", "LEARN");
    makeSwitch (unlearnButton, "Unlearn Button", unlearnLabel, "Unlearn Label", "UNLEARN");
    makeSwitch (clearButton, "Clear Button", clearLabel, "Clear Label", "CLEAR");

    fontHeight = 15.0f;
    lastHeight = 50.0f;
    setSize (400, 50);

    labelFont = makeCaptionFont (fontHeight);
    for (auto* label : { learnLabel.get(), unlearnLabel.get(), clearLabel.get() })
        label->setFont (labelFont);

    for (auto* button : { learnButton.get(), unlearnButton.get(), clearButton.get() })
        button->setClickingTogglesState (true);

    startTimer (50);
}

MidiComponent::~MidiComponent()
{
    stopTimer();
    learnButton = nullptr;
    learnLabel = nullptr;
    unlearnButton = nullptr;
    unlearnLabel = nullptr;
    clearButton = nullptr;
    clearLabel = nullptr;
}

void MidiComponent::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();
    placeRelative (*learnButton,   { 0.1f, 0.3f, 0.05f, 0.4f }, w, h);
    placeRelative (*learnLabel,    { 0.15f, 0.1f, 0.15f, 0.8f }, w, h);
    placeRelative (*unlearnButton, { 0.4f, 0.3f, 0.05f, 0.4f }, w, h);
    placeRelative (*unlearnLabel,  { 0.45f, 0.1f, 0.15f, 0.8f }, w, h);
    placeRelative (*clearButton,   { 0.7f, 0.3f, 0.05f, 0.4f }, w, h);
    placeRelative (*clearLabel,    { 0.75f, 0.1f, 0.15f, 0.8f }, w, h);

    if (const auto factor = fontScaleFactor (lastHeight, (float) h); factor > 0.0f)
    {
        scaleFont (labelFont, fontHeight, factor);
        for (auto* label : { learnLabel.get(), unlearnLabel.get(), clearLabel.get() })
            label->setFont (labelFont);
        lastHeight = (float) h;
    }
}

void MidiComponent::buttonClicked (juce::Button* button)
{
    if (button == learnButton.get())
        processor->midiLearnActive.store (learnButton->getToggleState());
    else if (button == unlearnButton.get())
        processor->midiUnlearnActive.store (unlearnButton->getToggleState());
    else if (button == clearButton.get())
        processor->midiClearPending.store (true);
}

void MidiComponent::timerCallback()
{
    if (processor != nullptr)
        clearButton->setToggleState (processor->midiClearPending.load(), juce::dontSendNotification);
}

} // namespace veltrane
