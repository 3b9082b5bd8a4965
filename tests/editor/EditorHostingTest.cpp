// The shipped VST2 binary's editor opened and closed in a window through JUCE's plug-in hosting,
// as a host does, under a virtual display (Xvfb).

#include "host/HostTestSupport.h"

#include <gtest/gtest.h>

#include <X11/Xlib.h>
#undef None

TEST (EditorHosting, OpensAndClosesTheVst2EditorRepeatedly)
{
    // Xvfb runs no window manager, so the atoms one announces do not exist and JUCE would send
    // None in their place; interned here (on a connection kept open, so that the server does
    // not reset and forget them).
    static Display* const display = XOpenDisplay (nullptr);
    ASSERT_NE (display, nullptr);
    for (const auto* atom : { "WM_PROTOCOLS", "WM_TAKE_FOCUS", "WM_DELETE_WINDOW", "WM_CHANGE_STATE", "WM_STATE", "_NET_WM_PING",
                              "_NET_WM_WINDOW_TYPE", "_NET_WM_WINDOW_TYPE_NORMAL", "_NET_WM_WINDOW_TYPE_COMBO", "_NET_WM_STATE",
                              "_NET_WM_STATE_HIDDEN", "_NET_WM_STATE_FULLSCREEN", "_NET_FRAME_EXTENTS", "_NET_WORKAREA", "_MOTIF_WM_HINTS",
                              "_NET_WM_ALLOWED_ACTIONS", "_NET_WM_ACTION_RESIZE", "_NET_WM_ACTION_FULLSCREEN", "_NET_WM_ACTION_MINIMIZE",
                              "_NET_WM_ACTION_CLOSE" })
        XInternAtom (display, atom, False);
    XSync (display, False);

    auto plugin = veltrane::test::loadPlugin (veltrane::test::Format::vst2);
    ASSERT_NE (plugin, nullptr);

    for (int round = 0; round < 5; ++round)
    {
        std::unique_ptr<juce::AudioProcessorEditor> editor (plugin->createEditorIfNeeded());
        ASSERT_NE (editor, nullptr);
        juce::DocumentWindow window ("Veltrane", juce::Colours::black, 0, true);
        window.setContentNonOwned (editor.get(), true);
        window.setVisible (true);
        juce::MessageManager::getInstance()->runDispatchLoopUntil (300);
        EXPECT_EQ (editor->getLocalBounds(), juce::Rectangle<int> (1000, 500)) << round;
        window.clearContentComponent();
        editor.reset();
        juce::MessageManager::getInstance()->runDispatchLoopUntil (50);
    }

    juce::AudioBuffer<float> buffer (2, 512);   // audio still runs after the editor has gone
    buffer.clear();
    juce::MidiBuffer midi;
    plugin->processBlock (buffer, midi);
}
