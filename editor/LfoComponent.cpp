#include "LfoComponent.h"

#include "../look/VeltraneLook.h"
#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

namespace
{
constexpr int syncedRateSteps = 17;   // eighteen tempo divisions
constexpr int waveSteps = 5;          // six waves

// Offsets from the panel's first parameter.
constexpr int waveOffset = 0, rateOffset = 1, syncOffset = 2, syncedRateOffset = 3;

constexpr LfoPanelDifferences lfo1 { "Lfo1 Component", "LFO 1", Param::LFO1Wave };
constexpr LfoPanelDifferences lfo2 { "Lfo2 Component", "LFO 2", Param::LFO2Wave };
}

LfoComponent::LfoComponent (const LfoPanelDifferences& d) : differences (d)
{
    setName (d.componentName);

    setUpSlider (*this, rateSlider, "Rate Slider", *this);
    setUpSlider (*this, syncedRateSlider, "Synced Rate Slider", *this, syncedRateSteps);
    setUpCaption (*this, rateLabel, "Rate Label", "Rate");
    setUpCaption (*this, syncedRateLabel, "Synced Rate Label", {});
    setUpSlider (*this, waveSlider, "Wave Slider", *this, waveSteps);
    setUpCaption (*this, waveLabel, "Wave Label", {});
    setUpCaption (*this, groupLabel, "Group Name", d.groupCaption);
    setUpToggle (*this, syncButton, "Sync Button", *this);
    setUpCaption (*this, syncLabel, "Sync Label", "Sync");

    groupLabel.setJustificationType (juce::Justification::centredRight);
    groupLabel.removeColour (juce::Label::outlineColourId);
    syncButton.setColour (juce::TextButton::textColourOnId, juce::Colour (Palette::accent));
    syncButton.setColour (juce::TextButton::textColourOffId, juce::Colour (0x00000000));

    setSize (800, 400);

    labelFont = makeCaptionFont (fontHeight);
    for (auto* label : { &rateLabel, &syncedRateLabel, &waveLabel, &groupLabel, &syncLabel })
        label->setFont (labelFont);

    syncButton.setClickingTogglesState (true);
    applySyncDisplayRule();

    defaultsPending = true;
    startTimer (50);
}

LfoComponent::~LfoComponent()
{
    stopTimer();
}

void LfoComponent::applySyncDisplayRule()
{
    const auto on = syncButton.getToggleState();
    rateSlider.setVisible (! on);
    rateLabel.setVisible (! on);
    syncedRateSlider.setVisible (on);
    syncedRateLabel.setVisible (on);
}

void LfoComponent::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();
    auto place = [w, h] (juce::Component& c, RelativeBounds b) { placeRelative (c, b, w, h); };

    place (rateSlider,       { 0.65f, 0.2f, 0.3f, 0.6f });
    place (syncedRateSlider, { 0.65f, 0.2f, 0.3f, 0.6f });
    place (rateLabel,        { 0.65f, 0.78f, 0.3f, 0.12f });
    place (syncedRateLabel,  { 0.65f, 0.78f, 0.3f, 0.12f });
    place (waveSlider,       { 0.05f, 0.2f, 0.3f, 0.6f });
    place (waveLabel,        { 0.05f, 0.78f, 0.3f, 0.12f });
    place (groupLabel,       { 0.65f, 0.07f, 0.3f, 0.12f });
    place (syncButton,       { 0.45f, 0.4f, 0.1f, 0.2f });
    place (syncLabel,        { 0.35f, 0.78f, 0.3f, 0.12f });

    if (const auto factor = fontScaleFactor (lastHeight, (float) h); factor > 0.0f)
    {
        scaleFont (labelFont, fontHeight, factor);
        for (auto* label : { &rateLabel, &syncedRateLabel, &waveLabel, &groupLabel, &syncLabel })
            label->setFont (labelFont);
        lastHeight = (float) h;
    }
}

void LfoComponent::sliderValueChanged (juce::Slider* slider)
{
    const auto k = differences.firstParameter;
    const auto value = slider->getValue();

    if (slider == &rateSlider)
        processor->setParameterFromControl (k + rateOffset, (float) value, true);
    else if (slider == &syncedRateSlider)
        processor->setParameterFromControl (k + syncedRateOffset, (float) (value / syncedRateSteps), true);
    else if (slider == &waveSlider)
        processor->setParameterFromControl (k + waveOffset, (float) (value / waveSteps), true);
}

void LfoComponent::buttonClicked (juce::Button* button)
{
    if (button != &syncButton)
        return;

    const auto on = syncButton.getToggleState();
    applySyncDisplayRule();
    processor->setParameterFromControl (differences.firstParameter + syncOffset, on ? 1.0f : 0.0f, true);
}

void LfoComponent::timerCallback()
{
    if (processor == nullptr)
        return;

    const auto k = differences.firstParameter;

    if (defaultsPending)
    {
        waveSlider.setDoubleClickReturnValue (true, waveSteps * processor->getParameterRecord (k + waveOffset).defaultValue);
        rateSlider.setDoubleClickReturnValue (true, processor->getParameterRecord (k + rateOffset).defaultValue);
        syncedRateSlider.setDoubleClickReturnValue (true, syncedRateSteps
                                                              * processor->getParameterRecord (k + syncedRateOffset).defaultValue);
        defaultsPending = false;
    }

    waveSlider.setValue (waveSteps * processor->getParameter (k + waveOffset), juce::dontSendNotification);
    waveLabel.setText (processor->getParameterText (k + waveOffset), juce::dontSendNotification);

    // Only exactly 1.0 means on, as for the engine.
    const auto syncOn = (int) processor->getParameter (k + syncOffset) != 0;
    if (syncOn != syncButton.getToggleState())
    {
        syncButton.setToggleState (syncOn, juce::dontSendNotification);
        applySyncDisplayRule();
    }

    rateSlider.setValue (processor->getParameter (k + rateOffset), juce::dontSendNotification);
    syncedRateSlider.setValue (syncedRateSteps * processor->getParameter (k + syncedRateOffset), juce::dontSendNotification);
    syncedRateLabel.setText (processor->getParameterText (k + syncedRateOffset), juce::dontSendNotification);
}

Lfo1Component::Lfo1Component() : LfoComponent (lfo1) {}
Lfo2Component::Lfo2Component() : LfoComponent (lfo2) {}

} // namespace veltrane
