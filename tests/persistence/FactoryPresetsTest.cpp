#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
// The preset files of the source tree, the set a first run must write.
juce::Array<juce::File> sourcePresets()
{
    auto files = juce::File (VELTRANE_FACTORY_PRESETS).findChildFiles (juce::File::findFiles, false, "*.vtp");
    files.sort();
    return files;
}

juce::StringArray namesIn (const juce::File& folder)
{
    juce::StringArray names;
    for (const auto& file : folder.findChildFiles (juce::File::findFiles, false, "*"))
        names.add (file.getFileName());
    names.sort (false);
    return names;
}
}

TEST (FactoryPresets, FirstRunWritesExactlyTheFactorySetAndEachSetsAll33Values)
{
    const TemporaryHome home;
    VeltraneAudioProcessor processor;
    const auto sources = sourcePresets();
    ASSERT_GE (sources.size(), 16);

    juce::StringArray expected;
    for (const auto& source : sources)
        expected.add (source.getFileName());
    EXPECT_EQ (namesIn (presetFolder()), expected);

    // Each one loaded as the preset box or a program change loads it: by its index in the list.
    const auto listed = processor.getPresetNames();
    ASSERT_EQ (listed.size(), sources.size());

    for (const auto& source : sources)
    {
        const auto name = source.getFileNameWithoutExtension();
        const auto xml = juce::XmlDocument::parse (source);
        ASSERT_NE (xml, nullptr) << name;
        EXPECT_EQ (xml->getStringAttribute ("PresetName"), name);

        for (int i = 0; i < Param::count; ++i)   // away from every stored value first
            processor.setParameter (i, std::abs (xml->getDoubleAttribute (processor.getParameterName (i)) - 0.37) < 1e-6 ? 0.73f : 0.37f);

        processor.presetToLoad.store (listed.indexOf (name));
        processor.presetLoadPending.store (true);
        processBlock (processor);

        EXPECT_EQ (processor.getPresetName(), name);
        for (int i = 0; i < Param::count; ++i)
        {
            const auto id = processor.getParameterName (i);
            ASSERT_TRUE (xml->hasAttribute (id)) << name << " " << id;
            EXPECT_EQ (processor.getParameter (i), (float) xml->getDoubleAttribute (id)) << name << " " << id;
        }
    }
}

TEST (FactoryPresets, LaterRunsNeitherBringBackNorOverwriteAPreset)
{
    const TemporaryHome home;
    { VeltraneAudioProcessor firstRun; }
    const auto deleted = presetFolder().getChildFile (sourcePresets()[0].getFileName());
    const auto changed = presetFolder().getChildFile (sourcePresets()[1].getFileName());
    ASSERT_TRUE (deleted.deleteFile());
    ASSERT_TRUE (changed.replaceWithText ("<VELTRANE_PRESET PresetName=\"Mine\" DryWet=\"0.25\"/>"));
    const auto before = namesIn (presetFolder());

    VeltraneAudioProcessor secondRun;

    EXPECT_EQ (namesIn (presetFolder()), before);
    EXPECT_EQ (changed.loadFileAsString(), "<VELTRANE_PRESET PresetName=\"Mine\" DryWet=\"0.25\"/>");
    EXPECT_EQ (secondRun.getPresetNames().size(), sourcePresets().size() - 1);
}
