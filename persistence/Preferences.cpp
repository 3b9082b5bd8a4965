#include "Preferences.h"

namespace veltrane
{

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

} // namespace veltrane
