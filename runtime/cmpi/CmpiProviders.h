// What a provider gives to the broker: one structure and function table per kind of provider.
#pragma once

#include "runtime/cmpi/CmpiObjects.h"

extern "C"
{

    struct CMPIInstanceMI;
    struct CMPIAssociationMI;
    struct CMPIMethodMI;
    struct CMPIPropertyMI;
    struct CMPIIndicationMI;

    struct CMPIInstanceMIFT
    {
        int ftVersion;
        int miVersion;
        const char* miName;
        CMPIStatus (*cleanup)(CMPIInstanceMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
        CMPIStatus (*enumerateInstanceNames)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                             const CMPIObjectPath* path);
        CMPIStatus (*enumerateInstances)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                         const CMPIObjectPath* path, const char** properties);
        CMPIStatus (*getInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                  const CMPIObjectPath* path, const char** properties);
        CMPIStatus (*createInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                     const CMPIObjectPath* path, const CMPIInstance* inst);
        CMPIStatus (*modifyInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                     const CMPIObjectPath* path, const CMPIInstance* inst, const char** properties);
        CMPIStatus (*deleteInstance)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                     const CMPIObjectPath* path);
        CMPIStatus (*execQuery)(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                const CMPIObjectPath* path, const char* query, const char* lang);
    };

    struct CMPIAssociationMIFT
    {
        int ftVersion;
        int miVersion;
        const char* miName;
        CMPIStatus (*cleanup)(CMPIAssociationMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
        CMPIStatus (*associators)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                  const CMPIObjectPath* path, const char* assocClass, const char* resultClass,
                                  const char* role, const char* resultRole, const char** properties);
        CMPIStatus (*associatorNames)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                      const CMPIObjectPath* path, const char* assocClass, const char* resultClass,
                                      const char* role, const char* resultRole);
        CMPIStatus (*references)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                 const CMPIObjectPath* path, const char* resultClass, const char* role,
                                 const char** properties);
        CMPIStatus (*referenceNames)(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                     const CMPIObjectPath* path, const char* resultClass, const char* role);
    };

    struct CMPIMethodMIFT
    {
        int ftVersion;
        int miVersion;
        const char* miName;
        CMPIStatus (*cleanup)(CMPIMethodMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
        CMPIStatus (*invokeMethod)(CMPIMethodMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                   const CMPIObjectPath* path, const char* method, const CMPIArgs* in, CMPIArgs* out);
    };

    struct CMPIPropertyMIFT
    {
        int ftVersion;
        int miVersion;
        const char* miName;
        CMPIStatus (*cleanup)(CMPIPropertyMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
        CMPIStatus (*setProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                  const CMPIObjectPath* path, const char* name, const CMPIData data);
        CMPIStatus (*getProperty)(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* result,
                                  const CMPIObjectPath* path, const char* name);
    };

    struct CMPIIndicationMIFT
    {
        int ftVersion;
        int miVersion;
        const char* miName;
        CMPIStatus (*cleanup)(CMPIIndicationMI* mi, const CMPIContext* ctx, CMPIBoolean terminating);
        CMPIStatus (*authorizeFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* exp,
                                      const char* className, const CMPIObjectPath* path, const char* owner);
        CMPIStatus (*mustPoll)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* exp,
                               const char* className, const CMPIObjectPath* path);
        CMPIStatus (*activateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* exp,
                                     const char* className, const CMPIObjectPath* path, CMPIBoolean first);
        CMPIStatus (*deActivateFilter)(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* exp,
                                       const char* className, const CMPIObjectPath* path, CMPIBoolean last);
        CMPIStatus (*enableIndications)(CMPIIndicationMI* mi, const CMPIContext* ctx);
        CMPIStatus (*disableIndications)(CMPIIndicationMI* mi, const CMPIContext* ctx);
    };

    struct CMPIInstanceMI
    {
        void* hdl; ///< the provider's own
        const CMPIInstanceMIFT* ft;
    };

    struct CMPIAssociationMI
    {
        void* hdl; ///< the provider's own
        const CMPIAssociationMIFT* ft;
    };

    struct CMPIMethodMI
    {
        void* hdl; ///< the provider's own
        const CMPIMethodMIFT* ft;
    };

    struct CMPIPropertyMI
    {
        void* hdl; ///< the provider's own
        const CMPIPropertyMIFT* ft;
    };

    struct CMPIIndicationMI
    {
        void* hdl; ///< the provider's own
        const CMPIIndicationMIFT* ft;
    };

} // extern "C"
