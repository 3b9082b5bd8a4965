#pragma once

#include <juce_core/juce_core.h>

#include <optional>

namespace veltrane::render
{

struct ParameterSetting
{
    juce::String identifier;
    float value = 0.0f;
};

struct RenderOptions
{
    juce::File pluginPath;
    juce::File inputFile;            // empty: the built-in test signal
    juce::File outputFile;
    juce::File plotFile;             // empty: no picture
    juce::File presetFile;           // a .vtp preset applied before rendering
    juce::File stateFile;            // a saved state chunk applied before rendering
    double sampleRate = 44100.0;
    int blockSize = 512;
    double tailSeconds = 2.0;
    double tempoBpm = 120.0;         // the play head's tempo, playing in 4/4 from the start
    juce::Array<ParameterSetting> parameters;
    bool infoOnly = false;
};

// The VST2 binary installed beside the program (../lib/vst/Veltrane.so from its folder),
// else the build's own.
juce::File defaultPluginPath();

// Parses the command line; returns the options or sets error to one line for the user.
std::optional<RenderOptions> parseArguments (const juce::StringArray& args, juce::String& error);

juce::String usage();

} // namespace veltrane::render
