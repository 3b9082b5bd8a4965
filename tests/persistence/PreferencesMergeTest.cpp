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

void writePreferences (const char* text)
{
    preferencesFile().getParentDirectory().createDirectory();
    preferencesFile().replaceWithData (text, std::strlen (text));
}
}

// An instance that closes writes only what it changed, on top of what other instances
// saved since it opened; keys it does not know, in any case, stay.
TEST (PreferencesMerge, InstancesKeepEachOthersChanges)
{
    TemporaryHome home;
    writePreferences ("<PROPERTIES><VALUE name=\"Other\" val=\"kept\"/><VALUE name=\"lastwidth\" val=\"5\"/>"
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
    auto expected = noControllers();
    expected[Param::Delay1Time] = 20;
    expected[Param::Delay1Feedback] = 30;
    EXPECT_EQ (controllersOf (next), expected);
    EXPECT_EQ (std::pair (next.lastEditorWidth, next.lastEditorHeight), std::pair (1200.0f, 600.0f));
    EXPECT_EQ (valueInFile ("Other") + valueInFile ("lastwidth"), "kept5");
}

// A damaged or foreign file gives the defaults and is replaced by a whole one on close.
TEST (PreferencesMerge, UnreadableFilesAreReplacedWhole)
{
    for (const auto* text : { "<PROPERTIES><VALUE name=\"DryWetCC\" val=\"7\"/>", "<OTHER/>", "\xff\xfe<" })
    {
        TemporaryHome home;
        writePreferences (text);
        std::make_unique<VeltraneAudioProcessor>()->getParameterRecord (Param::Delay1Time).midiController.store (74);
        EXPECT_EQ (valueInFile ("Delay1TimeCC") + valueInFile ("DryWetCC"), "74-1") << text;
    }
}
