# Run by CPack after it has made the package. Its DEB generator adds postinst and
# postrm scripts that run ldconfig whenever a shared object sits in a folder
# directly below /usr/lib, as the VST2 plug-in does in /usr/lib/vst. A plug-in
# needs no ldconfig, and a postrm would keep the package in dpkg's records after
# "apt remove" until it is purged, so the package is built again without them.
foreach (package IN LISTS CPACK_PACKAGE_FILES)
    set (tree "${package}.tree")
    file (REMOVE_RECURSE "${tree}")
    execute_process (COMMAND dpkg-deb -R "${package}" "${tree}" COMMAND_ERROR_IS_FATAL ANY)
    file (REMOVE "${tree}/DEBIAN/postinst" "${tree}/DEBIAN/postrm")
    execute_process (COMMAND dpkg-deb --root-owner-group "-Z${CPACK_VELTRANE_COMPRESSION}" -b "${tree}" "${package}"
                     OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
    file (REMOVE_RECURSE "${tree}")
endforeach()
