# The Debian package veltrane_<version>_amd64.deb, made by CPack from this build:
#     cmake --build build --target package
# Everything installs below /usr: the plug-ins where hosts look for them, the
# standalone application as veltrane with a desktop entry and an icon, the render
# tool, their manual pages, the copyright file and the changelog.
set (VELTRANE_PACKAGE_FILES "${CMAKE_BINARY_DIR}/package")
set (VELTRANE_PACKAGE_SOURCES "${CMAKE_CURRENT_LIST_DIR}/package")
set (VELTRANE_ICON "${VELTRANE_PACKAGE_FILES}/veltrane.png")
file (MAKE_DIRECTORY "${VELTRANE_PACKAGE_FILES}")

# The icon is the maker's logo, drawn by the code that draws it in the editor.
add_custom_command (OUTPUT "${VELTRANE_ICON}"
    COMMAND "$<TARGET_FILE:veltrane-editor-shot>" --icon 256 "${VELTRANE_ICON}"
    DEPENDS veltrane-editor-shot
    COMMENT "Drawing the application icon")

set (compressed "")
foreach (document veltrane.1 veltrane-render.1 changelog)
    add_custom_command (OUTPUT "${VELTRANE_PACKAGE_FILES}/${document}.gz"
        COMMAND gzip -9 -n -c "${VELTRANE_PACKAGE_SOURCES}/${document}" > "${VELTRANE_PACKAGE_FILES}/${document}.gz"
        DEPENDS "${VELTRANE_PACKAGE_SOURCES}/${document}")
    list (APPEND compressed "${VELTRANE_PACKAGE_FILES}/${document}.gz")
endforeach()

add_custom_target (veltrane_package_files ALL DEPENDS "${VELTRANE_ICON}" ${compressed})

install (FILES "${VELTRANE_VST2_BINARY}" DESTINATION lib/vst)
install (FILES "${VELTRANE_VST3_BUNDLE}/Contents/x86_64-linux/Veltrane.so"
         DESTINATION lib/vst3/Veltrane.vst3/Contents/x86_64-linux)
install (FILES "${VELTRANE_LV2_BUNDLE}/libVeltrane.so" "${VELTRANE_LV2_BUNDLE}/manifest.ttl"
               "${VELTRANE_LV2_BUNDLE}/dsp.ttl" "${VELTRANE_LV2_BUNDLE}/ui.ttl"
         DESTINATION lib/lv2/Veltrane.lv2)
install (PROGRAMS "${VELTRANE_ARTEFACTS}/Standalone/Veltrane" DESTINATION bin RENAME veltrane)
install (PROGRAMS "$<TARGET_FILE:veltrane-render>" DESTINATION bin)
install (FILES "${VELTRANE_PACKAGE_SOURCES}/veltrane.desktop" DESTINATION share/applications)
install (FILES "${VELTRANE_ICON}" DESTINATION share/icons/hicolor/256x256/apps)
install (FILES "${VELTRANE_PACKAGE_FILES}/veltrane.1.gz" "${VELTRANE_PACKAGE_FILES}/veltrane-render.1.gz"
         DESTINATION share/man/man1)
install (FILES "${VELTRANE_PACKAGE_SOURCES}/copyright" "${VELTRANE_PACKAGE_FILES}/changelog.gz"
         DESTINATION share/doc/veltrane)

# Stripped as Debian's own packaging strips: no symbols, comments or notes.
install (CODE "
    if (CMAKE_INSTALL_DO_STRIP)
        foreach (binary lib/vst/Veltrane.so lib/vst3/Veltrane.vst3/Contents/x86_64-linux/Veltrane.so
                        lib/lv2/Veltrane.lv2/libVeltrane.so bin/veltrane bin/veltrane-render)
            execute_process (COMMAND \"${CMAKE_STRIP}\" --remove-section=.comment --remove-section=.note
                                     --strip-unneeded \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/\${binary}\"
                             COMMAND_ERROR_IS_FATAL ANY)
        endforeach()
    endif()")

set (CPACK_GENERATOR DEB)
set (CPACK_PACKAGE_NAME veltrane)
set (CPACK_PACKAGE_VERSION "${PROJECT_VERSION}")
set (CPACK_PACKAGE_VENDOR "Tarnwell_Audio")
set (CPACK_PACKAGING_INSTALL_PREFIX /usr)
set (CPACK_STRIP_FILES ON)
set (CPACK_PACKAGE_DESCRIPTION_SUMMARY "stereo delay effect in VST2, VST3 and LV2 and as an application")
set (CPACK_PACKAGE_DESCRIPTION "Veltrane is a stereo delay: two feedback delay lines whose times glide to
new settings, each with its own feedback, output gain and modulation of time
and feedback by two envelope followers or two LFOs, free or locked to the
host tempo. Seven mix modes connect the delays; a dry/wet blend and a
waveshaper finish the sound. It keeps a preset library with MIDI program
change (18 factory presets to start from), learns MIDI controllers for every
parameter and has a resizable editor.

This package holds the plug-in for VST2, VST3 and LV2 hosts, the standalone
application veltrane and veltrane-render, which renders audio files through
the plug-in from the command line.")
set (CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set (CPACK_DEBIAN_PACKAGE_MAINTAINER "Tarnwell_Audio <packages@tarnwell.audio>")
set (CPACK_DEBIAN_PACKAGE_SECTION sound)
set (CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set (CPACK_DEBIAN_PACKAGE_HOMEPAGE "https://tarnwell.audio/plugins/veltrane")
set (CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set (CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
# CPack's own archive is unpacked again at once (see the script): it is only
# gzipped; the package itself is compressed with xz, as Debian's are.
set (CPACK_DEBIAN_COMPRESSION_TYPE gzip)
set (CPACK_VELTRANE_COMPRESSION xz)
set (CPACK_POST_BUILD_SCRIPTS "${VELTRANE_PACKAGE_SOURCES}/WithoutMaintainerScripts.cmake")
include (CPack)
