#include "FactoryPresets.h"

#include "PresetLibrary.h"

#include <FactoryPresetData.h>

namespace veltrane
{

void writeFactoryPresets (const juce::File& folder)
{
    for (int i = 0; i < FactoryPresetData::namedResourceListSize; ++i)
    {
        int size = 0;
        const auto* data = FactoryPresetData::getNamedResource (FactoryPresetData::namedResourceList[i], size);
        const auto contents = readPresetText (juce::String::fromUTF8 (data, size));
        const auto target = folder.getChildFile (FactoryPresetData::originalFilenames[i]);

        if (! contents || target.exists())
            continue;

        ParameterValues values {};
        bool complete = true;

        for (size_t p = 0; p < values.size(); ++p)
        {
            complete = complete && contents->values[p].has_value();
            values[p] = (float) contents->values[p].value_or (0.0);
        }

        if (complete)
            writePresetFile (target, contents->presetName, values);
    }
}

} // namespace veltrane
