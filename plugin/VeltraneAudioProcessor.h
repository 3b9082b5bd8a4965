#pragma once

#include "PluginParameter.h"
#include "../dsp/Engine.h"
#include "../dsp/SeededRandom.h"
#include "../persistence/Preferences.h"
#include "../persistence/PresetLibrary.h"

#include <juce_audio_processors/juce_audio_processors.h>

#include <array>
#include <atomic>
#include <memory>
#include <mutex>

namespace veltrane
{

// The plug-in instance the host talks to: 33 parameters, the engine, the preset
// library, MIDI learn and the per-user preferences.
//
// Threads: the host's audio thread runs processBlock; the host's automation and
// user-interface threads set and read parameters and the state; the message thread
// runs the editor. Requests from the editor (preset load, clear of MIDI bindings)
// are atomics that the next audio block serves.
class VeltraneAudioProcessor final : public juce::AudioProcessor
{
public:
    VeltraneAudioProcessor();
    ~VeltraneAudioProcessor() override;

    const juce::String getName() const override;
    void prepareToPlay (double sampleRate, int samplesPerBlock) override;
    void releaseResources() override {}
    void processBlock (juce::AudioBuffer<float>& buffer, juce::MidiBuffer& midiMessages) override;
    using juce::AudioProcessor::processBlock;
    void processBlockBypassed (juce::AudioBuffer<float>& buffer, juce::MidiBuffer& midiMessages) override;
    using juce::AudioProcessor::processBlockBypassed;
    void reset() override {}
    bool isBusesLayoutSupported (const BusesLayout& layouts) const override;
    // How long echoes ring on after the input stops, from the current delay times and
    // feedbacks (at most a minute). Never 0, so hosts keep processing after silence.
    double getTailLengthSeconds() const override;

    const juce::String getInputChannelName (int channelIndex) const override;
    const juce::String getOutputChannelName (int channelIndex) const override;
    bool isInputChannelStereoPair (int) const override { return true; }
    bool isOutputChannelStereoPair (int) const override { return true; }
    bool silenceInProducesSilenceOut() const { return false; }
    bool acceptsMidi() const override { return true; }
    bool producesMidi() const override { return false; }

    juce::AudioProcessorEditor* createEditor() override;
    bool hasEditor() const override { return true; }

    int getNumPrograms() override { return 0; }
    int getCurrentProgram() override { return 0; }
    void setCurrentProgram (int) override {}
    const juce::String getProgramName (int) override { return {}; }
    void changeProgramName (int, const juce::String&) override {}

    void getStateInformation (juce::MemoryBlock& destData) override;
    void setStateInformation (const void* data, int sizeInBytes) override;

    // Indexed parameter operations; index is 0..32. (JUCE's overloads with a maximum
    // length stay visible and end up here.)
    using juce::AudioProcessor::getParameterName;
    using juce::AudioProcessor::getParameterText;
    int getNumParameters() override { return Param::count; }
    const juce::String getParameterName (int index) override;
    float getParameter (int index) override;
    const juce::String getParameterText (int index) override;
    // Takes newValue when it lies in [0, 1] and ignores it otherwise (NaN too); the
    // last-parameter name and text follow this parameter either way.
    void setParameter (int index, float newValue) override;

    // setParameter, then every listener (the host's wrapper among them) hears the
    // value the parameter now holds.
    void setParameterNotifyingHost (int index, float newValue);

    // The one way in for editor controls (fromEditor true) and learned MIDI
    // controllers (false): the change is bracketed by a gesture; from the editor it
    // also arms or forgets a MIDI binding when learn or unlearn mode is on.
    void setParameterFromControl (int index, float newValue, bool fromEditor);

    // Name and display text of the parameter set last, from any thread; empty until
    // one is set.
    struct LastParameter { juce::String name, text; };
    LastParameter getLastParameter() const;
    juce::String getLastParameterName() const { return getLastParameter().name; }
    juce::String getLastParameterText() const { return getLastParameter().text; }

    PluginParameter& getParameterRecord (int index) noexcept { return parameters[(size_t) index]; }
    const PluginParameter& getParameterRecord (int index) const noexcept { return parameters[(size_t) index]; }
    float getPhysicalValue (int index) const noexcept
    {
        return parameters[(size_t) index].physicalValue.load (std::memory_order_relaxed);
    }

    // Draws new values for every parameter outside the skip list, then turns
    // Randomize off. Audio thread, at a block start.
    void randomize();
    // Fixes the Randomize generator's seed, for reproducible renders and tests.
    void seedRandomiser (juce::int64 seed) { randomiser = SeededRandom (seed); }

    // Block-start requests: a pending preset load, a clear of all MIDI bindings and
    // Randomize, in that order. Audio thread.
    void serveBlockStartRequests();
    // A MIDI control change inside a block: learning and learned parameters.
    void handleControlChange (int controllerNumber, int controllerValue);
    // A MIDI program change: the preset of that number loads at the next block.
    void requestPresetLoad (int presetIndex) noexcept;

    // Preset library and preferences. presetName and the preset lists are guarded by
    // presetLock: the message and host threads take it, the audio thread only ever
    // tries it and leaves a preset load pending for the next block when it cannot.
    juce::StringArray getPresetNames() const;
    juce::String getPresetName() const;
    // Cut to maxPresetNameLength characters, so every state stays readable.
    void setPresetName (const juce::String& newName);
    // Writes the current values under the current name, then rescans the list and
    // raises presetListChanged, whether or not the write succeeded. False when
    // nothing was written: a name that is empty or would leave the preset folder, or
    // a failed write, which leaves an existing preset of that name as it was.
    bool savePreset();
    // Applies the preset file at path. Message thread or tests: it waits for the
    // lock to set the name; the audio thread loads through loadRequestedPreset.
    void loadPreset (const juce::String& path);
    // Opens the preset folder in the desktop's file manager without waiting for it;
    // nothing without a desktop session.
    void revealPresetFolder();
    void setLastEditorSize (float width, float height);

    // Requests and modes shared with the editor and served by the audio block.
    // A load is requested by storing presetToLoad first, then presetLoadPending.
    std::atomic<bool> midiLearnActive { false };
    std::atomic<bool> midiUnlearnActive { false };
    std::atomic<bool> midiClearPending { false };
    std::atomic<bool> presetLoadPending { false };
    std::atomic<int> presetToLoad { 0 };
    std::atomic<bool> presetListChanged { true };

    float lastEditorWidth = 1000.0f;
    float lastEditorHeight = 500.0f;

    // The signal path, for inspection (tests, editor displays); processBlock drives it.
    const Engine& getEngine() const noexcept { return engine; }

private:
    // The preset numbered presetToLoad, at a block start; clears presetLoadPending
    // once served and keeps it set when the preset lock is busy. Audio thread.
    void loadRequestedPreset();
    // Serves a program change or a control change from a block's MIDI; false for any
    // other message. Audio thread.
    bool handleProgramOrControlChange (const juce::uint8* data, int numBytes);
    void applyPresetValues (const PresetContents& preset);
    // Constructor and destructor steps of the preset library and the preferences.
    void openPersistentState();
    void closePersistentState();

    std::array<PluginParameter, Param::count> parameters;
    // Two channels of delay lines, envelope followers and LFOs; each LFO's "Sample & Hold"
    // table is drawn from its own randomly seeded generator.
    Engine engine { (uint64_t) juce::Random().nextInt64() };
    SeededRandom randomiser { juce::Random().nextInt64() };   // seeded randomly, as Randomize's dice
    std::atomic<int> lastParameterIndex { -1 };   // -1 until a parameter is set

    std::unique_ptr<PreferencesFile> properties;         // per-user preferences
    mutable std::mutex presetLock;                       // guards the three below
    PresetLibrary presetLibrary;
    juce::StringArray presetNames;                       // copy of the library's list for the editor
    juce::String presetName { "Init" };

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (VeltraneAudioProcessor)
};

} // namespace veltrane
