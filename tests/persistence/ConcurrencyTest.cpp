#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <mutex>
#include <thread>
#include <vector>

using namespace veltrane;
using namespace veltrane::test;

// The audio thread processes blocks with program changes and controllers while
// the host saves and loads states, the editor saves presets, touches controls in
// learn mode and requests loads, and a panel reads the last-parameter fields. Run
// under ThreadSanitizer by tools/run-sanitizer-checks.sh.
TEST (Concurrency, HostEditorAndAudioThreadsShareTheProcessor)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.setPresetName ("First");
    processor.savePreset();
    processor.setPresetName ("Second");
    processor.savePreset();

    std::atomic<bool> running { true };
    std::mutex savedLock;
    std::vector<juce::MemoryBlock> savedStates;

    std::thread audio ([&] {
        for (int block = 0; running.load(); ++block)
        {
            juce::MidiBuffer midi;
            midi.addEvent (juce::MidiMessage::controllerEvent (1 + block % 16, block % 4, block % 128), block % 64);
            if (block % 7 == 0)
                midi.addEvent (juce::MidiMessage::programChange (1, block % 3), 3);
            processBlock (processor, midi);
        }
    });

    std::thread host ([&] {
        for (int round = 0; running.load(); ++round)
        {
            const auto chunk = chunkOf (processor);
            processor.setStateInformation (chunk.getData(), (int) chunk.getSize());

            if (round % 10 == 0)
            {
                const std::lock_guard<std::mutex> lock (savedLock);
                savedStates.push_back (chunk);
            }
        }
    });

    std::thread editor ([&] {
        for (int round = 0; running.load(); ++round)
        {
            processor.midiLearnActive.store (round % 2 == 0);
            processor.midiUnlearnActive.store (round % 5 == 0);
            processor.setParameterFromControl (round % Param::count, (float) (round % 100) / 100.0f, true);

            if (round % 20 == 0)
                processor.midiClearPending.store (true);

            if (round % 25 == 0)
            {
                processor.setPresetName ("Preset " + juce::String (round % 4));
                processor.savePreset();
            }

            if (round % 9 == 0)
                processor.requestPresetLoad (round % 5 - 1);

            (void) processor.getPresetNames();
            processor.presetListChanged.store (false);
        }
    });

    std::thread panel ([&] {
        while (running.load())
        {
            (void) processor.getLastParameterName();
            (void) processor.getLastParameterText();
            (void) processor.getPresetName();
        }
    });

    std::this_thread::sleep_for (std::chrono::milliseconds (1500));
    running.store (false);

    for (auto* thread : { &audio, &host, &editor, &panel })
        thread->join();

    // Every state saved along the way loads back whole: saved again, it gives the
    // same bytes.
    ASSERT_FALSE (savedStates.empty());

    for (const auto& state : savedStates)
    {
        VeltraneAudioProcessor restored;
        restored.setStateInformation (state.getData(), (int) state.getSize());
        EXPECT_EQ (chunkOf (restored), state);
    }

    // A request raised after the run is served by the next block.
    processor.requestPresetLoad (0);
    processBlock (processor);
    EXPECT_FALSE (processor.presetLoadPending.load());
}
