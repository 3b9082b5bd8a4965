#pragma once

#include "../plugin/ParameterTable.h"

#include <juce_core/juce_core.h>

#include <array>
#include <optional>

namespace veltrane
{

// The host state: "VC2!", the text length N as a 32-bit little-endian integer, N
// bytes of one-line XML (a "VELTRANE_STATE" element holding "PresetName" and, per
// parameter in index order, its normalised value and its controller under the
// identifier + "CC"), then one zero byte. The same bytes serve every plug-in format.
// Plain functions: the processor gathers and applies the values.

using ParameterValues = std::array<float, Param::count>;           // normalised
using MidiControllers = std::array<int, Param::count>;             // -1 for none

// What a state holds, with the defaults for absent attributes already taken.
struct StateContents
{
    juce::String presetName;                                        // " " when absent
    std::array<std::optional<double>, Param::count> values;         // absent: keep the current value
    MidiControllers midiControllers;                                // absent: -1
};

juce::MemoryBlock writeStateChunk (const juce::String& presetName,
                                   const ParameterValues& values,
                                   const MidiControllers& midiControllers);

// Nothing for a block that is shorter than 9 bytes, lacks the magic, has a length
// field of 0 or less, holds more than maxDocumentBytes of text, is not XML or has
// another root tag (compared ignoring case). A length beyond the data is clipped.
std::optional<StateContents> readStateChunk (const void* data, int sizeInBytes);

// The state's XML text as it stands in the chunk.
juce::String createStateText (const juce::String& presetName,
                              const ParameterValues& values,
                              const MidiControllers& midiControllers);

// The identifier + "CC" key of a parameter's controller, in states and preferences.
juce::String controllerKey (int index);

} // namespace veltrane
