#pragma once

#include "editor/VeltraneAudioProcessorEditor.h"
#include "plugin/VeltraneAudioProcessor.h"

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane::test
{

// The first component below root (depth first) of type T, with the given name
// unless the name is empty.
template <typename T>
T* findChild (juce::Component& root, const juce::String& name = {})
{
    for (auto* child : root.getChildren())
    {
        if (auto* match = dynamic_cast<T*> (child); match != nullptr && (name.isEmpty() || child->getName() == name))
            return match;

        if (auto* deeper = findChild<T> (*child, name))
            return deeper;
    }
    return nullptr;
}

// One 50 ms poll of every panel below root, as the message loop would run it.
inline void tick (juce::Component& root)
{
    if (auto* timer = dynamic_cast<juce::Timer*> (&root))
        timer->timerCallback();

    for (auto* child : root.getChildren())
        tick (*child);
}

// A mouse event on component c at pos, pressed at downPos.
inline juce::MouseEvent mouseEvent (juce::Component& c, juce::Point<float> pos, juce::Point<float> downPos,
                                    int clicks = 1)
{
    const auto now = juce::Time::getCurrentTime();
    return juce::MouseEvent (juce::Desktop::getInstance().getMainMouseSource(), pos, {},
                             juce::MouseInputSource::defaultPressure, 0.0f, 0.0f, 0.0f, 0.0f,
                             &c, &c, now, downPos, now, clicks, pos != downPos);
}

inline void doubleClick (juce::Slider& slider)
{
    const auto centre = slider.getLocalBounds().getCentre().toFloat();
    slider.mouseDoubleClick (mouseEvent (slider, centre, centre, 2));
}

// A click as the mouse makes it: the listeners hear it before this returns.
inline void click (juce::Button& button)
{
    const auto centre = button.getLocalBounds().getCentre().toFloat();
    auto& asComponent = static_cast<juce::Component&> (button);   // the handlers are protected in Button
    asComponent.mouseDown (mouseEvent (button, centre, centre));
    asComponent.mouseUp (mouseEvent (button, centre, centre));
}

// Everything the processor tells its listeners, as a host wrapper hears it.
struct RecordingListener final : juce::AudioProcessorListener
{
    juce::StringArray calls;

    void audioProcessorParameterChanged (juce::AudioProcessor*, int index, float value) override
    {
        calls.add ("set " + juce::String (index) + " " + juce::String (value, 6));
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

// A processor and its open editor, with the first poll done.
struct OpenEditor
{
    explicit OpenEditor (float width = 1000.0f, float height = 500.0f)
    {
        processor.setLastEditorSize (width, height);
        editor = std::make_unique<VeltraneAudioProcessorEditor> (processor);
        tick (*editor);
    }

    template <typename T = juce::Component>
    T& child (const juce::String& name)
    {
        auto* found = findChild<T> (*editor, name);
        jassert (found != nullptr);
        return *found;
    }

    VeltraneAudioProcessor processor;
    std::unique_ptr<VeltraneAudioProcessorEditor> editor;
};

} // namespace veltrane::test
