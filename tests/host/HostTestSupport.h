#pragma once

#include <juce_audio_processors/juce_audio_processors.h>

namespace veltrane::test
{

enum class Format { vst2, vst3 };

// The shipped binary of a format, loaded through JUCE's plug-in hosting.
inline std::unique_ptr<juce::AudioPluginInstance> loadPlugin (Format format)
{
    juce::VSTPluginFormat vst2;
    juce::VST3PluginFormat vst3;
    auto& pluginFormat = format == Format::vst2 ? static_cast<juce::AudioPluginFormat&> (vst2) : vst3;
    juce::OwnedArray<juce::PluginDescription> descriptions;
    pluginFormat.findAllTypesForFile (descriptions, format == Format::vst2 ? VELTRANE_VST2_BINARY : VELTRANE_VST3_BUNDLE);
    juce::String error;
    auto plugin = descriptions.isEmpty() ? nullptr : pluginFormat.createInstanceFromDescription (*descriptions[0], 44100.0, 512, error);
    if (plugin != nullptr)
        plugin->prepareToPlay (44100.0, 512);
    return plugin;
}

} // namespace veltrane::test
