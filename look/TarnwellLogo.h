#pragma once

#include <juce_gui_basics/juce_gui_basics.h>

namespace veltrane
{

// The maker's mark: six full-height orange bars and two thin wedges that meet left
// of the centre and open toward the bars. Decoration only; everything scales with
// the component's size.
class TarnwellLogo : public juce::Component
{
public:
    TarnwellLogo();

    void paint (juce::Graphics&) override;
    void resized() override;

private:
    juce::Path lowerWedge;
    juce::Path upperWedge;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (TarnwellLogo)
};

} // namespace veltrane
