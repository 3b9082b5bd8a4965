#include "VeltraneAudioProcessorEditor.h"

#include "../plugin/VeltraneAudioProcessor.h"

#include <cmath>

namespace veltrane
{

namespace
{
constexpr int defaultWidth = 1000, defaultHeight = 500;

constexpr RelativeBounds backgroundArea { 0.0f, 0.0f, 1.0f, 1.0f };
constexpr RelativeBounds delay1Area { 0.0f, 0.1f, 0.4f, 0.4f };
constexpr RelativeBounds delay2Area { 0.6f, 0.1f, 0.4f, 0.4f };
constexpr RelativeBounds envelope1Area { 0.0f, 0.7f, 0.2f, 0.2f };
constexpr RelativeBounds envelope2Area { 0.2f, 0.7f, 0.2f, 0.2f };
constexpr RelativeBounds lfo1Area { 0.6f, 0.7f, 0.2f, 0.2f };
constexpr RelativeBounds lfo2Area { 0.8f, 0.7f, 0.2f, 0.2f };
constexpr RelativeBounds globalArea { 0.4f, 0.1f, 0.2f, 0.9f };
constexpr RelativeBounds midiArea { 0.0f, 0.92f, 0.4f, 0.06f };
constexpr RelativeBounds presetArea { 0.6f, 0.5f, 0.4f, 0.2f };
constexpr RelativeBounds resizerArea { 0.98f, 0.96f, 0.02f, 0.04f };

bool isUsableSide (float side) noexcept
{
    return std::isfinite (side) && side >= 1.0f && side <= (float) VeltraneAudioProcessorEditor::maxOpeningSide;
}
}

juce::Point<int> VeltraneAudioProcessorEditor::openingSize (float storedWidth, float storedHeight) noexcept
{
    if (! isUsableSide (storedWidth) || ! isUsableSide (storedHeight))
        return { defaultWidth, defaultHeight };

    return { (int) storedWidth, (int) storedHeight };
}

VeltraneAudioProcessorEditor::VeltraneAudioProcessorEditor (VeltraneAudioProcessor& owner)
    : juce::AudioProcessorEditor (owner)
{
    setLookAndFeel (&look);
    addAndMakeVisible (background);

    processor = &owner;
    resizer = std::make_unique<juce::ResizableCornerComponent> (this, &sizeLimits);
    addAndMakeVisible (*resizer);

    sizeLimits.setSizeLimits (800, 400, 2000, 1000);
    sizeLimits.setFixedAspectRatio (2.0);

    // A stored size outside the limits is taken as it is; the limits bind only a
    // drag of the corner.
    const auto size = openingSize (processor->lastEditorWidth, processor->lastEditorHeight);
    setSize (size.x, size.y);

    const auto w = getWidth();
    const auto h = getHeight();
    placeRelative (background, backgroundArea, w, h);

    auto attach = [&] (auto& panel, const RelativeBounds& area) {
        panel.setProcessor (processor);
        addAndMakeVisible (panel);
        placeRelative (panel, area, w, h);
    };

    attach (delay1, delay1Area);
    attach (delay2, delay2Area);
    attach (envelope1, envelope1Area);
    attach (envelope2, envelope2Area);
    attach (lfo1, lfo1Area);
    attach (lfo2, lfo2Area);
    attach (globalPanel, globalArea);
    attach (midiPanel, midiArea);
    attach (presetPanel, presetArea);
}

VeltraneAudioProcessorEditor::~VeltraneAudioProcessorEditor()
{
    processor->setLastEditorSize ((float) getWidth(), (float) getHeight());

    // Nothing may draw through look once it is destroyed with the members below.
    setLookAndFeel (nullptr);
}

void VeltraneAudioProcessorEditor::resized()
{
    const auto w = getWidth();
    const auto h = getHeight();

    placeRelative (background, backgroundArea, w, h);
    placeRelative (delay1, delay1Area, w, h);
    placeRelative (delay2, delay2Area, w, h);
    placeRelative (envelope1, envelope1Area, w, h);
    placeRelative (envelope2, envelope2Area, w, h);
    placeRelative (lfo1, lfo1Area, w, h);
    placeRelative (lfo2, lfo2Area, w, h);
    placeRelative (globalPanel, globalArea, w, h);
    placeRelative (midiPanel, midiArea, w, h);
    placeRelative (presetPanel, presetArea, w, h);
    if (resizer != nullptr)
        placeRelative (*resizer, resizerArea, w, h);

    processor->setLastEditorSize ((float) w, (float) h);
}

} // namespace veltrane
