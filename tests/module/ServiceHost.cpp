#include "tests/module/ServiceHost.h"

#include "tests/module/HostNames.h"
#include "tests/module/RefreshLines.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace module_test
{

namespace
{

/// Whether a line is of the head of a method or of the conversion of a name.
bool isOfEveryCall(const std::string& line)
{
    for (const char* word : {"BuildCimpleInfo", "PERF: ", "TimeOut", "loadedtime", "TVR_MethodWrapper::Id2HBAName",
                             "TVR_MethodWrapper::str2HBAName", "DeviceID is::", "HBA Name is::", "wwpn:("})
        if (line.find(word) != line.npos)
            return true;
    return false;
}

} // namespace

broker::Value Answer::at(const std::string& name) const
{
    const broker::Property* found = broker::findNamed(out, name);
    return found ? found->value : broker::Value{};
}

std::string Answer::text(const std::string& name) const
{
    const broker::Value value = at(name);
    return value.isNull() ? std::string() : value.asString();
}

ServiceHost::ServiceHost(const std::string& serviceClass, const std::string& scenario, Libraries libraries)
    : Host(scenario, libraries), _serviceClass(serviceClass)
{
    setHostNames({});
    port = instancesOf("TVRHBA_FCPort").at(0).path; // the log begins with the first class
    service = instancesOf(serviceClass).at(0).path;
    EXPECT_TRUE(awaitRefresh());
}

Answer ServiceHost::callOnPort(const std::string& method, const std::string& entry, std::vector<broker::Property> in)
{
    in.push_back({"Target", broker::Value::reference(port)});
    return call(method, entry, in);
}

Answer ServiceHost::call(const std::string& method, const std::string& entry, const std::vector<broker::Property>& in)
{
    const std::size_t before = log().size();
    const broker::MethodReply reply = broker().invokeMethod(service, method, in);
    EXPECT_TRUE(reply.ok()) << method << ": " << broker::statusName(reply.status) << " " << reply.message;
    if (!reply.ok())
        return {};
    std::vector<std::string> lines = log();
    lines.erase(lines.begin(), lines.begin() + static_cast<std::ptrdiff_t>(before));
    const auto begin = std::find(lines.begin(), lines.end(), entry);
    EXPECT_NE(begin, lines.end()) << method;
    if (begin == lines.end())
        return {};
    lines.erase(lines.begin(), begin + 1);
    std::erase_if(lines, isOfEveryCall);
    return {reply.returnValue.asUnsigned(), reply.out, lines};
}

void ServiceHost::expectRefusals(const std::string& method, const std::string& entry, const std::string& wrongService,
                                 const std::string& wrongPort)
{
    const auto expect = [&](std::uint64_t value, const std::string& line, const std::vector<broker::Property>& in)
    {
        const Answer answer = call(method, entry, in);
        EXPECT_EQ(answer.value, value) << method;
        EXPECT_EQ(answer.lines, std::vector<std::string>{line});
    };
    const broker::Path known = service;
    service.setKey("Name", broker::Value::string("another"));
    expect(33068, wrongService, {{"Target", broker::Value::reference(port)}});
    service = known;
    broker::Path unknown = port;
    unknown.setKey("DeviceID", broker::Value::string("1000027A51160299"));
    expect(32968, wrongPort, {{"Target", broker::Value::reference(unknown)}});
    expect(32968, wrongPort, {});
}

std::vector<std::string> ServiceHost::portsAfterRefresh()
{
    const std::size_t done = logged(ended);
    instancesOf(_serviceClass); // starts it
    EXPECT_TRUE(awaitRefresh(done + 1));
    std::vector<std::string> ids;
    const std::vector<broker::Object> ports = instancesOf("TVRHBA_FCPort");
    for (const broker::Object& object : ports)
        ids.push_back(module_test::text(object, "DeviceID"));
    port = ports.at(0).path;
    return ids;
}

} // namespace module_test
