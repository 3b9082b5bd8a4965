#include "PresetComponent.h"

#include "PanelLayout.h"
#include "../look/VeltraneLook.h"
#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

PresetComponent::PresetComponent()
{
    setName ("Preset Component");
    const juce::Colour accent (Palette::accent);

    presetBox = std::make_unique<juce::ComboBox> ("Preset Box");
    addAndMakeVisible (*presetBox);
    presetBox->setEditableText (true);
    presetBox->setJustificationType (juce::Justification::centredLeft);
    presetBox->setTextWhenNoChoicesAvailable ("(no choices)");
    presetBox->addListener (this);

    auto makeButton = [&] (const juce::String& name, const juce::String& text) {
        auto button = std::make_unique<juce::TextButton> (name, juce::String());
        addAndMakeVisible (*button);
        button->setButtonText (text);
        button->addListener (this);
        for (auto id : { juce::TextButton::buttonColourId, juce::TextButton::buttonOnColourId,
                         juce::TextButton::textColourOffId, juce::TextButton::textColourOnId })
            button->setColour (id, accent);
        return button;
    };

    saveButton = makeButton ("Save Button", "Save");
    revealButton = makeButton ("Reveal Button", "Show");

    setSize (400, 100);
    refreshRequested = true;

    presetBox->setColour (juce::ComboBox::backgroundColourId, juce::Colour (Palette::ground));
    presetBox->setColour (juce::ComboBox::textColourId, accent);
    presetBox->setColour (juce::ComboBox::outlineColourId, accent);
    presetBox->setColour (juce::ComboBox::buttonColourId, accent);
    presetBox->setColour (juce::TextEditor::highlightColourId, accent);
    presetBox->setColour (juce::TextEditor::highlightedTextColourId, juce::Colour (Palette::ground));
    presetBox->setColour (juce::TextEditor::focusedOutlineColourId, accent);
    presetBox->setColour (juce::TextEditor::shadowColourId, accent);

    presetBox->setTextWhenNothingSelected ("Init");
    saveButton->setClickingTogglesState (true);

    startTimer (50);
}

PresetComponent::~PresetComponent()
{
    stopTimer();
    presetBox = nullptr;
    saveButton = nullptr;
    revealButton = nullptr;
}

void PresetComponent::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();
    placeRelative (*presetBox, { 0.05f, 0.4f, 0.4f, 0.2f }, w, h);
    placeRelative (*saveButton, { 0.5f, 0.2f, 0.2f, 0.2f }, w, h);
    placeRelative (*revealButton, { 0.5f, 0.6f, 0.2f, 0.2f }, w, h);
}

void PresetComponent::timerCallback()
{
    if (processor == nullptr)
        return;

    if (processor->presetListChanged.load() || refreshRequested)
    {
        // The box is editable, so clearing the items keeps the text it shows.
        presetBox->clear (juce::dontSendNotification);

        const auto names = processor->getPresetNames();
        for (int i = 0; i < names.size(); ++i)
            presetBox->addItem (names[i], i + 1);

        processor->presetListChanged.store (false);
        refreshRequested = false;
    }

    // JUCE delivers the box's change message asynchronously: writing the processor's
    // name back before it arrives would lose what the user entered and request the
    // preset shown before. The box follows the processor only while the user is not
    // entering a name.
    if (! userIsEnteringName())
    {
        shownName = processor->getPresetName();
        presetBox->setText (shownName, juce::dontSendNotification);
    }

    if (saveButton->getToggleState())
        saveButton->setToggleState (false, juce::dontSendNotification);
}

void PresetComponent::comboBoxChanged (juce::ComboBox* box)
{
    if (box != presetBox.get())
        return;

    // The index is stored before the flag is raised, so the audio thread that sees
    // the flag also sees the index. A typed name matches no item and gives -1.
    processor->presetToLoad.store (presetBox->getSelectedId() - 1);
    processor->presetLoadPending.store (true);
    shownName = presetBox->getText();
    processor->setPresetName (shownName);
}

bool PresetComponent::userIsEnteringName() const
{
    for (auto* child : presetBox->getChildren())
        if (auto* text = dynamic_cast<juce::Label*> (child); text != nullptr && text->isBeingEdited())
            return true;

    return presetBox->getText() != shownName;
}

void PresetComponent::buttonClicked (juce::Button* button)
{
    if (button == saveButton.get())
    {
        if (saveButton->getToggleState())
            processor->savePreset();
    }
    else if (button == revealButton.get())
    {
        processor->revealPresetFolder();
    }
}

} // namespace veltrane
