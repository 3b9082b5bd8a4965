#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

using namespace veltrane;

namespace
{
// Records what the processor tells its listeners, as a host wrapper hears it.
struct RecordingListener final : juce::AudioProcessorListener
{
    juce::StringArray calls;

    void audioProcessorParameterChanged (juce::AudioProcessor*, int index, float value) override
    {
        calls.add ("set " + juce::String (index) + " " + juce::String (value));
    }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
    void audioProcessorParameterChangeGestureBegin (juce::AudioProcessor*, int index) override
    {
        calls.add ("begin " + juce::String (index));
    }
    void audioProcessorParameterChangeGestureEnd (juce::AudioProcessor*, int index) override
    {
        calls.add ("end " + juce::String (index));
    }
};

juce::AudioProcessor::BusesLayout layoutOf (const juce::AudioChannelSet& in, const juce::AudioChannelSet& out)
{
    juce::AudioProcessor::BusesLayout layout;
    layout.inputBuses.add (in);
    layout.outputBuses.add (out);
    return layout;
}
}

TEST (Processor, IdentityChannelsAndPrograms)
{
    VeltraneAudioProcessor processor;

    EXPECT_EQ (processor.getName(), "Veltrane");
    EXPECT_EQ (processor.getNumPrograms(), 0);
    EXPECT_EQ (processor.getCurrentProgram(), 0);
    EXPECT_EQ (processor.getProgramName (0), "");
    EXPECT_EQ (processor.getInputChannelName (0), "1");
    EXPECT_EQ (processor.getOutputChannelName (1), "2");
    EXPECT_TRUE (processor.acceptsMidi());
    EXPECT_FALSE (processor.producesMidi());
    EXPECT_TRUE (processor.hasEditor());
    EXPECT_EQ (processor.getLatencySamples(), 0);
    EXPECT_EQ (processor.getTotalNumInputChannels(), 2);
    EXPECT_EQ (processor.getTotalNumOutputChannels(), 2);
    EXPECT_EQ (processor.lastEditorWidth, 1000.0f);
    EXPECT_EQ (processor.lastEditorHeight, 500.0f);
}

TEST (Processor, AcceptsExactlyMonoAndStereoPairs)
{
    VeltraneAudioProcessor processor;
    const auto mono = juce::AudioChannelSet::mono();
    const auto stereo = juce::AudioChannelSet::stereo();

    EXPECT_TRUE (processor.checkBusesLayoutSupported (layoutOf (mono, mono)));
    EXPECT_TRUE (processor.checkBusesLayoutSupported (layoutOf (stereo, stereo)));
    EXPECT_FALSE (processor.checkBusesLayoutSupported (layoutOf (stereo, mono)));
    EXPECT_FALSE (processor.checkBusesLayoutSupported (layoutOf (mono, stereo)));
    EXPECT_FALSE (processor.checkBusesLayoutSupported (layoutOf (juce::AudioChannelSet::create5point1(),
                                                                 juce::AudioChannelSet::create5point1())));
}

TEST (Processor, HostParametersMirrorTheTable)
{
    VeltraneAudioProcessor processor;
    const auto& hostParameters = processor.getParameters();
    ASSERT_EQ (hostParameters.size(), 33);

    for (int i = 0; i < Param::count; ++i)
    {
        auto* parameter = hostParameters[i];
        const auto& record = processor.getParameterRecord (i);

        EXPECT_EQ (parameter->getParameterIndex(), i);
        EXPECT_EQ (parameter->getName (100), record.name);
        EXPECT_EQ (parameter->getLabel(), "");       // the unit is part of the text
        EXPECT_EQ (parameter->getDefaultValue(), record.defaultValue);
        EXPECT_EQ (parameter->getValue(), processor.getParameter (i));
        EXPECT_EQ (parameter->getCurrentValueAsText(), processor.getParameterText (i));
        EXPECT_EQ (parameter->isDiscrete(), record.isDiscrete);
        EXPECT_TRUE (parameter->isAutomatable());
        EXPECT_FALSE (parameter->isMetaParameter());

        if (record.isDiscrete)
        {
            EXPECT_EQ (parameter->getNumSteps(), record.numChoices());
        }
    }

    auto* time = hostParameters[Param::Delay1Time];
    time->setValue (1.0f);
    EXPECT_EQ (processor.getParameterText (Param::Delay1Time), "2000.00 Ms");
    EXPECT_NEAR (time->getValueForText ("120.00 Ms"), 0.243987f, 1e-6f);
    EXPECT_EQ (hostParameters[Param::MixMode]->getValueForText ("Solo 1"), 0.5f);
    EXPECT_EQ (hostParameters[Param::MixMode]->getText (0.999f, 100), "Stereo Parallel");
}

TEST (Processor, ControlChangesAreBracketedByAGesture)
{
    VeltraneAudioProcessor processor;
    RecordingListener listener;
    processor.addListener (&listener);

    processor.setParameterFromControl (Param::DryWet, 0.25f, true);
    EXPECT_EQ (listener.calls.joinIntoString ("|"), "begin 15|set 15 0.25|end 15");
    EXPECT_EQ (processor.getParameter (Param::DryWet), 0.25f);
    EXPECT_EQ (processor.getLastParameterText(), "25.00 %");

    // A refused value still reaches the host, as the value the parameter kept.
    listener.calls.clear();
    processor.setParameterNotifyingHost (Param::Delay1Time, 2.0f);
    EXPECT_EQ (listener.calls.joinIntoString ("|"), "set 0 " + juce::String (processor.getParameter (Param::Delay1Time)));

    processor.removeListener (&listener);
}

TEST (Processor, EditorControlsArmAndForgetBindingsInLearnModes)
{
    VeltraneAudioProcessor processor;
    auto& time = processor.getParameterRecord (Param::Delay1Time);

    processor.setParameterFromControl (Param::Delay1Time, 0.5f, true);
    EXPECT_FALSE (time.learnArmed.load());

    processor.midiLearnActive = true;
    processor.setParameterFromControl (Param::Delay1Time, 0.5f, false);   // a controller never arms
    EXPECT_FALSE (time.learnArmed.load());
    processor.setParameterFromControl (Param::Delay1Time, 0.5f, true);
    EXPECT_TRUE (time.learnArmed.load());

    time.midiController = 74;
    processor.midiLearnActive = false;
    processor.midiUnlearnActive = true;
    processor.setParameterFromControl (Param::Delay1Time, 0.7f, false);
    EXPECT_EQ (time.midiController.load(), 74);
    processor.setParameterFromControl (Param::Delay1Time, 0.7f, true);
    EXPECT_EQ (time.midiController.load(), -1);
    EXPECT_EQ (processor.getParameter (Param::Delay1Time), 0.7f);
}
