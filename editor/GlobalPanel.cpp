#include "GlobalPanel.h"

#include "../look/VeltraneLook.h"
#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

namespace
{
constexpr int mixModeSteps = 6;      // seven mix modes
constexpr int waveshaperSteps = 3;   // four waveshaper types
constexpr double firstBoostedType = 2.0;   // "Hard Clipper"; "Dirt" follows
}

GlobalPanel::GlobalPanel()
{
    setName ("Global Panel");

    setUpCaption (*this, lastNameLabel, "Last Parameter Name", "Last tweaked parameter");
    setUpCaption (*this, lastValueLabel, "Last Parameter Value", "Value");
    setUpSlider (*this, mixModeSlider, "Mix Mode Slider", *this, mixModeSteps);
    setUpCaption (*this, mixModeLabel, "Mix Mode Label", "\n");
    setUpSlider (*this, dryWetSlider, "Dry Wet Slider", *this);
    setUpCaption (*this, dryWetLabel, "Dry Wet Label", "Dry / Wet");
    setUpToggle (*this, randomButton, "Random Button", *this);
    setUpCaption (*this, randomLabel, "Random Label", "Random");
    setUpSlider (*this, waveshaperSlider, "Waveshaper Slider", *this, waveshaperSteps);
    setUpCaption (*this, waveshaperLabel, "Waveshaper Label", "\n");
    setUpSlider (*this, boostSlider, "Boost Slider", *this);
    setUpCaption (*this, boostLabel, "Boost Label", "Boost");

    for (auto* bar : { &lastNameLabel, &lastValueLabel })
    {
        bar->setColour (juce::Label::backgroundColourId, juce::Colour (Palette::accent));
        bar->setColour (juce::Label::textColourId, juce::Colour (Palette::ground));
        bar->removeColour (juce::Label::outlineColourId);
    }

    for (auto* caption : { &mixModeLabel, &dryWetLabel, &randomLabel, &waveshaperLabel, &boostLabel })
        caption->setColour (juce::Label::backgroundColourId, juce::Colour (0x00FF7F50));

    setSize (240, 540);

    labelFont = makeCaptionFont (fontHeight);
    displayFont = makeCaptionFont (displayFontHeight);
    lastNameLabel.setFont (displayFont);
    lastValueLabel.setFont (displayFont);
    for (auto* caption : { &mixModeLabel, &dryWetLabel, &randomLabel, &waveshaperLabel, &boostLabel })
        caption->setFont (labelFont);

    randomButton.setClickingTogglesState (true);
    applyBoostRule();

    defaultsPending = true;
    startTimer (50);
}

GlobalPanel::~GlobalPanel()
{
    stopTimer();
}

void GlobalPanel::applyBoostRule()
{
    const auto boosted = waveshaperSlider.getValue() >= firstBoostedType;
    boostSlider.setVisible (boosted);
    boostLabel.setVisible (boosted);
}

void GlobalPanel::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();
    auto place = [w, h] (juce::Component& c, RelativeBounds b) { placeRelative (c, b, w, h); };

    // The two display bars touch: 0.05 + 0.0593 = 0.1093.
    place (lastNameLabel,    { 0.1f, 0.05f, 0.8f, 0.0593f });
    place (lastValueLabel,   { 0.1f, 0.1093f, 0.8f, 0.0593f });
    place (mixModeSlider,    { 0.1f, 0.3f, 0.4f, 0.1f });
    place (mixModeLabel,     { 0.1f, 0.4f, 0.4f, 0.0407f });
    place (dryWetSlider,     { 0.5f, 0.3f, 0.4f, 0.1f });
    place (dryWetLabel,      { 0.5f, 0.4f, 0.4f, 0.0407f });
    place (randomButton,     { 0.4f, 0.5f, 0.2f, 0.0796f });
    place (randomLabel,      { 0.3708f, 0.6f, 0.2583f, 0.0407f });
    place (waveshaperSlider, { 0.1f, 0.7f, 0.4f, 0.1f });
    place (waveshaperLabel,  { 0.1f, 0.8f, 0.4f, 0.0407f });
    place (boostSlider,      { 0.5f, 0.7f, 0.4f, 0.1f });
    place (boostLabel,       { 0.5f, 0.8f, 0.4f, 0.0407f });

    if (const auto factor = fontScaleFactor (lastHeight, (float) h); factor > 0.0f)
    {
        scaleFont (labelFont, fontHeight, factor);
        scaleFont (displayFont, displayFontHeight, factor);
        lastNameLabel.setFont (displayFont);
        lastValueLabel.setFont (displayFont);
        for (auto* caption : { &mixModeLabel, &dryWetLabel, &randomLabel, &waveshaperLabel, &boostLabel })
            caption->setFont (labelFont);
        lastHeight = (float) h;
    }
}

void GlobalPanel::sliderValueChanged (juce::Slider* slider)
{
    const auto value = slider->getValue();

    if (slider == &mixModeSlider)
        processor->setParameterFromControl (Param::MixMode, (float) (value / mixModeSteps), true);
    else if (slider == &dryWetSlider)
        processor->setParameterFromControl (Param::DryWet, (float) value, true);
    else if (slider == &waveshaperSlider)
        processor->setParameterFromControl (Param::Waveshaper, (float) (value / waveshaperSteps), true);
    else if (slider == &boostSlider)
        processor->setParameterFromControl (Param::WaveshaperAmount, (float) value, true);
}

void GlobalPanel::buttonClicked (juce::Button* button)
{
    if (button == &randomButton)
        processor->setParameterFromControl (Param::Randomize, randomButton.getToggleState() ? 1.0f : 0.0f, true);
}

void GlobalPanel::timerCallback()
{
    if (processor == nullptr)
        return;

    if (defaultsPending)
    {
        mixModeSlider.setDoubleClickReturnValue (true, mixModeSteps * processor->getParameterRecord (Param::MixMode).defaultValue);
        dryWetSlider.setDoubleClickReturnValue (true, processor->getParameterRecord (Param::DryWet).defaultValue);
        waveshaperSlider.setDoubleClickReturnValue (true, waveshaperSteps
                                                              * processor->getParameterRecord (Param::Waveshaper).defaultValue);
        boostSlider.setDoubleClickReturnValue (true, processor->getParameterRecord (Param::WaveshaperAmount).defaultValue);
        defaultsPending = false;
    }

    const auto last = processor->getLastParameter();
    lastNameLabel.setText (last.name, juce::dontSendNotification);
    lastValueLabel.setText (last.text, juce::dontSendNotification);

    // Before the waveshaper knob is refreshed below, so Boost follows a change from
    // elsewhere one tick after the knob.
    applyBoostRule();

    mixModeSlider.setValue (mixModeSteps * processor->getParameter (Param::MixMode), juce::dontSendNotification);
    mixModeLabel.setText (processor->getParameterText (Param::MixMode), juce::dontSendNotification);
    dryWetSlider.setValue (processor->getParameter (Param::DryWet), juce::dontSendNotification);
    waveshaperSlider.setValue (waveshaperSteps * processor->getParameter (Param::Waveshaper), juce::dontSendNotification);
    waveshaperLabel.setText (processor->getParameterText (Param::Waveshaper), juce::dontSendNotification);
    boostSlider.setValue (processor->getParameter (Param::WaveshaperAmount), juce::dontSendNotification);
    randomButton.setToggleState (processor->getParameter (Param::Randomize) != 0.0f, juce::dontSendNotification);
}

} // namespace veltrane
