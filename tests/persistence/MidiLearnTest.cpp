#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <cstring>

using namespace veltrane;

namespace
{
// One block carrying a control change (MIDI channel, controller, value).
void controlChange (VeltraneAudioProcessor& processor, int channel, int controller, int value)
{
    juce::AudioBuffer<float> silence (2, 64);
    silence.clear();
    juce::MidiBuffer midi (juce::MidiMessage::controllerEvent (channel, controller, value));
    processor.processBlock (silence, midi);
}
int controllerOf (VeltraneAudioProcessor& processor, int index) { return processor.getParameterRecord (index).midiController.load(); }
juce::File preferencesFile() { return juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Veltrane.prefs"); }
juce::String valueInFile (const juce::String& key)
{
    const auto xml = juce::parseXML (preferencesFile());
    auto* value = xml != nullptr ? xml->getChildByAttribute ("name", key) : nullptr;
    return value != nullptr ? value->getStringAttribute ("val") : "(none)";
}
void writePreferences (const char* text) { preferencesFile().getParentDirectory().createDirectory(); preferencesFile().replaceWithData (text, std::strlen (text)); }
}

TEST (MidiLearn, TouchedControlsLearnOrForgetTheNextControllerAndClearWaitsForTheNextBlock)
{
    const tools::PrivateHome home;
    VeltraneAudioProcessor processor;
    processor.setParameterFromControl (Param::Waveshaper, 0.0f, true);   // learn mode off: arms nothing
    processor.midiLearnActive = true;
    processor.setParameterFromControl (Param::Delay1Time, 0.3f, true);
    processor.setParameterFromControl (Param::DryWet, 0.5f, true);
    processor.setParameterFromControl (Param::MixMode, 0.5f, false);      // a controller never arms
    controlChange (processor, 5, 74, 127);                                 // on any channel
    for (auto index : { Param::Delay1Time, Param::DryWet })
        EXPECT_EQ (std::pair (controllerOf (processor, index), processor.getParameter (index)), std::pair (74, 1.0f));
    for (auto index : { Param::Waveshaper, Param::MixMode })
        EXPECT_EQ (controllerOf (processor, index), -1);
    controlChange (processor, 16, 74, 64);
    controlChange (processor, 1, 75, 0);   // no parameter follows 75
    EXPECT_EQ (processor.getParameter (Param::DryWet), 64.0f / 127.0f);
    processor.midiLearnActive = false;
    processor.midiUnlearnActive = true;
    processor.setParameterFromControl (Param::DryWet, 0.25f, true);
    controlChange (processor, 1, 74, 0);   // a controller never unlearns
    EXPECT_EQ (std::pair (controllerOf (processor, Param::DryWet), processor.getParameter (Param::DryWet)), std::pair (-1, 0.25f));
    EXPECT_EQ (std::pair (controllerOf (processor, Param::Delay1Time), processor.getParameter (Param::Delay1Time)), std::pair (74, 0.0f));
    processor.getParameterRecord (5).learnArmed = true;
    processor.midiClearPending = true;
    EXPECT_EQ (controllerOf (processor, Param::Delay1Time), 74);
    controlChange (processor, 1, 74, 127);   // cleared at the block start, before the controller
    EXPECT_FALSE (processor.midiClearPending.load());
    EXPECT_EQ (std::pair (controllerOf (processor, Param::Delay1Time), processor.getParameter (Param::Delay1Time)), std::pair (-1, 0.0f));
    EXPECT_TRUE (processor.getParameterRecord (5).learnArmed.load());
}

// An instance that closes writes only what it changed, on top of what other instances saved
// since it opened; keys are case-sensitive, and those it does not know stay.
TEST (Preferences, BindingsAndEditorSizeOutliveTheInstanceAndInstancesKeepEachOthersChanges)
{
    const tools::PrivateHome home;
    writePreferences ("<PROPERTIES><VALUE name=\"Other\" val=\"kept\"/><VALUE name=\"lastwidth\" val=\"5\"/>"
                      "<VALUE name=\"LastHeight\" val=\"tall\"/><VALUE name=\"DryWetCC\" val=\"7\"/><VALUE name=\"delay1timecc\" val=\"5\"/></PROPERTIES>");
    auto longLived = std::make_unique<VeltraneAudioProcessor>();
    EXPECT_EQ (std::pair (longLived->lastEditorWidth, longLived->lastEditorHeight), std::pair (1000.0f, 0.0f));   // no number reads as 0
    EXPECT_EQ (std::pair (controllerOf (*longLived, Param::DryWet), controllerOf (*longLived, Param::Delay1Time)), std::pair (7, -1));
    {
        VeltraneAudioProcessor shortLived;
        shortLived.getParameterRecord (Param::Delay1Time).midiController.store (20);
        shortLived.getParameterRecord (Param::DryWet).midiController.store (-1);
        shortLived.setLastEditorSize (1200.0f, 600.0f);
    }
    longLived->getParameterRecord (Param::Delay1Feedback).midiController.store (30);
    longLived.reset();
    VeltraneAudioProcessor next;
    for (int i = 0; i < Param::count; ++i)
        EXPECT_EQ (controllerOf (next, i), i == Param::Delay1Time ? 20 : i == Param::Delay1Feedback ? 30 : -1) << i;
    EXPECT_EQ (std::pair (next.lastEditorWidth, next.lastEditorHeight), std::pair (1200.0f, 600.0f));
    EXPECT_EQ (valueInFile ("Other") + valueInFile ("lastwidth") + " " + valueInFile ("Delay1TimeCC") + " " + valueInFile ("LastWidth"), "kept5 20 1200.0");
}

// A cut, foreign or undecodable preferences file is replaced whole by the next save, losing nothing it could hold.
TEST (Preferences, UnreadableFilesAreReplacedWhole)
{
    for (const auto* text : { "<PROPERTIES><VALUE name=\"DryWetCC\" val=\"7\"/>", "<OTHER/>", "\xff\xfe<" })
    {
        const tools::PrivateHome home;
        writePreferences (text);
        std::make_unique<VeltraneAudioProcessor>()->getParameterRecord (Param::Delay1Time).midiController.store (74);
        EXPECT_EQ (valueInFile ("Delay1TimeCC") + valueInFile ("DryWetCC"), "74-1") << text;
    }
}
