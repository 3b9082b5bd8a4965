#include "DelayComponent.h"

#include "../look/VeltraneLook.h"
#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

namespace
{
constexpr int sourceSteps = 6;   // seven modulation sources

constexpr DelayPanelDifferences delay1 { "Delay 1", Param::Delay1Time, 1 };
constexpr DelayPanelDifferences delay2 { "Delay 2", Param::Delay2Time, 2 };

// Bars of the painted numerals, in drawing order: stem, four serifs, second stem.
constexpr RelativeBounds numeralOne[] { { 0.89f, 0.07f, 0.01f, 0.2f },
                                        { 0.86f, 0.07f, 0.02f, 0.04f }, { 0.86f, 0.23f, 0.02f, 0.04f },
                                        { 0.9f, 0.07f, 0.02f, 0.04f }, { 0.9f, 0.23f, 0.02f, 0.04f } };
constexpr RelativeBounds numeralTwo[] { { 0.89f, 0.07f, 0.01f, 0.2f },
                                        { 0.85f, 0.07f, 0.02f, 0.04f }, { 0.85f, 0.23f, 0.02f, 0.04f },
                                        { 0.9f, 0.07f, 0.02f, 0.04f }, { 0.9f, 0.23f, 0.02f, 0.04f },
                                        { 0.87f, 0.07f, 0.01f, 0.2f } };
}

DelayComponent::DelayComponent (const DelayPanelDifferences& d)
    : differences (d),
      bindings { { { &timeSlider, d.firstParameter + 0, 0 },
                   { &feedbackSlider, d.firstParameter + 1, 0 },
                   { &timeModSlider, d.firstParameter + 2, 0 },
                   { &feedbackModSlider, d.firstParameter + 4, 0 },
                   { &timeModSrcSlider, d.firstParameter + 3, sourceSteps },
                   { &feedbackModSrcSlider, d.firstParameter + 5, sourceSteps },
                   { &gainSlider, d.firstParameter + 6, 0 } } }
{
    setName (d.componentName);

    setUpSlider (*this, timeSlider, "Time Slider", *this);
    setUpCaption (*this, timeLabel, "Time Label", "Time");
    setUpSlider (*this, feedbackSlider, "Feedback Slider", *this);
    setUpCaption (*this, feedbackLabel, "Feedback Label", "Feedback");
    setUpSlider (*this, timeModSlider, "TimeMod Slider", *this);
    setUpCaption (*this, timeModLabel, "TimeMod Label", "Mod");
    setUpSlider (*this, feedbackModSlider, "FeedbackMod Slider", *this);
    setUpCaption (*this, feedbackModLabel, "FeedbackMod Label", "Mod");
    setUpSlider (*this, timeModSrcSlider, "TimeModSrc Slider", *this);
    setUpCaption (*this, timeModSrcLabel, "TimeModSrc Label", {});
    setUpSlider (*this, feedbackModSrcSlider, "FeedbackModSrc Slider", *this);
    setUpCaption (*this, feedbackModSrcLabel, "FeedbackModSrc Label", {});
    setUpSlider (*this, gainSlider, "Gain Slider", *this, 0, juce::Slider::LinearVertical);
    setUpCaption (*this, gainLabel, "Gain Label", "Gain");

    gainSlider.setColour (juce::Slider::trackColourId, juce::Colour (0x00FFFFFF));
    gainSlider.setColour (juce::Slider::rotarySliderOutlineColourId, juce::Colour (0x00000000));
    gainSlider.setColour (juce::Slider::textBoxOutlineColourId, juce::Colour (0x00808080));

    setSize (500, 250);
    timeModSrcSlider.setRange (0.0, sourceSteps, 1.0);
    feedbackModSrcSlider.setRange (0.0, sourceSteps, 1.0);

    labelFont = makeCaptionFont (fontHeight);
    for (auto* label : { &timeLabel, &feedbackLabel, &timeModLabel, &feedbackModLabel,
                         &timeModSrcLabel, &feedbackModSrcLabel, &gainLabel })
        label->setFont (labelFont);

    defaultsPending = true;
    startTimer (50);
}

DelayComponent::~DelayComponent()
{
    stopTimer();
}

void DelayComponent::paint (juce::Graphics& g)
{
    g.setColour (juce::Colour (Palette::accent));

    auto fillBars = [&] (const auto& bars) {
        const auto w = (float) getWidth();
        const auto h = (float) getHeight();
        for (const auto& bar : bars)
            g.fillRect (juce::roundToInt (bar.x * w), juce::roundToInt (bar.y * h),
                        juce::roundToInt (bar.width * w), juce::roundToInt (bar.height * h));
    };

    if (differences.numeral == 1)
        fillBars (numeralOne);
    else
        fillBars (numeralTwo);
}

void DelayComponent::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();
    auto place = [w, h] (juce::Component& c, RelativeBounds b) { placeRelative (c, b, w, h); };

    place (timeSlider,           { 0.05f, 0.048f, 0.25f, 0.248f });
    place (timeLabel,            { 0.05f, 0.312f, 0.25f, 0.06f });
    place (feedbackSlider,       { 0.05f, 0.6f, 0.25f, 0.248f });
    place (feedbackLabel,        { 0.05f, 0.86f, 0.25f, 0.06f });
    place (timeModSlider,        { 0.3f, 0.048f, 0.25f, 0.248f });
    place (timeModLabel,         { 0.3f, 0.312f, 0.25f, 0.06f });
    place (feedbackModSlider,    { 0.3f, 0.6f, 0.25f, 0.248f });
    place (feedbackModLabel,     { 0.3f, 0.86f, 0.25f, 0.06f });
    place (timeModSrcSlider,     { 0.55f, 0.048f, 0.25f, 0.248f });
    place (timeModSrcLabel,      { 0.55f, 0.312f, 0.25f, 0.06f });
    place (feedbackModSrcSlider, { 0.55f, 0.6f, 0.25f, 0.248f });
    place (feedbackModSrcLabel,  { 0.55f, 0.86f, 0.25f, 0.06f });
    place (gainSlider,           { 0.864f, 0.312f, 0.04f, 0.54f });
    place (gainLabel,            { 0.81f, 0.86f, 0.15f, 0.06f });

    if (const auto factor = fontScaleFactor (lastHeight, (float) h); factor > 0.0f)
    {
        scaleFont (labelFont, fontHeight, factor);
        for (auto* label : { &timeLabel, &feedbackLabel, &timeModLabel, &feedbackModLabel,
                             &timeModSrcLabel, &feedbackModSrcLabel, &gainLabel })
            label->setFont (labelFont);
        lastHeight = (float) h;
    }
}

void DelayComponent::sliderValueChanged (juce::Slider* slider)
{
    for (const auto& binding : bindings)
    {
        if (binding.slider != slider)
            continue;

        auto value = slider->getValue();
        if (binding.choiceSteps > 0)
            value /= binding.choiceSteps;
        processor->setParameterFromControl (binding.parameter, (float) value, true);
        return;
    }
}

void DelayComponent::timerCallback()
{
    if (processor == nullptr)
        return;

    if (defaultsPending)
    {
        for (const auto& binding : bindings)
            binding.slider->setDoubleClickReturnValue (true, processor->getParameterRecord (binding.parameter).defaultValue
                                                                 * (float) juce::jmax (1, binding.choiceSteps));
        defaultsPending = false;
    }

    for (const auto& binding : bindings)
        binding.slider->setValue (processor->getParameter (binding.parameter) * (float) juce::jmax (1, binding.choiceSteps),
                                  juce::dontSendNotification);

    timeModSrcLabel.setText (processor->getParameterText (differences.firstParameter + 3), juce::dontSendNotification);
    feedbackModSrcLabel.setText (processor->getParameterText (differences.firstParameter + 5), juce::dontSendNotification);
}

Delay1Component::Delay1Component() : DelayComponent (delay1) {}
Delay2Component::Delay2Component() : DelayComponent (delay2) {}

} // namespace veltrane
