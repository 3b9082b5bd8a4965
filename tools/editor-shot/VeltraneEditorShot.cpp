// Renders the editor offscreen to two PNG files: the factory defaults at the default
// size 1000 x 500, and a changed state at the smallest size 800 x 400.
//
//     veltrane-editor-shot DEFAULT.png CHANGED.png

#include "editor/VeltraneAudioProcessorEditor.h"
#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <juce_gui_basics/juce_gui_basics.h>

#include <iostream>

namespace
{
using namespace veltrane;

// Runs every panel's poll by hand, twice, as the message loop would within 100 ms
// (the second tick shows what follows the first, such as the Boost knob).
void pollPanels (juce::Component& root)
{
    for (int tick = 0; tick < 2; ++tick)
        for (auto* child : root.getChildren())
            if (auto* timer = dynamic_cast<juce::Timer*> (child))
                timer->timerCallback();
}

void setNonDefaultState (VeltraneAudioProcessor& processor)
{
    const std::pair<int, float> values[] {
        { Param::Delay1Time, 0.55f },       { Param::Delay1Feedback, 0.72f },
        { Param::Delay1TimeMod, 0.35f },    { Param::Delay1TimeModSource, 5.0f / 6.0f },
        { Param::Delay2Time, 0.4f },        { Param::Delay2FeedbackMod, 0.6f },
        { Param::Delay2FeedbackModSource, 2.0f / 6.0f }, { Param::Delay2Gain, 0.62f },
        { Param::MixMode, 5.0f / 6.0f },    { Param::DryWet, 0.45f },
        { Param::Waveshaper, 1.0f },        { Param::WaveshaperAmount, 0.3f },
        { Param::Envelope1Attack, 0.8f },   { Param::Envelope2Sensitivity, 0.2f },
        { Param::LFO1Sync, 1.0f },          { Param::LFO1SyncedRate, 10.0f / 17.0f },
        { Param::LFO2Wave, 4.0f / 5.0f },   { Param::LFO2Rate, 0.5f },
    };

    for (const auto& [index, value] : values)
        processor.setParameter (index, value);
}

bool writeShot (VeltraneAudioProcessor& processor, const juce::File& file)
{
    VeltraneAudioProcessorEditor editor (processor);
    pollPanels (editor);
    const auto image = editor.createComponentSnapshot (editor.getLocalBounds(), true, 1.0f);

    file.deleteFile();
    juce::FileOutputStream stream (file);
    return stream.openedOk() && juce::PNGImageFormat().writeImageToStream (image, stream);
}
}

int main (int argc, char** argv)
{
    if (argc != 3)
    {
        std::cerr << "usage: veltrane-editor-shot DEFAULT.png CHANGED.png\n";
        return 2;
    }

    const veltrane::tools::PrivateHome privateHome;
    const juce::ScopedJuceInitialiser_GUI juce;
    const auto defaultFile = juce::File::getCurrentWorkingDirectory().getChildFile (argv[1]);
    const auto changedFile = juce::File::getCurrentWorkingDirectory().getChildFile (argv[2]);

    VeltraneAudioProcessor defaults;
    defaults.setLastEditorSize (1000.0f, 500.0f);

    VeltraneAudioProcessor changed;
    changed.setLastEditorSize (800.0f, 400.0f);
    setNonDefaultState (changed);

    if (! writeShot (defaults, defaultFile) || ! writeShot (changed, changedFile))
    {
        std::cerr << "veltrane-editor-shot: cannot write the pictures\n";
        return 1;
    }

    return 0;
}
