#include "services/TagTable.h"

#include "agent/MethodCall.h"
#include "foundation/CommonHelpers.h"
#include "runtime/values/Datetime.h"

#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <memory>
#include <new>
#include <optional>
#include <stdexcept>
#include <string_view>

namespace cimple
{

namespace
{

using Document = rapidxml::xml_document<>;
using Node = rapidxml::xml_node<>;

constexpr MethodEnd malformed = {5};
constexpr MethodEnd noMemory = {0x8000};

constexpr const char* tableVersion = "1.0";

/// Names of the elements, for those who read and who write.
namespace element
{
constexpr const char* root = "CruxConfig";
constexpr const char* system = "theSystem";
constexpr const char* version = "CruxVersion";
constexpr const char* creation = "CreationDate";
constexpr const char* host = "HostName";
constexpr const char* adapter = "Adapter";
constexpr const char* configuration = "Configuration";
constexpr const char* count = "numberOfEntries";
constexpr const char* row = "Row";
constexpr const char* source = "src_wwpn";
constexpr const char* target = "tgt_wwpn";
constexpr const char* reserved1 = "reserved1";
constexpr const char* tag = "tag";
constexpr const char* reserved2 = "reserved2";
} // namespace element

} // namespace

// --- what the parser may see ---------------------------------------------------------------------------

namespace
{

/// A walk over the tags of a text that comes from anywhere. RapidXML goes into elements by recursion, makes a node of
/// each, and passes over document types; what it gets is neither deeper nor larger than a table may be, and has no
/// document type. Names are taken more narrowly than the parser does, so that both see the same tags.
class Outline
{
public:
    explicit Outline(std::string_view text) : _rest(text) {}

    /// Throws std::runtime_error.
    void check()
    {
        for (std::size_t tag = _rest.find('<'); tag != std::string_view::npos; tag = _rest.find('<'))
        {
            _rest.remove_prefix(tag + 1);
            require(++_tags <= maximumTags); // also a comment, since the text behind it is a node
            if (take("!--"))
                pass("-->");
            else if (take("![CDATA["))
                pass("]]>");
            else if (take("?"))
                pass("?>");
            else if (take("/"))
                closeElement();
            else
                openElement();
        }
    }

private:
    static constexpr unsigned maximumDepth = 64;
    /// Six of a row, and room for what stands around them.
    static constexpr std::size_t maximumElements = 6 * maximumTagEntries + 1000;
    static constexpr std::size_t maximumTags = 2 * maximumElements;
    static constexpr std::size_t maximumAttributes = 1000;

    static void require(bool condition)
    {
        if (!condition)
            throw std::runtime_error("no text of a tag table");
    }

    bool take(std::string_view token)
    {
        if (!_rest.starts_with(token))
            return false;
        _rest.remove_prefix(token.size());
        return true;
    }
    void pass(std::string_view token)
    {
        const std::size_t place = _rest.find(token);
        require(place != std::string_view::npos);
        _rest.remove_prefix(place + token.size());
    }
    void passBlanks() { _rest.remove_prefix(std::min(_rest.find_first_not_of(" \t\r\n"), _rest.size())); }
    void passName()
    {
        const auto end = std::find_if_not(_rest.begin(), _rest.end(),
                                          [](char c)
                                          {
                                              return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                                                     (c >= '0' && c <= '9') || c == '_' || c == ':' || c == '.' ||
                                                     c == '-' || (c & 0x80) != 0;
                                          });
        require(end != _rest.begin());
        _rest.remove_prefix(static_cast<std::size_t>(end - _rest.begin()));
    }
    void passAttribute()
    {
        require(++_attributes <= maximumAttributes);
        passName();
        passBlanks();
        require(take("="));
        passBlanks();
        if (take("\""))
            return pass("\"");
        require(take("'"));
        pass("'");
    }

    void openElement()
    {
        require(++_elements <= maximumElements);
        passName();
        for (;;)
        {
            passBlanks();
            if (take("/>"))
                return;
            if (take(">"))
                return require(++_depth <= maximumDepth);
            passAttribute();
        }
    }
    void closeElement()
    {
        require(_depth-- > 0);
        pass(">");
    }

    std::string_view _rest;
    unsigned _depth = 0;
    std::size_t _elements = 0;
    std::size_t _tags = 0;
    std::size_t _attributes = 0;
};

} // namespace

// --- reading -------------------------------------------------------------------------------------------

namespace
{

const Node& childOf(const Node& parent, const char* name, const LogText& missing)
{
    const Node* child = parent.first_node(name);
    if (!child)
        MethodCall::end(missing, malformed);
    return *child;
}

/// The decimal number that is an element's text, blanks aside.
std::optional<long> numberOf(const Node& node)
{
    const char* const text = node.value(); // which the parser has ended with a zero byte
    char* end = nullptr;
    errno = 0;
    const long number = std::strtol(text, &end, 10);
    if (end == text || errno != 0)
        return std::nullopt;
    end += std::strspn(end, " \t\r\n");
    return end == text + node.value_size() ? std::optional(number) : std::nullopt;
}

void readName(HBA_WWN& out, const Node& node)
{
    if (stringToWwn(out.wwn, String(node.value(), node.value_size())) != 0)
        MethodCall::end({TVR_DBG, "SetConfigTable::unable to convert string to hbaname "}, malformed);
}

CPQFC_QosEntry entryOf(const Node& row)
{
    constexpr LogText badTag = {TVR_DBG, "SetConfigTable:: malformed tag field "};
    CPQFC_QosEntry entry{};
    const Node& source = childOf(row, element::source, {TVR_DBG, "SetConfigTable::malformed src_wwpn field "});
    const Node& target = childOf(row, element::target, {TVR_DBG, "SetConfigTable::malformed tgt_wwpn field "});
    readName(entry.src_wwpn, source);
    readName(entry.tgt_wwpn, target);
    const std::optional<long> tag = numberOf(childOf(row, element::tag, badTag));
    if (!tag || *tag < 0 || *tag > UINT8_MAX)
        MethodCall::end(badTag, malformed);
    entry.tag = static_cast<std::uint8_t>(*tag);
    return entry;
}

/// The rows, as many as the number before them says.
std::vector<const Node*> rowsOf(const Node& configuration)
{
    constexpr LogText noCount = {TVR_DBG, "numberOfEntriesNode is not found or corrupted in the Crux config table"};
    const std::optional<long> count = numberOf(childOf(configuration, element::count, noCount));
    if (!count)
        MethodCall::end(noCount, malformed);
    std::vector<const Node*> rows;
    for (const Node* row = configuration.first_node(element::row); row; row = row->next_sibling(element::row))
        rows.push_back(row);
    if (rows.empty() && *count != 0)
        MethodCall::end({TVR_DBG, "rowNode is not found or corrupted in the Crux config table"}, malformed);
    if (*count < 0 || static_cast<unsigned long>(*count) != rows.size() || rows.size() > maximumTagEntries)
        MethodCall::end({TVR_DBG, "SetConfigTable::numberOfEntries is not the number of the rows"}, malformed);
    return rows;
}

std::vector<CPQFC_QosEntry> entriesOf(const std::vector<const Node*>& rows)
{
    std::vector<CPQFC_QosEntry> entries;
    try
    {
        entries.reserve(rows.size());
    }
    catch (const std::bad_alloc&)
    {
        MethodCall::end({TVR_DBG, "SetConfigTable: Memory allocation failed"}, noMemory);
    }
    for (const Node* row : rows)
        entries.push_back(entryOf(*row));
    return entries;
}

} // namespace

std::vector<CPQFC_QosEntry> readTagTable(std::string text)
{
    if (text.size() > maximumTagFile || text.find('\0') != std::string::npos)
        throw std::runtime_error("no text of a tag table");
    Outline(text).check();
    const auto document = std::make_unique<Document>(); // too large for a stack
    document->parse<rapidxml::parse_default>(text.data());

    const Node& crux =
        childOf(*document, element::root, {TVR_DBG, "cruxNode is not found or corrupted in the Crux config table"});
    const Node& system =
        childOf(crux, element::system, {TVR_DBG, "theSystemNode is not found or corrupted in the Crux config table"});
    childOf(system, element::version, {TVR_DBG, "cruxVersionNode is not found or corrupted in the Crux config table"});
    childOf(system, element::creation,
            {TVR_DBG, "creationTimeNode is not found or corrupted in the Crux config table"});
    childOf(system, element::host, {TVR_DBG, "hostNameNode is not found or corrupted in the Crux config table"});
    const Node& adapter =
        childOf(system, element::adapter, {TVR_DBG, "adapterNode is not found or corrupted in the Crux config table"});
    const Node& configuration =
        childOf(adapter, element::configuration,
                {TVR_DBG, "configurationNode is not found or corrupted in the Crux config table"});
    return entriesOf(rowsOf(configuration));
}

// --- writing -------------------------------------------------------------------------------------------

namespace
{

/// A document under construction, which holds the texts of its nodes.
class Writer
{
public:
    Writer()
    {
        Node* declaration = _document->allocate_node(rapidxml::node_declaration);
        declaration->append_attribute(_document->allocate_attribute("version", "1.0"));
        declaration->append_attribute(_document->allocate_attribute("encoding", "utf-8"));
        _document->append_node(declaration);
    }

    Node& root(const char* name) { return add(*_document, name); }
    Node& add(Node& parent, const char* name)
    {
        Node* node = _document->allocate_node(rapidxml::node_element, name);
        parent.append_node(node);
        return *node;
    }
    void add(Node& parent, const char* name, const std::string& text)
    {
        add(parent, name).value(copyOf(text), text.size());
    }
    /// Text beside the children of an element.
    void addText(Node& parent, const std::string& text)
    {
        parent.append_node(_document->allocate_node(rapidxml::node_data, nullptr, copyOf(text), 0, text.size()));
    }
    std::string text() const
    {
        std::string text;
        rapidxml::print(std::back_inserter(text), *_document, 0); // indented with tabs
        return text;
    }

private:
    const char* copyOf(const std::string& text) { return _document->allocate_string(text.c_str(), text.size() + 1); }

    std::unique_ptr<Document> _document = std::make_unique<Document>();
};

/// A name that came from elsewhere, in characters that a document can have.
std::string plainText(std::string text)
{
    std::replace_if(
        text.begin(), text.end(), [](char c) { return c < ' ' || c > '~'; }, '?');
    return text;
}

std::string hexText(const HBA_WWN& wwn)
{
    char digits[17];
    wwnToUpperHex(wwn.wwn, digits);
    return digits;
}

void addRow(Writer& document, Node& configuration, const CPQFC_QosEntry& entry)
{
    Node& row = document.add(configuration, element::row);
    document.add(row, element::source, hexText(entry.src_wwpn));
    document.add(row, element::target, hexText(entry.tgt_wwpn));
    document.add(row, element::reserved1, "00000000000000000000000000000000");
    document.add(row, element::tag, std::to_string(entry.tag));
    document.add(row, element::reserved2, "000000");
}

} // namespace

std::string writeTagTable(const std::string& hostName, const std::string& adapterName,
                          const std::vector<CPQFC_QosEntry>& entries)
{
    Writer document;
    Node& system = document.add(document.root(element::root), element::system);
    document.add(system, element::version, tableVersion);
    document.add(system, element::creation, Datetime::now().text().c_str());
    document.add(system, element::host, plainText(hostName));
    Node& adapter = document.add(system, element::adapter);
    document.addText(adapter, plainText(adapterName));
    Node& configuration = document.add(adapter, element::configuration);
    document.add(configuration, element::count, std::to_string(entries.size()));
    for (const CPQFC_QosEntry& entry : entries)
        addRow(document, configuration, entry);
    return document.text();
}

} // namespace cimple
