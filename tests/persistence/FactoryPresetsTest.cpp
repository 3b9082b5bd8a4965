#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
// The preset files of the source tree: the set a first run must write.
const auto sources = juce::File (VELTRANE_FACTORY_PRESETS).findChildFiles (juce::File::findFiles, false, "*.vtp");

juce::StringArray fileNamesIn (const juce::Array<juce::File>& files)
{
    juce::StringArray names;
    for (const auto& file : files)
        names.add (file.getFileName());
    names.sort (false);
    return names;
}

juce::StringArray presetFiles() { return fileNamesIn (presetFolder().findChildFiles (juce::File::findFiles, false, "*")); }
}

TEST (FactoryPresets, AFirstRunWritesEachOnceAndEachSetsAll33Values)
{
    const TemporaryHome home;
    {
        VeltraneAudioProcessor processor;
        ASSERT_GE (sources.size(), 16);
        EXPECT_EQ (presetFiles(), fileNamesIn (sources));
        const auto listed = processor.getPresetNames();

        for (const auto& source : sources)
        {
            const auto name = source.getFileNameWithoutExtension();
            const auto xml = juce::XmlDocument::parse (source);
            ASSERT_NE (xml, nullptr) << name;
            EXPECT_EQ (xml->getStringAttribute ("PresetName"), name);

            for (int i = 0; i < Param::count; ++i)   // away from every stored value first
                processor.setParameter (i, xml->getStringAttribute (processor.getParameterName (i)) == "0.37" ? 0.73f : 0.37f);

            // Loaded as the preset box or a program change loads it: by its place in the list.
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

    // A later run brings back no preset the user deleted and overwrites none they changed.
    const juce::String mine ("<VELTRANE_PRESET PresetName=\"Mine\" DryWet=\"0.25\"/>");
    ASSERT_TRUE (presetFolder().getChildFile (sources[0].getFileName()).deleteFile());
    ASSERT_TRUE (presetFolder().getChildFile (sources[1].getFileName()).replaceWithText (mine));
    const auto before = presetFiles();

    VeltraneAudioProcessor secondRun;

    EXPECT_EQ (presetFiles(), before);
    EXPECT_EQ (presetFolder().getChildFile (sources[1].getFileName()).loadFileAsString(), mine);
    EXPECT_EQ (secondRun.getPresetNames().size(), sources.size() - 1);
}
