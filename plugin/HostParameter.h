#pragma once

#include <juce_audio_processors/juce_audio_processors.h>

namespace veltrane
{

class VeltraneAudioProcessor;

// What the host sees of one parameter: name, text, default, steps and value all
// come from the processor's record at the same index. The text already ends in
// the unit ("120.00 Ms"), so the separate unit label stays empty.
//
// The identifier doubles as the parameter ID, which names the parameter in LV2
// (JUCE would otherwise derive LV2 names from the index and give ten parameters the
// same one). VST2 and VST3 address parameters by index.
class HostParameter final : public juce::AudioProcessorParameterWithID
{
public:
    HostParameter (VeltraneAudioProcessor& owner, int tableIndex);

    float getValue() const override;
    void setValue (float newValue) override;
    float getDefaultValue() const override;
    juce::String getName (int maximumStringLength) const override;
    juce::String getLabel() const override { return {}; }
    juce::String getText (float normalisedValue, int maximumStringLength) const override;
    // A choice entry, or a number in the parameter's unit ("25", "25 %"); any other
    // text keeps the current value.
    float getValueForText (const juce::String& text) const override;
    bool isDiscrete() const override;
    bool isBoolean() const override;
    int getNumSteps() const override;
    juce::StringArray getAllValueStrings() const override;

private:
    VeltraneAudioProcessor& processor;
    const int index;
};

} // namespace veltrane
