#include "EditorTestSupport.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;
using namespace veltrane::test;

// The normalised default worked out from the table's physical default and law.
static float tableDefault (int index)
{
    const auto& row = parameterTable[(size_t) index];
    const auto n = (row.defaultPhysical - row.minimum) / (row.maximum - row.minimum);
    return row.law == Law::square ? std::sqrt (n) : row.law == Law::root ? n * n : n;
}

TEST (DoubleClickDefault, EveryContinuousControlGivesTheHostTheExactDefaultWhileDragsKeepTheStep)
{
    OpenEditor open;
    RecordingListener host;
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
        host.calls.clear();
        doubleClick (*slider);
        ASSERT_EQ (host.calls.size(), 3) << slider->getName();   // one gesture
        const auto index = host.calls[0].getTrailingIntValue();
        const auto value = open.processor.getParameter (index);
        EXPECT_EQ (value, tableDefault (index)) << slider->getName();

        const auto dragged = value + (value > 0.5f ? -0.0104 : 0.0104);
        slider->setValue (dragged, juce::sendNotificationSync);
        EXPECT_FLOAT_EQ (open.processor.getParameter (index), (float) (std::round (dragged * 1000.0) / 1000.0)) << slider->getName();
    };
    visit (*open.editor);
    open.processor.removeListener (&host);

    EXPECT_EQ (continuous, 20);
}
