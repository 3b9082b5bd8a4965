#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <map>

using namespace veltrane;

namespace
{
// One block carrying a control change (MIDI channel, controller, value).
void controlChange (VeltraneAudioProcessor& processor, int channel, int controller, int value)
{
    juce::AudioBuffer<float> buffer (2, 64);
    buffer.clear();
    juce::MidiBuffer midi;
    midi.addEvent (juce::MidiMessage::controllerEvent (channel, controller, value), 10);
    processor.processBlock (buffer, midi);
}
int controllerOf (VeltraneAudioProcessor& processor, int index) { return processor.getParameterRecord (index).midiController.load(); }
juce::File preferencesFile() { return juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Veltrane.prefs"); }
}

TEST (MidiLearn, TouchedControlsLearnTheNextControllerOnAnyChannelAndFollowIt)
{
    const tools::PrivateHome home;
    VeltraneAudioProcessor processor;
    processor.setParameterFromControl (Param::Waveshaper, 0.0f, true);   // learn mode off: arms nothing
    processor.midiLearnActive = true;
    processor.setParameterFromControl (Param::Delay1Time, 0.3f, true);
    processor.setParameterFromControl (Param::DryWet, 0.5f, true);
    processor.setParameterFromControl (Param::MixMode, 0.5f, false);      // a controller never arms
    controlChange (processor, 5, 74, 127);
    for (auto index : { Param::Delay1Time, Param::DryWet })
    {
        EXPECT_EQ (controllerOf (processor, index), 74);
        EXPECT_EQ (processor.getParameter (index), 1.0f);
    }
    for (auto index : { Param::Waveshaper, Param::MixMode })
        EXPECT_EQ (controllerOf (processor, index), -1);
    controlChange (processor, 16, 74, 64);
    EXPECT_EQ (processor.getParameter (Param::Delay1Time), 64.0f / 127.0f);
    controlChange (processor, 1, 75, 0);   // no parameter follows 75
    EXPECT_EQ (processor.getParameter (Param::DryWet), 64.0f / 127.0f);
}

TEST (MidiLearn, UnlearnForgetsTouchedBindingsAndClearWaitsForTheNextBlock)
{
    const tools::PrivateHome home;
    VeltraneAudioProcessor processor;
    processor.getParameterRecord (Param::LFO1Rate).midiController = 30;
    processor.getParameterRecord (Param::LFO2Rate).midiController = 31;
    processor.midiUnlearnActive = true;
    processor.setParameterFromControl (Param::LFO1Rate, 0.25f, true);
    controlChange (processor, 1, 31, 0);   // a controller never unlearns
    EXPECT_EQ (controllerOf (processor, Param::LFO1Rate), -1);
    EXPECT_EQ (processor.getParameter (Param::LFO1Rate), 0.25f);
    EXPECT_EQ (controllerOf (processor, Param::LFO2Rate), 31);
    EXPECT_EQ (processor.getParameter (Param::LFO2Rate), 0.0f);
    processor.getParameterRecord (5).learnArmed = true;
    processor.midiClearPending = true;
    EXPECT_EQ (controllerOf (processor, Param::LFO2Rate), 31);
    controlChange (processor, 1, 31, 127);   // cleared at the block start, before the controller
    EXPECT_FALSE (processor.midiClearPending.load());
    EXPECT_EQ (controllerOf (processor, Param::LFO2Rate), -1);
    EXPECT_EQ (processor.getParameter (Param::LFO2Rate), 0.0f);
    EXPECT_TRUE (processor.getParameterRecord (5).learnArmed.load());
}

TEST (Preferences, BindingsAndEditorSizeOutliveTheInstanceUnderCaseSensitiveKeys)
{
    const tools::PrivateHome home;
    {
        VeltraneAudioProcessor processor;
        EXPECT_EQ (processor.lastEditorWidth, 1000.0f);
        EXPECT_EQ (processor.lastEditorHeight, 500.0f);
        EXPECT_EQ (controllerOf (processor, 0), -1);
        processor.getParameterRecord (Param::Delay1Time).midiController = 74;
        processor.setLastEditorSize (1200.0f, 600.0f);
    }
    std::map<juce::String, juce::String> values;
    const auto xml = juce::parseXML (preferencesFile());
    ASSERT_NE (xml, nullptr);
    for (auto* value : xml->getChildWithTagNameIterator ("VALUE"))
        values[value->getStringAttribute ("name")] = value->getStringAttribute ("val");
    EXPECT_EQ (values.size(), 35u);
    EXPECT_EQ (values["Delay1TimeCC"] + " " + values["LFO2SyncedRateCC"], "74 -1");
    EXPECT_EQ (values["LastWidth"].getDoubleValue(), 1200.0);
    EXPECT_EQ (values["LastHeight"].getDoubleValue(), 600.0);
    VeltraneAudioProcessor next;
    EXPECT_EQ (controllerOf (next, Param::Delay1Time), 74);
    EXPECT_EQ (next.lastEditorWidth, 1200.0f);
    // Keys differ by case; a value that is no number reads as 0.
    preferencesFile().replaceWithText ("<?xml version=\"1.0\"?><PROPERTIES><VALUE name=\"lastwidth\" val=\"800\"/>"
                                       "<VALUE name=\"LastHeight\" val=\"tall\"/><VALUE name=\"delay1timecc\" val=\"5\"/></PROPERTIES>");
    VeltraneAudioProcessor odd;
    EXPECT_EQ (odd.lastEditorWidth, 1000.0f);
    EXPECT_EQ (odd.lastEditorHeight, 0.0f);
    EXPECT_EQ (controllerOf (odd, Param::Delay1Time), -1);
}
