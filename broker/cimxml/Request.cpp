#include "broker/cimxml/Request.h"

namespace cimxml
{

namespace
{

using pugi::xml_node;

constexpr int badRequest = 400;
constexpr int notImplemented = 501;

[[noreturn]] void refuse(const std::string& text)
{
    throw HttpRefusal(badRequest, "request-not-valid", text);
}

xml_node expectChild(const xml_node& parent, const char* name)
{
    const xml_node child = childOf(parent, name);
    if (!child)
        refuse(std::string("there is no ") + name);
    return child;
}

/// Versions count by the number before the dot.
void expectVersion(const xml_node& node, const char* attribute, std::string_view major, const char* refusal)
{
    const std::string_view version = node.attribute(attribute).value();
    if (!version.starts_with(major))
        throw HttpRefusal(notImplemented, refusal, std::string(attribute) + " is " + std::string(version));
}

/// Where the target of an extrinsic method stands, LOCALINSTANCEPATH or LOCALCLASSPATH.
xml_node targetOf(const xml_node& call)
{
    for (const char* name : {"LOCALINSTANCEPATH", "LOCALCLASSPATH"})
        if (const xml_node path = childOf(call, name))
            return path;
    refuse("the method has no target");
}

} // namespace

xml_node Request::parameter(std::string_view parameterName) const
{
    for (const xml_node& child : call.children(extrinsic ? "PARAMVALUE" : "IPARAMVALUE"))
        if (broker::sameName(child.attribute("NAME").value(), parameterName))
            return child;
    return {};
}

Request readRequest(const pugi::xml_document& document)
{
    const xml_node cim = expectChild(document, "CIM");
    expectVersion(cim, "CIMVERSION", "2.", "unsupported-cim-version");
    expectVersion(cim, "DTDVERSION", "2.", "unsupported-dtd-version");
    const xml_node message = expectChild(cim, "MESSAGE");
    expectVersion(message, "PROTOCOLVERSION", "1.", "unsupported-protocol-version");
    if (childOf(message, "MULTIREQ"))
        throw HttpRefusal(notImplemented, "multiple-requests-unsupported", "one request a message, please");
    const xml_node simple = expectChild(message, "SIMPLEREQ");
    Request request;
    request.id = message.attribute("ID").value();
    request.call = childOf(simple, "METHODCALL");
    request.extrinsic = !request.call.empty();
    if (!request.extrinsic)
        request.call = expectChild(simple, "IMETHODCALL");
    request.name = request.call.attribute("NAME").value();
    const xml_node holder = request.extrinsic ? targetOf(request.call) : request.call;
    request.nameSpace = Decoder::nameSpaceOf(expectChild(holder, "LOCALNAMESPACEPATH"));
    return request;
}

Message::Message(std::string_view text)
{
    parseXml(document, text);
    try
    {
        request = readRequest(document);
    }
    catch (const std::invalid_argument& error)
    {
        refuse(error.what());
    }
}

} // namespace cimxml
