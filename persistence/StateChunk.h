#pragma once

#include "SafeXml.h"
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
// another root tag (compared ignoring case). A length beyond the data is clipped;
// attributes of other names are ignored, however many.
std::optional<StateContents> readStateChunk (const void* data, int sizeInBytes);

// The state's XML text as it stands in the chunk.
juce::String createStateText (const juce::String& presetName,
                              const ParameterValues& values,
                              const MidiControllers& midiControllers);

// Longest preset name kept, in characters; names are cut to it wherever they come
// in: typed, loaded from a preset or restored from a state. JUCE writes every
// character beyond ASCII as a character number of up to ten bytes ("&#1114111;"),
// so a state with the longest name stays well within what the reader takes, and
// whatever the plug-in writes, it reads back. JUCE's parser also takes time growing
// with the square of the character numbers in one value (1.5 s for 100,000), so
// the bound is kept where the largest state still reads in milliseconds. No file
// name comes near it.
constexpr int maxPresetNameLength = 10000;
// Everything else in a state takes under 3 kB.
static_assert (10 * maxPresetNameLength + 16384 <= maxDocumentBytes, "a state must stay readable");

juce::String limitPresetName (const juce::String& name);

// The identifier + "CC" key of a parameter's controller, in states and preferences.
juce::String controllerKey (int index);

} // namespace veltrane
