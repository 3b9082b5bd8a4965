#include "PresetLibrary.h"

#include "FactoryPresets.h"
#include "SafeFile.h"
#include "SafeXml.h"

namespace veltrane
{

namespace
{
    constexpr char presetTag[] = "VELTRANE_PRESET";
    constexpr char presetNameAttribute[] = "PresetName";

    juce::StringArray presetAttributeNames()
    {
        juce::StringArray names;

        for (const auto& row : parameterTable)
            names.add (row.identifier);

        names.add (presetNameAttribute);
        return names;
    }

    bool isWindows (int platform) noexcept { return platform == 0; }

    // Earlier versions saved through "<name>_temp<hex>.vtp" beside the preset, the hex
    // being a random 32-bit number, and a crash could leave one behind. A name counts
    // as such a leftover only with all eight digits, in lower case, while the preset
    // it was replacing is listed too; any other name, however alike, stays listed.
    bool isLeftoverOfSave (const juce::String& name, const juce::StringArray& listed)
    {
        const auto stem = name.dropLastCharacters (13);

        return name.length() > 13 && name.substring (stem.length(), stem.length() + 5) == "_temp"
            && name.getLastCharacters (8).containsOnly ("0123456789abcdef") && listed.contains (stem);
    }
}

bool writePresetFile (const juce::File& target, const juce::String& presetName, const ParameterValues& values)
{
    juce::XmlElement element (presetTag);
    element.setAttribute (presetNameAttribute, presetName);

    for (int i = 0; i < Param::count; ++i)
        element.setAttribute (parameterTable[(size_t) i].identifier, formatValue ((double) values[(size_t) i]));

    juce::XmlElement::TextFormat format;
    format.dtd = " ";
    format.customEncoding = "UTF-8";
    juce::MemoryOutputStream text;
    element.writeTo (text, format);
    return replaceFileContents (target, text.getData(), text.getDataSize());
}

std::optional<PresetContents> readPresetText (const juce::String& text)
{
    return readPresetDocument (parseDocument (text));
}

std::optional<PresetContents> readPresetDocument (std::unique_ptr<juce::XmlElement> element)
{
    if (element == nullptr || ! element->getTagName().equalsIgnoreCase (presetTag))
        return {};

    static const auto names = presetAttributeNames();
    const auto found = takeAttributes (*element, names);

    PresetContents contents;

    for (size_t i = 0; i < (size_t) Param::count; ++i)
        if (const auto& value = found[i])
            contents.values[i] = value->getDoubleValue();

    contents.presetName = limitPresetName (found.back().value_or (" "));
    return contents;
}

std::optional<PresetContents> readPresetFile (const juce::File& file)
{
    return readPresetDocument (parseDocumentFile (file));
}

void PresetLibrary::chooseRoot (juce::SystemStats::OperatingSystemType system)
{
    using OS = juce::SystemStats;

    if ((system & OS::MacOSX) != 0 && system >= (OS::MacOSX | 5))
    {
        platform = 1;
        presetRoot = juce::File::getSpecialLocation (juce::File::userHomeDirectory).getFullPathName()
                   + "/Library/Audio/Presets/Tarnwell_Audio";
    }
    else if ((system & OS::Windows) != 0)
    {
        platform = 0;
        presetRoot = juce::File::getSpecialLocation (juce::File::userApplicationDataDirectory).getFullPathName()
                   + "\\Tarnwell_Audio\\Presets";
    }
    else if (system == OS::Linux)
    {
        platform = 2;
        presetRoot = juce::File::getSpecialLocation (juce::File::userHomeDirectory).getFullPathName()
                   + "/.Tarnwell_Audio/Presets";
    }
    else
    {
        platform = noPlatform;
        presetRoot.clear();
    }
}

void PresetLibrary::initialise (const juce::String& productName, const juce::String& fileExtension)
{
    extension = fileExtension;
    presetNames.clear();

    // Without a root there is no folder: "/" + product would name one at the top of
    // the file system.
    if (presetRoot.isEmpty())
    {
        presetFolder.clear();
        return;
    }

    presetFolder = presetRoot + "/" + productName + "/";

    if (isWindows (platform))
        presetFolder = presetFolder.replaceCharacter ('/', '\\');

    const juce::File folder (presetFolder);

    // A folder made here is a first run: it receives the factory presets.
    if (! folder.isDirectory() && folder.createDirectory().wasOk())
        writeFactoryPresets (folder);

    rescan();
}

void PresetLibrary::rescan()
{
    presetNames.clear();
    presetFiles.clear();

    if (presetFolder.isEmpty())
        return;

    // JUCE matches the wildcard ignoring case even where file names have case; such
    // a file ("b.VTP") could never be opened by the path built from its name, so
    // there only the exact extension counts.
    const auto exactCase = juce::File::areFileNamesCaseSensitive();

    for (const auto& entry : juce::RangedDirectoryIterator (juce::File (presetFolder), false,
                                                            "*." + extension, juce::File::findFiles))
    {
        const auto file = entry.getFile();

        if (! exactCase || file.getFileName().endsWith ("." + extension))
        {
            presetNames.add (file.getFileNameWithoutExtension());
            presetFiles.add (file.getFileName());
        }
    }

    const auto scanned = presetNames;

    for (int i = presetNames.size(); --i >= 0;)
    {
        if (isLeftoverOfSave (presetNames[i], scanned))
        {
            presetNames.remove (i);
            presetFiles.remove (i);
        }
    }
}

juce::String PresetLibrary::getPresetPath (int index) const
{
    // A negative index (a typed name that matches no entry) or an empty list names no
    // preset: the empty name is no preset's name.
    if (presetFolder.isEmpty() || presetFiles.isEmpty() || index < 0)
        return {};

    // The file found by the scan: a file named ".vtp" is listed as ".vtp" and loads.
    return presetFolder + presetFiles[juce::jmin (index, presetFiles.size() - 1)];
}

juce::String PresetLibrary::getPresetPath (const juce::String& name) const
{
    if (presetFolder.isEmpty() || ! isSafePresetName (name))
        return {};

    return presetFolder + name + "." + extension;
}

bool PresetLibrary::isSafePresetName (const juce::String& name) const
{
    if (name.isEmpty() || name.containsChar ('/'))
        return false;

    // Elsewhere both are ordinary characters of a file name: "AC\DC" is a preset.
    return ! (isWindows (platform) && name.containsAnyOf ("\\:"));
}

} // namespace veltrane
