#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <csignal>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

using namespace veltrane;

namespace
{
juce::File presetFolder() { return juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Presets/Veltrane"); }
juce::File preset (const juce::String& name) { return presetFolder().getChildFile (name + ".vtp"); }
void writePreset (const juce::String& name, const juce::String& text) { presetFolder().createDirectory(); ASSERT_TRUE (preset (name).replaceWithText (text)); }
juce::MemoryBlock stateOf (VeltraneAudioProcessor& processor) { juce::MemoryBlock block; processor.getStateInformation (block); return block; }
juce::MemoryBlock bytesOf (const juce::File& file) { juce::MemoryBlock bytes; file.loadFileAsData (bytes); return bytes; }
juce::StringArray sorted (juce::StringArray names) { names.sort (false); return names; }
void block (VeltraneAudioProcessor& processor, juce::MidiBuffer midi = {}) { juce::AudioBuffer<float> silence (2, 16); silence.clear(); processor.processBlock (silence, midi); }
// Loads the preset at this place of the list as the preset box and program changes do: in the next block.
void pick (VeltraneAudioProcessor& processor, int index) { processor.requestPresetLoad (index); block (processor); }
juce::StringArray filesUnder (const juce::File& folder)
{
    juce::StringArray names;
    for (const auto& entry : juce::RangedDirectoryIterator (folder, true, "*", juce::File::findFiles))
        names.add (entry.getFile().getRelativePathFrom (folder));
    return sorted (names);
}
}

TEST (PresetLibrary, SavedPresetHasJucesLayoutAndComesBackWithItsNameButNoBindings)
{
    const tools::PrivateHome home;
    presetFolder().createDirectory();   // not a first run: no factory presets
    VeltraneAudioProcessor processor;
    processor.presetListChanged = false;
    processor.savePreset();
    EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("Init"));
    EXPECT_TRUE (processor.presetListChanged.load());
    const auto lines = juce::StringArray::fromLines (preset ("Init").loadFileAsString());
    EXPECT_EQ (lines.joinIntoString ("|", 0, 3), "<?xml version=\"1.0\" encoding=\"UTF-8\"?>|| ");
    EXPECT_EQ (lines[3], "<VELTRANE_PRESET PresetName=\"Init\" Delay1Time=\"0.243987232\" Delay1Feedback=\"0.400000006\"");
    EXPECT_TRUE (lines[4].startsWith (juce::String::repeatedString (" ", 17) + "Delay1TimeMod=\"0\" ")) << lines[4];
    EXPECT_FALSE (lines.joinIntoString ("").contains ("CC="));
    processor.setParameter (Param::MixMode, 1.0f);
    processor.setPresetName ("Wide & \"open\"");
    processor.savePreset();
    processor.setParameter (Param::MixMode, 0.0f);
    processor.getParameterRecord (0).midiController = 20;
    processor.loadPreset (preset ("Wide & \"open\"").getFullPathName());
    EXPECT_EQ (std::pair (processor.getParameter (Param::MixMode), processor.getParameterRecord (0).midiController.load()), std::pair (1.0f, 20));   // no bindings in presets
}

TEST (PresetLibrary, MissingAttributesKeepTheirValuesAndUnusableFilesChangeNothing)
{
    const tools::PrivateHome home;
    writePreset ("Sparse", "<veltrane_preset delay1FEEDBACK=\"0.25\"/>");
    writePreset ("State", "<VELTRANE_STATE PresetName=\"State\" Delay1Time=\"0.5\"/>");
    writePreset ("Broken", "VELTRANE_PRESET PresetName=\"Broken\" Delay1Time=\"0.5\"");
    writePreset ("Huge", "<VELTRANE_PRESET PresetName=\"" + juce::String::repeatedString ("x", 1 << 20) + "\"/>");
    writePreset ("Deep", "<VELTRANE_PRESET Delay1Time=\"0.5\">" + juce::String::repeatedString ("<a>", 200000));
    writePreset ("Entities", "<!DOCTYPE VELTRANE_PRESET [<!ENTITY e SYSTEM \"/etc/passwd\">]><VELTRANE_PRESET PresetName=\"&e;\"/>");
    preset ("Zero").createSymbolicLink (juce::File ("/dev/zero"), true);
    ASSERT_EQ (::mkfifo (preset ("Pipe").getFullPathName().toRawUTF8(), 0600), 0);
    VeltraneAudioProcessor processor;
    processor.setParameter (0, 0.6f);
    const auto before = stateOf (processor);
    for (const auto* name : { "State", "Broken", "Huge", "Deep", "Entities", "Zero", "Pipe", "Missing" })
    {
        processor.loadPreset (preset (name).getFullPathName());
        EXPECT_EQ (stateOf (processor), before) << name;
    }
    processor.loadPreset (preset ("Sparse").getFullPathName());
    EXPECT_EQ (std::tuple (processor.getParameter (0), processor.getParameter (1), processor.getPresetName()), std::tuple (0.6f, 0.25f, juce::String (" ")));
}

TEST (PresetLibrary, UnsafeNamesAndFailedRenamesWriteNothingAndLoseNothing)
{
    const tools::PrivateHome home;
    const juce::File homeFolder (home.path());
    presetFolder().createDirectory();
    preset ("Taken").getChildFile ("inside").create();   // a folder where the file would go: the rename fails
    VeltraneAudioProcessor processor;
    processor.savePreset();
    const auto before = filesUnder (homeFolder);
    for (const auto& name : { juce::String ("../Escaped"), juce::String ("sub/Name"), juce::String ("/Absolute"), juce::String::repeatedString ("n", 300),
                              juce::String ("Taken"), juce::String() })
    {
        processor.setPresetName (name);
        processor.presetListChanged = false;
        EXPECT_FALSE (processor.savePreset()) << name;
        EXPECT_EQ (filesUnder (homeFolder), before) << name;
        EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("Init")) << name;
        EXPECT_TRUE (processor.presetListChanged.load()) << name;
    }
    // Names without a separator stay inside the folder; "\" is refused on Windows only.
    for (const auto* name : { "..", "AC\\DC" })
    {
        processor.setPresetName (name);
        EXPECT_TRUE (processor.savePreset() && preset (name).existsAsFile()) << name;
    }
    EXPECT_EQ (processor.getPresetNames().size(), 3);
    PresetLibrary windows;
    windows.platform = 0;
    EXPECT_FALSE (windows.isSafePresetName ("AC\\DC"));
}

// A write cut short (disk full, quota, file-size limit) leaves the old file as it was.
TEST (PresetLibrary, FileSizeLimitLeavesPresetAndPreferencesWhole)
{
    const tools::PrivateHome home;
    presetFolder().createDirectory();
    const auto preferences = presetFolder().getChildFile ("../../Veltrane.prefs");
    std::make_unique<VeltraneAudioProcessor>()->setLastEditorSize (1200.0f, 600.0f);   // writes the preferences
    auto processor = std::make_unique<VeltraneAudioProcessor>();
    processor->setPresetName ("Pad");
    ASSERT_TRUE (processor->savePreset());
    const auto presetBefore = bytesOf (preset ("Pad")), preferencesBefore = bytesOf (preferences);
    ASSERT_GT (juce::jmin (presetBefore.getSize(), preferencesBefore.getSize()), 1000u);
    processor->setLastEditorSize (1300.0f, 700.0f);
    const auto child = ::fork();
    ASSERT_GE (child, 0);
    if (child == 0)
    {
        ::alarm (30);   // a child that hangs fails instead
        const rlimit limit { 100, 100 };
        ::setrlimit (RLIMIT_FSIZE, &limit);
        ::signal (SIGXFSZ, SIG_IGN);
        processor->setParameter (0, 0.9f);
        processor->presetListChanged.store (false);
        const auto saved = processor->savePreset();
        const auto listed = processor->presetListChanged.load() && processor->getPresetNames() == juce::StringArray ("Pad");
        processor.reset();   // saves the preferences
        ::_exit (! saved && listed ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ (::waitpid (child, &status, 0), child);
    EXPECT_TRUE (WIFEXITED (status) && WEXITSTATUS (status) == 0) << "the failed save was reported as done";
    EXPECT_EQ (bytesOf (preset ("Pad")), presetBefore);
    EXPECT_EQ (bytesOf (preferences), preferencesBefore);
    EXPECT_EQ (presetFolder().getNumberOfChildFiles (juce::File::findFilesAndDirectories), 1);   // no temporary left
}

TEST (PresetLibrary, SavesInProgressAndTheirLeftoversAreNeverListed)
{
    const tools::PrivateHome home;
    presetFolder().createDirectory();
    VeltraneAudioProcessor saver;   // "Init" saved again and again
    saver.savePreset();
    PresetLibrary library;
    library.chooseRoot (juce::SystemStats::Linux);
    library.initialise ("Veltrane", "vtp");
    std::atomic<bool> saving { true };
    std::thread other ([&] { for (int i = 0; i < 40; ++i) saver.savePreset(); saving = false; });
    int scans = 0, wrongLists = 0;
    for (; saving || scans == 0; ++scans, library.rescan())
        wrongLists += library.getPresetNames() != juce::StringArray ("Init") ? 1 : 0;
    other.join();
    EXPECT_EQ (wrongLists, 0) << "of " << scans << " scans";
    // Leftovers of the old "<name>_temp<8 hex digits>.vtp" saves beside their preset are skipped; look-alikes stay.
    for (const auto* name : { "Init_temp0badf00d", "Solo_temp0badf00d", "Echo", "Echo_temp120", "Init_temp0BADF00D" })
        writePreset (name, "<VELTRANE_PRESET/>");
    library.rescan();
    EXPECT_EQ (sorted (library.getPresetNames()), juce::StringArray ({ "Echo", "Echo_temp120", "Init", "Init_temp0BADF00D", "Solo_temp0badf00d" }));
}

TEST (PresetLibrary, PresetsInEveryEncodingJuceReadsLoadAndDeclaredEntitiesStayRefused)
{
    const tools::PrivateHome home;
    presetFolder().createDirectory();
    const auto name = juce::String::fromUTF8 ("Wide \xc3\xa9 \xf0\x9f\x98\x80");
    const auto body = "<VELTRANE_PRESET PresetName=\"" + name + "\" Delay1Feedback=\"0.25\"/>";
    auto bytes = [] (const char* prefix, const juce::String& text) { juce::MemoryBlock b (prefix, std::strlen (prefix)); b.append (text.toRawUTF8(), text.getNumBytesAsUTF8()); return b; };
    // Byte-order mark and text as JUCE encodes UTF-16 (surrogate pairs included).
    auto utf16 = [] (const juce::String& text, bool bigEndian) {
        const auto marked = juce::String::charToString (0xfeff) + text;   // toUTF16() points into this string
        const auto units = marked.toUTF16();
        juce::MemoryBlock b (units.getAddress(), units.sizeInBytes() - 2);
        for (size_t i = 0; bigEndian && i < b.getSize(); i += 2)
            std::swap (b[i], b[i + 1]);
        return b;
    };
    const juce::String subset ("<!DOCTYPE VELTRANE_PRESET [\n <!-- the editor's own -->\n <!ELEMENT VELTRANE_PRESET EMPTY>\n"
                               " <!ATTLIST VELTRANE_PRESET PresetName CDATA \"x\">\n <!ENTITY unused 'a \"b\"'>\n]>\n");
    const struct { const char* what; juce::MemoryBlock bytes; bool loads; } cases[] = {
        { "UTF-8 with byte-order mark", bytes ("\xef\xbb\xbf", body), true },
        { "UTF-16 little-endian", utf16 ("<?xml version=\"1.0\" encoding=\"UTF-16\"?>\n" + body, false), true },
        { "UTF-16 big-endian", utf16 (body, true), true },
        { "internal DTD subset", bytes ("<?xml version=\"1.0\"?>\n", subset + body), true },
        { "declared entity in use", bytes ("<!DOCTYPE VELTRANE_PRESET [<!ENTITY n \"x\">]>", body.replace ("Wide", "&n;")), false },
    };
    for (const auto& c : cases)
    {
        ASSERT_TRUE (preset ("Preset").replaceWithData (c.bytes.getData(), c.bytes.getSize()));
        VeltraneAudioProcessor processor;
        processor.loadPreset (preset ("Preset").getFullPathName());
        EXPECT_EQ (processor.getParameter (Param::Delay1Feedback), c.loads ? 0.25f : 0.4f) << c.what;
        EXPECT_EQ (processor.getPresetName(), c.loads ? name : "Init") << c.what;
    }
}

// Only "*.vtp" files are listed. A program change picks by place, one past the end the last
// preset; a name longer than a state can hold is cut where it comes in (a preset picked, typing),
// so the state carrying it restores every setting.
TEST (PresetLibrary, ProgramChangesPickListedFilesAndLongestNamesRoundTripThroughTheState)
{
    const tools::PrivateHome home;
    const auto tooLong = juce::String::repeatedString (juce::String::fromUTF8 ("\xc3\xa9"), 200000);
    writePreset ("Long", "<VELTRANE_PRESET PresetName=\"" + tooLong + "\" Delay1Feedback=\"0.25\"/>");
    for (const auto* name : { "b.VTP", "c.txt", "e/f.vtp" })
        presetFolder().getChildFile (name).create();
    preset ("d").createDirectory();
    VeltraneAudioProcessor writer, reader;
    EXPECT_EQ (writer.getPresetNames(), juce::StringArray ("Long"));
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::programChange (1, 0), 0);
    block (writer, midi);   // heard in the next block
    block (writer);
    const auto chunk = stateOf (writer);
    reader.setStateInformation (chunk.getData(), (int) chunk.getSize());
    EXPECT_EQ (reader.getPresetName(), tooLong.substring (0, maxPresetNameLength));
    EXPECT_EQ (reader.getParameter (Param::Delay1Feedback), 0.25f);
    writer.setPresetName (tooLong + "typed");
    EXPECT_EQ (writer.getPresetName(), reader.getPresetName());
    for (auto [index, name] : { std::pair (1, reader.getPresetName()), { -1, juce::String ("Init") } })   // -1 names no file
    {
        writer.setPresetName ("Init");
        pick (writer, index);
        EXPECT_EQ (writer.getPresetName(), name) << index;
        EXPECT_FALSE (writer.presetLoadPending.load());
    }
}

TEST (PresetLibrary, AFirstRunWritesEachFactoryPresetOnceAndEachSetsAll33Values)
{
    const tools::PrivateHome home;
    const auto sources = juce::File (VELTRANE_FACTORY_PRESETS).findChildFiles (juce::File::findFiles, false, "*.vtp");
    ASSERT_GE (sources.size(), 16);
    {
        VeltraneAudioProcessor processor;
        EXPECT_EQ (filesUnder (presetFolder()), filesUnder (juce::File (VELTRANE_FACTORY_PRESETS)));
        for (const auto& source : sources)
        {
            const auto name = source.getFileNameWithoutExtension();
            const auto xml = juce::XmlDocument::parse (source);
            ASSERT_NE (xml, nullptr) << name;
            EXPECT_EQ (xml->getStringAttribute ("PresetName"), name);
            for (int i = 0; i < Param::count; ++i)   // away from every stored value first
                processor.setParameter (i, xml->getStringAttribute (processor.getParameterName (i)) == "0.37" ? 0.73f : 0.37f);
            pick (processor, processor.getPresetNames().indexOf (name));
            EXPECT_EQ (processor.getPresetName(), name);
            for (int i = 0; i < Param::count; ++i)
            {
                const auto id = processor.getParameterName (i);
                ASSERT_TRUE (xml->hasAttribute (id)) << name << " " << id;
                EXPECT_EQ (processor.getParameter (i), (float) xml->getDoubleAttribute (id)) << name << " " << id;
            }
        }
    }
    // A later run brings back no preset the user deleted and overwrites none they changed.
    ASSERT_TRUE (presetFolder().getChildFile (sources[0].getFileName()).deleteFile());
    ASSERT_TRUE (presetFolder().getChildFile (sources[1].getFileName()).replaceWithText ("<VELTRANE_PRESET PresetName=\"Mine\"/>"));
    const auto before = filesUnder (presetFolder());
    const VeltraneAudioProcessor secondRun;
    EXPECT_EQ (filesUnder (presetFolder()), before);
    EXPECT_EQ (presetFolder().getChildFile (sources[1].getFileName()).loadFileAsString(), "<VELTRANE_PRESET PresetName=\"Mine\"/>");
}
