// XML as it is written: elements with both tags, since clients have scanners of their own that take no others for most
// elements, and the five named entities, since they decode no numeric ones.
#pragma once

#include <initializer_list>
#include <string>
#include <string_view>

namespace cimxml
{

struct XmlAttribute
{
    const char* name;
    std::string_view value;
};

/// Writes into a text of the caller, which gets a whole document or a part of one.
class XmlText
{
public:
    explicit XmlText(std::string& text) : _text(text) {}

    void open(std::string_view element, std::initializer_list<XmlAttribute> attributes = {});
    void close(std::string_view element);
    /// Escaped. What XML cannot hold, or is no UTF-8, becomes a question mark.
    void characters(std::string_view text);
    /// As it is.
    void markup(std::string_view text) { _text += text; }
    void leaf(std::string_view element, std::string_view text, std::initializer_list<XmlAttribute> attributes = {});

private:
    std::string& _text;
};

/// An element for a scope: both of its tags.
class XmlElement
{
public:
    XmlElement(XmlText& xml, std::string_view name, std::initializer_list<XmlAttribute> attributes = {})
        : _xml(xml), _name(name)
    {
        xml.open(name, attributes);
    }
    ~XmlElement() { _xml.close(_name); }
    XmlElement(const XmlElement&) = delete;
    XmlElement& operator=(const XmlElement&) = delete;

private:
    XmlText& _xml;
    std::string_view _name;
};

} // namespace cimxml
