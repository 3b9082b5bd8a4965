#pragma once

#include "ParameterTable.h"

#include <juce_core/juce_core.h>

#include <atomic>

namespace veltrane
{

// One of the 33 parameters. The normalised value is the authoritative slot; the
// copies beside it are what the engine and the editor read. Every field that more
// than one thread touches is atomic, so each float or int is seen whole.
struct PluginParameter
{
    std::atomic<float> value { 0.0f };          // normalised, in [0, 1]
    std::atomic<float> currentValue { 0.0f };   // copy of value: what getParameter returns
    std::atomic<float> physicalValue { 0.0f };  // currentValue mapped by the law
    float minimum = 0.0f;
    float maximum = 1.0f;
    float defaultValue = 0.0f;                  // normalised
    bool isDiscrete = false;
    std::atomic<int> midiController { -1 };     // learned controller 0..127, -1 for none
    std::atomic<bool> learnArmed { false };     // takes the next controller number in learn mode
    juce::String name { "Parameter" };
    juce::String label;
    bool isSkewed = false;
    bool rootSkew = false;                      // with isSkewed: root law instead of square law
    const ChoiceList* choices = nullptr;

    // Takes bounds, law and texts from a table row and sets the value to the default.
    void initialise (const ParameterRow& row);

    // Stores a normalised value in [0, 1]; anything else (NaN included) is ignored.
    // Returns whether the value was taken.
    bool setNormalised (float newValue) noexcept;

    float normalisedToPhysical (float normalised) const noexcept;
    float physicalToNormalised (float physical) const noexcept;

    // Display text for a normalised value: "120.00 Ms" or a choice entry.
    juce::String textForValue (float normalised) const;
    juce::String getText() const { return textForValue (currentValue.load (std::memory_order_relaxed)); }

    // Choice index the engine and the display use: trunc of the physical value.
    int choiceIndex() const noexcept { return (int) physicalValue.load (std::memory_order_relaxed); }
    int numChoices() const noexcept { return choices != nullptr ? choices->size : 0; }
};

} // namespace veltrane
