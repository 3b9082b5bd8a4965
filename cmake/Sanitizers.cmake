# VELTRANE_SANITIZE=address,undefined or =thread instruments every target.
set (VELTRANE_SANITIZE "" CACHE STRING "Sanitizers to build with (address,undefined | thread)")

if (VELTRANE_SANITIZE)
    add_compile_options (-fsanitize=${VELTRANE_SANITIZE} -fno-omit-frame-pointer -g)
    add_link_options (-fsanitize=${VELTRANE_SANITIZE})
endif()
