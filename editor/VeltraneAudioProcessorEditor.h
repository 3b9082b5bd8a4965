#pragma once

#include "DelayComponent.h"
#include "EnvelopeComponent.h"
#include "GlobalPanel.h"
#include "LfoComponent.h"
#include "MidiComponent.h"
#include "PresetComponent.h"
#include "../look/VeltraneBackground.h"
#include "../look/VeltraneLook.h"

#include <juce_audio_processors/juce_audio_processors.h>

#include <memory>

namespace veltrane
{

class VeltraneAudioProcessor;

// The plug-in window: background, nine control panels at fixed proportions of the
// window, and a resize corner held to 800 x 400 .. 2000 x 1000 at a width twice the
// height. Holds no parameter state; the panels poll the processor. The size is
// handed to the processor on every layout pass and when the window closes.
class VeltraneAudioProcessorEditor final : public juce::AudioProcessorEditor
{
public:
    explicit VeltraneAudioProcessorEditor (VeltraneAudioProcessor&);
    ~VeltraneAudioProcessorEditor() override;

    void resized() override;

    // The stored size the editor opens at: the processor's floats truncated, or the
    // default size when a stored side is no usable window size (0, negative, not a
    // number, or beyond maxOpeningSide).
    static juce::Point<int> openingSize (float storedWidth, float storedHeight) noexcept;
    static constexpr int maxOpeningSide = 16384;

private:
    VeltraneAudioProcessor* processor;
    std::unique_ptr<juce::ResizableCornerComponent> resizer;
    juce::ComponentBoundsConstrainer sizeLimits;
    VeltraneLook look;
    VeltraneBackground background;
    Delay1Component delay1;
    Delay2Component delay2;
    Envelope1Component envelope1;
    Envelope2Component envelope2;
    Lfo1Component lfo1;
    Lfo2Component lfo2;
    GlobalPanel globalPanel;
    MidiComponent midiPanel;
    PresetComponent presetPanel;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (VeltraneAudioProcessorEditor)
};

} // namespace veltrane
