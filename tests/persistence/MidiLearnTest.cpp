#include "PersistenceTestSupport.h"
#include "persistence/StateChunk.h"
#include "support/TemporaryHome.h"

#include <gtest/gtest.h>

#include <map>

using namespace veltrane;
using namespace veltrane::test;

TEST (MidiLearn, ControllerOnAnyChannelBindsAndSetsInTheSameBlock)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.midiLearnActive.store (true);
    processor.setParameterFromControl (Param::Delay1Time, 0.3f, true);

    processBlock (processor, controlChange (5, 74, 127, 10));
    EXPECT_EQ (processor.getParameterRecord (Param::Delay1Time).midiController.load(), 74);
    EXPECT_FALSE (processor.getParameterRecord (Param::Delay1Time).learnArmed.load());
    EXPECT_EQ (processor.getParameter (Param::Delay1Time), 1.0f);

    processBlock (processor, controlChange (1, 74, 0));
    EXPECT_EQ (processor.getParameter (Param::Delay1Time), 0.0f);

    processBlock (processor, controlChange (16, 74, 64));
    EXPECT_EQ (processor.getParameter (Param::Delay1Time), 64.0f / 127.0f);
    EXPECT_NEAR (processor.getParameter (Param::Delay1Time), 0.503937f, 1.0e-6f);
}

TEST (MidiLearn, OneControllerDrivesEveryArmedParameter)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.midiLearnActive.store (true);
    processor.setParameterFromControl (Param::DryWet, 0.5f, true);
    processor.setParameterFromControl (Param::Delay2Feedback, 0.5f, true);

    processBlock (processor, controlChange (1, 7, 127));

    EXPECT_EQ (processor.getParameterRecord (Param::DryWet).midiController.load(), 7);
    EXPECT_EQ (processor.getParameterRecord (Param::Delay2Feedback).midiController.load(), 7);
    EXPECT_EQ (processor.getParameter (Param::DryWet), 1.0f);
    EXPECT_EQ (processor.getParameter (Param::Delay2Feedback), 1.0f);
}

TEST (MidiLearn, ArmedParameterWaitsWhileLearnModeIsOff)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.midiLearnActive.store (true);
    processor.setParameterFromControl (Param::MixMode, 0.0f, true);
    processor.midiLearnActive.store (false);

    // Off: touching arms nothing and controllers bind nothing.
    processor.setParameterFromControl (Param::Waveshaper, 0.0f, true);
    EXPECT_FALSE (processor.getParameterRecord (Param::Waveshaper).learnArmed.load());
    processBlock (processor, controlChange (1, 20, 127));
    EXPECT_EQ (processor.getParameterRecord (Param::MixMode).midiController.load(), -1);
    EXPECT_EQ (processor.getParameter (Param::MixMode), 0.0f);

    processor.midiLearnActive.store (true);
    processBlock (processor, controlChange (1, 21, 127));
    EXPECT_EQ (processor.getParameterRecord (Param::MixMode).midiController.load(), 21);
    EXPECT_EQ (processor.getParameterRecord (Param::Waveshaper).midiController.load(), -1);
}

TEST (MidiLearn, UnlearnForgetsTheBindingButTakesTheValue)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.getParameterRecord (Param::LFO1Rate).midiController.store (30);
    processor.midiUnlearnActive.store (true);

    processor.setParameterFromControl (Param::LFO1Rate, 0.25f, true);
    EXPECT_EQ (processor.getParameterRecord (Param::LFO1Rate).midiController.load(), -1);
    EXPECT_EQ (processor.getParameter (Param::LFO1Rate), 0.25f);

    // A controller never unlearns.
    processor.getParameterRecord (Param::LFO2Rate).midiController.store (31);
    processBlock (processor, controlChange (1, 31, 0));
    EXPECT_EQ (processor.getParameterRecord (Param::LFO2Rate).midiController.load(), 31);
}

TEST (MidiLearn, ClearWaitsForTheNextBlock)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.getParameterRecord (0).midiController.store (1);
    processor.getParameterRecord (32).midiController.store (2);
    processor.getParameterRecord (5).learnArmed.store (true);
    processor.midiClearPending.store (true);

    EXPECT_EQ (processor.getParameterRecord (0).midiController.load(), 1);
    EXPECT_TRUE (processor.midiClearPending.load());

    processBlock (processor);
    EXPECT_FALSE (processor.midiClearPending.load());
    EXPECT_EQ (controllersOf (processor), noControllers());
    EXPECT_TRUE (processor.getParameterRecord (5).learnArmed.load());
}

TEST (Preferences, NoFileGivesDefaults)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;

    EXPECT_EQ (processor.lastEditorWidth, 1000.0f);
    EXPECT_EQ (processor.lastEditorHeight, 500.0f);
    EXPECT_EQ (controllersOf (processor), noControllers());
}

TEST (Preferences, BindingsAndSizeOutliveTheInstance)
{
    TemporaryHome home;
    {
        VeltraneAudioProcessor processor;
        processor.getParameterRecord (Param::Delay1Time).midiController.store (74);
        processor.setLastEditorSize (1200.0f, 600.0f);
    }

    const auto xml = juce::parseXML (preferencesFile());
    ASSERT_NE (xml, nullptr);
    EXPECT_TRUE (xml->hasTagName ("PROPERTIES"));
    std::map<juce::String, juce::String> values;
    for (auto* value : xml->getChildWithTagNameIterator ("VALUE"))
        values[value->getStringAttribute ("name")] = value->getStringAttribute ("val");

    EXPECT_EQ (values["Delay1TimeCC"], "74");
    for (int i = 1; i < Param::count; ++i)
        EXPECT_EQ (values[controllerKey (i)], "-1") << controllerKey (i);
    EXPECT_EQ (values["LastWidth"].getDoubleValue(), 1200.0);
    EXPECT_EQ (values["LastHeight"].getDoubleValue(), 600.0);

    VeltraneAudioProcessor next;
    EXPECT_EQ (next.getParameterRecord (Param::Delay1Time).midiController.load(), 74);
    EXPECT_EQ (next.lastEditorWidth, 1200.0f);
    EXPECT_EQ (next.lastEditorHeight, 600.0f);
}

TEST (Preferences, KeysAreCaseSensitiveAndJunkReadsAsZero)
{
    TemporaryHome home;
    preferencesFile().getParentDirectory().createDirectory();
    preferencesFile().replaceWithText ("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<PROPERTIES>"
                                       "<VALUE name=\"lastwidth\" val=\"800\"/>"
                                       "<VALUE name=\"LastHeight\" val=\"tall\"/>"
                                       "<VALUE name=\"delay1timecc\" val=\"5\"/>"
                                       "<VALUE name=\"DryWetCC\" val=\"11\"/>"
                                       "</PROPERTIES>");

    VeltraneAudioProcessor processor;
    EXPECT_EQ (processor.lastEditorWidth, 1000.0f);
    EXPECT_EQ (processor.lastEditorHeight, 0.0f);
    EXPECT_EQ (processor.getParameterRecord (Param::Delay1Time).midiController.load(), -1);
    EXPECT_EQ (processor.getParameterRecord (Param::DryWet).midiController.load(), 11);
}

TEST (Preferences, StateWithoutControllersClearsBindings)
{
    TemporaryHome home;
    VeltraneAudioProcessor processor;
    processor.getParameterRecord (3).midiController.store (40);
    const auto block = wrapState ("<VELTRANE_STATE PresetName=\"x\"/>");
    processor.setStateInformation (block.getData(), (int) block.getSize());
    EXPECT_EQ (processor.getParameterRecord (3).midiController.load(), -1);
}
