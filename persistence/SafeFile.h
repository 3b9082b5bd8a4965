#pragma once

#include <juce_core/juce_core.h>

namespace veltrane
{

// Replaces target with numBytes of data, or leaves it untouched and returns false.
// The bytes go to a new hidden file ".veltrane-<hex>.tmp" beside target, are checked
// to be written whole (a full disk, a quota or a file-size limit cuts a write short)
// and flushed to the disk, and only then is the file renamed over target, so target
// holds either its old or its new content, never a part. The temporary name matches
// no preset scan. Any thread; concurrent writers of one target leave one whole file.
bool replaceFileContents (const juce::File& target, const void* data, size_t numBytes);

} // namespace veltrane
