# The factory presets, built into every format (and the fuzz targets, which load
# them through the preset library) and written into a new preset folder.
function (veltrane_add_factory_presets sourceRoot)
    juce_add_binary_data (veltrane_factory_presets
        HEADER_NAME FactoryPresetData.h
        NAMESPACE FactoryPresetData
        SOURCES
        "${sourceRoot}/presets/factory/Cascade.vtp"
        "${sourceRoot}/presets/factory/Chorus.vtp"
        "${sourceRoot}/presets/factory/Cross Echo.vtp"
        "${sourceRoot}/presets/factory/Crunch Echo.vtp"
        "${sourceRoot}/presets/factory/Dense Wash.vtp"
        "${sourceRoot}/presets/factory/Dotted And Triplet 120.vtp"
        "${sourceRoot}/presets/factory/Dotted Eighth 120.vtp"
        "${sourceRoot}/presets/factory/Dub Echo.vtp"
        "${sourceRoot}/presets/factory/Ducking Echo.vtp"
        "${sourceRoot}/presets/factory/Eighth Triplet 120.vtp"
        "${sourceRoot}/presets/factory/Flanger.vtp"
        "${sourceRoot}/presets/factory/Long Ambient.vtp"
        "${sourceRoot}/presets/factory/Ping Pong.vtp"
        "${sourceRoot}/presets/factory/Slap Back.vtp"
        "${sourceRoot}/presets/factory/Synced Sweep.vtp"
        "${sourceRoot}/presets/factory/Tape Wobble.vtp"
        "${sourceRoot}/presets/factory/Tempo Gate.vtp"
        "${sourceRoot}/presets/factory/Wide Doubler.vtp")
endfunction()
