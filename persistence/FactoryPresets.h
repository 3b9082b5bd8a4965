#pragma once

#include <juce_core/juce_core.h>

namespace veltrane
{

// Writes the presets built into the plug-in into folder, each under its own file
// name, leaving any file already there alone. The preset library calls it only
// when it has just created the folder, so a preset that the user deletes or
// changes afterwards is never brought back.
void writeFactoryPresets (const juce::File& folder);

} // namespace veltrane
