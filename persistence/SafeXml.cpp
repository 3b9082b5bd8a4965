#include "SafeXml.h"

#include <cstring>
#include <locale>
#include <sstream>

namespace veltrane
{

namespace
{
    // Skips from text to just past the first occurrence of terminator; the end of the
    // text when there is none.
    const char* skipPast (const char* text, const char* terminator)
    {
        const auto* found = std::strstr (text, terminator);
        return found != nullptr ? found + std::strlen (terminator) : text + std::strlen (text);
    }

    // An upper bound of how deep the parser would nest elements: every start tag that
    // does not close itself counts one level down, every end tag one level up.
    // Comments, CDATA, processing instructions and declarations are skipped whole, and
    // quoted attribute values inside a tag are passed over.
    bool nestsTooDeeply (const char* text)
    {
        int depth = 0;

        while (*text != 0)
        {
            if (*text != '<')
            {
                ++text;
                continue;
            }

            if (std::strncmp (text, "<!--", 4) == 0)        text = skipPast (text + 4, "-->");
            else if (std::strncmp (text, "<![CDATA[", 9) == 0) text = skipPast (text + 9, "]]>");
            else if (text[1] == '?')                     text = skipPast (text + 2, "?>");
            else if (text[1] == '!')                     text = skipPast (text + 2, ">");
            else if (text[1] == '/')
            {
                depth = juce::jmax (0, depth - 1);
                text = skipPast (text + 2, ">");
            }
            else
            {
                char previous = 0;
                ++text;

                while (*text != 0 && *text != '>')
                {
                    if (*text == '"' || *text == '\'')
                    {
                        const char quote[] = { *text, 0 };
                        text = skipPast (text + 1, quote);
                        previous = 0;
                        continue;
                    }

                    previous = *text++;
                }

                if (previous != '/' && ++depth > maxElementDepth)
                    return true;

                if (*text == '>')
                    ++text;
            }
        }

        return false;
    }
}

std::unique_ptr<juce::XmlElement> parseDocument (const juce::String& text)
{
    if (text.getNumBytesAsUTF8() > (size_t) maxDocumentBytes)
        return {};

    // Entity declarations are the only way to make the parser expand text on its own;
    // our files never contain them.
    if (text.containsIgnoreCase ("<!ENTITY"))
        return {};

    if (nestsTooDeeply (text.toRawUTF8()))
        return {};

    // Parsed from a string, the document has no input source, so a DTD naming an
    // external file reads nothing.
    auto element = juce::XmlDocument::parse (text);

    if (element != nullptr && element->getNumAttributes() > maxAttributes)
        return {};

    return element;
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
