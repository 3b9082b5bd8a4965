#include "VeltraneAudioProcessor.h"

#include <algorithm>

namespace veltrane
{

namespace
{
    // What the engine reads of the 33 parameters, taken once at the start of a block: physical
    // values for times and rates, normalised values for factors and depths, choice indices,
    // and dB levels as amplitudes.
    EngineSettings snapshotOf (const VeltraneAudioProcessor& processor, float tempoBpm) noexcept
    {
        auto normalised = [&processor] (int index) { return processor.getParameterRecord (index).currentValue.load (std::memory_order_relaxed); };
        auto physical = [&processor] (int index) { return processor.getPhysicalValue (index); };
        auto choice = [&processor] (int index) { return processor.getParameterRecord (index).choiceIndex(); };

        static_assert (Param::Delay2Time - Param::Delay1Time == 7 && Param::Delay2Gain - Param::Delay2Time == 6);
        static_assert (Param::Envelope2Sensitivity - Param::Envelope1Sensitivity == 3);
        static_assert (Param::LFO2Wave - Param::LFO1Wave == 4 && Param::LFO1SyncedRate - Param::LFO1Wave == 3);

        EngineSettings settings;

        for (int d = 0; d < 2; ++d)
        {
            const auto first = d == 0 ? Param::Delay1Time : Param::Delay2Time;
            auto& delay = settings.delay[d];
            delay.timeMs = physical (first);
            delay.feedback = normalised (first + 1);
            delay.timeModDepth = normalised (first + 2);
            delay.timeModSource = choice (first + 3);
            delay.feedbackModDepth = normalised (first + 4);
            delay.feedbackModSource = choice (first + 5);
            delay.gain = decibelsToAmplitude (physical (first + 6));

            const auto firstEnvelope = Param::Envelope1Sensitivity + 3 * d;
            auto& envelope = settings.envelope[d];
            envelope.sensitivity = decibelsToAmplitude (physical (firstEnvelope));
            envelope.attackMs = physical (firstEnvelope + 1);
            envelope.releaseMs = physical (firstEnvelope + 2);

            const auto firstLfo = Param::LFO1Wave + 4 * d;
            auto& lfo = settings.lfo[d];
            lfo.wave = choice (firstLfo);
            lfo.rateHz = physical (firstLfo + 1);
            lfo.sync = choice (firstLfo + 2) != 0;
            lfo.syncedRate = choice (firstLfo + 3);
        }

        settings.mixMode = choice (Param::MixMode);
        settings.dryWet = normalised (Param::DryWet);
        settings.shaper = choice (Param::Waveshaper);
        settings.shaperAmount = normalised (Param::WaveshaperAmount);
        settings.tempoBpm = tempoBpm;
        return settings;
    }

    // The host's tempo for this block. Without a play head or a position, 120 bpm, which is
    // what a synced LFO is expected to run at; a position without a tempo gives 0, at which
    // synced LFOs stand still.
    float tempoFrom (juce::AudioPlayHead* playHead)
    {
        if (playHead == nullptr)
            return 120.0f;

        const auto position = playHead->getPosition();

        if (! position.hasValue())
            return 120.0f;

        return (float) position->getBpm().orFallback (0.0);
    }

    // Calls handle (position, data, numBytes) for each event of at least two bytes inside
    // the block, reading the raw bytes, so that no message object (nor a SysEx copy) is
    // made. Events outside the block are ignored.
    template <typename Handler>
    void forEachEventInBlock (const juce::MidiBuffer& midiMessages, int numSamples, Handler&& handle)
    {
        for (const auto event : midiMessages)
            if (event.samplePosition >= 0 && event.samplePosition < numSamples && event.numBytes >= 2)
                handle (event.samplePosition, event.data, event.numBytes);
    }
}

void VeltraneAudioProcessor::prepareToPlay (double sampleRate, int)
{
    engine.prepare (sampleRate);
}

void VeltraneAudioProcessor::processBlock (juce::AudioBuffer<float>& buffer, juce::MidiBuffer& midiMessages)
{
    juce::ScopedNoDenormals noDenormals;
    const auto numSamples = buffer.getNumSamples();
    const auto numChannels = std::min ({ getTotalNumInputChannels(), buffer.getNumChannels(), Engine::numChannels });

    // A note-on with velocity on MIDI channel 1 restarts LFO 1, on channel 2 LFO 2.
    auto restartedLfo = [] (const juce::uint8* data, int numBytes)
    {
        const auto isNoteOn = (data[0] & 0xf0) == 0x90 && numBytes >= 3 && data[2] > 0;
        return isNoteOn && (data[0] & 0x0f) < 2 ? data[0] & 0x0f : -1;
    };

    serveBlockStartRequests();

    bool lfoRestarted[2] = { false, false };
    forEachEventInBlock (midiMessages, numSamples, [&] (int, const juce::uint8* data, int numBytes) {
        if (const auto lfo = restartedLfo (data, numBytes); lfo >= 0)
            lfoRestarted[lfo] = true;
    });

    engine.beginBlock (snapshotOf (*this, tempoFrom (getPlayHead())), numChannels, numSamples, lfoRestarted);

    // The block runs up to each event, which then takes effect: program changes and learned
    // controllers for the next block, LFO restarts from here on.
    auto* const* channels = buffer.getArrayOfWritePointers();
    int done = 0;

    forEachEventInBlock (midiMessages, numSamples, [&] (int position, const juce::uint8* data, int numBytes) {
        engine.process (channels, done, position);
        done = position;

        if (handleProgramOrControlChange (data, numBytes))
            return;

        if (const auto lfo = restartedLfo (data, numBytes); lfo >= 0)
            engine.restartLfo (lfo);
    });

    engine.process (channels, done, numSamples);

    for (auto channel = numChannels; channel < buffer.getNumChannels(); ++channel)
        buffer.clear (channel, 0, numSamples);
}

void VeltraneAudioProcessor::processBlockBypassed (juce::AudioBuffer<float>& buffer, juce::MidiBuffer& midiMessages)
{
    // The host's soft bypass: the input passes unchanged and the engine rests, keeping
    // its echoes, until the bypass ends. Requests from the editor, program changes and
    // learned controllers are still served, so nothing asked for meanwhile is lost.
    serveBlockStartRequests();

    forEachEventInBlock (midiMessages, buffer.getNumSamples(), [this] (int, const juce::uint8* data, int numBytes) {
        handleProgramOrControlChange (data, numBytes);
    });

    juce::AudioProcessor::processBlockBypassed (buffer, midiMessages);
}

bool VeltraneAudioProcessor::handleProgramOrControlChange (const juce::uint8* data, int numBytes)
{
    const auto type = data[0] & 0xf0;

    if (type == 0xc0)
        requestPresetLoad (data[1]);
    else if (type == 0xb0 && numBytes >= 3)
        handleControlChange (data[1], data[2]);
    else
        return false;

    return true;
}

} // namespace veltrane
