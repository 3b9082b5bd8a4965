#include "Preferences.h"

namespace veltrane
{

juce::PropertiesFile::Options preferencesOptions()
{
    juce::PropertiesFile::Options options;
    options.applicationName = "Veltrane";
    options.filenameSuffix = ".prefs";
    options.folderName = "Tarnwell_Audio";
    options.osxLibrarySubFolder = "Application Support";
    options.commonToAllUsers = false;
    options.ignoreCaseOfKeyNames = false;
    options.millisecondsBeforeSaving = 3000;
    options.storageFormat = juce::PropertiesFile::storeAsXML;
    options.processLock = nullptr;
    return options;
}

} // namespace veltrane
