#include "EnvelopeComponent.h"

#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

namespace
{
constexpr EnvelopePanelDifferences envelope1 { "Envelope1 Component", "ENV 1", Param::Envelope1Attack,
                                               Param::Envelope1Release, Param::Envelope1Sensitivity };
constexpr EnvelopePanelDifferences envelope2 { "Envelope2 Component", "ENV 2", Param::Envelope2Attack,
                                               Param::Envelope2Release, Param::Envelope2Sensitivity };
}

EnvelopeComponent::EnvelopeComponent (const EnvelopePanelDifferences& d) : differences (d)
{
    setName (d.componentName);

    setUpSlider (*this, attackSlider, "Attack Slider", *this);
    setUpCaption (*this, attackLabel, "Attack Label", "Attack");
    setUpSlider (*this, releaseSlider, "Release Slider", *this);
    setUpCaption (*this, releaseLabel, "Release Label", "Release");
    setUpSlider (*this, sensitivitySlider, "Sensitivity Slider", *this);
    setUpCaption (*this, sensitivityLabel, "Sensitivity Label", "Sensitivity");
    setUpCaption (*this, groupLabel, "Group Name", d.groupCaption);

    groupLabel.setJustificationType (juce::Justification::centredRight);
    groupLabel.removeColour (juce::Label::outlineColourId);

    setSize (800, 400);

    labelFont = makeCaptionFont (fontHeight);
    for (auto* label : { &attackLabel, &releaseLabel, &sensitivityLabel, &groupLabel })
        label->setFont (labelFont);

    defaultsPending = true;
    startTimer (50);
}

EnvelopeComponent::~EnvelopeComponent()
{
    stopTimer();
}

void EnvelopeComponent::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();
    auto place = [w, h] (juce::Component& c, RelativeBounds b) { placeRelative (c, b, w, h); };

    place (attackSlider,      { 0.05f, 0.2f, 0.3f, 0.6f });
    place (attackLabel,       { 0.05f, 0.78f, 0.3f, 0.12f });
    place (releaseSlider,     { 0.35f, 0.2f, 0.3f, 0.6f });
    place (releaseLabel,      { 0.35f, 0.78f, 0.3f, 0.12f });
    place (sensitivitySlider, { 0.65f, 0.2f, 0.3f, 0.6f });
    place (sensitivityLabel,  { 0.65f, 0.78f, 0.3f, 0.12f });
    place (groupLabel,        { 0.65f, 0.07f, 0.3f, 0.12f });

    if (const auto factor = fontScaleFactor (lastHeight, (float) h); factor > 0.0f)
    {
        scaleFont (labelFont, fontHeight, factor);
        for (auto* label : { &attackLabel, &releaseLabel, &sensitivityLabel, &groupLabel })
            label->setFont (labelFont);
        lastHeight = (float) h;
    }
}

void EnvelopeComponent::sliderValueChanged (juce::Slider* slider)
{
    const auto value = (float) slider->getValue();

    if (slider == &attackSlider)
        processor->setParameterFromControl (differences.attack, value, true);
    else if (slider == &releaseSlider)
        processor->setParameterFromControl (differences.release, value, true);
    else if (slider == &sensitivitySlider)
        processor->setParameterFromControl (differences.sensitivity, value, true);
}

void EnvelopeComponent::timerCallback()
{
    if (processor == nullptr)
        return;

    const std::pair<juce::Slider*, int> knobs[] { { &attackSlider, differences.attack },
                                                  { &releaseSlider, differences.release },
                                                  { &sensitivitySlider, differences.sensitivity } };

    if (defaultsPending)
    {
        for (const auto& [slider, index] : knobs)
            slider->setDoubleClickReturnValue (true, processor->getParameterRecord (index).defaultValue);
        defaultsPending = false;
    }

    for (const auto& [slider, index] : knobs)
        slider->setValue (processor->getParameter (index), juce::dontSendNotification);
}

Envelope1Component::Envelope1Component() : EnvelopeComponent (envelope1) {}
Envelope2Component::Envelope2Component() : EnvelopeComponent (envelope2) {}

} // namespace veltrane
