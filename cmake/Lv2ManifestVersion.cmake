# Run after JUCE's LV2 helper has written the bundle's manifest:
#   cmake -DMANIFEST=<bundle>/manifest.ttl -DURI=<plug-in URI> -DVERSION=<major.minor.micro> -P Lv2ManifestVersion.cmake
# LV2 hosts compare installed copies of a plug-in by the lv2:minorVersion and
# lv2:microVersion in each bundle's manifest, where hosts look for
# them; JUCE 7 writes them into dsp.ttl only. LV2 has no major version: the URI
# stands for it.
file (READ "${MANIFEST}" manifest)

if (NOT manifest MATCHES "lv2:minorVersion")
    string (REPLACE "." ";" parts "${VERSION}")
    list (GET parts 1 minor)
    list (GET parts 2 micro)
    file (APPEND "${MANIFEST}" "\n<${URI}>\n\tlv2:minorVersion ${minor} ;\n\tlv2:microVersion ${micro} .\n")
endif()
