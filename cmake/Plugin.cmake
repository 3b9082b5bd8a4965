# One processor, four formats. The identity below is the only place it is stated;
# the code reads it back through JUCE's JucePlugin_* macros.
set (VELTRANE_LV2_URI "https://tarnwell.audio/plugins/veltrane")

juce_add_plugin (Veltrane
    PRODUCT_NAME "Veltrane"
    COMPANY_NAME "Tarnwell_Audio"
    VERSION 1.2.1
    PLUGIN_MANUFACTURER_CODE Tarn
    PLUGIN_CODE TaVe
    FORMATS VST VST3 LV2 Standalone
    IS_SYNTH FALSE
    NEEDS_MIDI_INPUT TRUE
    NEEDS_MIDI_OUTPUT FALSE
    IS_MIDI_EFFECT FALSE
    EDITOR_WANTS_KEYBOARD_FOCUS FALSE
    VST2_CATEGORY kPlugCategEffect
    VST3_CATEGORIES Fx Delay
    LV2URI "${VELTRANE_LV2_URI}"
    COPY_PLUGIN_AFTER_BUILD FALSE)

target_sources (Veltrane PRIVATE
    plugin/ParameterTable.cpp
    plugin/PluginParameter.cpp
    plugin/HostParameter.cpp
    plugin/VeltraneAudioProcessor.cpp
    plugin/ProcessorBlock.cpp
    plugin/ProcessorPersistence.cpp
    persistence/FactoryPresets.cpp
    persistence/Preferences.cpp
    persistence/PresetLibrary.cpp
    persistence/SafeFile.cpp
    persistence/SafeXml.cpp
    persistence/StateChunk.cpp
    editor/PanelLayout.cpp
    editor/DelayComponent.cpp
    editor/LfoComponent.cpp
    editor/EnvelopeComponent.cpp
    editor/GlobalPanel.cpp
    editor/PresetComponent.cpp
    editor/MidiComponent.cpp
    editor/VeltraneAudioProcessorEditor.cpp
    look/VeltraneLook.cpp
    look/VeltraneBackground.cpp
    look/TarnwellLogo.cpp)

include ("${PROJECT_SOURCE_DIR}/cmake/FactoryPresets.cmake")
veltrane_add_factory_presets ("${PROJECT_SOURCE_DIR}")

target_include_directories (Veltrane PUBLIC "${PROJECT_SOURCE_DIR}")

target_compile_definitions (Veltrane PUBLIC
    ${VELTRANE_JUCE_DEFINITIONS}
    # Debian's JUCE ignores the LV2URI argument and would fall back to a relative
    # URI that LV2 hosts cannot open.
    JucePlugin_LV2URI="${VELTRANE_LV2_URI}"
    # The effect record's version field: JUCE's decimal form of 1.2.1.
    JucePlugin_VSTChunkStructureVersion=121)

# VST3 parameter IDs are the indices 0..32, as in every other format.
target_compile_definitions (Veltrane_VST3 PRIVATE JUCE_FORCE_USE_LEGACY_PARAM_IDS=1)

target_link_libraries (Veltrane
    PRIVATE
        juce::juce_audio_utils
        veltrane_dsp
        veltrane_factory_presets
    PUBLIC
        juce::juce_recommended_config_flags
        juce::juce_recommended_warning_flags)

get_target_property (VELTRANE_VERSION Veltrane JUCE_VERSION)
add_custom_command (TARGET Veltrane_LV2 POST_BUILD
    COMMAND "${CMAKE_COMMAND}" "-DMANIFEST=$<TARGET_FILE_DIR:Veltrane_LV2>/manifest.ttl" "-DURI=${VELTRANE_LV2_URI}"
            "-DVERSION=${VELTRANE_VERSION}" -P "${CMAKE_CURRENT_LIST_DIR}/Lv2ManifestVersion.cmake"
    VERBATIM)

set (VELTRANE_ARTEFACTS "${CMAKE_BINARY_DIR}/Veltrane_artefacts/${CMAKE_BUILD_TYPE}")
# Hosts list a VST2 plug-in by its file name too: ship it as Veltrane.so.
set_target_properties (Veltrane_VST PROPERTIES PREFIX "")
set (VELTRANE_VST2_BINARY "${VELTRANE_ARTEFACTS}/VST/Veltrane.so")
set (VELTRANE_VST3_BUNDLE "${VELTRANE_ARTEFACTS}/VST3/Veltrane.vst3")
set (VELTRANE_LV2_BUNDLE "${VELTRANE_ARTEFACTS}/LV2/Veltrane.lv2")
