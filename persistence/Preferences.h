#pragma once

#include <juce_data_structures/juce_data_structures.h>

#include <optional>

namespace veltrane
{

// Where and how the per-user preferences file shared by every instance lives:
// "LastWidth", "LastHeight" and one identifier + "CC" key per parameter, keys
// case-sensitive. On Linux it is ~/.Tarnwell_Audio/Veltrane.prefs.
juce::PropertiesFile::Options preferencesOptions();

constexpr char lastWidthKey[] = "LastWidth";
constexpr char lastHeightKey[] = "LastHeight";
constexpr float defaultEditorWidth = 1000.0f;
constexpr float defaultEditorHeight = 500.0f;

// The keys and values of a preferences file in JUCE's XML properties format (a
// "PROPERTIES" element with one "VALUE" element per key): empty for a missing
// file, nothing for a file that cannot be read or is not in that format.
std::optional<juce::StringPairArray> readPreferences (const juce::File& file);

// The file's text as juce::PropertiesFile writes it.
juce::String createPreferencesText (const juce::StringPairArray& values);

// The preferences file of one instance. It reads the file once when opened. Saving
// writes the keys whose values this instance changed since it read or last wrote
// them, and its values of keys the file lacks, on top of the file as it is on disk
// at that moment, so keys saved by other instances in between stay; the file is
// replaced whole or not at all. A change is saved after the options' delay
// (message thread) and by saveIfNeeded.
class PreferencesFile final : public juce::PropertySet,
                              private juce::Timer
{
public:
    explicit PreferencesFile (const juce::PropertiesFile::Options& options);
    ~PreferencesFile() override;

    // Whether the file now holds this instance's changes; when not, they stay
    // pending for the next save.
    bool save();
    bool saveIfNeeded();

    // The value a key stands for while the file lacks it: storing it is no change.
    void setDefaultValue (const juce::String& key, const juce::var& value) { defaults.set (key, value.toString()); }

    const juce::File& getFile() const noexcept { return file; }

private:
    void propertyChanged() override;
    void timerCallback() override { save(); }
    juce::StringPairArray changedValues();

    const juce::File file;
    const int millisecondsBeforeSaving;
    juce::StringPairArray savedValues { false };   // as this instance read or last wrote them
    juce::StringPairArray defaults { false };

    JUCE_DECLARE_NON_COPYABLE (PreferencesFile)
};

} // namespace veltrane
