#include "PersistenceTestSupport.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
juce::String valueInFile (const juce::String& key)
{
    const auto xml = juce::parseXML (preferencesFile());
    auto* value = xml != nullptr ? xml->getChildByAttribute ("name", key) : nullptr;
    return value != nullptr ? value->getStringAttribute ("val") : "(none)";
}
}

// An instance that closes writes only what it changed, on top of what other instances
// saved since it opened; keys it does not know, in any case, stay.
TEST (PreferencesMerge, InstancesKeepEachOthersChanges)
{
    TemporaryHome home;
    preferencesFile().getParentDirectory().createDirectory();
    preferencesFile().replaceWithText ("<PROPERTIES><VALUE name=\"Other\" val=\"kept\"/><VALUE name=\"lastwidth\" val=\"5\"/>"
                                       "<VALUE name=\"DryWetCC\" val=\"7\"/></PROPERTIES>");

    auto longLived = std::make_unique<VeltraneAudioProcessor>();
    {
        VeltraneAudioProcessor shortLived;
        shortLived.getParameterRecord (Param::Delay1Time).midiController.store (20);
        shortLived.getParameterRecord (Param::DryWet).midiController.store (-1);
        shortLived.setLastEditorSize (1200.0f, 600.0f);
    }
    longLived->getParameterRecord (Param::Delay1Feedback).midiController.store (30);
    longLived.reset();

    VeltraneAudioProcessor next;
    EXPECT_EQ (next.getParameterRecord (Param::Delay1Time).midiController.load(), 20);
    EXPECT_EQ (next.getParameterRecord (Param::Delay1Feedback).midiController.load(), 30);
    EXPECT_EQ (next.getParameterRecord (Param::DryWet).midiController.load(), -1);
    EXPECT_EQ (next.lastEditorWidth, 1200.0f);
    EXPECT_EQ (next.lastEditorHeight, 600.0f);
    EXPECT_EQ (valueInFile ("Other"), "kept");
    EXPECT_EQ (valueInFile ("lastwidth"), "5");
}

// A damaged or foreign file gives the defaults and is replaced by a whole one on close.
TEST (PreferencesMerge, UnreadableFilesAreReplacedWhole)
{
    for (const auto* text : { "<PROPERTIES><VALUE name=\"DryWetCC\" val=\"7\"/>", "<OTHER/>", "\xff\xfe<" })
    {
        TemporaryHome home;
        preferencesFile().getParentDirectory().createDirectory();
        preferencesFile().replaceWithData (text, std::strlen (text));
        {
            VeltraneAudioProcessor processor;
            EXPECT_EQ (controllersOf (processor), noControllers()) << text;
            processor.getParameterRecord (Param::Delay1Time).midiController.store (74);
        }

        EXPECT_EQ (valueInFile ("Delay1TimeCC"), "74") << text;
        EXPECT_EQ (valueInFile ("DryWetCC"), "-1") << text;
    }
}
