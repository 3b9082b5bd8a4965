// The version LV2 hosts read: minor and micro in the bundle's manifest, where hosts
// compare installed copies of a plug-in without loading their data (the URI stands
// for the major version), and the full release in the plug-in's data.

#include <lilv/lilv.h>
#include <lv2/core/lv2.h>

#include <gtest/gtest.h>

#include <string>

TEST (Lv2Version, ManifestAndDataCarryVersion121)
{
    auto* world = lilv_world_new();
    auto* bundle = lilv_new_file_uri (world, nullptr, VELTRANE_LV2_PATH "/Veltrane.lv2/");
    auto* uri = lilv_new_uri (world, VELTRANE_LV2_URI);
    lilv_world_load_bundle (world, bundle);   // the manifest alone

    auto valueOf = [world] (const LilvNode* subject, const char* property) {
        auto* predicate = lilv_new_uri (world, property);
        auto* value = lilv_world_get (world, subject, predicate, nullptr);
        lilv_node_free (predicate);
        return value;
    };
    auto* minor = valueOf (uri, LV2_CORE__minorVersion);
    auto* micro = valueOf (uri, LV2_CORE__microVersion);
    EXPECT_TRUE (minor != nullptr && lilv_node_as_int (minor) == 2);
    EXPECT_TRUE (micro != nullptr && lilv_node_as_int (micro) == 1);

    lilv_world_load_resource (world, uri);
    auto* release = valueOf (uri, "http://usefulinc.com/ns/doap#release");
    auto* revision = release != nullptr ? valueOf (release, "http://usefulinc.com/ns/doap#revision") : nullptr;
    EXPECT_EQ (std::string (revision != nullptr ? lilv_node_as_string (revision) : ""), "1.2.1");

    for (auto* node : { minor, micro, release, revision, uri, bundle })
        lilv_node_free (node);
    lilv_world_free (world);
}
