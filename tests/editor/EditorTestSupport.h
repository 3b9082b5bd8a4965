#pragma once

#include "editor/VeltraneAudioProcessorEditor.h"
#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

namespace veltrane::test
{

// The first component of type T below root (depth first), with the given name unless empty.
template <typename T = juce::Component>
T& find (juce::Component& root, const juce::String& name = {})
{
    std::function<T* (juce::Component&)> search = [&] (juce::Component& parent) -> T* {
        for (auto* child : parent.getChildren())
            if (auto* match = dynamic_cast<T*> (child); match != nullptr && (name.isEmpty() || child->getName() == name))
                return match;
            else if (auto* deeper = search (*child))
                return deeper;
        return nullptr;
    };
    if (auto* found = search (root))
        return *found;
    throw std::runtime_error (("no component " + name).toStdString());
}

// One 50 ms poll of every panel, as the message loop runs it.
inline void tick (juce::Component& root)
{
    if (auto* timer = dynamic_cast<juce::Timer*> (&root))
        timer->timerCallback();
    for (auto* child : root.getChildren())
        tick (*child);
}

inline juce::MouseEvent mouseAt (juce::Component& c, juce::Point<float> pos, juce::Point<float> down, int clicks = 1)
{
    const auto now = juce::Time::getCurrentTime();
    return { juce::Desktop::getInstance().getMainMouseSource(), pos, {}, juce::MouseInputSource::defaultPressure, 0, 0, 0, 0, &c, &c, now, down, now, clicks, pos != down };
}

// A click as the mouse makes it: the listeners have heard it when this returns.
inline void click (juce::Component& button)
{
    const auto centre = button.getLocalBounds().getCentre().toFloat();
    button.mouseDown (mouseAt (button, centre, centre));
    button.mouseUp (mouseAt (button, centre, centre));
}

// A processor in a home of its own and its open editor, polled once.
struct OpenEditor
{
    explicit OpenEditor (float width = 1000.0f, float height = 500.0f)
    {
        processor.setLastEditorSize (width, height);
        editor = std::make_unique<VeltraneAudioProcessorEditor> (processor);
        tick (*editor);
    }
    template <typename T = juce::Component>
    T& in (const juce::String& panel, const juce::String& name) { return find<T> (find (*editor, panel), name); }

    const tools::PrivateHome home;
    VeltraneAudioProcessor processor;
    std::unique_ptr<VeltraneAudioProcessorEditor> editor;
};

} // namespace veltrane::test
