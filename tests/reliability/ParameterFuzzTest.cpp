// Host automation gone wild: random values (in and out of range, NaN, infinities)
// for all 33 parameters from another thread while blocks run, with state saves and
// loads and Randomize in between. The output must stay finite throughout.

#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace veltrane;

namespace
{
float hostileValue (juce::Random& random)
{
    switch (random.nextInt (10))
    {
        case 0:  return std::numeric_limits<float>::quiet_NaN();
        case 1:  return random.nextBool() ? INFINITY : -INFINITY;
        case 2:  return random.nextFloat() * 4.0f - 2.0f;
        case 3:  return random.nextBool() ? 0.0f : 1.0f;
        default: return random.nextFloat();
    }
}

struct FuzzCounts
{
    std::atomic<int> automationEvents { 0 };
    std::atomic<int> stateLoads { 0 };
    std::atomic<int> blocks { 0 };
};

// Runs blocks of noise at full scale until told to stop; returns the largest output
// magnitude, or infinity as soon as a sample is not finite.
float processUntil (VeltraneAudioProcessor& processor, const std::atomic<bool>& stop, FuzzCounts& counts)
{
    juce::AudioBuffer<float> buffer (2, 256);
    juce::MidiBuffer midi;
    juce::Random random (99);
    float peak = 0.0f;

    while (! stop.load())
    {
        for (int c = 0; c < 2; ++c)
            for (int j = 0; j < buffer.getNumSamples(); ++j)
                buffer.setSample (c, j, random.nextFloat() * 2.0f - 1.0f);

        processor.processBlock (buffer, midi);
        ++counts.blocks;

        for (int c = 0; c < 2; ++c)
            for (int j = 0; j < buffer.getNumSamples(); ++j)
                if (! std::isfinite (buffer.getSample (c, j)))
                    return INFINITY;

        peak = std::max (peak, buffer.getMagnitude (0, buffer.getNumSamples()));
    }

    return peak;
}
}

TEST (ParameterFuzz, HostileAutomationStateChangesAndRandomizeKeepTheOutputFinite)
{
    VeltraneAudioProcessor processor;
    processor.prepareToPlay (44100.0, 256);

    std::atomic<bool> stop { false };
    FuzzCounts counts;
    float peak = 0.0f;

    std::thread audio ([&] { peak = processUntil (processor, stop, counts); });

    juce::Random random (2026);
    juce::MemoryBlock state;
    processor.getStateInformation (state);
    auto& hostParameters = processor.getParameters();

    for (int round = 0; round < 20000; ++round)
    {
        const auto index = random.nextInt (Param::count);
        const auto value = hostileValue (random);

        switch (random.nextInt (20))
        {
            case 0:  processor.getStateInformation (state); break;
            case 1:  processor.setStateInformation (state.getData(), (int) state.getSize()); ++counts.stateLoads; break;
            case 2:  processor.setParameterNotifyingHost (Param::Randomize, 1.0f); break;
            case 3:  processor.setParameterFromControl (index, value, true); break;
            case 4:  hostParameters[index]->setValue (value); break;
            default: processor.setParameter (index, value); break;
        }

        ++counts.automationEvents;

        if (round % 64 == 0)
            std::this_thread::yield();
    }

    stop = true;
    audio.join();

    EXPECT_TRUE (std::isfinite (peak));
    EXPECT_GT (counts.blocks.load(), 0);
    for (int i = 0; i < Param::count; ++i)
    {
        const auto value = processor.getParameter (i);
        EXPECT_TRUE (value >= 0.0f && value <= 1.0f) << processor.getParameterName (i) << " = " << value;
    }

    std::cout << counts.automationEvents << " automation events, " << counts.stateLoads << " state loads, "
              << counts.blocks << " blocks" << std::endl;
}

TEST (ParameterFuzz, BoundedInputInDesignedRangesGivesBoundedOutput)
{
    // Sensitivities at or below 0 dB keep the envelopes within [0, 1] for input
    // within full scale, so every modulated feedback stays at or below 1 and each
    // loop's gain at or below 0.96.
    VeltraneAudioProcessor processor;
    processor.prepareToPlay (48000.0, 256);

    std::atomic<bool> stop { false };
    FuzzCounts counts;
    float peak = 0.0f;

    std::thread audio ([&] { peak = processUntil (processor, stop, counts); });

    juce::Random random (77);
    const auto designedMaximum = processor.getParameterRecord (Param::Envelope1Sensitivity).physicalToNormalised (0.0f);

    for (int round = 0; round < 5000; ++round)
    {
        const auto index = random.nextInt (Param::count);
        auto value = random.nextFloat();

        if (index == Param::Envelope1Sensitivity || index == Param::Envelope2Sensitivity)
            value *= designedMaximum;
        if (index == Param::Waveshaper)
            value = random.nextBool() ? 0.0f : 1.0f;   // "Dry" and "Dirt"; the cubic folds loud input over
        if (index == Param::Randomize)
            continue;                                   // it would draw sensitivities above 0 dB

        processor.setParameter (index, value);
        ++counts.automationEvents;

        if (round % 16 == 0)
            std::this_thread::sleep_for (std::chrono::microseconds (200));
    }

    stop = true;
    audio.join();

    // Two delays at loop gain 0.96 can each build up to 25 times the input, and a
    // chain multiplies the two, plus the dry path.
    EXPECT_LT (peak, 700.0f);
    EXPECT_GT (counts.blocks.load(), 0);
}
