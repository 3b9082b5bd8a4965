#include "tools/common/PrivateHome.h"

#include <juce_events/juce_events.h>

#include <gtest/gtest.h>

// Every test binary runs in a fresh empty HOME, with JUCE's message manager.
int main (int argc, char** argv)
{
    static const veltrane::tools::PrivateHome home;
    ::testing::InitGoogleTest (&argc, argv);
    const juce::ScopedJuceInitialiser_GUI juce;
    return RUN_ALL_TESTS();
}
