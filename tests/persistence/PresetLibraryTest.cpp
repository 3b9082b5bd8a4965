#include "PersistenceTestSupport.h"
#include "persistence/PresetLibrary.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

#include <sys/stat.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
void writePreset (const juce::String& fileName, const juce::String& text)
{
    presetFolder().createDirectory();
    ASSERT_TRUE (presetFolder().getChildFile (fileName).replaceWithText (text));
}

// Every file below the temporary home, relative to it.
juce::StringArray filesUnder (const juce::File& root)
{
    juce::StringArray names;

    for (const auto& entry : juce::RangedDirectoryIterator (root, true, "*", juce::File::findFiles))
        names.add (entry.getFile().getRelativePathFrom (root));

    names.sort (false);
    return names;
}
}

TEST (PresetLibrary, EmptyFolderGivesEmptyListAndInit)
{
    TemporaryHome home;
    presetFolder().createDirectory();
    VeltraneAudioProcessor processor;

    EXPECT_TRUE (presetFolder().isDirectory());
    EXPECT_TRUE (processor.getPresetNames().isEmpty());
    EXPECT_EQ (processor.getPresetName(), "Init");
    EXPECT_TRUE (processor.presetListChanged.load());
}

TEST (PresetLibrary, SavingInitWritesJuceLayoutWithoutControllers)
{
    TemporaryHome home;
    presetFolder().createDirectory();
    VeltraneAudioProcessor processor;
    processor.getParameterRecord (0).midiController.store (74);
    processor.presetListChanged.store (false);

    processor.savePreset();

    const auto file = presetFolder().getChildFile ("Init.vtp");
    ASSERT_TRUE (file.existsAsFile());
    EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("Init"));
    EXPECT_TRUE (processor.presetListChanged.load());

    const auto text = file.loadFileAsString();
    EXPECT_TRUE (text.endsWith ("/>\r\n"));
    EXPECT_FALSE (text.contains ("CC="));

    const auto lines = juce::StringArray::fromLines (text.upToLastOccurrenceOf ("\r\n", false, false));
    ASSERT_GE (lines.size(), 4);
    EXPECT_EQ (lines[0], "<?xml version=\"1.0\" encoding=\"UTF-8\"?>");
    EXPECT_EQ (lines[1], "");
    EXPECT_EQ (lines[2], " ");
    EXPECT_TRUE (lines[3].startsWith ("<VELTRANE_PRESET PresetName=\"Init\" Delay1Time=\""));

    // Attributes wrap, under the first one, once a line's attributes pass 60 characters.
    const juce::String indent (juce::String::repeatedString (" ", 17));
    juce::StringArray attributes;

    for (int i = 3; i < lines.size(); ++i)
    {
        const auto line = i == 3 ? lines[i].fromFirstOccurrenceOf ("<VELTRANE_PRESET", false, false) : lines[i];
        if (i > 3)
        {
            EXPECT_TRUE (line.startsWith (indent) && line[17] != ' ') << line;
        }

        const auto attributesPart = i == 3 ? line : " " + line.substring (17);
        const auto lastAttributeStart = attributesPart.lastIndexOf (" ");
        if (i < lines.size() - 1)
        {
            EXPECT_GT (attributesPart.length(), 60) << line;
            EXPECT_LE (lastAttributeStart, 60) << line;
        }

        attributes.addTokens (attributesPart.upToLastOccurrenceOf ("/>", false, false), " ", "\"");
    }

    attributes.removeEmptyStrings();
    ASSERT_EQ (attributes.size(), 34);
    for (int i = 0; i < Param::count; ++i)
        EXPECT_TRUE (attributes[i + 1].startsWith (juce::String (parameterTable[(size_t) i].identifier) + "=\""));
}

TEST (PresetLibrary, LoadSetsValuesAndNameButKeepsBindings)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.setParameter (0, 0.75f);
    processor.setParameter (Param::MixMode, 1.0f);
    processor.setPresetName ("Wide & \"open\"");
    processor.savePreset();

    processor.setParameter (0, 0.1f);
    processor.setParameter (Param::MixMode, 0.0f);
    processor.setPresetName ("Other");
    processor.getParameterRecord (0).midiController.store (20);

    processor.loadPreset (presetFolder().getChildFile ("Wide & \"open\".vtp").getFullPathName());

    EXPECT_EQ (processor.getParameter (0), 0.75f);
    EXPECT_EQ (processor.getParameter (Param::MixMode), 1.0f);
    EXPECT_EQ (processor.getPresetName(), "Wide & \"open\"");
    EXPECT_EQ (processor.getParameterRecord (0).midiController.load(), 20);
}

TEST (PresetLibrary, MissingAttributesKeepValuesButNotifyTheHost)
{
    TemporaryHome home;
    writePreset ("Sparse.vtp", "<veltrane_preset delay1FEEDBACK=\"0.25\"/>");
    VeltraneAudioProcessor processor;
    processor.setParameter (0, 0.6f);
    ParameterChangeRecorder recorder;
    processor.addListener (&recorder);

    processor.loadPreset (presetFolder().getChildFile ("Sparse.vtp").getFullPathName());

    EXPECT_EQ (processor.getParameter (0), 0.6f);
    EXPECT_EQ (processor.getParameter (1), 0.25f);
    EXPECT_EQ (processor.getPresetName(), " ");
    EXPECT_EQ (recorder.changedIndices.size(), Param::count);
    processor.removeListener (&recorder);
}

TEST (PresetLibrary, UnusableFilesChangeNothing)
{
    TemporaryHome home;
    writePreset ("State.vtp", "<VELTRANE_STATE PresetName=\"State\" Delay1Time=\"0.5\"/>");
    writePreset ("Broken.vtp", "VELTRANE_PRESET PresetName=\"Broken\" Delay1Time=\"0.5\"");
    writePreset ("Huge.vtp", "<VELTRANE_PRESET PresetName=\"" + juce::String::repeatedString ("x", 1 << 20) + "\"/>");
    writePreset ("Deep.vtp", "<VELTRANE_PRESET Delay1Time=\"0.5\">" + juce::String::repeatedString ("<a>", 200000));
    writePreset ("Entities.vtp", "<!DOCTYPE VELTRANE_PRESET SYSTEM \"/etc/passwd\" [<!ENTITY e SYSTEM \"/etc/passwd\">]>"
                                 "<VELTRANE_PRESET PresetName=\"&e;\" Delay1Time=\"0.5\"/>");
    presetFolder().getChildFile ("Zero.vtp").createSymbolicLink (juce::File ("/dev/zero"), true);
    ASSERT_EQ (::mkfifo (presetFolder().getChildFile ("Pipe.vtp").getFullPathName().toRawUTF8(), 0600), 0);

    VeltraneAudioProcessor processor;
    const auto before = chunkOf (processor);

    for (const auto* name : { "State", "Broken", "Huge", "Deep", "Entities", "Zero", "Pipe", "Missing" })
    {
        processor.loadPreset (presetFolder().getChildFile (juce::String (name) + ".vtp").getFullPathName());
        EXPECT_EQ (chunkOf (processor), before) << name;
    }
}

TEST (PresetLibrary, ListsOnlyTheExtensionInFileSystemCase)
{
    TemporaryHome home;
    writePreset ("a.vtp", "<VELTRANE_PRESET/>");
    writePreset ("b.VTP", "<VELTRANE_PRESET/>");
    writePreset ("c.txt", "<VELTRANE_PRESET/>");
    presetFolder().getChildFile ("d.vtp").createDirectory();
    presetFolder().getChildFile ("e").createDirectory();
    presetFolder().getChildFile ("e/f.vtp").replaceWithText ("<VELTRANE_PRESET/>");

    VeltraneAudioProcessor processor;
    EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("a"));
}

TEST (PresetLibrary, ProgramChangeLoadsAtTheNextBlock)
{
    TemporaryHome home;
    for (auto [name, value] : { std::pair { "One", "0.1" }, { "Two", "0.2" }, { "Three", "0.3" } })
        writePreset (juce::String (name) + ".vtp", juce::String ("<VELTRANE_PRESET PresetName=\"") + name + "\" Delay1Feedback=\"" + value + "\"/>");

    VeltraneAudioProcessor processor;
    const auto names = processor.getPresetNames();
    ASSERT_EQ (names.size(), 3);

    processBlock (processor, programChange (3, 5));
    EXPECT_EQ (processor.getPresetName(), "Init");
    EXPECT_EQ (processor.getParameter (1), 0.4f);

    processBlock (processor);
    EXPECT_EQ (processor.getPresetName(), names[2]);
    EXPECT_FALSE (processor.presetLoadPending.load());

    // A negative index names ".vtp", which does not exist: nothing changes.
    processor.presetToLoad.store (-1);
    processor.presetLoadPending.store (true);
    processBlock (processor);
    EXPECT_EQ (processor.getPresetName(), names[2]);
    EXPECT_FALSE (processor.presetLoadPending.load());
}

TEST (PresetLibrary, UnsafeNamesWriteNothing)
{
    TemporaryHome home;
    const juce::File homeFolder (home.path());
    VeltraneAudioProcessor processor;
    const auto before = filesUnder (homeFolder);

    for (const auto& name : { juce::String ("../Escaped"), juce::String ("../../../Escaped"), juce::String ("sub/Name"),
                              juce::String (home.path() + "/Absolute"), juce::String ("/Absolute") })
    {
        processor.setPresetName (name);
        processor.presetListChanged.store (false);
        processor.savePreset();
        EXPECT_EQ (filesUnder (homeFolder), before) << name;
        EXPECT_TRUE (processor.presetListChanged.load()) << name;
    }

    EXPECT_FALSE (juce::File ("/Absolute.vtp").exists());

    PresetLibrary library;
    library.chooseRoot (juce::SystemStats::Linux);
    library.initialise ("Veltrane", "vtp");
    EXPECT_EQ (library.getPresetPath (juce::String ("../Escaped")), "");
    EXPECT_EQ (library.getPresetPath (juce::String ("Pad")), presetFolder().getFullPathName() + "/Pad.vtp");

    // Names without separators stay inside the folder, however odd.
    for (const auto* name : { "..", "Wait..." })
    {
        processor.setPresetName (name);
        processor.savePreset();
        EXPECT_TRUE (presetFolder().getChildFile (juce::String (name) + ".vtp").existsAsFile()) << name;
    }
}

TEST (PresetLibrary, PathsByIndexClampToTheList)
{
    TemporaryHome home;
    writePreset ("Only.vtp", "<VELTRANE_PRESET/>");

    PresetLibrary library;
    library.chooseRoot (juce::SystemStats::Linux);
    EXPECT_EQ (library.platform, 2);
    library.initialise ("Veltrane", "vtp");
    const auto folder = presetFolder().getFullPathName() + "/";

    EXPECT_EQ (library.presetFolder, folder);
    EXPECT_EQ (library.getPresetPath (0), folder + "Only.vtp");
    EXPECT_EQ (library.getPresetPath (200), folder + "Only.vtp");
    EXPECT_EQ (library.getPresetPath (-1), "");

    PresetLibrary elsewhere;
    elsewhere.chooseRoot (juce::SystemStats::UnknownOS);
    elsewhere.initialise ("Veltrane", "vtp");
    EXPECT_EQ (elsewhere.platform, PresetLibrary::noPlatform);
    EXPECT_EQ (elsewhere.getPresetPath (0), "");
    EXPECT_TRUE (elsewhere.getPresetNames().isEmpty());
}
