// Audio, host (wild automation, states saved and loaded) and editor (presets, bindings, displays)
// threads share one processor as hosts share it. tools/run-sanitizer-checks.sh runs it under ThreadSanitizer.

#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <thread>

using namespace veltrane;

TEST (Concurrency, HostEditorAndAudioThreadsShareTheProcessor)
{
    VeltraneAudioProcessor processor;
    processor.prepareToPlay (44100.0, 256);
    std::atomic<bool> running { true };
    float peak = 0.0f;
    std::vector<juce::MemoryBlock> states;
    std::thread audio ([&] {
        juce::AudioBuffer<float> buffer (2, 256);
        juce::Random noise (99);
        for (int block = 0; running; ++block)
        {
            juce::MidiBuffer midi;
            midi.addEvent (juce::MidiMessage::controllerEvent (1 + block % 16, block % 4, block % 128), block % 64);
            midi.addEvent (juce::MidiMessage::programChange (1, block % 3), 3);
            for (int i = 0; i < 512; ++i)
                buffer.setSample (i / 256, i % 256, noise.nextFloat() * 2.0f - 1.0f);
            processor.processBlock (buffer, midi);
            for (int i = 0; i < 512; ++i)   // NaN and infinities count as infinite
                peak = std::max (peak, std::isfinite (buffer.getSample (i / 256, i % 256)) ? std::abs (buffer.getSample (i / 256, i % 256)) : INFINITY);
        }
    });
    std::thread host ([&] {
        juce::Random random (2026);
        const float hostile[] { NAN, INFINITY, -INFINITY, -0.5f, 1.5f, 0.0f, 1.0f };
        for (int round = 0; running; ++round)
        {
            const auto index = random.nextInt (Param::count);
            const auto value = random.nextBool() ? random.nextFloat() : hostile[random.nextInt (7)];
            processor.getParameters()[index]->setValue (value);
            processor.setParameterNotifyingHost (round % 200 == 0 ? (int) Param::Randomize : index, value);
            if (round % 50 == 0)
            {
                juce::MemoryBlock state;
                processor.getStateInformation (state);
                processor.setStateInformation (state.getData(), (int) state.getSize());
                if (round % 500 == 0)
                    states.push_back (state);
            }
        }
    });
    std::thread editor ([&] {
        for (int round = 0; running; ++round)
        {
            processor.midiLearnActive = round % 2 == 0;
            processor.midiUnlearnActive = round % 5 == 0;
            processor.setParameterFromControl (round % Param::count, (float) (round % 100) / 100.0f, true);
            processor.midiClearPending = processor.midiClearPending || round % 20 == 0;
            if (round % 25 == 0)
            {
                processor.setPresetName ("Preset " + juce::String (round % 4));
                processor.savePreset();
            }
            if (round % 9 == 0)
                processor.requestPresetLoad (round % 5 - 1);
            (void) (processor.getPresetNames().joinIntoString ("") + processor.getLastParameterName() + processor.getLastParameterText() + processor.getPresetName());
        }
    });
    std::this_thread::sleep_for (std::chrono::milliseconds (1500));
    running = false;
    for (auto* thread : { &audio, &host, &editor })
        thread->join();
    EXPECT_TRUE (std::isfinite (peak));
    for (int i = 0; i < Param::count; ++i)
        EXPECT_TRUE (processor.getParameter (i) >= 0.0f && processor.getParameter (i) <= 1.0f) << processor.getParameterName (i);
    ASSERT_FALSE (states.empty());
    for (const auto& state : states)   // every state saved along the way loads back whole
    {
        VeltraneAudioProcessor restored;
        restored.setStateInformation (state.getData(), (int) state.getSize());
        juce::MemoryBlock again;
        restored.getStateInformation (again);
        EXPECT_EQ (again, state);
    }
}
