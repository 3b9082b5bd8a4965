#include "HostParameter.h"

#include "VeltraneAudioProcessor.h"

namespace veltrane
{

HostParameter::HostParameter (VeltraneAudioProcessor& owner, int tableIndex)
    : juce::AudioProcessorParameterWithID (juce::ParameterID (parameterTable[(size_t) tableIndex].identifier, 1),
                                           parameterTable[(size_t) tableIndex].identifier),
      processor (owner),
      index (tableIndex)
{
}

float HostParameter::getValue() const
{
    return processor.getParameterRecord (index).currentValue.load (std::memory_order_relaxed);
}

void HostParameter::setValue (float newValue)
{
    processor.setParameter (index, newValue);
}

float HostParameter::getDefaultValue() const
{
    return processor.getParameterRecord (index).defaultValue;
}

juce::String HostParameter::getName (int maximumStringLength) const
{
    return processor.getParameterRecord (index).name.substring (0, maximumStringLength);
}

juce::String HostParameter::getText (float normalisedValue, int maximumStringLength) const
{
    return processor.getParameterRecord (index).textForValue (normalisedValue).substring (0, maximumStringLength);
}

float HostParameter::getValueForText (const juce::String& text) const
{
    const auto& record = processor.getParameterRecord (index);

    if (record.isDiscrete)
    {
        const auto count = record.numChoices();

        for (int i = 0; i < count; ++i)
            if (text.trim().equalsIgnoreCase (record.choices->entries[i]))
                return count > 1 ? (float) i / (float) (count - 1) : 0.0f;

        return record.currentValue.load();
    }

    // getFloatValue reads text without a number as 0, which would jump the
    // parameter to (or towards) its minimum: such text leaves the value alone.
    const auto trimmed = text.trim();
    auto start = trimmed.getCharPointer();
    if (*start == '+' || *start == '-')
        ++start;
    if (*start == '.')
        ++start;
    if (! start.isDigit())
        return record.currentValue.load();

    const auto physical = juce::jlimit (record.minimum, record.maximum, trimmed.getFloatValue());
    return juce::jlimit (0.0f, 1.0f, record.physicalToNormalised (physical));
}

bool HostParameter::isDiscrete() const
{
    return processor.getParameterRecord (index).isDiscrete;
}

bool HostParameter::isBoolean() const
{
    return processor.getParameterRecord (index).choices == &Choices::offOn;
}

int HostParameter::getNumSteps() const
{
    const auto& record = processor.getParameterRecord (index);
    return record.isDiscrete ? record.numChoices() : AudioProcessorParameter::getNumSteps();
}

juce::StringArray HostParameter::getAllValueStrings() const
{
    const auto& record = processor.getParameterRecord (index);
    juce::StringArray texts;

    for (int i = 0; i < record.numChoices(); ++i)
        texts.add (record.choices->entries[i]);

    return texts;
}

} // namespace veltrane
