#include "VeltraneAudioProcessor.h"

#include "HostParameter.h"
#include "../editor/VeltraneAudioProcessorEditor.h"

namespace veltrane
{

VeltraneAudioProcessor::VeltraneAudioProcessor()
    : juce::AudioProcessor (BusesProperties()
                                .withInput ("Input", juce::AudioChannelSet::stereo(), true)
                                .withOutput ("Output", juce::AudioChannelSet::stereo(), true))
{
    for (int i = 0; i < Param::count; ++i)
        parameters[(size_t) i].initialise (parameterTable[(size_t) i]);

    for (int i = 0; i < Param::count; ++i)
        addParameter (new HostParameter (*this, i));

    openPersistentState();
}

VeltraneAudioProcessor::~VeltraneAudioProcessor()
{
    closePersistentState();
}

const juce::String VeltraneAudioProcessor::getName() const
{
    return JucePlugin_Name;
}

bool VeltraneAudioProcessor::isBusesLayoutSupported (const BusesLayout& layouts) const
{
    // One in / one out or two in / two out, whatever the host calls the channels
    // (stereo, a surround pair, two discrete channels): the engine holds two channels
    // and treats them alike.
    const auto in = layouts.getMainInputChannels();
    return in == layouts.getMainOutputChannels() && (in == 1 || in == 2);
}

double VeltraneAudioProcessor::getTailLengthSeconds() const
{
    // Each delay loops at feedback * 0.96; the tail lasts until an echo has fallen
    // by 60 dB. A chain of the two delays rings as long as both together.
    auto ringTime = [this] (int timeIndex, int feedbackIndex) {
        const auto seconds = (double) getPhysicalValue (timeIndex) * 0.001;
        const auto loopGain = (double) parameters[(size_t) feedbackIndex].currentValue.load() * 0.96;
        const auto repeats = loopGain > 0.0 ? std::log (0.001) / std::log (loopGain) : 0.0;
        return seconds * (1.0 + repeats);
    };

    const auto tail = ringTime (Param::Delay1Time, Param::Delay1Feedback)
                    + ringTime (Param::Delay2Time, Param::Delay2Feedback);
    return juce::jlimit (0.001, 60.0, tail);
}

const juce::String VeltraneAudioProcessor::getInputChannelName (int channelIndex) const
{
    return juce::String (channelIndex + 1);
}

const juce::String VeltraneAudioProcessor::getOutputChannelName (int channelIndex) const
{
    return juce::String (channelIndex + 1);
}

juce::AudioProcessorEditor* VeltraneAudioProcessor::createEditor()
{
    return new VeltraneAudioProcessorEditor (*this);
}

const juce::String VeltraneAudioProcessor::getParameterName (int index)
{
    return parameters[(size_t) index].name;
}

float VeltraneAudioProcessor::getParameter (int index)
{
    return parameters[(size_t) index].currentValue.load (std::memory_order_relaxed);
}

const juce::String VeltraneAudioProcessor::getParameterText (int index)
{
    return parameters[(size_t) index].getText();
}

void VeltraneAudioProcessor::setParameter (int index, float newValue)
{
    parameters[(size_t) index].setNormalised (newValue);

    // The name and text are derived from this index when they are read, so the
    // hand-over to the editor is one atomic word and costs the caller nothing.
    lastParameterIndex.store (index, std::memory_order_release);
}

VeltraneAudioProcessor::LastParameter VeltraneAudioProcessor::getLastParameter() const
{
    // One load of the index, so the name and the text belong to the same parameter
    // however often other threads set parameters meanwhile.
    const auto index = lastParameterIndex.load (std::memory_order_acquire);

    if (index < 0)
        return {};

    const auto& record = parameters[(size_t) index];
    return { record.name, record.getText() };
}

void VeltraneAudioProcessor::setParameterNotifyingHost (int index, float newValue)
{
    setParameter (index, newValue);

    // Listeners hear the value the parameter holds, so a host is never told a value
    // outside [0, 1] that the parameter refused.
    auto* parameter = getParameters()[index];
    parameter->sendValueChangedMessageToListeners (parameter->getValue());
}

void VeltraneAudioProcessor::setParameterFromControl (int index, float newValue, bool fromEditor)
{
    auto* parameter = getParameters()[index];
    parameter->beginChangeGesture();
    setParameterNotifyingHost (index, newValue);
    parameter->endChangeGesture();

    if (! fromEditor)
        return;

    auto& record = parameters[(size_t) index];

    if (midiLearnActive.load())
        record.learnArmed.store (true);

    if (midiUnlearnActive.load())
        record.midiController.store (-1);
}

void VeltraneAudioProcessor::randomize()
{
    for (int i = 0; i < Param::count; ++i)
        if (isRandomized (i))
            setParameterNotifyingHost (i, randomiser.nextFloat());

    setParameterNotifyingHost (Param::Randomize, 0.0f);
}

void VeltraneAudioProcessor::serveBlockStartRequests()
{
    if (presetLoadPending.load())
        loadRequestedPreset();

    if (midiClearPending.load())
    {
        for (auto& record : parameters)
            record.midiController.store (-1);

        midiClearPending.store (false);
    }

    if (parameters[Param::Randomize].choiceIndex() != 0)
        randomize();
}

void VeltraneAudioProcessor::requestPresetLoad (int presetIndex) noexcept
{
    presetToLoad.store (presetIndex);
    presetLoadPending.store (true);
}

} // namespace veltrane

juce::AudioProcessor* JUCE_CALLTYPE createPluginFilter()
{
    return new veltrane::VeltraneAudioProcessor();
}
