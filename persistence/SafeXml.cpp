#include "SafeXml.h"

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <locale>
#include <sstream>

namespace veltrane
{

namespace
{
    // UTF-16 takes up to twice the bytes of the same text in UTF-8.
    constexpr int maxFileBytes = 2 * maxDocumentBytes;

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

    // Little- or big-endian UTF-16 as UTF-8, up to a zero character; nothing for an
    // odd number of bytes or a surrogate without its partner.
    std::optional<std::string> utf16ToUtf8 (const unsigned char* bytes, size_t numBytes, bool bigEndian)
    {
        if (numBytes % 2 != 0)
            return {};

        const auto unitAt = [&] (size_t i) {
            return (juce::uint32) (bigEndian ? (bytes[i] << 8) | bytes[i + 1] : (bytes[i + 1] << 8) | bytes[i]);
        };

        std::string text;
        text.reserve (numBytes);

        for (size_t i = 0; i < numBytes; i += 2)
        {
            auto code = unitAt (i);

            if (code == 0)
                break;

            if (code >= 0xdc00 && code <= 0xdfff)
                return {};

            if (code >= 0xd800 && code <= 0xdbff)
            {
                const auto low = i + 2 < numBytes ? unitAt (i + 2) : 0;

                if (low < 0xdc00 || low > 0xdfff)
                    return {};

                code = 0x10000 + ((code - 0xd800) << 10) + (low - 0xdc00);
                i += 2;
            }

            char encoded[4];
            const auto length = juce::CharPointer_UTF8::getBytesRequiredFor ((juce::juce_wchar) code);
            juce::CharPointer_UTF8 (encoded).write ((juce::juce_wchar) code);
            text.append (encoded, length);
        }

        return text;
    }

    // A strict reading of the document's shape: an optional declaration, comments,
    // processing instructions and a DOCTYPE, then one element whose tags,
    // attributes, references, text, comments and CDATA are well formed, nested at
    // most maxElementDepth deep. JUCE's parser is lenient with malformed
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
                for (p += 9; *p != 0 && *p != '>' && *p != '[' && *p != '<';)
                    ++p;

                if (*p == '[' && ! internalSubset())
                    return false;

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

        // Inside an element, JUCE's parser loops for ever on a processing instruction
        // that character data follows (past spaces, comments and more instructions):
        // it rolls back to the instruction and reads an empty text there, again and
        // again. Such a document is refused.
        bool markupFollows() const
        {
            auto ahead = *this;
            return ahead.misc() && *ahead.p == '<';
        }

        // Skips to the end of terminator, refusing the angle brackets that JUCE would
        // count before it.
        bool skipPastWithoutBrackets (const char* terminator)
        {
            const auto* found = std::strstr (p, terminator);

            if (found == nullptr || std::find_if (p, found, [] (char c) { return c == '<' || c == '>'; }) != found)
                return false;

            p = found + std::strlen (terminator);
            return true;
        }

        // The declarations, comments, processing instructions and parameter-entity
        // references between '[' and ']', then the space before the closing '>'.
        // Nothing declared is ever expanded: only the predefined entities and
        // character numbers pass in the document. JUCE finds the end of the DOCTYPE
        // by counting angle brackets, so none may stand in a literal or a comment.
        bool internalSubset()
        {
            for (++p;;)
            {
                skipSpace();

                if (*p == ']')
                {
                    ++p;
                    skipSpace();
                    return true;
                }

                if (*p == '%')
                {
                    ++p;
                    if (name() == nullptr || *p++ != ';')
                        return false;
                }
                else if (startsWith ("<!--") || startsWith ("<?"))
                {
                    p += 2;
                    if (! skipPastWithoutBrackets (p[-1] == '?' ? "?>" : "-->"))
                        return false;
                }
                else if (startsWith ("<!"))
                {
                    for (p += 2; *p != '>'; ++p)
                    {
                        if (*p == '"' || *p == '\'')
                        {
                            const auto* end = std::strchr (p + 1, *p);
                            if (end == nullptr || std::find_if (p, end, [] (char c) { return c == '<' || c == '>'; }) != end)
                                return false;
                            p = end;
                        }
                        else if (*p == 0 || *p == '<' || *p == '[' || *p == ']')
                        {
                            return false;
                        }
                    }

                    ++p;
                }
                else
                {
                    return false;
                }
            }
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
                else if (startsWith ("<?"))
                {
                    if (! skipPast ("?>") || ! markupFollows())
                        return false;
                }
                else
                {
                    const auto* skip = startsWith ("<!--") ? "-->" : startsWith ("<![CDATA[") ? "]]>" : nullptr;

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
    return juce::XmlDocument::parse (text);
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

std::unique_ptr<juce::XmlElement> parseDocumentFile (const juce::File& file)
{
    std::error_code error;
    const std::filesystem::path path (file.getFullPathName().toStdString());

    if (! std::filesystem::is_regular_file (path, error))
        return {};

    const auto size = std::filesystem::file_size (path, error);

    if (error || size > (std::uintmax_t) maxFileBytes)
        return {};

    juce::FileInputStream stream (file);

    if (! stream.openedOk())
        return {};

    // At most one byte more than allowed, in case the file grew since it was measured.
    juce::MemoryBlock bytes;
    stream.readIntoMemoryBlock (bytes, maxFileBytes + 1);

    if (bytes.getSize() > (size_t) maxFileBytes)
        return {};

    const auto* data = static_cast<const unsigned char*> (bytes.getData());
    const auto numBytes = bytes.getSize();

    if (numBytes >= 3 && data[0] == 0xef && data[1] == 0xbb && data[2] == 0xbf)
        return parseDocument (reinterpret_cast<const char*> (data + 3), numBytes - 3);

    const auto littleEndian = numBytes >= 2 && data[0] == 0xff && data[1] == 0xfe;
    const auto bigEndian = numBytes >= 2 && data[0] == 0xfe && data[1] == 0xff;

    if (littleEndian || bigEndian)
    {
        const auto utf8 = utf16ToUtf8 (data + 2, numBytes - 2, bigEndian);
        return utf8.has_value() ? parseDocument (utf8->data(), utf8->size()) : nullptr;
    }

    return parseDocument (reinterpret_cast<const char*> (data), numBytes);
}

std::vector<std::optional<juce::String>> takeAttributes (juce::XmlElement& element, const juce::StringArray& names)
{
    std::vector<std::optional<juce::String>> found ((size_t) names.size());

    // Attribute names are never empty, so an empty first name means none is left.
    for (juce::String attributeName; (attributeName = element.getAttributeName (0)).isNotEmpty();)
    {
        for (int j = 0; j < names.size(); ++j)
            if (! found[(size_t) j].has_value() && attributeName.equalsIgnoreCase (names[j]))
                found[(size_t) j] = element.getAttributeValue (0);

        element.removeAttribute (juce::Identifier (attributeName));
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
