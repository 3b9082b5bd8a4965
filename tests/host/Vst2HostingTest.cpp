// The shipped VST2 binary and VST3 bundle loaded through JUCE's own plug-in hosting.

#include <juce_audio_processors/juce_audio_processors.h>

#include <gtest/gtest.h>

namespace Vst2
{
#include <pluginterfaces/vst2.x/aeffectx.h>
}

namespace
{
std::unique_ptr<juce::AudioPluginInstance> loadPlugin (juce::AudioPluginFormat& format, const juce::String& path)
{
    juce::OwnedArray<juce::PluginDescription> descriptions;
    format.findAllTypesForFile (descriptions, path);

    if (descriptions.isEmpty())
        return nullptr;

    juce::String error;
    return format.createInstanceFromDescription (*descriptions[0], 44100.0, 512, error);
}

juce::AudioProcessor::BusesLayout layoutOf (int inputs, int outputs)
{
    juce::AudioProcessor::BusesLayout layout;
    layout.inputBuses.add (juce::AudioChannelSet::canonicalChannelSet (inputs));
    layout.outputBuses.add (juce::AudioChannelSet::canonicalChannelSet (outputs));
    return layout;
}

// What the loaded effect answers to effSetSpeakerArrangement.
juce::pointer_sized_int askArrangement (juce::AudioPluginInstance& plugin, int inputs, int outputs)
{
    auto* effect = static_cast<Vst2::AEffect*> (plugin.getPlatformSpecificData());
    Vst2::VstSpeakerArrangement in {}, out {};
    in.type = inputs == 1 ? Vst2::kSpeakerArrMono : Vst2::kSpeakerArrStereo;
    in.numChannels = inputs;
    out.type = outputs == 1 ? Vst2::kSpeakerArrMono : Vst2::kSpeakerArrStereo;
    out.numChannels = outputs;
    return effect->dispatcher (effect, Vst2::effSetSpeakerArrangement, 0, (juce::pointer_sized_int) &in, &out, 0.0f);
}

void expectIdentity (juce::AudioPluginInstance& plugin)
{
    const auto description = plugin.getPluginDescription();
    EXPECT_EQ (plugin.getName(), "Veltrane");
    EXPECT_EQ (description.manufacturerName, "Tarnwell_Audio");
    EXPECT_TRUE (description.version.startsWith ("1.2.1")) << description.version;
    EXPECT_FALSE (description.isInstrument);
    EXPECT_EQ (plugin.getTotalNumInputChannels(), 2);
    EXPECT_EQ (plugin.getTotalNumOutputChannels(), 2);
    EXPECT_TRUE (plugin.acceptsMidi());
    EXPECT_FALSE (plugin.producesMidi());
}
}

TEST (Vst2Hosting, ReportsIdentityParametersAndLayouts)
{
    juce::VSTPluginFormat format;
    auto plugin = loadPlugin (format, VELTRANE_VST2_BINARY);
    ASSERT_NE (plugin, nullptr);

    expectIdentity (*plugin);
    EXPECT_EQ (plugin->getPluginDescription().uniqueId, (int) 0x54615665);   // "TaVe"

    const auto& parameters = plugin->getParameters();
    ASSERT_EQ (parameters.size(), 33);
    EXPECT_EQ (parameters[0]->getName (64), "Delay1Time");
    EXPECT_EQ (parameters[0]->getCurrentValueAsText(), "120.00 Ms");
    EXPECT_EQ (parameters[6]->getCurrentValueAsText(), "0.00 dB");
    EXPECT_EQ (parameters[28]->getName (64), "LFO1SyncedRate");
    EXPECT_EQ (parameters[28]->getCurrentValueAsText(), "1/4");
    EXPECT_EQ (parameters[14]->getName (64), "MixMode");
    EXPECT_EQ (parameters[23]->getName (64), "Envelope2Attack");
    EXPECT_EQ (parameters[0]->getLabel(), "");

    EXPECT_EQ (plugin->getProgramName (0), "");

    // JUCE's VST2 hosting judges layouts by channel counts alone, so the plug-in's
    // own answer is asked for through the effect JUCE loaded.
    EXPECT_TRUE (plugin->checkBusesLayoutSupported (layoutOf (1, 1)));
    EXPECT_TRUE (plugin->checkBusesLayoutSupported (layoutOf (2, 2)));
    EXPECT_EQ (askArrangement (*plugin, 1, 1), 1);
    EXPECT_EQ (askArrangement (*plugin, 2, 2), 1);
    EXPECT_EQ (askArrangement (*plugin, 2, 1), 0);
}

TEST (Vst2Hosting, ProcessesAudioInPlace)
{
    juce::VSTPluginFormat format;
    auto plugin = loadPlugin (format, VELTRANE_VST2_BINARY);
    ASSERT_NE (plugin, nullptr);

    plugin->prepareToPlay (44100.0, 512);
    juce::AudioBuffer<float> buffer (2, 512);
    juce::MidiBuffer midi;

    for (int block = 0; block < 20; ++block)
    {
        buffer.clear();
        buffer.setSample (0, 0, 1.0f);
        plugin->processBlock (buffer, midi);

        for (int c = 0; c < 2; ++c)
            for (int j = 0; j < buffer.getNumSamples(); ++j)
                ASSERT_TRUE (std::isfinite (buffer.getSample (c, j)));
    }

    plugin->releaseResources();
}

TEST (Vst3Hosting, LoadsTheBundleWithTheSameIdentity)
{
    juce::VST3PluginFormat format;
    auto plugin = loadPlugin (format, VELTRANE_VST3_BUNDLE);
    ASSERT_NE (plugin, nullptr);

    expectIdentity (*plugin);

    const auto& parameters = plugin->getParameters();
    ASSERT_GE (parameters.size(), 33);
    EXPECT_EQ (parameters[0]->getName (64), "Delay1Time");
    EXPECT_EQ (parameters[0]->getCurrentValueAsText(), "120.00 Ms");
    EXPECT_EQ (parameters[32]->getName (64), "LFO2SyncedRate");
}

namespace
{
// The effect's own chunk (effGetChunk), without JUCE's bank wrapping around it.
juce::MemoryBlock effectChunk (juce::AudioPluginInstance& plugin)
{
    auto* effect = static_cast<Vst2::AEffect*> (plugin.getPlatformSpecificData());
    void* data = nullptr;
    const auto size = effect->dispatcher (effect, Vst2::effGetChunk, 0, 0, &data, 0.0f);
    return size > 0 && data != nullptr ? juce::MemoryBlock (data, (size_t) size) : juce::MemoryBlock();
}

void setEffectChunk (juce::AudioPluginInstance& plugin, const juce::String& text)
{
    juce::MemoryBlock chunk;
    chunk.append ("VC2!", 4);
    const auto length = juce::ByteOrder::swapIfBigEndian ((juce::uint32) text.getNumBytesAsUTF8());
    chunk.append (&length, 4);
    chunk.append (text.toRawUTF8(), text.getNumBytesAsUTF8());
    chunk.append ("", 1);

    auto* effect = static_cast<Vst2::AEffect*> (plugin.getPlatformSpecificData());
    effect->dispatcher (effect, Vst2::effSetChunk, 0, (juce::pointer_sized_int) chunk.getSize(), chunk.getData(), 0.0f);
}
}

TEST (Vst2Hosting, SavedStateRestoresValuesBindingsAndPresetName)
{
    juce::VSTPluginFormat format;
    auto original = loadPlugin (format, VELTRANE_VST2_BINARY);
    ASSERT_NE (original, nullptr);

    // Bindings and a name reach the effect through a chunk; values through the host.
    setEffectChunk (*original, "<VELTRANE_STATE PresetName=\"Wide &amp; &quot;dark&quot;\" Delay1TimeCC=\"74\" LFO2SyncedRateCC=\"1\"/>");
    const auto& parameters = original->getParameters();
    ASSERT_EQ (parameters.size(), 33);
    for (int i = 0; i < parameters.size(); ++i)
        parameters[i]->setValue ((float) (i + 1) / 37.0f);

    const auto expected = effectChunk (*original);
    const auto text = juce::String::fromUTF8 (static_cast<const char*> (expected.getData()) + 8, (int) expected.getSize() - 9);
    EXPECT_TRUE (text.contains ("PresetName=\"Wide &amp; &quot;dark&quot;\"")) << text;
    EXPECT_TRUE (text.contains ("Delay1TimeCC=\"74\"")) << text;

    juce::MemoryBlock hostState;
    original->getStateInformation (hostState);

    auto restored = loadPlugin (format, VELTRANE_VST2_BINARY);
    ASSERT_NE (restored, nullptr);
    restored->setStateInformation (hostState.getData(), (int) hostState.getSize());

    EXPECT_EQ (effectChunk (*restored), expected);
    for (int i = 0; i < parameters.size(); ++i)
        EXPECT_EQ (restored->getParameters()[i]->getValue(), (float) (i + 1) / 37.0f) << i;
}
