#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

using namespace veltrane;

namespace
{
// What the processor tells its listeners, as a host's wrapper hears it.
struct HostLog final : juce::AudioProcessorListener
{
    juce::StringArray calls;
    void audioProcessorParameterChanged (juce::AudioProcessor*, int i, float v) override { calls.add ("set " + juce::String (i) + " " + juce::String (v)); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
    void audioProcessorParameterChangeGestureBegin (juce::AudioProcessor*, int i) override { calls.add ("begin " + juce::String (i)); }
    void audioProcessorParameterChangeGestureEnd (juce::AudioProcessor*, int i) override { calls.add ("end " + juce::String (i)); }
};
}

TEST (Processor, ControlChangeIsOneGestureAndTheHostHearsTheValueKept)
{
    VeltraneAudioProcessor processor;
    HostLog host;
    processor.addListener (&host);
    processor.setParameterFromControl (Param::DryWet, 0.25f, true);
    processor.setParameterNotifyingHost (Param::Delay1Time, 2.0f);   // refused
    EXPECT_EQ (host.calls.joinIntoString ("|"), "begin 15|set 15 0.25|end 15|set 0 " + juce::String (processor.getParameter (0)));
    processor.removeListener (&host);
}

TEST (Processor, HostParametersTakeTextAsTheyShowIt)
{
    VeltraneAudioProcessor processor;
    const auto& parameters = processor.getParameters();
    const struct { int index; const char* text; float value; } cases[] {
        { Param::MixMode, "Solo 1", 0.5f }, { Param::LFO1SyncedRate, "1/4", 6.0f / 17.0f },
        { Param::LFO2Sync, "on", 1.0f },    { Param::Delay1Time, "120.00 Ms", 0.243987f }, { Param::DryWet, "250", 1.0f },
    };
    for (const auto& c : cases)
        EXPECT_NEAR (parameters[c.index]->getValueForText (c.text), c.value, 1e-6f) << c.text;
}
