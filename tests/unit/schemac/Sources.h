// MOF texts for the tests of the schema compiler.
#pragma once

#include "schemac/Check.h"
#include "schemac/Parser.h"

#include <string>
#include <vector>

namespace schemac
{

/// Declarations that a test's own text builds on; they stand in a file of their own.
inline constexpr const char* prelude = R"(
Qualifier Abstract : boolean = false, Scope(class, association, indication), Flavor(EnableOverride, Restricted);
Qualifier Aggregate : boolean = false, Scope(reference);
Qualifier Aggregation : boolean = false, Scope(association);
Qualifier Association : boolean = false, Scope(association);
Qualifier BitMap : string[], Scope(property, method, parameter);
Qualifier BitValues : string[], Scope(property, method, parameter);
Qualifier Composition : boolean = false, Scope(association);
Qualifier Counter : boolean = false, Scope(property, method, parameter);
Qualifier Description : string = NULL, Scope(any);
Qualifier EmbeddedInstance : string = NULL, Scope(property, method, parameter);
Qualifier EmbeddedObject : boolean = false, Scope(property, method, parameter);
Qualifier Experimental : boolean = false, Scope(any);
Qualifier In : boolean = true, Scope(parameter);
Qualifier Indication : boolean = false, Scope(class, indication);
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier MaxLen : uint32 = NULL, Scope(property, method, parameter);
Qualifier Octetstring : boolean = false, Scope(property, method, parameter), Flavor(disableoverride);
Qualifier Out : boolean = false, Scope(parameter);
Qualifier Override : string = NULL, Scope(property, reference, method);
Qualifier PUnit : string = NULL, Scope(property, method, parameter);
Qualifier Read : boolean = true, Scope(property);
Qualifier Required : boolean = false, Scope(property, reference, method, parameter);
Qualifier ValueMap : string[], Scope(property, method, parameter);
Qualifier Values : string[], Scope(property, method, parameter);
Qualifier Version : string = NULL, Scope(class, association, indication);
Qualifier Weak : boolean = false, Scope(reference);
Qualifier Write : boolean = false, Scope(property);

[Abstract]
class T_Element {
   string InstanceID;
   string Caption;
   uint16 State = 5;
   uint32 Start([In] uint16 Level);
};
class T_Device : T_Element {
   [Key, Override ( "InstanceID" )]
   string InstanceID;
};
class T_Disk : T_Device {
};
[Association]
class T_Link {
   [Key]
   T_Element REF Antecedent;
   [Key]
   T_Element REF Dependent;
};
)";

inline Schema parsed(const std::string& text)
{
    Schema schema;
    parse(prelude, "prelude", schema);
    parse(text, "t.mof", schema);
    return schema;
}

/// All refusals of the text, on top of the prelude.
inline std::vector<std::string> refusals_of(const std::string& text)
{
    try
    {
        Schema schema = parsed(text);
        return check(schema);
    }
    catch (const SyntaxError& error)
    {
        return {error.what()};
    }
}

/// The resolved schema of a text that must be right; throws if it is refused.
inline Schema checked(const std::string& text)
{
    Schema schema = parsed(text);
    const std::vector<std::string> refusals = check(schema);
    if (!refusals.empty())
    {
        throw std::runtime_error(refusals.front());
    }
    return schema;
}

} // namespace schemac
