#include "Preferences.h"

#include "SafeFile.h"
#include "SafeXml.h"

#include <mutex>

namespace veltrane
{

namespace
{
    constexpr char fileTag[] = "PROPERTIES";
    constexpr char valueTag[] = "VALUE";
    constexpr char nameAttribute[] = "name";
    constexpr char valueAttribute[] = "val";
}

juce::PropertiesFile::Options preferencesOptions()
{
    juce::PropertiesFile::Options options;
    options.applicationName = "Veltrane";
    options.filenameSuffix = ".prefs";
   #if JUCE_LINUX || JUCE_BSD
    // JUCE puts the file in ~/<folder>/; a hidden folder keeps it beside the presets
    // in ~/.Tarnwell_Audio/ instead of adding a visible folder to the home directory.
    options.folderName = ".Tarnwell_Audio";
   #else
    options.folderName = "Tarnwell_Audio";
   #endif
    options.osxLibrarySubFolder = "Application Support";
    options.commonToAllUsers = false;
    options.ignoreCaseOfKeyNames = false;
    options.millisecondsBeforeSaving = 3000;
    options.storageFormat = juce::PropertiesFile::storeAsXML;
    options.processLock = nullptr;
    return options;
}

std::optional<juce::StringPairArray> readPreferences (const juce::File& file)
{
    juce::StringPairArray values (false);

    if (! file.exists())
        return values;

    const auto document = parseDocumentFile (file);

    if (document == nullptr || ! document->hasTagName (fileTag))
        return {};

    // As juce::PropertiesFile reads it: a value held as an element is kept as its text.
    for (auto* value : document->getChildWithTagNameIterator (valueTag))
    {
        const auto name = value->getStringAttribute (nameAttribute);

        if (name.isNotEmpty())
            values.set (name, value->getFirstChildElement() != nullptr
                                  ? value->getFirstChildElement()->toString (juce::XmlElement::TextFormat().singleLine().withoutHeader())
                                  : value->getStringAttribute (valueAttribute));
    }

    return values;
}

juce::String createPreferencesText (const juce::StringPairArray& values)
{
    juce::XmlElement document (fileTag);

    for (int i = 0; i < values.size(); ++i)
    {
        auto* element = document.createNewChildElement (valueTag);
        element->setAttribute (nameAttribute, values.getAllKeys()[i]);

        // A value that is itself XML is written as an element, as JUCE writes it.
        if (auto child = parseDocument (values.getAllValues()[i]))
            element->addChildElement (child.release());
        else
            element->setAttribute (valueAttribute, values.getAllValues()[i]);
    }

    return document.toString();
}

PreferencesFile::PreferencesFile (const juce::PropertiesFile::Options& options)
    : juce::PropertySet (options.ignoreCaseOfKeyNames),
      file (options.getDefaultFile()),
      millisecondsBeforeSaving (options.millisecondsBeforeSaving)
{
    if (const auto values = readPreferences (file))
        getAllProperties().addArray (*values);

    savedValues = getAllProperties();
}

PreferencesFile::~PreferencesFile()
{
    stopTimer();
    saveIfNeeded();
}

juce::StringPairArray PreferencesFile::changedValues()
{
    juce::StringPairArray changed (false);
    const auto& current = getAllProperties();

    for (int i = 0; i < current.size(); ++i)
    {
        const auto& key = current.getAllKeys()[i];
        const auto& value = current.getAllValues()[i];
        const auto saved = savedValues.getAllKeys().indexOf (key);
        const auto unchanged = saved >= 0 ? savedValues.getAllValues()[saved] == value
                                          : defaults.getAllKeys().contains (key) && defaults[key] == value;

        if (! unchanged)
            changed.set (key, value);
    }

    return changed;
}

bool PreferencesFile::save()
{
    const juce::ScopedLock held (getLock());
    stopTimer();

    const auto changed = changedValues();

    if (changed.size() == 0)
        return true;

    if (file == juce::File() || ! file.getParentDirectory().createDirectory())
        return false;

    // Instances in one process merge one at a time, so none writes over another's.
    static std::mutex mergeLock;
    const std::lock_guard<std::mutex> merging (mergeLock);

    // A file that cannot be read (damaged, or not a properties file) is replaced by
    // everything this instance holds, as JUCE would replace it.
    auto merged = readPreferences (file).value_or (getAllProperties());
    merged.addArray (changed);

    for (int i = 0; i < getAllProperties().size(); ++i)
        if (! merged.containsKey (getAllProperties().getAllKeys()[i]))
            merged.set (getAllProperties().getAllKeys()[i], getAllProperties().getAllValues()[i]);

    const auto text = createPreferencesText (merged);

    if (! replaceFileContents (file, text.toRawUTF8(), text.getNumBytesAsUTF8()))
        return false;

    savedValues = getAllProperties();
    return true;
}

bool PreferencesFile::saveIfNeeded()
{
    const juce::ScopedLock held (getLock());
    return changedValues().size() == 0 || save();
}

void PreferencesFile::propertyChanged()
{
    if (millisecondsBeforeSaving > 0)
        startTimer (millisecondsBeforeSaving);
    else if (millisecondsBeforeSaving == 0)
        saveIfNeeded();
}

} // namespace veltrane
