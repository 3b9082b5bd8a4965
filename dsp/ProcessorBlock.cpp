#include "../plugin/VeltraneAudioProcessor.h"

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

    serveBlockStartRequests();
    engine.beginBlock (snapshotOf (*this, tempoFrom (getPlayHead())), numChannels, numSamples);

    for (int channel = 0; channel < numChannels; ++channel)
    {
        auto* samples = buffer.getWritePointer (channel);

        if (channel != 0)
        {
            engine.process (channel, samples, 0, numSamples);
            continue;
        }

        // The first channel's pass stops at every MIDI event inside the block and handles it
        // there, reading the raw bytes so that no message object (nor a SysEx copy) is made.
        int done = 0;

        for (const auto event : midiMessages)
        {
            if (event.samplePosition < 0 || event.samplePosition >= numSamples || event.numBytes < 2)
                continue;

            engine.process (0, samples, done, event.samplePosition);
            done = event.samplePosition;

            const auto status = event.data[0];
            const auto type = status & 0xf0;

            if (type == 0xc0)
                requestPresetLoad (event.data[1]);
            else if (type == 0xb0 && event.numBytes >= 3)
                handleControlChange (event.data[1], event.data[2]);
            else if (type == 0x90 && event.numBytes >= 3 && event.data[2] > 0 && (status & 0x0f) < 2)
                engine.restartLfo (status & 0x0f); // MIDI channel 1 restarts LFO 1, channel 2 LFO 2
        }

        engine.process (0, samples, done, numSamples);
    }

    for (auto channel = numChannels; channel < buffer.getNumChannels(); ++channel)
        buffer.clear (channel, 0, numSamples);
}

} // namespace veltrane
