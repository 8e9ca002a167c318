// Where the module's classes and those that it takes from others live.
#pragma once

namespace cimple
{

/// Namespaces in which the module's classes are served and its profiles registered.
inline constexpr const char* providerNamespace = "root/tavrin";
inline constexpr const char* interopNamespace = "root/pg_interop";
/// Where the schema of the classes was taken from, and the platform classes that the module asks the broker for.
inline constexpr const char* schemaDirectory = "/tmp/tvr_ibm/schema/cim_schema_2.26.0Experimental-MOFs";
inline constexpr const char* platformClasses = "IBMSD_ComputerSystem IBMSD_Chassis PG_RegisteredProfile";

} // namespace cimple
