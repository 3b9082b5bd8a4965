// The shipped LV2 bundle through lilv, the library most Linux LV2 hosts use: it is
// found under its URI, instantiated with the features it requires and run on audio.

#include "HostTestSupport.h"
#include "support/TemporaryHome.h"

#include <lilv/lilv.h>
#include <lv2/atom/atom.h>
#include <lv2/atom/util.h>
#include <lv2/buf-size/buf-size.h>
#include <lv2/options/options.h>
#include <lv2/state/state.h>
#include <lv2/urid/urid.h>

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <map>
#include <string>
#include <vector>

namespace
{
constexpr double sampleRate = 44100.0;
constexpr int blockSize = 512;

// A plain URI-to-number table, the uri-map feature every JUCE LV2 plug-in requires.
struct UridMap
{
    std::map<std::string, LV2_URID> ids;

    static LV2_URID map (LV2_URID_Map_Handle handle, const char* uri)
    {
        auto& ids = static_cast<UridMap*> (handle)->ids;
        const auto found = ids.find (uri);
        if (found != ids.end())
            return found->second;
        const auto id = (LV2_URID) ids.size() + 1;
        ids.emplace (uri, id);
        return id;
    }
};

class Lv2Host : public ::testing::Test
{
protected:
    void SetUp() override
    {
        // VELTRANE_TEST_LV2_PATH points the test at another tree, such as an unpacked package.
        const auto* path = std::getenv ("VELTRANE_TEST_LV2_PATH");
        ::setenv ("LV2_PATH", path != nullptr ? path : VELTRANE_LV2_PATH, 1);
        world = lilv_world_new();
        lilv_world_load_all (world);

        auto* uri = lilv_new_uri (world, VELTRANE_LV2_URI);
        plugin = lilv_plugins_get_by_uri (lilv_world_get_all_plugins (world), uri);
        lilv_node_free (uri);
        ASSERT_NE (plugin, nullptr) << "no plug-in " << VELTRANE_LV2_URI << " under " << VELTRANE_LV2_PATH;
    }

    void TearDown() override
    {
        if (instance != nullptr)
            lilv_instance_free (instance);
        lilv_world_free (world);
    }

    bool portIs (const LilvPort* port, const char* classUri)
    {
        auto* node = lilv_new_uri (world, classUri);
        const auto result = lilv_port_is_a (plugin, port, node);
        lilv_node_free (node);
        return result;
    }

    void instantiate()
    {
        map.handle = &urids;
        map.map = UridMap::map;
        const auto intType = UridMap::map (&urids, LV2_ATOM__Int);
        options = {
            { LV2_OPTIONS_INSTANCE, 0, UridMap::map (&urids, LV2_BUF_SIZE__maxBlockLength), sizeof (int32_t), intType, &maxBlock },
            { LV2_OPTIONS_INSTANCE, 0, UridMap::map (&urids, LV2_BUF_SIZE__minBlockLength), sizeof (int32_t), intType, &minBlock },
            { LV2_OPTIONS_INSTANCE, 0, 0, 0, 0, nullptr },
        };
        const LV2_Feature mapFeature { LV2_URID__map, &map };
        const LV2_Feature optionsFeature { LV2_OPTIONS__options, options.data() };
        const LV2_Feature boundedFeature { LV2_BUF_SIZE__boundedBlockLength, nullptr };
        const LV2_Feature* features[] { &mapFeature, &optionsFeature, &boundedFeature, nullptr };

        instance = lilv_plugin_instantiate (plugin, sampleRate, features);
        ASSERT_NE (instance, nullptr);

        const auto numPorts = lilv_plugin_get_num_ports (plugin);
        controls.assign (numPorts, 0.0f);
        atoms.assign (numPorts, std::vector<uint64_t> (2048, 0));

        for (uint32_t i = 0; i < numPorts; ++i)
        {
            const auto* port = lilv_plugin_get_port_by_index (plugin, i);
            const auto isInput = portIs (port, LV2_CORE__InputPort);

            if (portIs (port, LV2_CORE__AudioPort))
            {
                auto& buffers = isInput ? audioIn : audioOut;
                buffers.emplace_back (blockSize, 0.0f);
                lilv_instance_connect_port (instance, i, buffers.back().data());
            }
            else if (portIs (port, LV2_CORE__ControlPort))
            {
                LilvNode* defaultValue = nullptr;
                lilv_port_get_range (plugin, port, &defaultValue, nullptr, nullptr);
                controls[i] = defaultValue != nullptr ? lilv_node_as_float (defaultValue) : 0.0f;
                lilv_node_free (defaultValue);
                lilv_instance_connect_port (instance, i, &controls[i]);
            }
            else if (portIs (port, LV2_ATOM__AtomPort))
            {
                (isInput ? atomInputs : atomOutputs).push_back (i);
                lilv_instance_connect_port (instance, i, atoms[i].data());
            }
        }
    }

    // Event sequences in (empty, or with the given MIDI messages), room for events
    // out, as a host prepares them per block.
    void prepareAtomPorts (const std::vector<std::pair<int64_t, std::vector<uint8_t>>>& midi = {})
    {
        const auto sequenceType = UridMap::map (&urids, LV2_ATOM__Sequence);
        const auto chunkType = UridMap::map (&urids, LV2_ATOM__Chunk);

        for (auto i : atomInputs)
        {
            auto* sequence = reinterpret_cast<LV2_Atom_Sequence*> (atoms[i].data());
            sequence->atom.size = sizeof (LV2_Atom_Sequence_Body);
            sequence->atom.type = sequenceType;
            sequence->body.unit = 0;
            sequence->body.pad = 0;

            for (const auto& [frame, bytes] : midi)
            {
                auto* event = reinterpret_cast<LV2_Atom_Event*> (reinterpret_cast<char*> (&sequence->body) + sequence->atom.size);
                event->time.frames = frame;
                event->body.size = (uint32_t) bytes.size();
                event->body.type = UridMap::map (&urids, "http://lv2plug.in/ns/ext/midi#MidiEvent");
                std::copy (bytes.begin(), bytes.end(), reinterpret_cast<uint8_t*> (event + 1));
                sequence->atom.size += (uint32_t) lv2_atom_pad_size (sizeof (LV2_Atom_Event) + bytes.size());
            }
        }

        for (auto i : atomOutputs)
        {
            auto* atom = reinterpret_cast<LV2_Atom*> (atoms[i].data());
            atom->size = (uint32_t) (atoms[i].size() * sizeof (uint64_t) - sizeof (LV2_Atom));
            atom->type = chunkType;
        }
    }

    // The plug-in's state through its LV2 state interface: JUCE keeps the host
    // state chunk as base64 text under one key.
    struct StateStore
    {
        std::map<LV2_URID, std::string> values;
        LV2_URID stringType = 0;

        static LV2_State_Status store (LV2_State_Handle handle, uint32_t key, const void* value, size_t size,
                                       uint32_t, uint32_t)
        {
            static_cast<StateStore*> (handle)->values[key] = std::string (static_cast<const char*> (value), size);
            return LV2_STATE_SUCCESS;
        }

        static const void* retrieve (LV2_State_Handle handle, uint32_t key, size_t* size, uint32_t* type, uint32_t* flags)
        {
            auto* self = static_cast<StateStore*> (handle);
            const auto found = self->values.find (key);
            if (found == self->values.end())
                return nullptr;
            *size = found->second.size();
            *type = self->stringType;
            *flags = LV2_STATE_IS_POD | LV2_STATE_IS_PORTABLE;
            return found->second.data();
        }
    };

    const LV2_State_Interface* stateInterface()
    {
        return static_cast<const LV2_State_Interface*> (lilv_instance_get_extension_data (instance, LV2_STATE__interface));
    }

    juce::MemoryBlock saveChunk()
    {
        StateStore store;
        stateInterface()->save (lilv_instance_get_handle (instance), StateStore::store, &store, 0, nullptr);
        juce::MemoryBlock chunk;
        if (store.values.size() == 1)
            chunk.fromBase64Encoding (juce::String::fromUTF8 (store.values.begin()->second.c_str()));
        return chunk;
    }

    void restoreChunk (const juce::MemoryBlock& chunk)
    {
        StateStore store;
        store.stringType = UridMap::map (&urids, LV2_ATOM__String);
        const auto key = UridMap::map (&urids, (std::string (VELTRANE_LV2_URI) + ":StateString").c_str());
        const auto text = chunk.toBase64Encoding();
        store.values[key] = std::string (text.toRawUTF8()) + '\0';
        stateInterface()->restore (lilv_instance_get_handle (instance), StateStore::retrieve, &store, 0, nullptr);
    }

    LilvWorld* world = nullptr;
    const LilvPlugin* plugin = nullptr;
    LilvInstance* instance = nullptr;
    UridMap urids;
    LV2_URID_Map map {};
    int32_t maxBlock = blockSize, minBlock = 1;
    std::vector<LV2_Options_Option> options;
    std::vector<std::vector<float>> audioIn, audioOut;
    std::vector<float> controls;
    std::vector<std::vector<uint64_t>> atoms;
    std::vector<uint32_t> atomInputs, atomOutputs;
};
}

TEST_F (Lv2Host, FindsTheBundleUnderItsUri)
{
    auto* name = lilv_plugin_get_name (plugin);
    EXPECT_STREQ (lilv_node_as_string (name), "Veltrane");
    lilv_node_free (name);

    auto* author = lilv_plugin_get_author_name (plugin);
    ASSERT_NE (author, nullptr);
    EXPECT_STREQ (lilv_node_as_string (author), "Tarnwell_Audio");
    lilv_node_free (author);
}

TEST_F (Lv2Host, ProcessesStereoAudio)
{
    instantiate();
    ASSERT_EQ (audioIn.size(), 2u);
    ASSERT_EQ (audioOut.size(), 2u);
    ASSERT_FALSE (atomInputs.empty());

    lilv_instance_activate (instance);
    double energy = 0.0;

    for (int block = 0; block < 40; ++block)
    {
        for (auto& channel : audioIn)
            std::fill (channel.begin(), channel.end(), 0.0f);

        if (block == 0)
            audioIn[0][0] = audioIn[1][0] = 1.0f;

        prepareAtomPorts();
        lilv_instance_run (instance, blockSize);

        for (const auto& channel : audioOut)
            for (auto sample : channel)
            {
                ASSERT_TRUE (std::isfinite (sample));
                energy += (double) sample * sample;
            }
    }

    lilv_instance_deactivate (instance);
    EXPECT_GT (energy, 0.1);
}

TEST_F (Lv2Host, StateChunkRestoresThroughTheStateInterface)
{
    using veltrane::test::StateChunkFixture;
    instantiate();
    ASSERT_NE (stateInterface(), nullptr);

    // The identifiers, in index order, as the plug-in's own state names them.
    const auto fresh = saveChunk();
    const auto freshXml = juce::AudioProcessor::getXmlFromBinary (fresh.getData(), (int) fresh.getSize());
    ASSERT_NE (freshXml, nullptr);
    juce::StringArray identifiers;
    for (int i = 0; i < freshXml->getNumAttributes(); ++i)
        if (const auto name = freshXml->getAttributeName (i); name != "PresetName" && ! name.endsWith ("CC"))
            identifiers.add (name);
    ASSERT_EQ (identifiers.size(), StateChunkFixture::numParameters);

    const auto chunk = StateChunkFixture::makeChunk (identifiers);
    restoreChunk (chunk);
    EXPECT_EQ (saveChunk(), chunk);
}

TEST_F (Lv2Host, MidiReachesLearnedControllersAndProgramChanges)
{
    using namespace veltrane::test;
    const TemporaryHome home;

    // A preset the program change can select, in the folder a new instance scans.
    const auto folder = juce::File::getSpecialLocation (juce::File::userHomeDirectory)
                            .getChildFile (".Tarnwell_Audio/Presets/Veltrane");
    ASSERT_TRUE (folder.createDirectory());
    ASSERT_TRUE (folder.getChildFile ("Quiet.vtp").replaceWithText (
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<VELTRANE_PRESET PresetName=\"Quiet\" WaveshaperAmount=\"0.75\"/>\n"));

    instantiate();
    lilv_instance_activate (instance);

    const auto fresh = parseStateChunk (saveChunk());
    ASSERT_NE (fresh, nullptr);
    juce::StringArray identifiers;
    juce::Array<float> defaults;
    for (int i = 0; i < fresh->getNumAttributes(); ++i)
        if (const auto name = fresh->getAttributeName (i); name != "PresetName" && ! name.endsWith ("CC"))
        {
            identifiers.add (name);
            defaults.add ((float) fresh->getDoubleAttribute (name));
        }
    restoreChunk (StateChunkFixture::makeChunk (identifiers, {}, { { "DryWet", 74 } }, "Init", defaults));

    const auto runWith = [this] (std::vector<std::pair<int64_t, std::vector<uint8_t>>> midi) {
        prepareAtomPorts (midi);
        lilv_instance_run (instance, blockSize);
    };

    runWith ({ { 10, { 0xb4, 74, 32 } }, { 20, { 0xc0, 0 } } });   // CC 74 on channel 5, program 0
    runWith ({});
    lilv_instance_deactivate (instance);

    const auto state = parseStateChunk (saveChunk());
    ASSERT_NE (state, nullptr);
    EXPECT_FLOAT_EQ ((float) state->getDoubleAttribute ("DryWet"), 32.0f / 127.0f);
    EXPECT_EQ (state->getIntAttribute ("DryWetCC"), 74);
    EXPECT_EQ (state->getStringAttribute ("PresetName"), "Quiet");
    EXPECT_EQ (state->getDoubleAttribute ("WaveshaperAmount"), 0.75);

    // The instance writes its preferences when it goes: while this test's HOME exists.
    lilv_instance_free (instance);
    instance = nullptr;
}
