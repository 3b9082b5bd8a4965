#pragma once

#include "TarnwellLogo.h"

#include <juce_gui_basics/juce_gui_basics.h>

#include <memory>

namespace veltrane
{

// Fills the editor behind the transparent panels: dark ground, orange frames around
// the panel areas, a glow under the title strip, the VELTRANE wordmark in block
// letters, and the maker's logo. Every coordinate is a fraction of the current size.
class VeltraneBackground : public juce::Component
{
public:
    VeltraneBackground();
    ~VeltraneBackground() override;

    void paint (juce::Graphics&) override;
    void resized() override;

private:
    std::unique_ptr<TarnwellLogo> logo;

    JUCE_DECLARE_NON_COPYABLE_WITH_LEAK_DETECTOR (VeltraneBackground)
};

} // namespace veltrane
