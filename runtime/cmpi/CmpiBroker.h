// The broker: up-calls, object factory and operating system services.
#pragma once

#include "runtime/cmpi/CmpiObjects.h"

#include <ctime>

extern "C"
{

    struct CMPIBrokerFT
    {
        unsigned int brokerCapabilities;
        unsigned int brokerVersion;
        const char* brokerName;
        CMPIContext* (*prepareAttachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
        CMPIStatus (*attachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
        CMPIStatus (*detachThread)(const CMPIBroker* mb, const CMPIContext* ctx);
        CMPIStatus (*deliverIndication)(const CMPIBroker* mb, const CMPIContext* ctx, const char* ns,
                                        const CMPIInstance* indication);
        CMPIEnumeration* (*enumerateInstanceNames)(const CMPIBroker* mb, const CMPIContext* ctx,
                                                   const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIInstance* (*getInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                     const char** properties, CMPIStatus* rc);
        CMPIObjectPath* (*createInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                          const CMPIInstance* inst, CMPIStatus* rc);
        CMPIStatus (*modifyInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                     const CMPIInstance* inst, const char** properties);
        CMPIStatus (*deleteInstance)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path);
        CMPIEnumeration* (*execQuery)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                      const char* query, const char* lang, CMPIStatus* rc);
        CMPIEnumeration* (*enumerateInstances)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                               const char** properties, CMPIStatus* rc);
        CMPIEnumeration* (*associators)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                        const char* assocClass, const char* resultClass, const char* role,
                                        const char* resultRole, const char** properties, CMPIStatus* rc);
        CMPIEnumeration* (*associatorNames)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                            const char* assocClass, const char* resultClass, const char* role,
                                            const char* resultRole, CMPIStatus* rc);
        CMPIEnumeration* (*references)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                       const char* resultClass, const char* role, const char** properties,
                                       CMPIStatus* rc);
        CMPIEnumeration* (*referenceNames)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                           const char* resultClass, const char* role, CMPIStatus* rc);
        CMPIData (*invokeMethod)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                 const char* method, const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc);
        CMPIStatus (*setProperty)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                  const char* name, const CMPIValue* value, CMPIType type);
        CMPIData (*getProperty)(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                const char* name, CMPIStatus* rc);
    };

    struct CMPIBrokerEncFT
    {
        int ftVersion;
        CMPIInstance* (*newInstance)(const CMPIBroker* mb, const CMPIObjectPath* path, CMPIStatus* rc);
        CMPIObjectPath* (*newObjectPath)(const CMPIBroker* mb, const char* ns, const char* className, CMPIStatus* rc);
        CMPIArgs* (*newArgs)(const CMPIBroker* mb, CMPIStatus* rc);
        CMPIString* (*newString)(const CMPIBroker* mb, const char* text, CMPIStatus* rc);
        CMPIArray* (*newArray)(const CMPIBroker* mb, CMPICount size, CMPIType elementType, CMPIStatus* rc);
        CMPIDateTime* (*newDateTime)(const CMPIBroker* mb, CMPIStatus* rc);
        CMPIDateTime* (*newDateTimeFromBinary)(const CMPIBroker* mb, CMPIUint64 microseconds, CMPIBoolean isInterval,
                                               CMPIStatus* rc);
        CMPIDateTime* (*newDateTimeFromChars)(const CMPIBroker* mb, const char* text, CMPIStatus* rc);
        CMPISelectExp* (*newSelectExp)(const CMPIBroker* mb, const char* query, const char* lang,
                                       CMPIArray** projection, CMPIStatus* rc);
        CMPIBoolean (*classPathIsA)(const CMPIBroker* mb, const CMPIObjectPath* path, const char* className,
                                    CMPIStatus* rc);
        CMPIString* (*toString)(const CMPIBroker* mb, const void* object, CMPIStatus* rc);
        CMPIBoolean (*isOfType)(const CMPIBroker* mb, const void* object, const char* typeName, CMPIStatus* rc);
        CMPIString* (*getType)(const CMPIBroker* mb, const void* object, CMPIStatus* rc);
        CMPIString* (*getMessage)(const CMPIBroker* mb, const char* msgId, const char* defaultText, CMPIStatus* rc,
                                  CMPICount count, ...);
        CMPIStatus (*logMessage)(const CMPIBroker* mb, int severity, const char* id, const char* text,
                                 const CMPIString* str);
        CMPIStatus (*trace)(const CMPIBroker* mb, int level, const char* component, const char* text,
                            const CMPIString* str);
    };

    struct CMPIBrokerExtFT
    {
        int ftVersion;
        char* (*resolveFileName)(const char* libName);
        void* (*newThread)(void* (*start)(void*), void* parm, int detached);
        int (*joinThread)(void* thread, void** retval);
        int (*exitThread)(void* retval);
        int (*cancelThread)(void* thread);
        int (*threadSleep)(CMPIUint32 msec);
        int (*threadOnce)(int* once, void (*init)(void));
        int (*createThreadKey)(CMPI_THREAD_KEY_TYPE* key, void (*cleanup)(void*));
        int (*destroyThreadKey)(CMPI_THREAD_KEY_TYPE key);
        void* (*getThreadSpecific)(CMPI_THREAD_KEY_TYPE key);
        int (*setThreadSpecific)(CMPI_THREAD_KEY_TYPE key, void* value);
        void* (*newMutex)(int opt);
        void (*destroyMutex)(void* mutex);
        void (*lockMutex)(void* mutex);
        void (*unlockMutex)(void* mutex);
        void* (*newCondition)(int opt);
        void (*destroyCondition)(void* cond);
        int (*condWait)(void* cond, void* mutex);
        int (*timedCondWait)(void* cond, void* mutex, struct timespec* until);
        int (*signalCondition)(void* cond);
    };

    /// Never copied: brokers keep data of their own behind it.
    struct CMPIBroker
    {
        void* hdl;
        const CMPIBrokerFT* bft;
        const CMPIBrokerEncFT* eft;
        const CMPIBrokerExtFT* xft;
    };

} // extern "C"
