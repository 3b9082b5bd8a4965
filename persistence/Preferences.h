#pragma once

#include <juce_data_structures/juce_data_structures.h>

namespace veltrane
{

// The per-user preferences file shared by every instance: "LastWidth",
// "LastHeight" and one identifier + "CC" key per parameter, keys case-sensitive.
// On Linux JUCE keeps it as ~/.Tarnwell_Audio/Veltrane.prefs.
juce::PropertiesFile::Options preferencesOptions();

constexpr char lastWidthKey[] = "LastWidth";
constexpr char lastHeightKey[] = "LastHeight";
constexpr float defaultEditorWidth = 1000.0f;
constexpr float defaultEditorHeight = 500.0f;

} // namespace veltrane
