#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

void VeltraneAudioProcessor::getStateInformation (juce::MemoryBlock& destData)
{
    destData.reset();
}

void VeltraneAudioProcessor::setStateInformation (const void*, int)
{
}

juce::StringArray VeltraneAudioProcessor::getPresetNames() const { return {}; }
juce::String VeltraneAudioProcessor::getPresetName() const { return "Init"; }
void VeltraneAudioProcessor::setPresetName (const juce::String&) {}
void VeltraneAudioProcessor::savePreset() {}
void VeltraneAudioProcessor::loadPreset (const juce::String&) {}
void VeltraneAudioProcessor::loadRequestedPreset() {}
void VeltraneAudioProcessor::revealPresetFolder() {}

void VeltraneAudioProcessor::setLastEditorSize (float width, float height)
{
    lastEditorWidth = width;
    lastEditorHeight = height;
}

void VeltraneAudioProcessor::handleControlChange (int controllerNumber, int controllerValue)
{
    const auto learning = midiLearnActive.load();

    for (int i = 0; i < Param::count; ++i)
    {
        auto& record = parameters[(size_t) i];

        if (learning && record.learnArmed.load())
        {
            record.midiController.store (controllerNumber);
            record.learnArmed.store (false);
        }

        if (record.midiController.load() == controllerNumber)
            setParameterFromControl (i, (float) controllerValue / 127.0f, false);
    }
}

} // namespace veltrane
