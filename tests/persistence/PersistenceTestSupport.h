#pragma once

#include "plugin/VeltraneAudioProcessor.h"

#include <juce_audio_processors/juce_audio_processors.h>

#include <optional>

namespace veltrane::test
{

// Records the parameter changes the processor reports, as a host wrapper hears them.
struct ParameterChangeRecorder final : juce::AudioProcessorListener
{
    juce::Array<int> changedIndices;

    void audioProcessorParameterChanged (juce::AudioProcessor*, int index, float) override { changedIndices.add (index); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
};

// One stereo block of silence carrying the given MIDI events.
inline void processBlock (VeltraneAudioProcessor& processor, const juce::MidiBuffer& midi = {}, int samples = 64)
{
    juce::AudioBuffer<float> buffer (2, samples);
    buffer.clear();
    auto events = midi;
    processor.processBlock (buffer, events);
}

inline juce::MidiBuffer controlChange (int channel, int controller, int value, int sample = 0)
{
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::controllerEvent (channel, controller, value), sample);
    return midi;
}

inline juce::MidiBuffer programChange (int channel, int program)
{
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::programChange (channel, program), 0);
    return midi;
}

// Every normalised value, bit for bit.
inline std::array<float, Param::count> valuesOf (VeltraneAudioProcessor& processor)
{
    std::array<float, Param::count> values {};

    for (int i = 0; i < Param::count; ++i)
        values[(size_t) i] = processor.getParameter (i);

    return values;
}

inline std::array<int, Param::count> controllersOf (VeltraneAudioProcessor& processor)
{
    std::array<int, Param::count> controllers {};

    for (int i = 0; i < Param::count; ++i)
        controllers[(size_t) i] = processor.getParameterRecord (i).midiController.load();

    return controllers;
}

inline std::array<int, Param::count> noControllers()
{
    std::array<int, Param::count> controllers {};
    controllers.fill (-1);
    return controllers;
}

inline juce::MemoryBlock chunkOf (VeltraneAudioProcessor& processor)
{
    juce::MemoryBlock block;
    processor.getStateInformation (block);
    return block;
}

// A state block around arbitrary text, with the length field given or the true one.
inline juce::MemoryBlock wrapState (const juce::String& text, std::optional<int> lengthField = {})
{
    juce::MemoryBlock block;
    block.append ("VC2!", 4);
    const auto bytes = (int) text.getNumBytesAsUTF8();
    const auto length = juce::ByteOrder::swapIfBigEndian ((juce::uint32) lengthField.value_or (bytes));
    block.append (&length, 4);
    block.append (text.toRawUTF8(), (size_t) bytes);
    block.append ("", 1);
    return block;
}

inline juce::File presetFolder()
{
    return juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Presets/Veltrane");
}

inline juce::File preferencesFile()
{
    return juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Veltrane.prefs");
}

} // namespace veltrane::test
