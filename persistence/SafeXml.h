#pragma once

#include <juce_core/juce_core.h>

#include <memory>
#include <vector>

namespace veltrane
{

// Largest XML text, in bytes, taken from a host state or a preset file. A state is
// about 2 kB; anything near this size is not ours.
constexpr int maxDocumentBytes = 1 << 20;

// Deepest element nesting taken. Our documents are one element without children.
constexpr int maxElementDepth = 32;

// Most attributes taken on the document element; ours carry 34 or 67. JUCE finds
// an attribute by walking a list, so a bound keeps the lookups below cheap.
constexpr int maxAttributes = 1024;

// The document element of text, or null when the text is larger than
// maxDocumentBytes, nests elements deeper than maxElementDepth, declares entities,
// is not XML, or whose element has more than maxAttributes attributes. JUCE's parser recurses once per nesting level and expands declared
// entities recursively, so those documents are refused before it runs. Any thread.
std::unique_ptr<juce::XmlElement> parseDocument (const juce::String& text);

// The document element of numBytes bytes of UTF-8 text (ending early at a zero
// byte), or null when parseDocument refuses it or the bytes are not strictly valid
// UTF-8: JUCE's decoder steps past the end of the text on a malformed sequence and
// miscounts an overlong zero.
std::unique_ptr<juce::XmlElement> parseDocument (const char* utf8, size_t numBytes);

// For each of names, the value of the first attribute of element whose name equals
// it ignoring the case of letters, or null when there is none.
std::vector<const juce::String*> findAttributes (const juce::XmlElement& element, const juce::StringArray& names);

// A value as "%.9g" writes it, with a full stop whatever the locale: nine
// significant digits bring every single-precision value back unchanged.
juce::String formatValue (double value);

} // namespace veltrane
