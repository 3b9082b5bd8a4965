// The shipped LV2 bundle through lilv, as most Linux hosts run it: found, instantiated, run on audio.

#include <lilv/lilv.h>
#include <lv2/atom/atom.h>
#include <lv2/buf-size/buf-size.h>
#include <lv2/options/options.h>
#include <lv2/urid/urid.h>

#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <string>
#include <vector>

TEST (Lv2Host, InstantiatedByLilvItDelaysStereoByTheDefault120Ms)
{
    // VELTRANE_TEST_LV2_PATH points the test at another tree, such as an unpacked package.
    const auto* path = std::getenv ("VELTRANE_TEST_LV2_PATH");
    ::setenv ("LV2_PATH", path != nullptr ? path : VELTRANE_LV2_PATH, 1);
    auto* world = lilv_world_new();
    lilv_world_load_all (world);
    auto* uri = lilv_new_uri (world, VELTRANE_LV2_URI);
    const auto* plugin = lilv_plugins_get_by_uri (lilv_world_get_all_plugins (world), uri);
    ASSERT_NE (plugin, nullptr) << VELTRANE_LV2_URI << " not under " << VELTRANE_LV2_PATH;
    lilv_node_free (uri);

    // The features every JUCE LV2 plug-in requires: URIs mapped to numbers, and block-size options.
    LV2_URID_Map map { nullptr, [] (LV2_URID_Map_Handle, const char* u) { static std::map<std::string, LV2_URID> ids; return ids.emplace (u, (LV2_URID) ids.size() + 1).first->second; } };
    const auto id = [&map] (const char* u) { return map.map (nullptr, u); };
    int32_t maxBlock = 512, minBlock = 1;
    const LV2_Options_Option options[] { { LV2_OPTIONS_INSTANCE, 0, id (LV2_BUF_SIZE__maxBlockLength), 4, id (LV2_ATOM__Int), &maxBlock },
                                         { LV2_OPTIONS_INSTANCE, 0, id (LV2_BUF_SIZE__minBlockLength), 4, id (LV2_ATOM__Int), &minBlock }, {} };
    const LV2_Feature mapFeature { LV2_URID__map, &map }, optionsFeature { LV2_OPTIONS__options, (void*) options },
                      bounded { LV2_BUF_SIZE__boundedBlockLength, nullptr };
    const LV2_Feature* features[] { &mapFeature, &optionsFeature, &bounded, nullptr };
    auto* instance = lilv_plugin_instantiate (plugin, 44100.0, features);
    ASSERT_NE (instance, nullptr);

    // Every port connected: audio, controls at their defaults, atom sequences.
    std::vector<std::vector<float>> audioIn, audioOut;
    std::vector<float> controls (lilv_plugin_get_num_ports (plugin));
    lilv_plugin_get_port_ranges_float (plugin, nullptr, nullptr, controls.data());
    std::vector<std::vector<uint64_t>> atomIn, atomOut;
    for (uint32_t i = 0; i < controls.size(); ++i)
    {
        const auto* port = lilv_plugin_get_port_by_index (plugin, i);
        auto is = [&] (const char* kind) { auto* node = lilv_new_uri (world, kind); const auto result = lilv_port_is_a (plugin, port, node); lilv_node_free (node); return result; };
        if (is (LV2_CORE__AudioPort))
            lilv_instance_connect_port (instance, i, (is (LV2_CORE__InputPort) ? audioIn : audioOut).emplace_back (512).data());
        else if (is (LV2_CORE__ControlPort))
            lilv_instance_connect_port (instance, i, &controls[i]);   // NaN where a port has no default
        else if (is (LV2_ATOM__AtomPort))
            lilv_instance_connect_port (instance, i, (is (LV2_CORE__InputPort) ? atomIn : atomOut).emplace_back (4096).data());
    }
    ASSERT_EQ (audioIn.size() * 10 + audioOut.size(), 22u);

    lilv_instance_activate (instance);
    std::vector<int> firstEcho { -1, -1 };
    for (int block = 0; block < 11; ++block)
    {
        for (auto& channel : audioIn)
            for (size_t j = 0; j < 512; ++j)
                channel[j] = block == 0 && j == 0 ? 1.0f : 0.0f;
        for (auto& atom : atomIn)   // an empty event sequence in, room for events out, renewed every block
            *(LV2_Atom_Sequence*) atom.data() = { { sizeof (LV2_Atom_Sequence_Body), id (LV2_ATOM__Sequence) }, { 0, 0 } };
        for (auto& atom : atomOut)
            *(LV2_Atom*) atom.data() = { 4096 * 8 - sizeof (LV2_Atom), id (LV2_ATOM__Chunk) };
        lilv_instance_run (instance, 512);
        for (size_t c = 0; c < 2; ++c)
            for (int j = 0; j < 512 && firstEcho[c] < 0; ++j)
                if (std::abs (audioOut[c][(size_t) j]) > 1.0e-6f)
                    firstEcho[c] = block * 512 + j;
    }
    EXPECT_EQ (firstEcho, std::vector<int> ({ 5292, 5292 }));
    lilv_instance_deactivate (instance);
    lilv_instance_free (instance);
    lilv_world_free (world);
}
