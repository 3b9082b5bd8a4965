#include "EditorTestSupport.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;
using namespace veltrane::test;

namespace
{
// The values the host receives, bit for bit.
struct HostValues final : juce::AudioProcessorListener
{
    std::vector<std::pair<int, float>> received;

    void audioProcessorParameterChanged (juce::AudioProcessor*, int index, float value) override { received.emplace_back (index, value); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
};

// The default normalised value worked out from the table's physical default.
float tableDefault (int index)
{
    const auto& row = parameterTable[(size_t) index];
    const auto n = (row.defaultPhysical - row.minimum) / (row.maximum - row.minimum);
    return row.law == Law::square ? std::sqrt (n) : row.law == Law::root ? n * n : n;
}
}

TEST (DoubleClickDefault, EveryContinuousControlGivesTheHostTheExactDefaultWhileDragsKeepTheStep)
{
    OpenEditor open;
    HostValues host;
    open.processor.addListener (&host);
    int continuous = 0;

    std::function<void (juce::Component&)> visit = [&] (juce::Component& c) {
        for (auto* child : c.getChildren())
            visit (*child);

        auto* slider = dynamic_cast<juce::Slider*> (&c);
        if (slider == nullptr || slider->getInterval() != 0.001)
            return;

        ++continuous;
        slider->setValue (0.9, juce::sendNotificationSync);
        host.received.clear();
        doubleClick (*slider);

        ASSERT_EQ (host.received.size(), 1u) << slider->getName();
        const auto [index, value] = host.received[0];
        EXPECT_EQ (value, tableDefault (index)) << slider->getName();

        slider->setValue (value + (value > 0.5f ? -0.0104 : 0.0104), juce::sendNotificationSync);   // a drag beside it
        ASSERT_EQ (host.received.size(), 2u) << slider->getName();
        const auto step = std::round (host.received.back().second * 1000.0f) / 1000.0f;
        EXPECT_FLOAT_EQ (host.received.back().second, step) << slider->getName();
    };
    visit (*open.editor);
    open.processor.removeListener (&host);

    EXPECT_EQ (continuous, 20);
}
