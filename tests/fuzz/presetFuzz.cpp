#include "persistence/PresetLibrary.h"

#include <cstddef>
#include <cstdint>
#include <unistd.h>

// Any bytes in a preset file, read through the file path the audio block uses.
extern "C" int LLVMFuzzerTestOneInput (const std::uint8_t* data, std::size_t size)
{
    static const auto file = juce::File::getSpecialLocation (juce::File::tempDirectory)
                                 .getChildFile ("veltrane-fuzz-" + juce::String (::getpid()) + ".vtp");

    if (! file.replaceWithData (data, size))
        return 0;

    if (const auto preset = veltrane::readPresetFile (file))
        (void) preset->presetName.length();

    return 0;
}
