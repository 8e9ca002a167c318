// Requests as clients write them, and what they get.
#include "broker/cimxml/Operations.h"
#include "broker/cimxml/Decode.h"
#include "tests/unit/broker/FakeModule.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <random>

using namespace broker_test;
using cimxml::answer;
using cimxml::HttpRefusal;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;

namespace
{

const std::string nameSpace =
    R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="tavrin"/></LOCALNAMESPACEPATH>)";
const std::string portOne = R"(<INSTANCENAME CLASSNAME="TST_Base"><KEYBINDING NAME="Id"><KEYVALUE VALUETYPE="string">1)"
                            "</KEYVALUE></KEYBINDING></INSTANCENAME>";

std::string message(const std::string& call)
{
    return R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="4711" )"
           R"(PROTOCOLVERSION="1.0"><SIMPLEREQ>)" +
           call + "</SIMPLEREQ></MESSAGE></CIM>";
}

std::string operation(const std::string& name, const std::string& parameters, const std::string& space = nameSpace)
{
    return message("<IMETHODCALL NAME=\"" + name + "\">" + space + parameters + "</IMETHODCALL>");
}

std::string parameter(const std::string& name, const std::string& value)
{
    return "<IPARAMVALUE NAME=\"" + name + "\">" + value + "</IPARAMVALUE>";
}

std::string ofClass(const std::string& name)
{
    return parameter("ClassName", "<CLASSNAME NAME=\"" + name + "\"/>");
}

std::string most(unsigned count)
{
    return parameter("MaxObjectCount", "<VALUE>" + std::to_string(count) + "</VALUE>");
}

std::string methodCall(const std::string& arguments, const std::string& method = "Add")
{
    return message("<METHODCALL NAME=\"" + method + "\"><LOCALINSTANCEPATH>" + nameSpace + portOne +
                   "</LOCALINSTANCEPATH>" + arguments + "</METHODCALL>");
}

std::string error(int code)
{
    return "<ERROR CODE=\"" + std::to_string(code) + "\"";
}

/// A broker with one TST_Base.
struct Host : Fixture
{
    Host()
    {
        on("enumerateInstanceNames",
           [](const Call& call)
           {
               CMReturnObjectPath(call.result, newBasePath(call, "1"));
               CMReturnDone(call.result);
               return ok;
           });
    }
    cimxml::Pulls pulls;
    std::string ask(const std::string& request) { return answer(*broker, pulls, request); }
};

TEST(CimXmlOperations, AnswersHaveTheFrameOfTheirRequests)
{
    Host host;
    const std::string response = host.ask(operation("EnumerateInstanceNames", ofClass("TST_Base")));
    EXPECT_THAT(response,
                testing::StartsWith(R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0">)"
                                    R"(<MESSAGE ID="4711" PROTOCOLVERSION="1.0"><SIMPLERSP>)"
                                    R"(<IMETHODRESPONSE NAME="EnumerateInstanceNames"><IRETURNVALUE>)"));
    EXPECT_THAT(response, HasSubstr(R"(<INSTANCENAME CLASSNAME="TST_Base">)"));
    EXPECT_THAT(response, EndsWith("</IRETURNVALUE></IMETHODRESPONSE></SIMPLERSP></MESSAGE></CIM>"));
}

TEST(CimXmlOperations, FailuresAreAnswersWithTheirCodes)
{
    Host host;
    const std::string elsewhere = R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="none"/></LOCALNAMESPACEPATH>)";
    const struct
    {
        std::string request;
        int code;
    } rows[] = {
        {operation("ExecQuery", ""), 7},
        {operation("PullInstancePaths", parameter("EnumerationContext", "<VALUE>x</VALUE>") + most(1)), 21},
        {operation("CloseEnumeration", parameter("EnumerationContext", "<VALUE>x</VALUE>")), 21},
        {operation("OpenEnumerateInstancePaths", ofClass("TST_Base") + parameter("FilterQuery", "<VALUE>x</VALUE>")),
         25},
        {operation("EnumerateInstances", ofClass("TST_Base"), elsewhere), 3},
        {operation("EnumerateClassNames", "", elsewhere), 3},
        {operation("EnumerateInstances", ofClass("None")), 5},
        {operation("GetClass", ofClass("None")), 5},
        {operation("GetClass", ofClass("")), 5},
        {methodCall("").replace(methodCall("").find("TST_Base"), 8, ""), 5},
        {operation("EnumerateInstances", ""), 4},
        {operation("GetInstance", parameter("InstanceName", "<VALUE>x</VALUE>")), 4},
        {operation("CreateInstance", parameter("NewInstance", R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="X">)"
                                                              "</PROPERTY></INSTANCE>")),
         4},
        {operation("CreateInstance", parameter("NewInstance", R"(<INSTANCE CLASSNAME="None"></INSTANCE>)")), 5},
        {operation("Associators", parameter("ObjectName", R"(<CLASSNAME NAME="TST_Base"/>)")), 7},
        {operation("DeleteInstance", parameter("InstanceName", portOne)), 7}, // of the provider
        {methodCall("", "Multiply"), 17},
        {methodCall(R"(<PARAMVALUE NAME="C"><VALUE>1</VALUE></PARAMVALUE>)"), 4},
        {methodCall(R"(<PARAMVALUE NAME="A"><VALUE>many</VALUE></PARAMVALUE>)"), 4},
    };
    for (const auto& row : rows)
    {
        const std::string response = host.ask(row.request);
        EXPECT_THAT(response, HasSubstr(error(row.code))) << row.request;
        EXPECT_THAT(response, Not(HasSubstr("IRETURNVALUE"))) << row.request;
    }
}

TEST(CimXmlOperations, WhatIsNoRequestIsRefusedOverHttp)
{
    Host host;
    const std::string good = operation("EnumerateInstanceNames", ofClass("TST_Base"));
    const auto with = [&](const std::string& from, const std::string& to)
    {
        std::string text = good;
        return text.replace(text.find(from), from.size(), to);
    };
    const struct
    {
        std::string request;
        int status;
        const char* header;
    } rows[] = {
        {"", 400, "request-not-well-formed"},
        {good.substr(0, good.size() - 1), 400, "request-not-well-formed"},
        {"<A/>", 400, "request-not-valid"},
        {with("SIMPLEREQ", "SIMPLERSP").replace(good.rfind("SIMPLEREQ"), 9, "SIMPLERSP"), 400, "request-not-valid"},
        {with(nameSpace, ""), 400, "request-not-valid"},
        {with(R"(CIMVERSION="2.0")", R"(CIMVERSION="3.0")"), 501, "unsupported-cim-version"},
        {with(R"(DTDVERSION="2.0")", R"(DTDVERSION="1.0")"), 501, "unsupported-dtd-version"},
        {with(R"(PROTOCOLVERSION="1.0")", R"(PROTOCOLVERSION="2.0")"), 501, "unsupported-protocol-version"},
        {R"(<CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0"><MULTIREQ/></MESSAGE></CIM>)",
         501, "multiple-requests-unsupported"},
    };
    for (const auto& row : rows)
    {
        try
        {
            ADD_FAILURE() << host.ask(row.request);
        }
        catch (const HttpRefusal& refusal)
        {
            EXPECT_EQ(refusal.status, row.status) << row.request;
            EXPECT_STREQ(refusal.header, row.header) << row.request;
        }
    }
}

/// Clients leave the types of arguments out, and crash on output parameters without a value.
TEST(CimXmlOperations, ArgumentsGetTheTypesOfTheClass)
{
    Host host;
    host.on("invokeMethod",
            [](const Call& call)
            {
                const CMPIData a = CMGetArg(call.in, "A", nullptr);
                EXPECT_EQ(a.type, CMPI_uint32);
                CMPIValue sum{};
                sum.uint32 = a.value.uint32 + 1;
                CMAddArg(call.out, "Sum", &sum, CMPI_uint32);
                CMPIValue result{};
                CMReturnData(call.result, &result, CMPI_uint32);
                CMReturnDone(call.result);
                return ok;
            });
    EXPECT_THAT(
        host.ask(methodCall(R"(<PARAMVALUE NAME="a"><VALUE>41</VALUE></PARAMVALUE>)")),
        HasSubstr(R"(<METHODRESPONSE NAME="Add"><RETURNVALUE PARAMTYPE="uint32"><VALUE>0</VALUE></RETURNVALUE>)"
                  R"(<PARAMVALUE NAME="Sum" PARAMTYPE="uint32"><VALUE>42</VALUE></PARAMVALUE></METHODRESPONSE>)"));
}

TEST(CimXmlOperations, ResultsArePulledInParts)
{
    Host host;
    const std::string opened = host.ask(operation("OpenEnumerateInstancePaths", ofClass("TST_Base")));
    EXPECT_THAT(opened, HasSubstr(R"(<IRETURNVALUE></IRETURNVALUE>)"));
    EXPECT_THAT(opened, HasSubstr(R"(<PARAMVALUE NAME="EndOfSequence" PARAMTYPE="boolean"><VALUE>FALSE</VALUE>)"));
    const std::string mark = R"(<PARAMVALUE NAME="EnumerationContext" PARAMTYPE="string">)";
    const std::size_t at = opened.find(mark) + mark.size();
    const std::string context =
        parameter("EnumerationContext", opened.substr(at, opened.find("</PARAMVALUE>", at) - at));
    EXPECT_THAT(host.ask(operation("PullInstancesWithPath", context + most(1))), HasSubstr(error(21)));
    const std::string pulled = host.ask(operation("PullInstancePaths", context + most(9)));
    EXPECT_THAT(pulled, HasSubstr(R"(<IRETURNVALUE><INSTANCEPATH>)"));
    EXPECT_THAT(pulled, HasSubstr(R"(PARAMTYPE="boolean"><VALUE>TRUE</VALUE>)"));
    EXPECT_THAT(host.ask(operation("PullInstancePaths", context + most(1))), HasSubstr(error(21)));
    EXPECT_THAT(host.ask(operation("OpenEnumerateInstancePaths", ofClass("TST_Base") + most(9))),
                HasSubstr(R"(<VALUE>TRUE</VALUE>)"));
}

TEST(CimXmlOperations, ClassesAreGivenByGeneration)
{
    Host host;
    const auto names = [&](const std::string& parameters)
    {
        std::string response = host.ask(operation("EnumerateClassNames", parameters));
        std::string found;
        for (std::size_t at = 0; (at = response.find("<CLASSNAME NAME=\"", at)) != response.npos; at++)
            found += response.substr(at + 17, response.find('"', at + 17) - at - 17) + " ";
        return found;
    };
    EXPECT_EQ(names(""), "TST_Base TST_Port TST_Link IBMSD_ComputerSystem ");
    EXPECT_EQ(names(ofClass("tst_base")), "TST_Disk ");
    EXPECT_EQ(names(ofClass("TST_Disk")), "");
    EXPECT_THAT(names(parameter("DeepInheritance", "<VALUE>TRUE</VALUE>")), HasSubstr("TST_Disk"));
}

TEST(CimXmlOperations, QualifiersAreThoseOfTheSchema)
{
    Host host;
    const auto named = [](const std::string& name)
    { return operation("GetQualifier", parameter("QualifierName", "<VALUE>" + name + "</VALUE>")); };
    const struct
    {
        const char *name, *declaration;
    } rows[] = {
        {"key", R"(<IRETURNVALUE><QUALIFIER.DECLARATION NAME="Key" TYPE="boolean" ISARRAY="false" OVERRIDABLE="false" )"
                R"(TOSUBCLASS="true" TRANSLATABLE="false"><SCOPE CLASS="false" ASSOCIATION="false" REFERENCE="true" )"
                R"(PROPERTY="true" METHOD="false" PARAMETER="false" INDICATION="false"></SCOPE><VALUE>FALSE</VALUE>)"
                R"(</QUALIFIER.DECLARATION></IRETURNVALUE>)"},
        {"Values", R"(TYPE="string" ISARRAY="true" OVERRIDABLE="true" TOSUBCLASS="true" TRANSLATABLE="true">)"},
        {"Values", R"(PARAMETER="true" INDICATION="false"></SCOPE></QUALIFIER.DECLARATION>)"},
        {"Version", R"(OVERRIDABLE="true" TOSUBCLASS="false" TRANSLATABLE="true"><SCOPE CLASS="true")"},
        {"Description", R"(<SCOPE CLASS="true" ASSOCIATION="true" REFERENCE="true" PROPERTY="true" METHOD="true" )"
                        R"(PARAMETER="true" INDICATION="true"></SCOPE></QUALIFIER.DECLARATION>)"},
        {"ArrayType", "<VALUE>Bag</VALUE>"},
    };
    const std::string all = host.ask(operation("EnumerateQualifiers", ""));
    for (const auto& row : rows)
        EXPECT_THAT(host.ask(named(row.name)), HasSubstr(row.declaration)) << row.name;
    EXPECT_THAT(host.ask(named("None")), HasSubstr(error(6)));
    constexpr std::size_t declared = 71;
    std::size_t count = 0;
    for (std::size_t at = 0; (at = all.find("<QUALIFIER.DECLARATION ", at)) != all.npos; at++)
        count++;
    EXPECT_EQ(count, declared);
}

/// What a client sees of a failure depends on how much of the result is on its way.
TEST(CimXmlOperations, LateFailuresLeaveTheResponseWithoutAnEnd)
{
    for (const int results : {1, 5000})
    {
        Host host;
        host.on("enumerateInstanceNames",
                [&](const Call& call)
                {
                    for (int i = 0; i < results; i++)
                        CMReturnObjectPath(call.result, newBasePath(call, std::to_string(i).c_str()));
                    return CMPIStatus{CMPI_RC_ERR_ACCESS_DENIED, nullptr};
                });
        std::string response;
        std::size_t longest = 0;
        const auto take = [&](std::string_view part)
        {
            response += part;
            longest = std::max(longest, part.size());
            return true;
        };
        const cimxml::Message request(operation("EnumerateInstanceNames", ofClass("TST_Base")));
        const bool whole = answer(*host.broker, host.pulls, request, take);
        EXPECT_EQ(whole, results == 1);
        EXPECT_EQ(response.find(error(2)) != response.npos, whole);
        EXPECT_EQ(response.ends_with("</CIM>"), whole);
        EXPECT_LT(longest, 80000u) << "of a part";
    }
}

TEST(CimXmlOperations, ProvidersEndWhenTheClientHasGone)
{
    Host host;
    int given = 0;
    host.on("enumerateInstanceNames",
            [&](const Call& call)
            {
                CMPIStatus status = ok;
                while (status.rc == CMPI_RC_OK && given++ < 100000)
                    status = CMReturnObjectPath(call.result, newBasePath(call, "1"));
                return status;
            });
    const cimxml::Message request(operation("EnumerateInstanceNames", ofClass("TST_Base")));
    EXPECT_FALSE(answer(*host.broker, host.pulls, request, [](std::string_view) { return false; }));
    EXPECT_LT(given, 1000);
}

/// Requests with bytes changed, doubled, taken out and put in; whatever comes of them, it is an answer or a refusal.
TEST(CimXmlOperations, DamagedRequestsAreAnsweredOrRefused)
{
    Host host;
    const std::string requests[] = {
        operation("EnumerateInstanceNames", ofClass("TST_Base")),
        operation("GetInstance", parameter("InstanceName", portOne)),
        operation("OpenEnumerateInstancePaths", ofClass("TST_Base") + most(1)),
        operation("CreateInstance", parameter("NewInstance", R"(<INSTANCE CLASSNAME="TST_Disk"><PROPERTY NAME="Size">)"
                                                             "<VALUE>7</VALUE></PROPERTY></INSTANCE>")),
        operation("GetClass", ofClass("TST_Disk") + parameter("LocalOnly", "<VALUE>FALSE</VALUE>")),
        methodCall(R"(<PARAMVALUE NAME="A"><VALUE>&#x41;1</VALUE></PARAMVALUE>)"),
    };
    std::minstd_rand random(4711);
    const auto below = [&](std::size_t end) { return random() % end; };
    constexpr std::string_view marks = "<>\"'&;/=! \xC3\xFF";
    std::size_t answered = 0, refused = 0;
    for (int round = 0; round < 5000; round++)
    {
        std::string text = requests[below(std::size(requests))];
        for (std::size_t changes = 1 + below(2); changes > 0; changes--)
        {
            const std::size_t at = below(text.size());
            const std::string piece = text.substr(at, below(40));
            switch (below(4))
            {
            case 0:
                text[at] = marks[below(marks.size())];
                break;
            case 1:
                text.erase(at, piece.size());
                break;
            case 2:
                text.insert(below(text.size()), piece);
                break;
            default:
                text.insert(at, 1, static_cast<char>(random()));
            }
            text += text.empty() ? "<" : "";
        }
        try
        {
            EXPECT_THAT(host.ask(text), EndsWith("</CIM>"));
            answered++;
        }
        catch (const HttpRefusal&)
        {
            refused++;
        }
    }
    EXPECT_GT(answered, 500u);
    EXPECT_GT(refused, 500u);
}

} // namespace
