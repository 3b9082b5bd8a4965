// The editor of the shipped VST2 binary opened and closed in a window through JUCE's
// plug-in hosting, as a host does. Needs a display (run under Xvfb).

#include <juce_audio_processors/juce_audio_processors.h>

#include <gtest/gtest.h>

namespace veltrane::test
{
void internWindowManagerAtoms();
}

namespace
{
std::unique_ptr<juce::AudioPluginInstance> loadVst2()
{
    juce::VSTPluginFormat format;
    juce::OwnedArray<juce::PluginDescription> descriptions;
    format.findAllTypesForFile (descriptions, VELTRANE_VST2_BINARY);

    if (descriptions.isEmpty())
        return nullptr;

    juce::String error;
    return format.createInstanceFromDescription (*descriptions[0], 44100.0, 512, error);
}
}

TEST (EditorHosting, OpensAndClosesTheVst2EditorRepeatedly)
{
    veltrane::test::internWindowManagerAtoms();

    auto plugin = loadVst2();
    ASSERT_NE (plugin, nullptr);
    ASSERT_TRUE (plugin->hasEditor());
    plugin->prepareToPlay (44100.0, 512);

    for (int round = 0; round < 5; ++round)
    {
        std::unique_ptr<juce::AudioProcessorEditor> editor (plugin->createEditorIfNeeded());
        ASSERT_NE (editor, nullptr) << round;

        juce::DocumentWindow window ("Veltrane", juce::Colours::black, 0, true);
        window.setContentNonOwned (editor.get(), true);
        window.setVisible (true);
        juce::MessageManager::getInstance()->runDispatchLoopUntil (300);

        // The plug-in reports the size its editor opened at.
        EXPECT_EQ (editor->getWidth(), 1000) << round;
        EXPECT_EQ (editor->getHeight(), 500) << round;

        window.clearContentComponent();
        window.setVisible (false);
        editor.reset();
        juce::MessageManager::getInstance()->runDispatchLoopUntil (50);
    }

    // Audio still runs after the editor has gone.
    juce::AudioBuffer<float> buffer (2, 512);
    juce::MidiBuffer midi;
    buffer.clear();
    plugin->processBlock (buffer, midi);
    plugin->releaseResources();
}
