#include "persistence/StateChunk.h"

#include <climits>
#include <cstddef>
#include <cstdint>

// Any bytes a host may hand to setStateInformation.
extern "C" int LLVMFuzzerTestOneInput (const std::uint8_t* data, std::size_t size)
{
    if (size > (std::size_t) INT_MAX)
        return 0;

    if (const auto state = veltrane::readStateChunk (data, (int) size))
        (void) veltrane::writeStateChunk (state->presetName, {}, state->midiControllers);

    return 0;
}
