#include "PresetLibrary.h"

#include "FactoryPresets.h"
#include "SafeXml.h"

#include <filesystem>

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
}

bool writePresetFile (const juce::File& target, const juce::String& presetName, const ParameterValues& values)
{
    juce::XmlElement element (presetTag);
    element.setAttribute (presetNameAttribute, presetName);

    for (int i = 0; i < Param::count; ++i)
        element.setAttribute (parameterTable[(size_t) i].identifier, formatValue ((double) values[(size_t) i]));

    return element.writeTo (target, [] {
        juce::XmlElement::TextFormat format;
        format.dtd = " ";
        format.customEncoding = "UTF-8";
        return format;
    }());
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
    const auto found = findAttributes (*element, names);

    PresetContents contents;

    for (size_t i = 0; i < (size_t) Param::count; ++i)
        if (const auto* value = found[i])
            contents.values[i] = value->getDoubleValue();

    const auto* presetName = found.back();
    contents.presetName = presetName != nullptr ? *presetName : juce::String (" ");
    return contents;
}

std::optional<PresetContents> readPresetFile (const juce::File& file)
{
    // Only a plain file is opened: a pipe or a device in the folder would block or
    // never end. The size is checked before anything is read.
    std::error_code error;
    const std::filesystem::path path (file.getFullPathName().toStdString());

    if (! std::filesystem::is_regular_file (path, error))
        return {};

    const auto size = std::filesystem::file_size (path, error);

    if (error || size > (std::uintmax_t) maxDocumentBytes)
        return {};

    juce::FileInputStream stream (file);

    if (! stream.openedOk())
        return {};

    // At most one byte more than allowed, in case the file grew since it was measured.
    juce::MemoryBlock bytes;
    stream.readIntoMemoryBlock (bytes, maxDocumentBytes + 1);

    if (bytes.getSize() > (size_t) maxDocumentBytes)
        return {};

    return readPresetDocument (parseDocument (static_cast<const char*> (bytes.getData()), bytes.getSize()));
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
            presetNames.add (file.getFileNameWithoutExtension());
    }
}

juce::String PresetLibrary::getPresetPath (int index) const
{
    if (presetFolder.isEmpty())
        return {};

    if (index >= presetNames.size())
        index = presetNames.size() - 1;

    // Listed names are names of files found in the folder, so they need no check.
    return presetFolder + (index >= 0 ? presetNames[index] : juce::String()) + "." + extension;
}

juce::String PresetLibrary::getPresetPath (const juce::String& name) const
{
    if (presetFolder.isEmpty() || ! isSafePresetName (name))
        return {};

    return presetFolder + name + "." + extension;
}

bool PresetLibrary::isSafePresetName (const juce::String& name) const
{
    if (name.containsAnyOf ("/\\"))
        return false;

    return ! (isWindows (platform) && name.containsChar (':'));
}

} // namespace veltrane
