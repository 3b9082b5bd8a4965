// The shipped LV2 bundle through lilv, the library most Linux LV2 hosts use: found under its
// URI, instantiated with the features it requires, run on audio and MIDI, its state saved and
// restored through the LV2 state interface.

#include "HostTestSupport.h"

#include <lilv/lilv.h>
#include <lv2/atom/util.h>
#include <lv2/buf-size/buf-size.h>
#include <lv2/midi/midi.h>
#include <lv2/options/options.h>
#include <lv2/state/state.h>

#include <gtest/gtest.h>

#include <map>

namespace
{
class Lv2Host : public ::testing::Test
{
protected:
    void SetUp() override
    {
        // A preset a program change can select, in the folder the instance lists when it is made.
        const auto folder = juce::File::getSpecialLocation (juce::File::userHomeDirectory).getChildFile (".Tarnwell_Audio/Presets/Veltrane");
        ASSERT_TRUE (folder.createDirectory() && folder.getChildFile ("Quiet.vtp").replaceWithText ("<VELTRANE_PRESET PresetName=\"Quiet\" WaveshaperAmount=\"0.75\"/>"));
        ::setenv ("LV2_PATH", VELTRANE_LV2_PATH, 1);
        lilv_world_load_all (world);
        auto* uri = lilv_new_uri (world, VELTRANE_LV2_URI);
        plugin = lilv_plugins_get_by_uri (lilv_world_get_all_plugins (world), uri);
        lilv_node_free (uri);
        ASSERT_NE (plugin, nullptr) << VELTRANE_LV2_URI << " not under " << VELTRANE_LV2_PATH;

        const auto intType = id (LV2_ATOM__Int);
        options = { { LV2_OPTIONS_INSTANCE, 0, id (LV2_BUF_SIZE__maxBlockLength), 4, intType, &maxBlock },
                    { LV2_OPTIONS_INSTANCE, 0, id (LV2_BUF_SIZE__minBlockLength), 4, intType, &minBlock }, {} };
        const LV2_Feature mapFeature { LV2_URID__map, &map }, optionsFeature { LV2_OPTIONS__options, options.data() },
                          bounded { LV2_BUF_SIZE__boundedBlockLength, nullptr };
        const LV2_Feature* features[] { &mapFeature, &optionsFeature, &bounded, nullptr };
        instance = lilv_plugin_instantiate (plugin, 44100.0, features);
        ASSERT_NE (instance, nullptr);

        for (uint32_t i = 0; i < lilv_plugin_get_num_ports (plugin); ++i)
        {
            const auto* port = lilv_plugin_get_port_by_index (plugin, i);
            auto is = [&] (const char* kind) { auto* node = lilv_new_uri (world, kind); const auto result = lilv_port_is_a (plugin, port, node); lilv_node_free (node); return result; };
            const auto input = is (LV2_CORE__InputPort);
            if (is (LV2_CORE__AudioPort))
                lilv_instance_connect_port (instance, i, (input ? audioIn : audioOut).emplace_back (512).data());
            else if (is (LV2_CORE__ControlPort))
            {
                LilvNode* value = nullptr;
                lilv_port_get_range (plugin, port, &value, nullptr, nullptr);
                controls[i] = value != nullptr ? lilv_node_as_float (value) : 0.0f;
                lilv_node_free (value);
                lilv_instance_connect_port (instance, i, &controls[i]);
            }
            else if (is (LV2_ATOM__AtomPort))
                lilv_instance_connect_port (instance, i, (input ? atomIn : atomOut).emplace_back (4096).data());
        }
        lilv_instance_activate (instance);
    }

    void TearDown() override
    {
        if (instance != nullptr)
            lilv_instance_free (instance);   // writes the preferences, while this test's home exists
        lilv_world_free (world);
    }

    LV2_URID id (const std::string& uri) { return urids.emplace (uri, (LV2_URID) urids.size() + 1).first->second; }

    // One block of the audio in audioIn, with MIDI events (frame, bytes).
    void run (const std::vector<std::pair<int64_t, std::vector<uint8_t>>>& midi = {})
    {
        for (auto& buffer : atomIn)
        {
            auto* sequence = (LV2_Atom_Sequence*) buffer.data();
            *sequence = { { sizeof (LV2_Atom_Sequence_Body), id (LV2_ATOM__Sequence) }, { 0, 0 } };
            for (const auto& [frame, bytes] : midi)
            {
                auto* event = (LV2_Atom_Event*) ((char*) &sequence->body + sequence->atom.size);
                *event = { { frame }, { (uint32_t) bytes.size(), id (LV2_MIDI__MidiEvent) } };
                std::copy (bytes.begin(), bytes.end(), (uint8_t*) (event + 1));
                sequence->atom.size += (uint32_t) lv2_atom_pad_size (sizeof (LV2_Atom_Event) + bytes.size());
            }
        }
        for (auto& buffer : atomOut)
            *(LV2_Atom*) buffer.data() = { (uint32_t) (buffer.size() * 8 - sizeof (LV2_Atom)), id (LV2_ATOM__Chunk) };
        lilv_instance_run (instance, 512);
    }

    // The plug-in's state chunk through the state interface: JUCE keeps it as base64 text under one key.
    juce::MemoryBlock saveChunk()
    {
        values.clear();
        interface()->save (lilv_instance_get_handle (instance), store, this, 0, nullptr);
        juce::MemoryBlock chunk;
        if (values.size() == 1)
            chunk.fromBase64Encoding (juce::String::fromUTF8 (values.begin()->second.c_str()));
        return chunk;
    }

    void restoreChunk (const juce::MemoryBlock& chunk)
    {
        values = { { id (std::string (VELTRANE_LV2_URI) + ":StateString"), chunk.toBase64Encoding().toStdString() + '\0' } };
        interface()->restore (lilv_instance_get_handle (instance), retrieve, this, 0, nullptr);
    }

    const LV2_State_Interface* interface() { return (const LV2_State_Interface*) lilv_instance_get_extension_data (instance, LV2_STATE__interface); }

    static LV2_State_Status store (LV2_State_Handle self, uint32_t key, const void* value, size_t size, uint32_t, uint32_t)
    {
        static_cast<Lv2Host*> (self)->values[key] = std::string ((const char*) value, size);
        return LV2_STATE_SUCCESS;
    }

    static const void* retrieve (LV2_State_Handle handle, uint32_t key, size_t* size, uint32_t* type, uint32_t* flags)
    {
        auto* self = static_cast<Lv2Host*> (handle);
        const auto found = self->values.find (key);
        if (found == self->values.end())
            return nullptr;
        *size = found->second.size();
        *type = self->id (LV2_ATOM__String);
        *flags = LV2_STATE_IS_POD | LV2_STATE_IS_PORTABLE;
        return found->second.data();
    }

    LilvWorld* world = lilv_world_new();
    const LilvPlugin* plugin = nullptr;
    LilvInstance* instance = nullptr;
    std::map<std::string, LV2_URID> urids;
    LV2_URID_Map map { this, [] (LV2_URID_Map_Handle self, const char* uri) { return static_cast<Lv2Host*> (self)->id (uri); } };
    int32_t maxBlock = 512, minBlock = 1;
    std::vector<LV2_Options_Option> options;
    std::vector<std::vector<float>> audioIn, audioOut;
    std::map<uint32_t, float> controls;
    std::vector<std::vector<uint64_t>> atomIn, atomOut;
    std::map<uint32_t, std::string> values;
};
}

TEST_F (Lv2Host, FoundUnderItsUriItDelaysStereoByTheDefault120Ms)
{
    auto* name = lilv_plugin_get_name (plugin);
    auto* author = lilv_plugin_get_author_name (plugin);
    EXPECT_EQ (std::string (lilv_node_as_string (name)) + " by " + lilv_node_as_string (author), "Veltrane by Tarnwell_Audio");
    lilv_node_free (name);
    lilv_node_free (author);

    ASSERT_EQ (audioIn.size() * 10 + audioOut.size(), 22u);
    std::vector<int> firstEcho (2, -1);
    for (int block = 0; block < 11; ++block)
    {
        for (auto& channel : audioIn)
        {
            std::fill (channel.begin(), channel.end(), 0.0f);
            channel[0] = block == 0 ? 1.0f : 0.0f;
        }
        run();
        for (size_t c = 0; c < 2; ++c)
            for (int j = 0; j < 512 && firstEcho[c] < 0; ++j)
                firstEcho[c] = std::abs (audioOut[c][(size_t) j]) > 1.0e-6f ? block * 512 + j : -1;
    }
    EXPECT_EQ (firstEcho, std::vector<int> ({ 5292, 5292 }));
}

TEST_F (Lv2Host, StateRestoresThroughTheStateInterfaceAndMidiReachesThePlugIn)
{
    const auto chunk = veltrane::test::edited (saveChunk(), [] (juce::XmlElement& state) { state.setAttribute ("DryWetCC", 74); state.setAttribute ("Delay1Time", 0.5); });
    restoreChunk (chunk);
    EXPECT_EQ (saveChunk(), chunk);

    run ({ { 10, { 0xb4, 74, 32 } }, { 20, { 0xc0, 0 } } });   // CC 74 on MIDI channel 5, program 0
    run();
    const auto state = veltrane::test::parseStateChunk (saveChunk());
    ASSERT_NE (state, nullptr);
    EXPECT_FLOAT_EQ ((float) state->getDoubleAttribute ("DryWet"), 32.0f / 127.0f);
    EXPECT_EQ (state->getStringAttribute ("PresetName") + " " + state->getStringAttribute ("WaveshaperAmount"), "Quiet 0.75");
}
