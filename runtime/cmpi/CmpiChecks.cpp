// Compile-time checks of the binary interface (x86-64 Linux, version 100).
#include "runtime/cmpi/Cmpi.h"

#include <cstddef>
#include <type_traits>

#if defined(__x86_64__) && defined(__linux__)

static_assert(offsetof(CMPIData, state) == 2);
static_assert(offsetof(CMPIData, value) == 8);
static_assert(offsetof(CMPIStatus, msg) == 8);
static_assert(offsetof(CMPIBroker, xft) == 24);
static_assert(offsetof(CMPIBrokerFT, brokerName) == 8);
static_assert(offsetof(CMPIBrokerFT, prepareAttachThread) == 16);
static_assert(offsetof(CMPIBrokerFT, deliverIndication) == 40);
static_assert(offsetof(CMPIBrokerFT, getInstance) == 56);
static_assert(offsetof(CMPIBrokerFT, enumerateInstances) == 96);
static_assert(offsetof(CMPIBrokerFT, invokeMethod) == 136);
static_assert(offsetof(CMPIBrokerFT, getProperty) == 152);
static_assert(offsetof(CMPIBrokerEncFT, newInstance) == 8);
static_assert(offsetof(CMPIBrokerEncFT, newDateTimeFromChars) == 64);
static_assert(offsetof(CMPIBrokerEncFT, classPathIsA) == 80);
static_assert(offsetof(CMPIBrokerEncFT, trace) == 128);
static_assert(offsetof(CMPIBrokerExtFT, signalCondition) == 160);
static_assert(offsetof(CMPIInstanceFT, setPropertyFilter) == 64);
static_assert(offsetof(CMPIInstanceFT, setObjectPath) == 72);
static_assert(offsetof(CMPIObjectPathFT, addKey) == 72);
static_assert(offsetof(CMPIObjectPathFT, getKeyAt) == 88);
static_assert(offsetof(CMPIObjectPathFT, toString) == 152);
static_assert(offsetof(CMPIArgsFT, addArg) == 24);
static_assert(offsetof(CMPIArgsFT, getArgCount) == 48);
static_assert(offsetof(CMPIResultFT, returnDone) == 48);
static_assert(offsetof(CMPIContextFT, addEntry) == 48);
static_assert(offsetof(CMPIStringFT, getCharPtr) == 24);
static_assert(offsetof(CMPIArrayFT, setElementAt) == 48);
static_assert(offsetof(CMPIEnumerationFT, hasNext) == 32);
static_assert(offsetof(CMPIDateTimeFT, getStringFormat) == 32);
static_assert(offsetof(CMPISelectExpFT, getString) == 32);
static_assert(offsetof(CMPIInstanceMIFT, miName) == 8);
static_assert(offsetof(CMPIInstanceMIFT, cleanup) == 16);
static_assert(offsetof(CMPIInstanceMIFT, modifyInstance) == 56);
static_assert(offsetof(CMPIInstanceMIFT, execQuery) == 72);
static_assert(offsetof(CMPIAssociationMIFT, referenceNames) == 48);
static_assert(offsetof(CMPIMethodMIFT, invokeMethod) == 24);
static_assert(offsetof(CMPIIndicationMIFT, disableIndications) == 64);

// Sizes of tables depend on the header set: some append slots whatever the version.
#ifndef TVR_SYSTEM_CMPI

template <class T, std::size_t size> constexpr bool has_layout = sizeof(T) == size && alignof(T) == 8;

static_assert(has_layout<CMPIValuePtr, 16>);
static_assert(has_layout<CMPIValue, 16>);
static_assert(has_layout<CMPIData, 24>);
static_assert(has_layout<CMPIStatus, 16>);
static_assert(has_layout<CMPIBroker, 32>);
static_assert(has_layout<CMPIBrokerFT, 160>);
static_assert(has_layout<CMPIBrokerEncFT, 136>);
static_assert(has_layout<CMPIBrokerExtFT, 168>);
static_assert(has_layout<CMPIContext, 16>);
static_assert(has_layout<CMPIResult, 16>);
static_assert(has_layout<CMPIString, 16>);
static_assert(has_layout<CMPIArray, 16>);
static_assert(has_layout<CMPIEnumeration, 16>);
static_assert(has_layout<CMPIInstance, 16>);
static_assert(has_layout<CMPIObjectPath, 16>);
static_assert(has_layout<CMPIArgs, 16>);
static_assert(has_layout<CMPIDateTime, 16>);
static_assert(has_layout<CMPISelectExp, 16>);
static_assert(has_layout<CMPISelectCond, 16>);
static_assert(has_layout<CMPISubCond, 16>);
static_assert(has_layout<CMPIPredicate, 16>);
static_assert(has_layout<CMPIContextFT, 56>);
static_assert(has_layout<CMPIResultFT, 56>);
static_assert(has_layout<CMPIStringFT, 32>);
static_assert(has_layout<CMPIArrayFT, 56>);
static_assert(has_layout<CMPIEnumerationFT, 48>);
static_assert(has_layout<CMPIInstanceFT, 80>);
static_assert(has_layout<CMPIObjectPathFT, 160>);
static_assert(has_layout<CMPIArgsFT, 56>);
static_assert(has_layout<CMPIDateTimeFT, 48>);
static_assert(has_layout<CMPISelectExpFT, 64>);
static_assert(has_layout<CMPISelectCondFT, 40>);
static_assert(has_layout<CMPISubCondFT, 48>);
static_assert(has_layout<CMPIPredicateFT, 40>);
static_assert(has_layout<CMPIInstanceMI, 16>);
static_assert(has_layout<CMPIAssociationMI, 16>);
static_assert(has_layout<CMPIMethodMI, 16>);
static_assert(has_layout<CMPIPropertyMI, 16>);
static_assert(has_layout<CMPIIndicationMI, 16>);
static_assert(has_layout<CMPIInstanceMIFT, 80>);
static_assert(has_layout<CMPIAssociationMIFT, 56>);
static_assert(has_layout<CMPIMethodMIFT, 32>);
static_assert(has_layout<CMPIPropertyMIFT, 40>);
static_assert(has_layout<CMPIIndicationMIFT, 72>);

#endif

template <class T> constexpr bool is_plain = std::is_trivially_copyable_v<T>&& std::is_standard_layout_v<T>;

static_assert(is_plain<CMPIStatus>);
static_assert(is_plain<CMPIData>);
static_assert(is_plain<CMPIValue>);
static_assert(sizeof(CMPIValue) == 16);
static_assert(sizeof(CMPIData) == 24);
static_assert(sizeof(CMPIStatus) == 16);
static_assert(sizeof(CMPIBoolean) == 1);
static_assert(CMPI_refA == 0x3100);
static_assert(CMPI_RC_NEVER_UNLOAD == 51);
static_assert(offsetof(cimple::Broker_With_Memory, mft) == 32);
static_assert(offsetof(cimple::Broker_Memory_FT, release) == 16);

#endif
