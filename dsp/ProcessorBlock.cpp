#include "../plugin/VeltraneAudioProcessor.h"

namespace veltrane
{

void VeltraneAudioProcessor::prepareToPlay (double, int)
{
}

void VeltraneAudioProcessor::processBlock (juce::AudioBuffer<float>& buffer, juce::MidiBuffer& midiMessages)
{
    juce::ScopedNoDenormals noDenormals;
    serveBlockStartRequests();

    for (const auto metadata : midiMessages)
    {
        const auto message = metadata.getMessage();

        if (message.isProgramChange())
            requestPresetLoad (message.getProgramChangeNumber());
        else if (message.isController())
            handleControlChange (message.getControllerNumber(), message.getControllerValue());
    }

    for (auto channel = getTotalNumInputChannels(); channel < getTotalNumOutputChannels(); ++channel)
        buffer.clear (channel, 0, buffer.getNumSamples());
}

} // namespace veltrane
