// LV2 hosts compare installed copies of a plug-in by the minor and micro version in
// each bundle's manifest (the URI stands for the major version): 1.2.1 gives 2 and 1.

#include <lilv/lilv.h>
#include <lv2/core/lv2.h>

#include <gtest/gtest.h>

TEST (Lv2Version, ManifestCarriesMinorAndMicroVersion)
{
    auto* world = lilv_world_new();
    auto* bundle = lilv_new_file_uri (world, nullptr, VELTRANE_LV2_PATH "/Veltrane.lv2/");
    auto* uri = lilv_new_uri (world, VELTRANE_LV2_URI);
    lilv_world_load_bundle (world, bundle);   // the manifest alone

    auto intOf = [world, uri] (const char* property) {
        auto* predicate = lilv_new_uri (world, property);
        auto* value = lilv_world_get (world, uri, predicate, nullptr);
        const auto result = value != nullptr ? lilv_node_as_int (value) : -1;
        lilv_node_free (value);
        lilv_node_free (predicate);
        return result;
    };
    EXPECT_EQ (intOf (LV2_CORE__minorVersion), 2);
    EXPECT_EQ (intOf (LV2_CORE__microVersion), 1);

    lilv_node_free (uri);
    lilv_node_free (bundle);
    lilv_world_free (world);
}
