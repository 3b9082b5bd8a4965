#include "PluginParameter.h"

#include <cmath>

namespace veltrane
{

void PluginParameter::initialise (const ParameterRow& row)
{
    minimum = row.minimum;
    maximum = row.maximum;
    isDiscrete = row.choices != nullptr;
    choices = row.choices;
    name = row.identifier;
    label = row.label;
    isSkewed = row.law != Law::straight;
    rootSkew = row.law == Law::root;

    if (minimum <= row.defaultPhysical && row.defaultPhysical <= maximum)
        defaultValue = physicalToNormalised (row.defaultPhysical);

    value.exchange (defaultValue);
    currentValue.store (value.load());
    physicalValue.store (normalisedToPhysical (currentValue.load()));
}

bool PluginParameter::setNormalised (float newValue) noexcept
{
    if (! (newValue >= 0.0f && newValue <= 1.0f))
        return false;

    value.exchange (newValue);
    const auto taken = value.load();
    currentValue.store (taken, std::memory_order_relaxed);
    physicalValue.store (normalisedToPhysical (taken), std::memory_order_relaxed);
    return true;
}

float PluginParameter::normalisedToPhysical (float v) const noexcept
{
    const auto range = maximum - minimum;

    if (! isSkewed)
        return minimum + range * v;

    return rootSkew ? minimum + range * std::sqrt (v)
                    : minimum + range * v * v;
}

float PluginParameter::physicalToNormalised (float physical) const noexcept
{
    const auto n = (physical - minimum) / (maximum - minimum);

    if (! isSkewed)
        return n;

    return rootSkew ? n * n : std::sqrt (n);
}

juce::String PluginParameter::textForValue (float normalised) const
{
    const auto physical = normalisedToPhysical (normalised);

    if (! isDiscrete)
        return juce::String ((double) physical, 2) + " " + label;

    const auto index = (int) physical;

    if (choices == nullptr || index < 0 || index >= choices->size)
        return {};

    return choices->entries[index];
}

} // namespace veltrane
