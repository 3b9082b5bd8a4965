#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <sys/stat.h>

using namespace veltrane;

namespace
{
juce::File presetFolder() { return juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Presets/Veltrane"); }
void writePreset (const juce::String& fileName, const juce::String& text)
{
    presetFolder().createDirectory();
    ASSERT_TRUE (presetFolder().getChildFile (fileName).replaceWithText (text));
}
juce::MemoryBlock stateOf (VeltraneAudioProcessor& processor)
{
    juce::MemoryBlock block;
    processor.getStateInformation (block);
    return block;
}
// The relative paths of every file below the folder.
juce::StringArray filesUnder (const juce::File& folder)
{
    juce::StringArray names;
    for (const auto& entry : juce::RangedDirectoryIterator (folder, true, "*", juce::File::findFiles))
        names.add (entry.getFile().getRelativePathFrom (folder));
    names.sort (false);
    return names;
}
}

TEST (PresetLibrary, SavedPresetHasJucesLayoutAndComesBackWithItsNameButNoBindings)
{
    const tools::PrivateHome home;
    presetFolder().createDirectory();   // not a first run: no factory presets
    VeltraneAudioProcessor processor;
    EXPECT_TRUE (processor.getPresetNames().isEmpty());
    EXPECT_EQ (processor.getPresetName(), "Init");
    processor.presetListChanged = false;
    processor.savePreset();
    EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("Init"));
    EXPECT_TRUE (processor.presetListChanged.load());
    const auto lines = juce::StringArray::fromLines (presetFolder().getChildFile ("Init.vtp").loadFileAsString());
    ASSERT_GE (lines.size(), 6);
    EXPECT_EQ (lines[0], "<?xml version=\"1.0\" encoding=\"UTF-8\"?>");
    EXPECT_EQ (lines[1] + "|" + lines[2], "| ");
    EXPECT_EQ (lines[3], "<VELTRANE_PRESET PresetName=\"Init\" Delay1Time=\"0.243987232\" Delay1Feedback=\"0.400000006\"");
    EXPECT_TRUE (lines[4].startsWith (juce::String::repeatedString (" ", 17) + "Delay1TimeMod=\"0\" ")) << lines[4];
    EXPECT_FALSE (lines.joinIntoString ("").contains ("CC="));
    processor.setParameter (Param::MixMode, 1.0f);
    processor.setPresetName ("Wide & \"open\"");
    processor.savePreset();
    processor.setParameter (Param::MixMode, 0.0f);
    processor.setPresetName ("Other");
    processor.getParameterRecord (0).midiController = 20;
    processor.loadPreset (presetFolder().getChildFile ("Wide & \"open\".vtp").getFullPathName());
    EXPECT_EQ (processor.getParameter (Param::MixMode), 1.0f);
    EXPECT_EQ (processor.getPresetName(), "Wide & \"open\"");
    EXPECT_EQ (processor.getParameterRecord (0).midiController.load(), 20);
}

TEST (PresetLibrary, MissingAttributesKeepTheirValuesAndUnusableFilesChangeNothing)
{
    const tools::PrivateHome home;
    writePreset ("Sparse.vtp", "<veltrane_preset delay1FEEDBACK=\"0.25\"/>");
    writePreset ("State.vtp", "<VELTRANE_STATE PresetName=\"State\" Delay1Time=\"0.5\"/>");
    writePreset ("Broken.vtp", "VELTRANE_PRESET PresetName=\"Broken\" Delay1Time=\"0.5\"");
    writePreset ("Huge.vtp", "<VELTRANE_PRESET PresetName=\"" + juce::String::repeatedString ("x", 1 << 20) + "\"/>");
    writePreset ("Deep.vtp", "<VELTRANE_PRESET Delay1Time=\"0.5\">" + juce::String::repeatedString ("<a>", 200000));
    writePreset ("Entities.vtp", "<!DOCTYPE VELTRANE_PRESET [<!ENTITY e SYSTEM \"/etc/passwd\">]><VELTRANE_PRESET PresetName=\"&e;\"/>");
    presetFolder().getChildFile ("Zero.vtp").createSymbolicLink (juce::File ("/dev/zero"), true);
    ASSERT_EQ (::mkfifo (presetFolder().getChildFile ("Pipe.vtp").getFullPathName().toRawUTF8(), 0600), 0);
    VeltraneAudioProcessor processor;
    processor.setParameter (0, 0.6f);
    const auto before = stateOf (processor);
    for (const auto* name : { "State", "Broken", "Huge", "Deep", "Entities", "Zero", "Pipe", "Missing" })
    {
        processor.loadPreset (presetFolder().getChildFile (juce::String (name) + ".vtp").getFullPathName());
        EXPECT_EQ (stateOf (processor), before) << name;
    }
    processor.loadPreset (presetFolder().getChildFile ("Sparse.vtp").getFullPathName());
    EXPECT_EQ (processor.getParameter (0), 0.6f);
    EXPECT_EQ (processor.getParameter (1), 0.25f);
    EXPECT_EQ (processor.getPresetName(), " ");
}

TEST (PresetLibrary, ListsTheExtensionOnlyAndProgramChangesPickByIndexUpToTheLast)
{
    const tools::PrivateHome home;
    writePreset ("Only.vtp", "<VELTRANE_PRESET PresetName=\"Only\" Delay1Feedback=\"0.1\"/>");
    writePreset ("b.VTP", "<VELTRANE_PRESET/>");
    writePreset ("c.txt", "<VELTRANE_PRESET/>");
    presetFolder().getChildFile ("d.vtp").createDirectory();
    presetFolder().getChildFile ("e").createDirectory();
    presetFolder().getChildFile ("e/f.vtp").replaceWithText ("<VELTRANE_PRESET/>");
    VeltraneAudioProcessor processor;
    EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("Only"));
    // Index 1 is one past the end: the last preset. A negative index names no file.
    for (auto [index, name] : { std::pair (1, "Only"), { -1, "Init" } })
    {
        processor.setPresetName ("Init");
        processor.requestPresetLoad (index);
        juce::AudioBuffer<float> buffer (2, 16);
        buffer.clear();
        juce::MidiBuffer midi;
        processor.processBlock (buffer, midi);
        EXPECT_EQ (processor.getPresetName(), name) << index;
        EXPECT_FALSE (processor.presetLoadPending.load());
    }
}

TEST (PresetLibrary, UnsafeNamesAndFailedWritesWriteNothingAndLoseNothing)
{
    const tools::PrivateHome home;
    const juce::File homeFolder (home.path());
    presetFolder().createDirectory();
    VeltraneAudioProcessor processor;
    processor.savePreset();
    const auto before = filesUnder (homeFolder);
    for (const auto& name : { juce::String ("../Escaped"), juce::String ("sub/Name"), juce::String ("/Absolute"), juce::String::repeatedString ("n", 300) })
    {
        processor.setPresetName (name);
        processor.presetListChanged = false;
        processor.savePreset();
        EXPECT_EQ (filesUnder (homeFolder), before) << name;
        EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("Init")) << name;
        EXPECT_TRUE (processor.presetListChanged.load()) << name;
    }
    // Odd names without a separator stay inside the folder.
    processor.setPresetName ("..");
    processor.savePreset();
    EXPECT_TRUE (presetFolder().getChildFile ("...vtp").existsAsFile());
}
