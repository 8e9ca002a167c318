// The customary names of those CMPI operations that are in use, as inline functions over the function tables.
//
// They compile with any published header set: what one set takes as const and another not is passed non-const.
// `rc` may be null everywhere.
#pragma once

// --- factory ----------------------------------------------------------------------------------------------

inline CMPIObjectPath* CMNewObjectPath(const CMPIBroker* mb, const char* ns, const char* class_name, CMPIStatus* rc)
{
    return mb->eft->newObjectPath(mb, ns, class_name, rc);
}
inline CMPIInstance* CMNewInstance(const CMPIBroker* mb, const CMPIObjectPath* path, CMPIStatus* rc)
{
    return mb->eft->newInstance(mb, path, rc);
}
inline CMPIArgs* CMNewArgs(const CMPIBroker* mb, CMPIStatus* rc)
{
    return mb->eft->newArgs(mb, rc);
}
inline CMPIString* CMNewString(const CMPIBroker* mb, const char* text, CMPIStatus* rc)
{
    return mb->eft->newString(mb, text, rc);
}
/// `type` is that of an element, without the array bit.
inline CMPIArray* CMNewArray(const CMPIBroker* mb, CMPICount count, CMPIType type, CMPIStatus* rc)
{
    return mb->eft->newArray(mb, count, type, rc);
}
inline CMPIDateTime* CMNewDateTimeFromChars(const CMPIBroker* mb, const char* text, CMPIStatus* rc)
{
    return mb->eft->newDateTimeFromChars(mb, text, rc);
}

// --- up-calls ---------------------------------------------------------------------------------------------

/// To be called on the existing thread; both later calls take the result, on the new thread.
inline CMPIContext* CBPrepareAttachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    return mb->bft->prepareAttachThread(mb, ctx);
}
inline CMPIStatus CBAttachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    return mb->bft->attachThread(mb, ctx);
}
/// The broker frees `ctx`.
inline CMPIStatus CBDetachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    return mb->bft->detachThread(mb, ctx);
}
inline CMPIStatus CBDeliverIndication(const CMPIBroker* mb, const CMPIContext* ctx, const char* ns,
                                      const CMPIInstance* indication)
{
    return mb->bft->deliverIndication(mb, ctx, ns, indication);
}
inline CMPIEnumeration* CBEnumInstances(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                        const char** properties, CMPIStatus* rc)
{
    return mb->bft->enumerateInstances(mb, ctx, path, properties, rc);
}
inline CMPIInstance* CBGetInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                   const char** properties, CMPIStatus* rc)
{
    return mb->bft->getInstance(mb, ctx, path, properties, rc);
}
inline CMPIObjectPath* CBCreateInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                        const CMPIInstance* inst, CMPIStatus* rc)
{
    return mb->bft->createInstance(mb, ctx, path, inst, rc);
}
inline CMPIStatus CBModifyInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                   const CMPIInstance* inst, const char** properties)
{
    return mb->bft->modifyInstance(mb, ctx, path, inst, properties);
}
inline CMPIStatus CBDeleteInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path)
{
    return mb->bft->deleteInstance(mb, ctx, path);
}
inline CMPIData CBInvokeMethod(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                               const char* method, const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc)
{
    return mb->bft->invokeMethod(mb, ctx, path, method, in, out, rc);
}

// --- result -----------------------------------------------------------------------------------------------

inline CMPIStatus CMReturnData(const CMPIResult* result, const CMPIValue* value, CMPIType type)
{
    return result->ft->returnData(result, value, type);
}
inline CMPIStatus CMReturnInstance(const CMPIResult* result, const CMPIInstance* inst)
{
    return result->ft->returnInstance(result, inst);
}
inline CMPIStatus CMReturnObjectPath(const CMPIResult* result, const CMPIObjectPath* path)
{
    return result->ft->returnObjectPath(result, path);
}
inline CMPIStatus CMReturnDone(const CMPIResult* result)
{
    return result->ft->returnDone(result);
}

// --- strings, datetimes, arrays, enumerations ---------------------------------------------------------------

inline const char* CMGetCharsPtr(const CMPIString* str, CMPIStatus* rc)
{
    return str->ft->getCharPtr(str, rc);
}
inline CMPIString* CMGetStringFormat(const CMPIDateTime* dt, CMPIStatus* rc)
{
    return dt->ft->getStringFormat(dt, rc);
}
inline CMPICount CMGetArrayCount(const CMPIArray* array, CMPIStatus* rc)
{
    return array->ft->getSize(array, rc);
}
inline CMPIData CMGetArrayElementAt(const CMPIArray* array, CMPICount index, CMPIStatus* rc)
{
    return array->ft->getElementAt(array, index, rc);
}
/// A broker may copy the whole union: `value` must be one.
inline CMPIStatus CMSetArrayElementAt(CMPIArray* array, CMPICount index, const CMPIValue* value, CMPIType type)
{
    return array->ft->setElementAt(array, index, value, type);
}
inline CMPIBoolean CMHasNext(const CMPIEnumeration* en, CMPIStatus* rc)
{
    return en->ft->hasNext(en, rc);
}
inline CMPIData CMGetNext(const CMPIEnumeration* en, CMPIStatus* rc)
{
    return en->ft->getNext(en, rc);
}

// --- context ----------------------------------------------------------------------------------------------

inline CMPIData CMGetContextEntry(const CMPIContext* ctx, const char* name, CMPIStatus* rc)
{
    return ctx->ft->getEntry(ctx, name, rc);
}

// --- arguments, object paths, instances: `name` may be null, an index counts from 0 -------------------------

inline CMPICount CMGetArgCount(const CMPIArgs* args, CMPIStatus* rc)
{
    return args->ft->getArgCount(args, rc);
}
inline CMPIData CMGetArg(const CMPIArgs* args, const char* name, CMPIStatus* rc)
{
    return args->ft->getArg(args, name, rc);
}
inline CMPIData CMGetArgAt(const CMPIArgs* args, CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    return args->ft->getArgAt(args, index, name, rc);
}
inline CMPIStatus CMAddArg(CMPIArgs* args, const char* name, const CMPIValue* value, CMPIType type)
{
    return args->ft->addArg(args, name, value, type);
}
inline CMPICount CMGetKeyCount(const CMPIObjectPath* path, CMPIStatus* rc)
{
    return path->ft->getKeyCount(path, rc);
}
inline CMPIData CMGetKey(const CMPIObjectPath* path, const char* name, CMPIStatus* rc)
{
    return path->ft->getKey(path, name, rc);
}
inline CMPIData CMGetKeyAt(const CMPIObjectPath* path, CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    return path->ft->getKeyAt(path, index, name, rc);
}
inline CMPIStatus CMAddKey(CMPIObjectPath* path, const char* name, const CMPIValue* value, CMPIType type)
{
    return path->ft->addKey(path, name, value, type);
}
inline CMPIString* CMGetNameSpace(const CMPIObjectPath* path, CMPIStatus* rc)
{
    return path->ft->getNameSpace(path, rc);
}
inline CMPIString* CMGetClassName(const CMPIObjectPath* path, CMPIStatus* rc)
{
    return path->ft->getClassName(path, rc);
}
inline CMPICount CMGetPropertyCount(const CMPIInstance* inst, CMPIStatus* rc)
{
    return inst->ft->getPropertyCount(inst, rc);
}
inline CMPIData CMGetProperty(const CMPIInstance* inst, const char* name, CMPIStatus* rc)
{
    return inst->ft->getProperty(inst, name, rc);
}
inline CMPIData CMGetPropertyAt(const CMPIInstance* inst, CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    return inst->ft->getPropertyAt(inst, index, name, rc);
}
inline CMPIStatus CMSetProperty(CMPIInstance* inst, const char* name, const CMPIValue* value, CMPIType type)
{
    return inst->ft->setProperty(inst, name, value, type);
}
/// Both lists end with a null pointer; a null property list means all.
inline CMPIStatus CMSetPropertyFilter(CMPIInstance* inst, const char** properties, const char** keys)
{
    return inst->ft->setPropertyFilter(inst, properties, keys);
}
inline CMPIObjectPath* CMGetObjectPath(const CMPIInstance* inst, CMPIStatus* rc)
{
    return inst->ft->getObjectPath(inst, rc);
}
inline CMPIString* CMGetSelExpString(const CMPISelectExp* exp, CMPIStatus* rc)
{
    return exp->ft->getString(exp, rc);
}

// --- all objects ------------------------------------------------------------------------------------------

/// Only for objects that the caller cloned.
template <class Object> CMPIStatus CMRelease(Object* object)
{
    return object->ft->release(object);
}
template <class Object> Object* CMClone(const Object* object, CMPIStatus* rc)
{
    return object->ft->clone(object, rc);
}
inline bool CMIsNullValue(const CMPIData& data)
{
    return (data.state & CMPI_nullValue) != 0;
}
inline void CMSetStatus(CMPIStatus* rc, CMPIrc code)
{
    if (rc)
        *rc = CMPIStatus{code, nullptr};
}
