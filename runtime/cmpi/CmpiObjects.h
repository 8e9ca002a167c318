// The objects that a broker hands to a provider, and their function tables.
#pragma once

#include "runtime/cmpi/CmpiTypes.h"

extern "C"
{

    struct CMPIContextFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIContext* ctx);
        CMPIContext* (*clone)(const CMPIContext* ctx, CMPIStatus* rc);
        CMPIData (*getEntry)(const CMPIContext* ctx, const char* name, CMPIStatus* rc);
        CMPIData (*getEntryAt)(const CMPIContext* ctx, CMPICount index, CMPIString** name, CMPIStatus* rc);
        CMPICount (*getEntryCount)(const CMPIContext* ctx, CMPIStatus* rc);
        CMPIStatus (*addEntry)(const CMPIContext* ctx, const char* name, const CMPIValue* value, const CMPIType type);
    };

    struct CMPIResultFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIResult* result);
        CMPIResult* (*clone)(const CMPIResult* result, CMPIStatus* rc);
        CMPIStatus (*returnData)(const CMPIResult* result, const CMPIValue* value, const CMPIType type);
        CMPIStatus (*returnInstance)(const CMPIResult* result, const CMPIInstance* inst);
        CMPIStatus (*returnObjectPath)(const CMPIResult* result, const CMPIObjectPath* path);
        CMPIStatus (*returnDone)(const CMPIResult* result);
    };

    struct CMPIStringFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIString* str);
        CMPIString* (*clone)(const CMPIString* str, CMPIStatus* rc);
        const char* (*getCharPtr)(const CMPIString* str, CMPIStatus* rc);
    };

    struct CMPIArrayFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIArray* array);
        CMPIArray* (*clone)(const CMPIArray* array, CMPIStatus* rc);
        CMPICount (*getSize)(const CMPIArray* array, CMPIStatus* rc);
        CMPIType (*getSimpleType)(const CMPIArray* array, CMPIStatus* rc);
        CMPIData (*getElementAt)(const CMPIArray* array, CMPICount index, CMPIStatus* rc);
        CMPIStatus (*setElementAt)(CMPIArray* array, CMPICount index, const CMPIValue* value, CMPIType type);
    };

    struct CMPIEnumerationFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIEnumeration* en);
        CMPIEnumeration* (*clone)(const CMPIEnumeration* en, CMPIStatus* rc);
        CMPIData (*getNext)(const CMPIEnumeration* en, CMPIStatus* rc);
        CMPIBoolean (*hasNext)(const CMPIEnumeration* en, CMPIStatus* rc);
        CMPIArray* (*toArray)(const CMPIEnumeration* en, CMPIStatus* rc);
    };

    struct CMPIInstanceFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIInstance* inst);
        CMPIInstance* (*clone)(const CMPIInstance* inst, CMPIStatus* rc);
        CMPIData (*getProperty)(const CMPIInstance* inst, const char* name, CMPIStatus* rc);
        CMPIData (*getPropertyAt)(const CMPIInstance* inst, CMPICount index, CMPIString** name, CMPIStatus* rc);
        CMPICount (*getPropertyCount)(const CMPIInstance* inst, CMPIStatus* rc);
        CMPIStatus (*setProperty)(const CMPIInstance* inst, const char* name, const CMPIValue* value, CMPIType type);
        CMPIObjectPath* (*getObjectPath)(const CMPIInstance* inst, CMPIStatus* rc);
        CMPIStatus (*setPropertyFilter)(CMPIInstance* inst, const char** properties, const char** keys);
        CMPIStatus (*setObjectPath)(CMPIInstance* inst, const CMPIObjectPath* path);
    };

    struct CMPIObjectPathFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIObjectPath* path);
        CMPIObjectPath* (*clone)(const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIStatus (*setNameSpace)(CMPIObjectPath* path, const char* ns);
        CMPIString* (*getNameSpace)(const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIStatus (*setHostname)(CMPIObjectPath* path, const char* host);
        CMPIString* (*getHostname)(const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIStatus (*setClassName)(CMPIObjectPath* path, const char* className);
        CMPIString* (*getClassName)(const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIStatus (*addKey)(CMPIObjectPath* path, const char* name, const CMPIValue* value, const CMPIType type);
        CMPIData (*getKey)(const CMPIObjectPath* path, const char* name, CMPIStatus* rc);
        CMPIData (*getKeyAt)(const CMPIObjectPath* path, CMPICount index, CMPIString** name, CMPIStatus* rc);
        CMPICount (*getKeyCount)(const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIStatus (*setNameSpaceFromObjectPath)(CMPIObjectPath* path, const CMPIObjectPath* from);
        CMPIStatus (*setHostAndNameSpaceFromObjectPath)(CMPIObjectPath* path, const CMPIObjectPath* from);
        CMPIData (*getClassQualifier)(const CMPIObjectPath* path, const char* qualifier, CMPIStatus* rc);
        CMPIData (*getPropertyQualifier)(const CMPIObjectPath* path, const char* property, const char* qualifier,
                                         CMPIStatus* rc);
        CMPIData (*getMethodQualifier)(const CMPIObjectPath* path, const char* method, const char* qualifier,
                                       CMPIStatus* rc);
        CMPIData (*getParameterQualifier)(const CMPIObjectPath* path, const char* method, const char* parameter,
                                          const char* qualifier, CMPIStatus* rc);
        CMPIString* (*toString)(const CMPIObjectPath* path, CMPIStatus* rc);
    };

    struct CMPIArgsFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIArgs* args);
        CMPIArgs* (*clone)(const CMPIArgs* args, CMPIStatus* rc);
        CMPIStatus (*addArg)(const CMPIArgs* args, const char* name, const CMPIValue* value, const CMPIType type);
        CMPIData (*getArg)(const CMPIArgs* args, const char* name, CMPIStatus* rc);
        CMPIData (*getArgAt)(const CMPIArgs* args, CMPICount index, CMPIString** name, CMPIStatus* rc);
        CMPICount (*getArgCount)(const CMPIArgs* args, CMPIStatus* rc);
    };

    struct CMPIDateTimeFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIDateTime* dt);
        CMPIDateTime* (*clone)(const CMPIDateTime* dt, CMPIStatus* rc);
        CMPIUint64 (*getBinaryFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
        CMPIString* (*getStringFormat)(const CMPIDateTime* dt, CMPIStatus* rc);
        CMPIBoolean (*isInterval)(const CMPIDateTime* dt, CMPIStatus* rc);
    };

    struct CMPISelectExpFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPISelectExp* exp);
        CMPISelectExp* (*clone)(const CMPISelectExp* exp, CMPIStatus* rc);
        CMPIBoolean (*evaluate)(const CMPISelectExp* exp, const CMPIInstance* inst, CMPIStatus* rc);
        CMPIString* (*getString)(const CMPISelectExp* exp, CMPIStatus* rc);
        CMPISelectCond* (*getDOC)(const CMPISelectExp* exp, CMPIStatus* rc);
        CMPISelectCond* (*getCOD)(const CMPISelectExp* exp, CMPIStatus* rc);
        CMPIBoolean (*evaluateUsingAccessor)(const CMPISelectExp* exp, CMPIAccessor* accessor, void* parm,
                                             CMPIStatus* rc);
    };

    struct CMPISelectCondFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPISelectCond* cond);
        CMPISelectCond* (*clone)(const CMPISelectCond* cond, CMPIStatus* rc);
        CMPICount (*getCountAndType)(const CMPISelectCond* cond, int* type, CMPIStatus* rc);
        CMPISubCond* (*getSubCondAt)(const CMPISelectCond* cond, CMPICount index, CMPIStatus* rc);
    };

    struct CMPISubCondFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPISubCond* sub);
        CMPISubCond* (*clone)(const CMPISubCond* sub, CMPIStatus* rc);
        CMPICount (*getCount)(const CMPISubCond* sub, CMPIStatus* rc);
        CMPIPredicate* (*getPredicateAt)(const CMPISubCond* sub, CMPICount index, CMPIStatus* rc);
        CMPIPredicate* (*getPredicate)(const CMPISubCond* sub, const char* name, CMPIStatus* rc);
    };

    struct CMPIPredicateFT
    {
        int ftVersion;
        CMPIStatus (*release)(CMPIPredicate* pred);
        CMPIPredicate* (*clone)(const CMPIPredicate* pred, CMPIStatus* rc);
        CMPIStatus (*getData)(const CMPIPredicate* pred, CMPIType* type, CMPIPredOp* op, CMPIString** lhs,
                              CMPIString** rhs);
        CMPIBoolean (*evaluateUsingAccessor)(const CMPIPredicate* pred, CMPIAccessor* accessor, void* parm,
                                             CMPIStatus* rc);
    };

    struct CMPIContext
    {
        void* hdl; ///< the broker's own
        const CMPIContextFT* ft;
    };

    struct CMPIResult
    {
        void* hdl; ///< the broker's own
        const CMPIResultFT* ft;
    };

    struct CMPIString
    {
        void* hdl; ///< the broker's own
        const CMPIStringFT* ft;
    };

    struct CMPIArray
    {
        void* hdl; ///< the broker's own
        const CMPIArrayFT* ft;
    };

    struct CMPIEnumeration
    {
        void* hdl; ///< the broker's own
        const CMPIEnumerationFT* ft;
    };

    struct CMPIInstance
    {
        void* hdl; ///< the broker's own
        const CMPIInstanceFT* ft;
    };

    struct CMPIObjectPath
    {
        void* hdl; ///< the broker's own
        const CMPIObjectPathFT* ft;
    };

    struct CMPIArgs
    {
        void* hdl; ///< the broker's own
        const CMPIArgsFT* ft;
    };

    struct CMPIDateTime
    {
        void* hdl; ///< the broker's own
        const CMPIDateTimeFT* ft;
    };

    struct CMPISelectExp
    {
        void* hdl; ///< the broker's own
        const CMPISelectExpFT* ft;
    };

    struct CMPISelectCond
    {
        void* hdl; ///< the broker's own
        const CMPISelectCondFT* ft;
    };

    struct CMPISubCond
    {
        void* hdl; ///< the broker's own
        const CMPISubCondFT* ft;
    };

    struct CMPIPredicate
    {
        void* hdl; ///< the broker's own
        const CMPIPredicateFT* ft;
    };

} // extern "C"
