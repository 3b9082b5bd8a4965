#include "SafeXml.h"

#include <cstring>
#include <locale>
#include <sstream>

namespace veltrane
{

namespace
{
    // Strict UTF-8: no stray continuation byte, no truncated, overlong or surrogate
    // sequence, nothing above U+10FFFF. Stops at a zero byte.
    bool isStrictUtf8 (const unsigned char* bytes, size_t numBytes)
    {
        for (size_t i = 0; i < numBytes && bytes[i] != 0;)
        {
            const auto lead = bytes[i];
            int extra = 0;
            juce::uint32 code = 0, minimum = 0;

            if (lead < 0x80)            { ++i; continue; }
            if ((lead & 0xe0) == 0xc0)  { extra = 1; code = lead & 0x1fu; minimum = 0x80; }
            else if ((lead & 0xf0) == 0xe0) { extra = 2; code = lead & 0x0fu; minimum = 0x800; }
            else if ((lead & 0xf8) == 0xf0) { extra = 3; code = lead & 0x07u; minimum = 0x10000; }
            else return false;

            if (i + (size_t) extra >= numBytes)
                return false;

            for (int k = 1; k <= extra; ++k)
            {
                if ((bytes[i + (size_t) k] & 0xc0) != 0x80)
                    return false;

                code = (code << 6) | (bytes[i + (size_t) k] & 0x3fu);
            }

            if (code < minimum || code > 0x10ffff || (code >= 0xd800 && code <= 0xdfff))
                return false;

            i += (size_t) extra + 1;
        }

        return true;
    }

    // A strict reading of the document's shape: an optional declaration, comments,
    // processing instructions and a DOCTYPE without internal subset, then one element
    // whose tags, attributes, references, text, comments and CDATA are well formed,
    // nested at most maxElementDepth deep. JUCE's parser is lenient with malformed
    // text and then can loop forever or read past the end, so it only ever sees
    // documents that pass here.
    class ShapeCheck
    {
    public:
        explicit ShapeCheck (const char* text) : p (text) {}

        bool document()
        {
            if (! misc())
                return false;

            if (startsWith ("<!DOCTYPE"))
            {
                while (*p != 0 && *p != '>' && *p != '[' && *p != '<')
                    ++p;

                if (*p++ != '>' || ! misc())
                    return false;
            }

            return element (1) && misc() && *p == 0;
        }

    private:
        bool startsWith (const char* prefix) const { return std::strncmp (p, prefix, std::strlen (prefix)) == 0; }
        static bool isSpace (char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

        static bool isNameChar (char c)
        {
            return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9')
                || c == '_' || c == ':' || c == '.' || c == '-' || (unsigned char) c >= 0x80;
        }

        void skipSpace() { while (isSpace (*p)) ++p; }

        bool skipPast (const char* terminator)
        {
            const auto* found = std::strstr (p, terminator);

            if (found == nullptr)
                return false;

            p = found + std::strlen (terminator);
            return true;
        }

        // Whitespace, comments and processing instructions.
        bool misc()
        {
            for (;;)
            {
                skipSpace();

                if (startsWith ("<!--"))
                {
                    p += 4;
                    if (! skipPast ("-->"))
                        return false;
                }
                else if (startsWith ("<?"))
                {
                    p += 2;
                    if (! skipPast ("?>"))
                        return false;
                }
                else
                {
                    return true;
                }
            }
        }

        const char* name()
        {
            const auto* begin = p;

            if (*p == '-' || *p == '.' || (*p >= '0' && *p <= '9'))
                return nullptr;

            while (isNameChar (*p))
                ++p;

            return p != begin ? begin : nullptr;
        }

        // One of the five named references, or the number of a character that a
        // string can hold.
        bool reference()
        {
            ++p;

            for (const auto* named : { "amp;", "lt;", "gt;", "quot;", "apos;" })
            {
                if (startsWith (named))
                {
                    p += std::strlen (named);
                    return true;
                }
            }

            if (*p++ != '#')
                return false;

            const bool hex = *p == 'x';
            p += hex ? 1 : 0;
            long code = 0;
            int digits = 0;

            for (; *p != ';'; ++p, ++digits)
            {
                const auto value = juce::CharacterFunctions::getHexDigitValue ((juce::juce_wchar) (unsigned char) *p);

                if (value < 0 || (! hex && value > 9) || digits >= 7)
                    return false;

                code = code * (hex ? 16 : 10) + value;
            }

            ++p;
            return digits > 0 && code > 0 && code <= 0x10ffff && ! (code >= 0xd800 && code <= 0xdfff);
        }

        bool attributes()
        {
            for (;;)
            {
                const bool spaced = isSpace (*p);
                skipSpace();

                if (*p == '/' || *p == '>')
                    return true;

                if (! spaced || name() == nullptr)
                    return false;

                skipSpace();
                if (*p++ != '=')
                    return false;
                skipSpace();

                const auto quote = *p++;
                if (quote != '"' && quote != '\'')
                    return false;

                while (*p != quote)
                {
                    if (*p == 0 || *p == '<')
                        return false;

                    if (*p != '&')
                        ++p;
                    else if (! reference())
                        return false;
                }

                ++p;
            }
        }

        bool element (int depth)
        {
            if (depth > maxElementDepth || *p++ != '<')
                return false;

            const auto* tagName = name();

            if (tagName == nullptr)
                return false;

            const auto tagLength = (size_t) (p - tagName);

            if (! attributes())
                return false;

            if (startsWith ("/>"))
            {
                p += 2;
                return true;
            }

            if (*p++ != '>')
                return false;

            for (;;)
            {
                if (*p == 0)
                    return false;

                if (*p == '&')
                {
                    if (! reference())
                        return false;
                }
                else if (*p != '<')
                {
                    ++p;
                }
                else if (startsWith ("</"))
                {
                    p += 2;

                    if (std::strncmp (p, tagName, tagLength) != 0 || isNameChar (p[tagLength]))
                        return false;

                    p += tagLength;
                    skipSpace();
                    return *p++ == '>';
                }
                else
                {
                    const auto* skip = startsWith ("<!--") ? "-->" : startsWith ("<![CDATA[") ? "]]>"
                                     : startsWith ("<?") ? "?>" : nullptr;

                    if (skip != nullptr ? ! skipPast (skip) : ! element (depth + 1))
                        return false;
                }
            }
        }

        const char* p;
    };
}

std::unique_ptr<juce::XmlElement> parseDocument (const juce::String& text)
{
    if (text.getNumBytesAsUTF8() > (size_t) maxDocumentBytes)
        return {};

    // Declared entities are refused with the rest: only the five named references
    // and character numbers pass, and a DOCTYPE may not hold declarations.
    if (! ShapeCheck (text.toRawUTF8()).document())
        return {};

    // Parsed from a string, the document has no input source, so a DTD naming an
    // external file reads nothing.
    auto element = juce::XmlDocument::parse (text);

    if (element != nullptr && element->getNumAttributes() > maxAttributes)
        return {};

    return element;
}

std::unique_ptr<juce::XmlElement> parseDocument (const char* utf8, size_t numBytes)
{
    if (numBytes > (size_t) maxDocumentBytes || ! isStrictUtf8 (reinterpret_cast<const unsigned char*> (utf8), numBytes))
        return {};

    // Decoded from a zero-terminated copy: the bytes given may have no terminator.
    juce::MemoryBlock text (utf8, numBytes);
    text.append ("", 1);
    return parseDocument (juce::String (juce::CharPointer_UTF8 (static_cast<const char*> (text.getData()))));
}

std::vector<const juce::String*> findAttributes (const juce::XmlElement& element, const juce::StringArray& names)
{
    std::vector<const juce::String*> found ((size_t) names.size(), nullptr);
    const auto count = juce::jmin (element.getNumAttributes(), maxAttributes);

    for (int i = 0; i < count; ++i)
    {
        const auto& attributeName = element.getAttributeName (i);

        for (int j = 0; j < names.size(); ++j)
            if (found[(size_t) j] == nullptr && attributeName.equalsIgnoreCase (names[j]))
                found[(size_t) j] = &element.getAttributeValue (i);
    }

    return found;
}

juce::String formatValue (double value)
{
    std::ostringstream stream;
    stream.imbue (std::locale::classic());
    stream.precision (9);
    stream << value;
    return stream.str();
}

} // namespace veltrane
