#pragma once

#include "StateChunk.h"

#include <juce_core/juce_core.h>

#include <array>
#include <optional>

namespace veltrane
{

// A preset file: an XML document whose "VELTRANE_PRESET" element holds "PresetName"
// and every parameter's normalised value under its identifier (no controllers).
struct PresetContents
{
    juce::String presetName;                                        // " " when absent
    std::array<std::optional<double>, Param::count> values;         // absent: keep the current value
};

// Writes target whole or not at all (replaceFileContents), in JUCE's file layout:
// declaration, an empty line, a line holding one space, then the element with its
// attributes wrapped after 60 characters. Returns whether the file was written.
bool writePresetFile (const juce::File& target, const juce::String& presetName, const ParameterValues& values);

// Nothing for a missing file, a file parseDocumentFile refuses or another root tag.
// The name is cut to maxPresetNameLength characters.
std::optional<PresetContents> readPresetFile (const juce::File& file);
std::optional<PresetContents> readPresetText (const juce::String& text);
std::optional<PresetContents> readPresetDocument (std::unique_ptr<juce::XmlElement> element);

// The per-user folder of preset files and the names found in it. Plain object; the
// processor guards the list against its threads.
class PresetLibrary
{
public:
    static constexpr int noPlatform = -1;

    // Sets platform and presetRoot for this operating system: Windows 0, macOS 1,
    // Linux 2; any other system gets noPlatform and no folder at all.
    void chooseRoot (juce::SystemStats::OperatingSystemType system);

    // Builds presetFolder, creates it when missing and scans it.
    void initialise (const juce::String& productName, const juce::String& fileExtension);

    // Scans presetFolder again: the "*.extension" files directly in it, in the
    // order the file system lists them, names without the extension. Leftovers of
    // interrupted saves of earlier versions are not listed (see isLeftoverOfSave).
    void rescan();

    juce::StringArray getPresetNames() const { return presetNames; }

    // The file of entry index of the list (the last entry beyond the end); empty for
    // a negative index, an empty list or no folder.
    juce::String getPresetPath (int index) const;

    // presetFolder + name + "." + extension, or empty when there is no folder or the
    // name is refused (see isSafePresetName).
    juce::String getPresetPath (const juce::String& name) const;

    // A name is safe when it is not empty (".vtp" would be a hidden file that the
    // list could only show as ".vtp") and its file stays directly inside the preset
    // folder: it holds no '/', and on Windows no '\\' or ':' (drive letters and
    // alternate streams). "." and ".." are safe: with the extension they name "..vtp"
    // and "...vtp" inside the folder.
    bool isSafePresetName (const juce::String& name) const;

    int platform = noPlatform;
    juce::String presetRoot;      // the maker's preset folder, empty without a platform
    juce::String presetFolder;    // presetRoot + separator + product + separator
    juce::String extension;       // without the dot
    juce::StringArray presetNames;
    juce::StringArray presetFiles;   // the file name behind each entry of presetNames
};

} // namespace veltrane
