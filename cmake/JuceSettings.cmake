# JUCE expects the VST 2.4 interface as pluginterfaces/vst2.x/aeffect(x).h; our
# folder forwards to Debian's FST headers.
juce_set_vst2_sdk_path ("${CMAKE_CURRENT_LIST_DIR}/vst2")

# Options every JUCE-compiling target shares. Debian's JUCE links no FLAC or Ogg.
set (VELTRANE_JUCE_DEFINITIONS
    JUCE_USE_FLAC=0
    JUCE_USE_OGGVORBIS=0
    JUCE_USE_CURL=0
    JUCE_WEB_BROWSER=0
    JUCE_DISPLAY_SPLASH_SCREEN=0
    JUCE_REPORT_APP_USAGE=0
    JUCE_VST3_CAN_REPLACE_VST2=0
    JUCE_SILENCE_XCODE_15_LINKER_WARNING=1)

# Lets a target compile against another target's JUCE modules and link its
# objects, instead of compiling JUCE once more.
function (veltrane_use_juce_from target juceTarget)
    target_include_directories (${target} PRIVATE $<TARGET_PROPERTY:${juceTarget},INCLUDE_DIRECTORIES>)
    target_compile_definitions (${target} PRIVATE $<TARGET_PROPERTY:${juceTarget},COMPILE_DEFINITIONS>)
    target_link_libraries (${target} PRIVATE ${juceTarget})
endfunction()
