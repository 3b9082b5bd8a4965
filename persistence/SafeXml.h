#pragma once

#include <juce_core/juce_core.h>

#include <memory>
#include <optional>
#include <vector>

namespace veltrane
{

// Largest XML text, in bytes, taken from a host state or a preset file. A state is
// about 2 kB; anything near this size is not ours.
constexpr int maxDocumentBytes = 1 << 20;

// Deepest element nesting taken. Our documents are one element without children.
constexpr int maxElementDepth = 32;

// The document element of text, or null when the text is larger than
// maxDocumentBytes, nests elements deeper than maxElementDepth, refers to an entity
// other than the five predefined ones, or is not XML. JUCE's parser recurses once
// per nesting level and expands declared entities recursively, so those documents
// are refused before it runs; a DOCTYPE, with an internal subset too, is taken and
// nothing declared in it is ever expanded. Any thread.
std::unique_ptr<juce::XmlElement> parseDocument (const juce::String& text);

// The document element of numBytes bytes of UTF-8 text (ending early at a zero
// byte), or null when parseDocument refuses it or the bytes are not strictly valid
// UTF-8: JUCE's decoder steps past the end of the text on a malformed sequence and
// miscounts an overlong zero.
std::unique_ptr<juce::XmlElement> parseDocument (const char* utf8, size_t numBytes);

// The document element of a file as editors save it: UTF-8 with or without a
// byte-order mark, or UTF-16 in either byte order after its mark. Null for anything
// but a plain file (a pipe or a device would block or never end), a file of more
// than twice maxDocumentBytes (UTF-16 takes up to twice the bytes of its UTF-8),
// malformed UTF-16 and whatever parseDocument refuses.
std::unique_ptr<juce::XmlElement> parseDocumentFile (const juce::File& file);

// For each of names, the value of the first attribute of element whose name equals
// it ignoring the case of letters, or nothing. Every attribute is taken off element
// on the way, so a document with very many unknown attributes costs time in
// proportion to its length: JUCE walks its list to reach an attribute by index.
std::vector<std::optional<juce::String>> takeAttributes (juce::XmlElement& element, const juce::StringArray& names);

// A value as "%.9g" writes it, with a full stop whatever the locale: nine
// significant digits bring every single-precision value back unchanged.
juce::String formatValue (double value);

} // namespace veltrane
