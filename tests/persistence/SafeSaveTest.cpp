#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

#include <csignal>
#include <sys/resource.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
juce::MemoryBlock bytesOf (const juce::File& file) { juce::MemoryBlock bytes; file.loadFileAsData (bytes); return bytes; }
juce::StringArray sorted (juce::StringArray names) { names.sort (false); return names; }
}

// A write cut short (disk full, quota, file-size limit) leaves the old file as it was.
TEST (SafeSave, FileSizeLimitLeavesPresetAndPreferencesWhole)
{
    TemporaryHome home;
    presetFolder().createDirectory();   // an existing folder: no factory presets
    std::make_unique<VeltraneAudioProcessor>()->setLastEditorSize (1200.0f, 600.0f);   // writes the preferences
    auto processor = std::make_unique<VeltraneAudioProcessor>();
    processor->setPresetName ("Pad");
    ASSERT_TRUE (processor->savePreset());
    const auto preset = presetFolder().getChildFile ("Pad.vtp");
    const auto presetBefore = bytesOf (preset), preferencesBefore = bytesOf (preferencesFile());
    ASSERT_GT (juce::jmin (presetBefore.getSize(), preferencesBefore.getSize()), 1000u);
    processor->setLastEditorSize (1300.0f, 700.0f);

    const auto child = ::fork();
    ASSERT_GE (child, 0);

    if (child == 0)
    {
        ::alarm (30);   // a child that hangs fails instead
        const rlimit limit { 100, 100 };
        ::signal (SIGXFSZ, SIG_IGN);
        ::setrlimit (RLIMIT_FSIZE, &limit);
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
    EXPECT_EQ (bytesOf (preset), presetBefore);
    EXPECT_EQ (bytesOf (preferencesFile()), preferencesBefore);
    EXPECT_EQ (presetFolder().getNumberOfChildFiles (juce::File::findFilesAndDirectories), 1);   // no temporary left
}

TEST (SafeSave, SavesInProgressAndTheirLeftoversAreNeverListed)
{
    TemporaryHome home;
    presetFolder().createDirectory();   // an existing folder: no factory presets
    VeltraneAudioProcessor saver;
    saver.setPresetName ("Pad");
    saver.savePreset();

    PresetLibrary library;
    library.chooseRoot (juce::SystemStats::Linux);
    library.initialise ("Veltrane", "vtp");
    std::atomic<bool> saving { true };
    std::thread other ([&] { for (int i = 0; i < 40; ++i) saver.savePreset(); saving = false; });
    int scans = 0, wrongLists = 0;

    for (; saving || scans == 0; ++scans)
    {
        library.rescan();
        wrongLists += library.getPresetNames() != juce::StringArray ("Pad") ? 1 : 0;
    }

    other.join();
    EXPECT_EQ (wrongLists, 0) << "of " << scans << " scans";

    // Leftovers of the old "<name>_temp<8 hex digits>.vtp" saves beside their preset are
    // skipped; names that only look alike stay listed.
    for (const auto* name : { "Pad_temp0badf00d", "Solo_temp0badf00d", "Echo", "Echo_temp120", "Pad_temp0BADF00D" })
        presetFolder().getChildFile (juce::String (name) + ".vtp").replaceWithText ("<VELTRANE_PRESET/>");

    library.rescan();
    EXPECT_EQ (sorted (library.getPresetNames()),
               juce::StringArray ({ "Echo", "Echo_temp120", "Pad", "Pad_temp0BADF00D", "Solo_temp0badf00d" }));
}

TEST (SafeSave, BackslashNamesSaveAndTheEmptyNameIsNoPreset)
{
    TemporaryHome home;
    presetFolder().createDirectory();   // an existing folder: no factory presets
    {
        VeltraneAudioProcessor processor;
        processor.setParameter (Param::Delay1Feedback, 0.25f);
        processor.setPresetName ("AC\\DC");
        EXPECT_TRUE (processor.savePreset());
        processor.setPresetName ("");
        EXPECT_FALSE (processor.savePreset());
        EXPECT_EQ (processor.getPresetNames(), juce::StringArray ("AC\\DC"));
    }

    PresetLibrary windows;
    windows.platform = 0;
    EXPECT_FALSE (windows.isSafePresetName ("AC\\DC"));

    // A ".vtp" of an earlier version is listed as ".vtp" and loads when picked; a typed
    // name that matches no entry (index -1) loads nothing.
    presetFolder().getChildFile (".vtp").replaceWithText ("<VELTRANE_PRESET PresetName=\"\" Delay1Feedback=\"0.75\"/>");
    VeltraneAudioProcessor processor;
    const auto names = processor.getPresetNames();
    ASSERT_EQ (sorted (names), juce::StringArray ({ ".vtp", "AC\\DC" }));

    for (auto [index, value] : { std::pair { -1, 0.4f }, { names.indexOf (".vtp"), 0.75f }, { names.indexOf ("AC\\DC"), 0.25f } })
    {
        processor.presetToLoad.store (index);
        processor.presetLoadPending.store (true);
        processBlock (processor);
        EXPECT_EQ (processor.getParameter (Param::Delay1Feedback), value) << index;
    }
}
