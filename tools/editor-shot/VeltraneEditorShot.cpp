// Renders the editor offscreen to two PNG files: the factory defaults at the default
// size 1000 x 500, and a changed state with the longest texts at the smallest size
// 800 x 400. With --icon it draws the maker's logo as the application icon instead.
//
//     veltrane-editor-shot DEFAULT.png CHANGED.png
//     veltrane-editor-shot --icon SIZE ICON.png

#include "editor/VeltraneAudioProcessorEditor.h"
#include "look/TarnwellLogo.h"
#include "look/VeltraneLook.h"
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
    // The last value set names the last parameter shown at the top of the middle column.
    const std::pair<int, float> values[] {
        { Param::Delay1Time, 0.55f },       { Param::Delay1Feedback, 0.72f },
        { Param::Delay1TimeMod, 0.35f },    { Param::Delay1TimeModSource, 2.0f / 6.0f },
        { Param::Delay2Time, 0.4f },        { Param::Delay2FeedbackMod, 0.6f },
        { Param::Delay2Gain, 0.62f },       { Param::MixMode, 1.0f },
        { Param::DryWet, 0.45f },           { Param::Waveshaper, 2.0f / 3.0f },
        { Param::WaveshaperAmount, 0.3f },  { Param::Envelope1Attack, 0.8f },
        { Param::Envelope2Sensitivity, 0.2f }, { Param::LFO1Sync, 1.0f },
        { Param::LFO1SyncedRate, 17.0f / 17.0f }, { Param::LFO2Wave, 1.0f },
        { Param::LFO2Rate, 0.5f },          { Param::Delay2FeedbackModSource, 4.0f / 6.0f },
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

// The logo on the editor's ground, square, for the application's icon.
bool writeIcon (int size, const juce::File& file)
{
    juce::Image image (juce::Image::ARGB, size, size, true);
    {
        juce::Graphics g (image);
        g.setColour (juce::Colour (Palette::ground));
        g.fillRoundedRectangle (image.getBounds().toFloat(), (float) size * 0.125f);
        TarnwellLogo logo;
        logo.setSize (size, size);
        logo.paintEntireComponent (g, false);
    }

    file.deleteFile();
    juce::FileOutputStream stream (file);
    return stream.openedOk() && juce::PNGImageFormat().writeImageToStream (image, stream);
}
}

int main (int argc, char** argv)
{
    const auto iconMode = argc == 4 && juce::String (argv[1]) == "--icon";

    if (argc != 3 && ! iconMode)
    {
        std::cerr << "usage: veltrane-editor-shot DEFAULT.png CHANGED.png\n"
                     "       veltrane-editor-shot --icon SIZE ICON.png\n";
        return 2;
    }

    const veltrane::tools::PrivateHome privateHome;
    const juce::ScopedJuceInitialiser_GUI juce;

    if (iconMode)
    {
        const auto size = juce::String (argv[2]).getIntValue();
        if (size >= 16 && size <= 1024 && writeIcon (size, juce::File::getCurrentWorkingDirectory().getChildFile (argv[3])))
            return 0;

        std::cerr << "veltrane-editor-shot: cannot write the icon\n";
        return 1;
    }
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
