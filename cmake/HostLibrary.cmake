# JUCE compiled once with VST2 and VST3 hosting, for veltrane-render and the tests
# that load the shipped binaries the way a host does.
add_library (veltrane_host_juce STATIC)

target_link_libraries (veltrane_host_juce
    PRIVATE
        juce::juce_audio_utils
        juce::juce_audio_formats
    PUBLIC
        juce::juce_recommended_config_flags
        juce::pkgconfig_JUCE_IMG_LINUX_DEPS)   # Debian's JUCE decodes images with the system libpng and libjpeg

target_compile_definitions (veltrane_host_juce PUBLIC
    ${VELTRANE_JUCE_DEFINITIONS}
    JUCE_PLUGINHOST_VST=1
    JUCE_PLUGINHOST_VST3=1
    JUCE_STANDALONE_APPLICATION=1
    JUCE_MODAL_LOOPS_PERMITTED=1)
target_include_directories (veltrane_host_juce PUBLIC "${CMAKE_CURRENT_LIST_DIR}/vst2")
