#include "VeltraneAudioProcessor.h"

#include "../persistence/StateChunk.h"

namespace veltrane
{

// Threads: presetName, presetNames and the library's list are guarded by presetLock.
// The message and host threads lock it (briefly, never while calling out); the audio
// thread only try-locks it, and when it cannot take it a requested preset load stays
// pending for the next block. Parameter values, controllers, learn flags and the
// requests are atomics of their own.

void VeltraneAudioProcessor::openPersistentState()
{
    {
        const std::lock_guard<std::mutex> lock (presetLock);
        presetLibrary.chooseRoot (juce::SystemStats::getOperatingSystemType());
        presetLibrary.initialise ("Veltrane", "vtp");
        presetNames = presetLibrary.getPresetNames();
    }

    properties = std::make_unique<PreferencesFile> (preferencesOptions());

    for (int i = 0; i < Param::count; ++i)
    {
        properties->setDefaultValue (controllerKey (i), -1);
        parameters[(size_t) i].midiController.store (properties->getIntValue (controllerKey (i), -1));
    }

    lastEditorWidth = (float) properties->getDoubleValue (lastWidthKey, defaultEditorWidth);
    lastEditorHeight = (float) properties->getDoubleValue (lastHeightKey, defaultEditorHeight);
}

void VeltraneAudioProcessor::closePersistentState()
{
    for (int i = 0; i < Param::count; ++i)
        properties->setValue (controllerKey (i), parameters[(size_t) i].midiController.load());

    properties->saveIfNeeded();
}

void VeltraneAudioProcessor::getStateInformation (juce::MemoryBlock& destData)
{
    ParameterValues values;
    MidiControllers controllers;

    for (int i = 0; i < Param::count; ++i)
    {
        values[(size_t) i] = getParameter (i);
        controllers[(size_t) i] = parameters[(size_t) i].midiController.load();
    }

    destData = writeStateChunk (getPresetName(), values, controllers);
}

void VeltraneAudioProcessor::setStateInformation (const void* data, int sizeInBytes)
{
    const auto state = readStateChunk (data, sizeInBytes);

    if (! state.has_value())
        return;

    for (int i = 0; i < Param::count; ++i)
    {
        const auto& value = state->values[(size_t) i];
        setParameterNotifyingHost (i, value.has_value() ? (float) *value : getParameter (i));
        parameters[(size_t) i].midiController.store (state->midiControllers[(size_t) i]);
    }

    setPresetName (state->presetName);
}

juce::StringArray VeltraneAudioProcessor::getPresetNames() const
{
    const std::lock_guard<std::mutex> lock (presetLock);
    return presetNames;
}

juce::String VeltraneAudioProcessor::getPresetName() const
{
    const std::lock_guard<std::mutex> lock (presetLock);
    return presetName;
}

void VeltraneAudioProcessor::setPresetName (const juce::String& newName)
{
    const auto limited = limitPresetName (newName);
    const std::lock_guard<std::mutex> lock (presetLock);
    presetName = limited;
}

bool VeltraneAudioProcessor::savePreset()
{
    const auto name = getPresetName();
    // Empty for an empty name or one that would leave the preset folder.
    const auto path = presetLibrary.getPresetPath (name);
    auto saved = false;

    if (path.isNotEmpty())
    {
        ParameterValues values;

        for (int i = 0; i < Param::count; ++i)
            values[(size_t) i] = getParameter (i);

        saved = writePresetFile (juce::File (path), name, values);
    }

    {
        const std::lock_guard<std::mutex> lock (presetLock);
        presetLibrary.rescan();
        presetNames = presetLibrary.getPresetNames();
    }

    presetListChanged.store (true);
    return saved;
}

void VeltraneAudioProcessor::applyPresetValues (const PresetContents& preset)
{
    for (int i = 0; i < Param::count; ++i)
    {
        const auto& value = preset.values[(size_t) i];
        setParameterNotifyingHost (i, value.has_value() ? (float) *value : getParameter (i));
    }
}

void VeltraneAudioProcessor::loadPreset (const juce::String& path)
{
    if (path.isEmpty())
        return;

    if (const auto preset = readPresetFile (juce::File (path)))
    {
        applyPresetValues (*preset);
        setPresetName (preset->presetName);
    }
}

void VeltraneAudioProcessor::loadRequestedPreset()
{
    std::unique_lock<std::mutex> lock (presetLock, std::try_to_lock);

    if (! lock.owns_lock())
        return;   // still pending: the next block tries again

    // Taking the flag before reading the number: a request raised from here on
    // stays pending and is served by the next block.
    if (! presetLoadPending.exchange (false))
        return;

    const auto path = presetLibrary.getPresetPath (presetToLoad.load());
    const auto preset = path.isNotEmpty() ? readPresetFile (juce::File (path)) : std::nullopt;

    if (! preset.has_value())
        return;

    // The name is set while the lock is held; the values go to the host after it is
    // released, so no host callback ever runs under the lock.
    presetName = preset->presetName;
    lock.unlock();
    applyPresetValues (*preset);
}

void VeltraneAudioProcessor::revealPresetFolder()
{
    const juce::File folder (presetLibrary.presetFolder);

    if (presetLibrary.presetFolder.isEmpty() || ! folder.isDirectory())
        return;

   #if JUCE_LINUX || JUCE_BSD
    // Without a desktop session there is no file manager to show.
    if (juce::SystemStats::getEnvironmentVariable ("DISPLAY", {}).isEmpty()
        && juce::SystemStats::getEnvironmentVariable ("WAYLAND_DISPLAY", {}).isEmpty())
        return;

    // The shell starts xdg-open in the background and returns at once, so the file
    // manager neither blocks this thread nor is left behind as a child to reap.
    juce::ChildProcess launcher;

    if (launcher.start (juce::StringArray { "/bin/sh", "-c", "xdg-open \"$1\" >/dev/null 2>&1 &",
                                            "sh", folder.getFullPathName() }, 0))
        launcher.waitForProcessToFinish (1000);
   #else
    folder.startAsProcess();
   #endif
}

void VeltraneAudioProcessor::setLastEditorSize (float width, float height)
{
    lastEditorWidth = width;
    lastEditorHeight = height;
    properties->setValue (lastWidthKey, (double) width);
    properties->setValue (lastHeightKey, (double) height);
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
