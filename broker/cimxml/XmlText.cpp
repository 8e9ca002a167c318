#include "broker/cimxml/XmlText.h"

#include "broker/values/Utf8.h"

#include <algorithm>

namespace cimxml
{

namespace
{

/// XML 1.0 knows of three control characters.
bool isXmlByte(char c)
{
    return static_cast<unsigned char>(c) >= 0x20 || c == '\t' || c == '\n' || c == '\r';
}

/// U+FFFE and U+FFFF, which are no characters of XML.
bool isNoCharacter(std::string_view character)
{
    return character == "\xEF\xBF\xBE" || character == "\xEF\xBF\xBF";
}

std::string_view entityOf(char c)
{
    switch (c)
    {
    case '&':
        return "&amp;";
    case '<':
        return "&lt;";
    case '>':
        return "&gt;";
    case '"':
        return "&quot;";
    case '\r':
        return "&#13;"; // a reader takes a bare one for the end of a line
    default:
        return {};
    }
}

bool isPlain(char c)
{
    return c >= 0x20 && c < 0x7F && c != '&' && c != '<' && c != '>' && c != '"';
}

void appendEscaped(std::string& out, std::string_view text)
{
    for (;;)
    {
        const auto plain = static_cast<std::size_t>(std::ranges::find_if_not(text, isPlain) - text.begin());
        out.append(text.substr(0, plain));
        text.remove_prefix(plain);
        if (text.empty())
            return;
        std::size_t length = 1;
        if (static_cast<unsigned char>(text.front()) >= 0x80)
        {
            length = broker::longCharacter(text);
            const bool valid = length != 0 && !isNoCharacter(text.substr(0, length));
            length = length == 0 ? 1 : length;
            out += valid ? text.substr(0, length) : "?";
        }
        else if (const std::string_view entity = entityOf(text.front()); !entity.empty())
            out += entity;
        else
            out += isXmlByte(text.front()) ? text.front() : '?';
        text.remove_prefix(length);
    }
}

} // namespace

void XmlText::open(std::string_view element, std::initializer_list<XmlAttribute> attributes)
{
    _text.append("<").append(element);
    for (const XmlAttribute& attribute : attributes)
    {
        _text.append(" ").append(attribute.name).append("=\"");
        appendEscaped(_text, attribute.value);
        _text.append("\"");
    }
    _text.append(">");
}

void XmlText::close(std::string_view element)
{
    _text.append("</").append(element).append(">");
}

void XmlText::characters(std::string_view text)
{
    appendEscaped(_text, text);
}

void XmlText::leaf(std::string_view element, std::string_view text, std::initializer_list<XmlAttribute> attributes)
{
    const XmlElement whole(*this, element, attributes);
    characters(text);
}

} // namespace cimxml
