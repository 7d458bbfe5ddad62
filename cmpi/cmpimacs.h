/**
 * @file
 * CMPI's convenience names, and what defines a provider's factory functions.
 *
 * The `CM…` names are inline functions, or macros where the includer defines `CMPI_NO_INLINE`. Each calls the
 * slot of its object's table; none checks anything. A value argument is any pointer: of a `CMPI_chars` value
 * the text itself.
 */
#ifndef CMPIMACS_H
#define CMPIMACS_H

#include "cmpift.h"

#define CMIsNullObject(o) ((o) == NULL || *(void* CMPI_CONST_SINCE_210*)(o) == NULL)
#define CMIsNullValue(v) (((v).state & CMPI_nullValue) != 0)
#define CMIsArray(v) (((v).type & CMPI_ARRAY) != 0)

/** A copy of any object, which belongs to the caller. */
#define CMClone(o, rc) ((o)->ft->clone((o), (rc)))
/** Releases any object. */
#define CMRelease(o) ((o)->ft->release((o)))

/** Returns from a provider function with a code. */
#define CMReturn(code)                           \
    do {                                         \
        CMPIStatus cmpiStatus_ = {(code), NULL}; \
        return cmpiStatus_;                      \
    } while (0)

/** Sets a status, given by a pointer that may be null, to a code without text. */
#define CMSetStatus(status, code)           \
    do {                                    \
        CMPIStatus* cmpiStatus_ = (status); \
        if (cmpiStatus_ != NULL) {          \
            cmpiStatus_->rc = (code);       \
            cmpiStatus_->msg = NULL;        \
        }                                   \
    } while (0)

#ifdef CMPI_NO_INLINE

/* Making objects, and asking about classes */
#define CMNewInstance(b, instPath, rc) ((b)->eft->newInstance((b), (instPath), (rc)))
#define CMNewObjectPath(b, ns, cn, rc) ((b)->eft->newObjectPath((b), (ns), (cn), (rc)))
#define CMNewArgs(b, rc) ((b)->eft->newArgs((b), (rc)))
#define CMNewString(b, data, rc) ((b)->eft->newString((b), (data), (rc)))
#define CMNewArray(b, size, type, rc) ((b)->eft->newArray((b), (size), (type), (rc)))
#define CMNewDateTime(b, rc) ((b)->eft->newDateTime((b), (rc)))
#define CMNewDateTimeFromBinary(b, binTime, interval, rc) \
    ((b)->eft->newDateTimeFromBinary((b), (binTime), (interval), (rc)))
#define CMNewDateTimeFromChars(b, datetime, rc) ((b)->eft->newDateTimeFromChars((b), (datetime), (rc)))
#define CMClassPathIsA(b, classPath, className, rc) \
    ((b)->eft->classPathIsA((b), (classPath), (className), (rc)))

/* Instances */
#define CMGetProperty(o, name, rc) ((o)->ft->getProperty((o), (name), (rc)))
#define CMGetPropertyAt(o, index, name, rc) ((o)->ft->getPropertyAt((o), (index), (name), (rc)))
#define CMGetPropertyCount(o, rc) ((o)->ft->getPropertyCount((o), (rc)))
#define CMSetProperty(o, name, value, type) ((o)->ft->setProperty((o), (name), (CMPIValue*)(value), (type)))
#define CMGetObjectPath(o, rc) ((o)->ft->getObjectPath((o), (rc)))
#define CMSetPropertyFilter(o, properties, keyList) ((o)->ft->setPropertyFilter((o), (properties), (keyList)))

/* Object paths */
#define CMAddKey(o, key, value, type) ((o)->ft->addKey((o), (key), (CMPIValue*)(value), (type)))
#define CMGetKey(o, key, rc) ((o)->ft->getKey((o), (key), (rc)))
#define CMGetKeyAt(o, index, name, rc) ((o)->ft->getKeyAt((o), (index), (name), (rc)))
#define CMGetKeyCount(o, rc) ((o)->ft->getKeyCount((o), (rc)))
#define CMGetClassName(o, rc) ((o)->ft->getClassName((o), (rc)))
#define CMSetClassName(o, cn) ((o)->ft->setClassName((o), (cn)))
#define CMGetNameSpace(o, rc) ((o)->ft->getNameSpace((o), (rc)))
#define CMSetNameSpace(o, ns) ((o)->ft->setNameSpace((o), (ns)))
#define CMGetHostname(o, rc) ((o)->ft->getHostname((o), (rc)))
#define CMSetHostname(o, hn) ((o)->ft->setHostname((o), (hn)))

/* A method's arguments */
#define CMGetArg(o, name, rc) ((o)->ft->getArg((o), (name), (rc)))
#define CMGetArgAt(o, index, name, rc) ((o)->ft->getArgAt((o), (index), (name), (rc)))
#define CMGetArgCount(o, rc) ((o)->ft->getArgCount((o), (rc)))
#define CMAddArg(o, name, value, type) ((o)->ft->addArg((o), (name), (CMPIValue*)(value), (type)))

/* Strings */
#define CMGetCharsPtr(o, rc) ((o)->ft->getCharPtr((o), (rc)))

/* Dates and times */
#define CMGetStringFormat(o, rc) ((o)->ft->getStringFormat((o), (rc)))
#define CMGetBinaryFormat(o, rc) ((o)->ft->getBinaryFormat((o), (rc)))
#define CMIsInterval(o, rc) ((o)->ft->isInterval((o), (rc)))

/* Arrays */
#define CMGetArrayCount(o, rc) ((o)->ft->getSize((o), (rc)))
#define CMGetArrayType(o, rc) ((o)->ft->getSimpleType((o), (rc)))
#define CMGetArrayElementAt(o, index, rc) ((o)->ft->getElementAt((o), (index), (rc)))
#define CMSetArrayElementAt(o, index, value, type) \
    ((o)->ft->setElementAt((o), (index), (CMPIValue*)(value), (type)))

/* Enumerations */
#define CMGetNext(o, rc) ((o)->ft->getNext((o), (rc)))
#define CMHasNext(o, rc) ((o)->ft->hasNext((o), (rc)))
#define CMToArray(o, rc) ((o)->ft->toArray((o), (rc)))

/* Results */
#define CMReturnData(o, value, type) ((o)->ft->returnData((o), (CMPIValue*)(value), (type)))
#define CMReturnInstance(o, inst) ((o)->ft->returnInstance((o), (inst)))
#define CMReturnObjectPath(o, op) ((o)->ft->returnObjectPath((o), (op)))
#define CMReturnDone(o) ((o)->ft->returnDone((o)))

/* Contexts */
#define CMGetContextEntry(o, name, rc) ((o)->ft->getEntry((o), (name), (rc)))
#define CMAddContextEntry(o, name, value, type) ((o)->ft->addEntry((o), (name), (CMPIValue*)(value), (type)))
#define CMGetContextEntryAt(o, index, name, rc) ((o)->ft->getEntryAt((o), (index), (name), (rc)))
#define CMGetContextEntryCount(o, rc) ((o)->ft->getEntryCount((o), (rc)))

#else

/* The value argument of a slot, from any pointer. */
#ifdef __cplusplus
#define CMPI_VALUE(pointer) static_cast<const CMPIValue*>(pointer)
#else
#define CMPI_VALUE(pointer) ((const CMPIValue*)(pointer))
#endif

/* Making objects, and asking about classes */

static inline CMPIInstance* CMNewInstance(const CMPIBroker* b, const CMPIObjectPath* instPath,
                                          CMPIStatus* rc) {
    return b->eft->newInstance(b, instPath, rc);
}
static inline CMPIObjectPath* CMNewObjectPath(const CMPIBroker* b, const char* ns, const char* cn,
                                              CMPIStatus* rc) {
    return b->eft->newObjectPath(b, ns, cn, rc);
}
static inline CMPIArgs* CMNewArgs(const CMPIBroker* b, CMPIStatus* rc) {
    return b->eft->newArgs(b, rc);
}
static inline CMPIString* CMNewString(const CMPIBroker* b, const char* data, CMPIStatus* rc) {
    return b->eft->newString(b, data, rc);
}
static inline CMPIArray* CMNewArray(const CMPIBroker* b, CMPICount size, CMPIType type, CMPIStatus* rc) {
    return b->eft->newArray(b, size, type, rc);
}
static inline CMPIDateTime* CMNewDateTime(const CMPIBroker* b, CMPIStatus* rc) {
    return b->eft->newDateTime(b, rc);
}
static inline CMPIDateTime* CMNewDateTimeFromBinary(const CMPIBroker* b, CMPIUint64 binTime,
                                                    CMPIBoolean interval, CMPIStatus* rc) {
    return b->eft->newDateTimeFromBinary(b, binTime, interval, rc);
}
static inline CMPIDateTime* CMNewDateTimeFromChars(const CMPIBroker* b, const char* datetime,
                                                   CMPIStatus* rc) {
    return b->eft->newDateTimeFromChars(b, datetime, rc);
}
static inline CMPIBoolean CMClassPathIsA(const CMPIBroker* b, const CMPIObjectPath* classPath,
                                         const char* className, CMPIStatus* rc) {
    return b->eft->classPathIsA(b, classPath, className, rc);
}

/* Instances */

static inline CMPIData CMGetProperty(const CMPIInstance* o, const char* name, CMPIStatus* rc) {
    return o->ft->getProperty(o, name, rc);
}
static inline CMPIData CMGetPropertyAt(const CMPIInstance* o, CMPICount index, CMPIString** name,
                                       CMPIStatus* rc) {
    return o->ft->getPropertyAt(o, index, name, rc);
}
static inline CMPICount CMGetPropertyCount(const CMPIInstance* o, CMPIStatus* rc) {
    return o->ft->getPropertyCount(o, rc);
}
static inline CMPIStatus CMSetProperty(const CMPIInstance* o, const char* name, const void* value,
                                       CMPIType type) {
    return o->ft->setProperty(o, name, CMPI_VALUE(value), type);
}
static inline CMPIObjectPath* CMGetObjectPath(const CMPIInstance* o, CMPIStatus* rc) {
    return o->ft->getObjectPath(o, rc);
}
static inline CMPIStatus CMSetPropertyFilter(const CMPIInstance* o, const char** properties,
                                             const char** keyList) {
    return o->ft->setPropertyFilter(o, properties, keyList);
}

/* Object paths */

static inline CMPIStatus CMAddKey(const CMPIObjectPath* o, const char* key, const void* value,
                                  const CMPIType type) {
    return o->ft->addKey(o, key, CMPI_VALUE(value), type);
}
static inline CMPIData CMGetKey(const CMPIObjectPath* o, const char* key, CMPIStatus* rc) {
    return o->ft->getKey(o, key, rc);
}
static inline CMPIData CMGetKeyAt(const CMPIObjectPath* o, CMPICount index, CMPIString** name,
                                  CMPIStatus* rc) {
    return o->ft->getKeyAt(o, index, name, rc);
}
static inline CMPICount CMGetKeyCount(const CMPIObjectPath* o, CMPIStatus* rc) {
    return o->ft->getKeyCount(o, rc);
}
static inline CMPIString* CMGetClassName(const CMPIObjectPath* o, CMPIStatus* rc) {
    return o->ft->getClassName(o, rc);
}
static inline CMPIStatus CMSetClassName(const CMPIObjectPath* o, const char* cn) {
    return o->ft->setClassName(o, cn);
}
static inline CMPIString* CMGetNameSpace(const CMPIObjectPath* o, CMPIStatus* rc) {
    return o->ft->getNameSpace(o, rc);
}
static inline CMPIStatus CMSetNameSpace(const CMPIObjectPath* o, const char* ns) {
    return o->ft->setNameSpace(o, ns);
}
static inline CMPIString* CMGetHostname(const CMPIObjectPath* o, CMPIStatus* rc) {
    return o->ft->getHostname(o, rc);
}
static inline CMPIStatus CMSetHostname(const CMPIObjectPath* o, const char* hn) {
    return o->ft->setHostname(o, hn);
}

/* A method's arguments */

static inline CMPIData CMGetArg(const CMPIArgs* o, const char* name, CMPIStatus* rc) {
    return o->ft->getArg(o, name, rc);
}
static inline CMPIData CMGetArgAt(const CMPIArgs* o, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    return o->ft->getArgAt(o, index, name, rc);
}
static inline CMPICount CMGetArgCount(const CMPIArgs* o, CMPIStatus* rc) {
    return o->ft->getArgCount(o, rc);
}
static inline CMPIStatus CMAddArg(const CMPIArgs* o, const char* name, const void* value,
                                  const CMPIType type) {
    return o->ft->addArg(o, name, CMPI_VALUE(value), type);
}

/* Strings */

static inline CMPI_CONST_SINCE_210 char* CMGetCharsPtr(const CMPIString* o, CMPIStatus* rc) {
    return o->ft->getCharPtr(o, rc);
}

/* Dates and times */

static inline CMPIString* CMGetStringFormat(const CMPIDateTime* o, CMPIStatus* rc) {
    return o->ft->getStringFormat(o, rc);
}
static inline CMPIUint64 CMGetBinaryFormat(const CMPIDateTime* o, CMPIStatus* rc) {
    return o->ft->getBinaryFormat(o, rc);
}
static inline CMPIBoolean CMIsInterval(const CMPIDateTime* o, CMPIStatus* rc) {
    return o->ft->isInterval(o, rc);
}

/* Arrays */

static inline CMPICount CMGetArrayCount(const CMPIArray* o, CMPIStatus* rc) {
    return o->ft->getSize(o, rc);
}
static inline CMPIType CMGetArrayType(const CMPIArray* o, CMPIStatus* rc) {
    return o->ft->getSimpleType(o, rc);
}
static inline CMPIData CMGetArrayElementAt(const CMPIArray* o, CMPICount index, CMPIStatus* rc) {
    return o->ft->getElementAt(o, index, rc);
}
static inline CMPIStatus CMSetArrayElementAt(const CMPIArray* o, CMPICount index, const void* value,
                                             CMPIType type) {
    return o->ft->setElementAt(o, index, CMPI_VALUE(value), type);
}

/* Enumerations */

static inline CMPIData CMGetNext(const CMPIEnumeration* o, CMPIStatus* rc) {
    return o->ft->getNext(o, rc);
}
static inline CMPIBoolean CMHasNext(const CMPIEnumeration* o, CMPIStatus* rc) {
    return o->ft->hasNext(o, rc);
}
static inline CMPIArray* CMToArray(const CMPIEnumeration* o, CMPIStatus* rc) {
    return o->ft->toArray(o, rc);
}

/* Results */

static inline CMPIStatus CMReturnData(const CMPIResult* o, const void* value, const CMPIType type) {
    return o->ft->returnData(o, CMPI_VALUE(value), type);
}
static inline CMPIStatus CMReturnInstance(const CMPIResult* o, const CMPIInstance* inst) {
    return o->ft->returnInstance(o, inst);
}
static inline CMPIStatus CMReturnObjectPath(const CMPIResult* o, const CMPIObjectPath* op) {
    return o->ft->returnObjectPath(o, op);
}
static inline CMPIStatus CMReturnDone(const CMPIResult* o) {
    return o->ft->returnDone(o);
}

/* Contexts */

static inline CMPIData CMGetContextEntry(const CMPIContext* o, const char* name, CMPIStatus* rc) {
    return o->ft->getEntry(o, name, rc);
}
static inline CMPIStatus CMAddContextEntry(const CMPIContext* o, const char* name, const void* value,
                                           const CMPIType type) {
    return o->ft->addEntry(o, name, CMPI_VALUE(value), type);
}
static inline CMPIData CMGetContextEntryAt(const CMPIContext* o, CMPICount index, CMPIString** name,
                                           CMPIStatus* rc) {
    return o->ft->getEntryAt(o, index, name, rc);
}
static inline CMPICount CMGetContextEntryCount(const CMPIContext* o, CMPIStatus* rc) {
    return o->ft->getEntryCount(o, rc);
}

#undef CMPI_VALUE

#endif

/* The slots of version 2.1 that a provider need not have. */
#if CMPI_VERSION >= 210
#define CMPI_NO_FILTERED_INSTANCES , NULL
#define CMPI_NO_FILTERED_ASSOCIATIONS , NULL, NULL
#else
#define CMPI_NO_FILTERED_INSTANCES
#define CMPI_NO_FILTERED_ASSOCIATIONS
#endif

/**
 * @name Factories of a provider written as functions
 * Each defines the factory function of the MI `miname` for the functions of its kind, whose names begin with
 * `pfx`. `mbvar` is the variable that keeps the broker, `hook` a statement that is run when the CIM server
 * calls the factory; it may be empty.
 */
/** @{ */

/** A `hook` that does nothing. */
#define CMNoHook

/** Functions: `pfx##Cleanup`, `pfx##EnumInstanceNames`, `pfx##EnumInstances`, `pfx##GetInstance`,
 * `pfx##CreateInstance`, `pfx##ModifyInstance`, `pfx##DeleteInstance`, `pfx##ExecQuery`. */
#define CMInstanceMIStub(pfx, miname, mbvar, hook)                           \
    static CMPI_CONST_SINCE_210 CMPIInstanceMIFT miname##InstanceTable_ = {  \
        CMPICurrentVersion,                                                  \
        CMPICurrentVersion,                                                  \
        "instance" #miname,                                                  \
        pfx##Cleanup,                                                        \
        pfx##EnumInstanceNames,                                              \
        pfx##EnumInstances,                                                  \
        pfx##GetInstance,                                                    \
        pfx##CreateInstance,                                                 \
        pfx##ModifyInstance,                                                 \
        pfx##DeleteInstance,                                                 \
        pfx##ExecQuery CMPI_NO_FILTERED_INSTANCES};                          \
    CMPI_EXTERN_C CMPI_EXPORT CMPIInstanceMI* miname##_Create_InstanceMI(    \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_);  \
    CMPI_EXTERN_C CMPI_EXPORT CMPIInstanceMI* miname##_Create_InstanceMI(    \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_) { \
        static CMPIInstanceMI mi = {NULL, &miname##InstanceTable_};          \
        (void)ctx_;                                                          \
        mbvar = brkr_;                                                       \
        hook;                                                                \
        CMSetStatus(rc_, CMPI_RC_OK);                                        \
        return &mi;                                                          \
    }

/** Functions: `pfx##AssociationCleanup`, `pfx##Associators`, `pfx##AssociatorNames`, `pfx##References`,
 * `pfx##ReferenceNames`. */
#define CMAssociationMIStub(pfx, miname, mbvar, hook)                              \
    static CMPI_CONST_SINCE_210 CMPIAssociationMIFT miname##AssociationTable_ = {  \
        CMPICurrentVersion,    CMPICurrentVersion,                                 \
        "association" #miname, pfx##AssociationCleanup,                            \
        pfx##Associators,      pfx##AssociatorNames,                               \
        pfx##References,       pfx##ReferenceNames CMPI_NO_FILTERED_ASSOCIATIONS}; \
    CMPI_EXTERN_C CMPI_EXPORT CMPIAssociationMI* miname##_Create_AssociationMI(    \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_);        \
    CMPI_EXTERN_C CMPI_EXPORT CMPIAssociationMI* miname##_Create_AssociationMI(    \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_) {       \
        static CMPIAssociationMI mi = {NULL, &miname##AssociationTable_};          \
        (void)ctx_;                                                                \
        mbvar = brkr_;                                                             \
        hook;                                                                      \
        CMSetStatus(rc_, CMPI_RC_OK);                                              \
        return &mi;                                                                \
    }

/** Functions: `pfx##MethodCleanup`, `pfx##InvokeMethod`. */
#define CMMethodMIStub(pfx, miname, mbvar, hook)                                                          \
    static CMPI_CONST_SINCE_210 CMPIMethodMIFT miname##MethodTable_ = {                                   \
        CMPICurrentVersion, CMPICurrentVersion, "method" #miname, pfx##MethodCleanup, pfx##InvokeMethod}; \
    CMPI_EXTERN_C CMPI_EXPORT CMPIMethodMI* miname##_Create_MethodMI(                                     \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_);                               \
    CMPI_EXTERN_C CMPI_EXPORT CMPIMethodMI* miname##_Create_MethodMI(                                     \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_) {                              \
        static CMPIMethodMI mi = {NULL, &miname##MethodTable_};                                           \
        (void)ctx_;                                                                                       \
        mbvar = brkr_;                                                                                    \
        hook;                                                                                             \
        CMSetStatus(rc_, CMPI_RC_OK);                                                                     \
        return &mi;                                                                                       \
    }

/** Functions: `pfx##PropertyCleanup`, `pfx##SetProperty`, `pfx##GetProperty`. */
#define CMPropertyMIStub(pfx, miname, mbvar, hook)                           \
    static CMPI_CONST_SINCE_210 CMPIPropertyMIFT miname##PropertyTable_ = {  \
        CMPICurrentVersion,   CMPICurrentVersion, "property" #miname,        \
        pfx##PropertyCleanup, pfx##SetProperty,   pfx##GetProperty};         \
    CMPI_EXTERN_C CMPI_EXPORT CMPIPropertyMI* miname##_Create_PropertyMI(    \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_);  \
    CMPI_EXTERN_C CMPI_EXPORT CMPIPropertyMI* miname##_Create_PropertyMI(    \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_) { \
        static CMPIPropertyMI mi = {NULL, &miname##PropertyTable_};          \
        (void)ctx_;                                                          \
        mbvar = brkr_;                                                       \
        hook;                                                                \
        CMSetStatus(rc_, CMPI_RC_OK);                                        \
        return &mi;                                                          \
    }

/** Functions: `pfx##IndicationCleanup`, `pfx##AuthorizeFilter`, `pfx##MustPoll`, `pfx##ActivateFilter`,
 * `pfx##DeActivateFilter`, `pfx##EnableIndications`, `pfx##DisableIndications`. */
#define CMIndicationMIStub(pfx, miname, mbvar, hook)                                                  \
    static CMPI_CONST_SINCE_210 CMPIIndicationMIFT miname##IndicationTable_ = {                       \
        CMPICurrentVersion,     CMPICurrentVersion,     "indication" #miname, pfx##IndicationCleanup, \
        pfx##AuthorizeFilter,   pfx##MustPoll,          pfx##ActivateFilter,  pfx##DeActivateFilter,  \
        pfx##EnableIndications, pfx##DisableIndications};                                             \
    CMPI_EXTERN_C CMPI_EXPORT CMPIIndicationMI* miname##_Create_IndicationMI(                         \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_);                           \
    CMPI_EXTERN_C CMPI_EXPORT CMPIIndicationMI* miname##_Create_IndicationMI(                         \
        const CMPIBroker* brkr_, const CMPIContext* ctx_, CMPIStatus* rc_) {                          \
        static CMPIIndicationMI mi = {NULL, &miname##IndicationTable_};                               \
        (void)ctx_;                                                                                   \
        mbvar = brkr_;                                                                                \
        hook;                                                                                         \
        CMSetStatus(rc_, CMPI_RC_OK);                                                                 \
        return &mi;                                                                                   \
    }
/** @} */

#ifdef __cplusplus

/**
 * @name Factories of a provider written as a class
 * The class `cn` is constructible from `(const CMPIBroker*, const CMPIContext*)`, and has a member function
 * for each function of the MI's table, with its name and its parameters after the first. All MIs of one name
 * share one object: it is made when the server calls the first factory and deleted when the last MI is
 * cleaned up. An exception that leaves the constructor or a member function reaches the server as
 * `CMPI_RC_ERR_FAILED`.
 *
 * @code
 * CMProviderBase(DemoPort)
 * CMInstanceMIFactory(DemoPortProvider, DemoPort)
 * CMMethodMIFactory(DemoPortProvider, DemoPort)
 * @endcode
 */
/** @{ */

extern "C++" { // a provider may include this header inside an extern "C" of its own

#include <mutex>

/** The object that all MIs of one name share. */
class CMPIProviderBase {
public:
    /** The provider object. */
    void* object() const { return object_; }

    /** The base that an MI record was made for. */
    template <class MI>
    static CMPIProviderBase& of(MI* mi) {
        return *static_cast<CMPIProviderBase*>(const_cast<void*>(static_cast<const void*>(mi->hdl)));
    }

    /** Counts one more MI and makes the object for the first; false, with a status, when that fails. */
    template <class Provider>
    bool acquire(const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* rc) {
        const std::lock_guard<std::mutex> lock(mutex_);
        CMSetStatus(rc, CMPI_RC_OK);
        if (object_ == nullptr) {
            try {
                object_ = new Provider(broker, context);
            } catch (...) {
                CMSetStatus(rc, CMPI_RC_ERR_FAILED);
                return false;
            }
            destroy_ = [](void* object) { delete static_cast<Provider*>(object); };
        }
        ++users_;
        return true;
    }

    /** Counts one MI less and deletes the object after the last. */
    template <class MI>
    static CMPIStatus release(MI* mi) {
        CMPIProviderBase& base = of(mi);
        const std::lock_guard<std::mutex> lock(base.mutex_);
        if (base.users_ > 0 && --base.users_ == 0) {
            base.destroy_(base.object_);
            base.object_ = nullptr;
        }
        CMReturn(CMPI_RC_OK);
    }

    /** Calls a member function; no exception leaves it. */
    template <class Function>
    static CMPIStatus guarded(Function function) {
        try {
            return function();
        } catch (...) {
            CMReturn(CMPI_RC_ERR_FAILED);
        }
    }

private:
    std::mutex mutex_;
    void* object_ = nullptr;
    unsigned int users_ = 0;
    void (*destroy_)(void*) = nullptr;
};

/* A function table that calls the member functions of `Provider`. */
template <class Provider, CMPIProviderBase& base>
struct CMPIInstanceAdapter {
    static CMPIStatus cleanup(CMPIInstanceMI* mi, const CMPIContext*, CMPIBoolean) {
        return CMPIProviderBase::release(mi);
    }
    static CMPIStatus enumerateInstanceNames(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                             const CMPIResult* rslt, const CMPIObjectPath* classPath) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->enumerateInstanceNames(ctx, rslt, classPath);
        });
    }
    static CMPIStatus enumerateInstances(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                         const CMPIObjectPath* classPath, const char** properties) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->enumerateInstances(ctx, rslt, classPath, properties);
        });
    }
    static CMPIStatus getInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                  const CMPIObjectPath* instPath, const char** properties) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->getInstance(ctx, rslt, instPath, properties);
        });
    }
    static CMPIStatus createInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                     const CMPIObjectPath* classPath, const CMPIInstance* inst) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->createInstance(ctx, rslt, classPath, inst);
        });
    }
    static CMPIStatus modifyInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                     const CMPIObjectPath* instPath, const CMPIInstance* modInst,
                                     const char** properties) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->modifyInstance(ctx, rslt, instPath, modInst, properties);
        });
    }
    static CMPIStatus deleteInstance(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                     const CMPIObjectPath* op) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())->deleteInstance(ctx, rslt, op);
        });
    }
    static CMPIStatus execQuery(CMPIInstanceMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                const CMPIObjectPath* classPath, const char* query, const char* lang) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->execQuery(ctx, rslt, classPath, query, lang);
        });
    }
    static CMPIInstanceMI* create(const char* name, const CMPIBroker* broker, const CMPIContext* context,
                                  CMPIStatus* rc) {
        static CMPI_CONST_SINCE_210 CMPIInstanceMIFT table = {CMPICurrentVersion,
                                                              CMPICurrentVersion,
                                                              name,
                                                              cleanup,
                                                              enumerateInstanceNames,
                                                              enumerateInstances,
                                                              getInstance,
                                                              createInstance,
                                                              modifyInstance,
                                                              deleteInstance,
                                                              execQuery CMPI_NO_FILTERED_INSTANCES};
        static CMPIInstanceMI mi = {&base, &table};
        return base.template acquire<Provider>(broker, context, rc) ? &mi : nullptr;
    }
};

/* A function table that calls the member functions of `Provider`. */
template <class Provider, CMPIProviderBase& base>
struct CMPIAssociationAdapter {
    static CMPIStatus cleanup(CMPIAssociationMI* mi, const CMPIContext*, CMPIBoolean) {
        return CMPIProviderBase::release(mi);
    }
    static CMPIStatus associators(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                  const CMPIObjectPath* instPath, const char* assocClass,
                                  const char* resultClass, const char* role, const char* resultRole,
                                  const char** properties) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->associators(ctx, rslt, instPath, assocClass, resultClass, role, resultRole, properties);
        });
    }
    static CMPIStatus associatorNames(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                      const CMPIObjectPath* instPath, const char* assocClass,
                                      const char* resultClass, const char* role, const char* resultRole) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->associatorNames(ctx, rslt, instPath, assocClass, resultClass, role, resultRole);
        });
    }
    static CMPIStatus references(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                 const CMPIObjectPath* instPath, const char* resultClass, const char* role,
                                 const char** properties) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->references(ctx, rslt, instPath, resultClass, role, properties);
        });
    }
    static CMPIStatus referenceNames(CMPIAssociationMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                     const CMPIObjectPath* instPath, const char* resultClass,
                                     const char* role) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->referenceNames(ctx, rslt, instPath, resultClass, role);
        });
    }
    static CMPIAssociationMI* create(const char* name, const CMPIBroker* broker, const CMPIContext* context,
                                     CMPIStatus* rc) {
        static CMPI_CONST_SINCE_210 CMPIAssociationMIFT table = {
            CMPICurrentVersion, CMPICurrentVersion, name,       cleanup,
            associators,        associatorNames,    references, referenceNames CMPI_NO_FILTERED_ASSOCIATIONS};
        static CMPIAssociationMI mi = {&base, &table};
        return base.template acquire<Provider>(broker, context, rc) ? &mi : nullptr;
    }
};

/* A function table that calls the member functions of `Provider`. */
template <class Provider, CMPIProviderBase& base>
struct CMPIMethodAdapter {
    static CMPIStatus cleanup(CMPIMethodMI* mi, const CMPIContext*, CMPIBoolean) {
        return CMPIProviderBase::release(mi);
    }
    static CMPIStatus invokeMethod(CMPIMethodMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                   const CMPIObjectPath* objPath, const char* method, const CMPIArgs* in,
                                   CMPIArgs* out) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->invokeMethod(ctx, rslt, objPath, method, in, out);
        });
    }
    static CMPIMethodMI* create(const char* name, const CMPIBroker* broker, const CMPIContext* context,
                                CMPIStatus* rc) {
        static CMPI_CONST_SINCE_210 CMPIMethodMIFT table = {CMPICurrentVersion, CMPICurrentVersion, name,
                                                            cleanup, invokeMethod};
        static CMPIMethodMI mi = {&base, &table};
        return base.template acquire<Provider>(broker, context, rc) ? &mi : nullptr;
    }
};

/* A function table that calls the member functions of `Provider`. */
template <class Provider, CMPIProviderBase& base>
struct CMPIPropertyAdapter {
    static CMPIStatus cleanup(CMPIPropertyMI* mi, const CMPIContext*, CMPIBoolean) {
        return CMPIProviderBase::release(mi);
    }
    static CMPIStatus setProperty(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                  const CMPIObjectPath* instPath, const char* name, const CMPIData data) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->setProperty(ctx, rslt, instPath, name, data);
        });
    }
    static CMPIStatus getProperty(CMPIPropertyMI* mi, const CMPIContext* ctx, const CMPIResult* rslt,
                                  const CMPIObjectPath* instPath, const char* name) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->getProperty(ctx, rslt, instPath, name);
        });
    }
    static CMPIPropertyMI* create(const char* name, const CMPIBroker* broker, const CMPIContext* context,
                                  CMPIStatus* rc) {
        static CMPI_CONST_SINCE_210 CMPIPropertyMIFT table = {
            CMPICurrentVersion, CMPICurrentVersion, name, cleanup, setProperty, getProperty};
        static CMPIPropertyMI mi = {&base, &table};
        return base.template acquire<Provider>(broker, context, rc) ? &mi : nullptr;
    }
};

/* A function table that calls the member functions of `Provider`. */
template <class Provider, CMPIProviderBase& base>
struct CMPIIndicationAdapter {
    static CMPIStatus cleanup(CMPIIndicationMI* mi, const CMPIContext*, CMPIBoolean) {
        return CMPIProviderBase::release(mi);
    }
    static CMPIStatus authorizeFilter(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                      const CMPISelectExp* filter, const char* className,
                                      const CMPIObjectPath* classPath, const char* owner) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->authorizeFilter(ctx, filter, className, classPath, owner);
        });
    }
    static CMPIStatus mustPoll(CMPIIndicationMI* mi, const CMPIContext* ctx, const CMPISelectExp* filter,
                               const char* className, const CMPIObjectPath* classPath) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->mustPoll(ctx, filter, className, classPath);
        });
    }
    static CMPIStatus activateFilter(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                     const CMPISelectExp* filter, const char* className,
                                     const CMPIObjectPath* classPath, CMPIBoolean firstActivation) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->activateFilter(ctx, filter, className, classPath, firstActivation);
        });
    }
    static CMPIStatus deActivateFilter(CMPIIndicationMI* mi, const CMPIContext* ctx,
                                       const CMPISelectExp* filter, const char* className,
                                       const CMPIObjectPath* classPath, CMPIBoolean lastActivation) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->deActivateFilter(ctx, filter, className, classPath, lastActivation);
        });
    }
    static CMPIStatus enableIndications(CMPIIndicationMI* mi, const CMPIContext* ctx) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())->enableIndications(ctx);
        });
    }
    static CMPIStatus disableIndications(CMPIIndicationMI* mi, const CMPIContext* ctx) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())->disableIndications(ctx);
        });
    }
    static CMPIIndicationMI* create(const char* name, const CMPIBroker* broker, const CMPIContext* context,
                                    CMPIStatus* rc) {
        static CMPI_CONST_SINCE_210 CMPIIndicationMIFT table = {
            CMPICurrentVersion, CMPICurrentVersion, name,           cleanup,
            authorizeFilter,    mustPoll,           activateFilter, deActivateFilter,
            enableIndications,  disableIndications};
        static CMPIIndicationMI mi = {&base, &table};
        return base.template acquire<Provider>(broker, context, rc) ? &mi : nullptr;
    }
};

} // extern "C++"

/** The object that the MIs named `miname` share; once for each name, before its factories. */
#define CMProviderBase(miname) static CMPIProviderBase cmpiProviderBase_##miname;

#define CMInstanceMIFactory(cn, miname)                                                               \
    extern "C" CMPI_EXPORT CMPIInstanceMI* miname##_Create_InstanceMI(                                \
        const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* rc) {                       \
        return CMPIInstanceAdapter<cn, cmpiProviderBase_##miname>::create("instance" #miname, broker, \
                                                                          context, rc);               \
    }

#define CMAssociationMIFactory(cn, miname)                                                                  \
    extern "C" CMPI_EXPORT CMPIAssociationMI* miname##_Create_AssociationMI(                                \
        const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* rc) {                             \
        return CMPIAssociationAdapter<cn, cmpiProviderBase_##miname>::create("association" #miname, broker, \
                                                                             context, rc);                  \
    }

#define CMMethodMIFactory(cn, miname)                                                                      \
    extern "C" CMPI_EXPORT CMPIMethodMI* miname##_Create_MethodMI(                                         \
        const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* rc) {                            \
        return CMPIMethodAdapter<cn, cmpiProviderBase_##miname>::create("method" #miname, broker, context, \
                                                                        rc);                               \
    }

#define CMPropertyMIFactory(cn, miname)                                                               \
    extern "C" CMPI_EXPORT CMPIPropertyMI* miname##_Create_PropertyMI(                                \
        const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* rc) {                       \
        return CMPIPropertyAdapter<cn, cmpiProviderBase_##miname>::create("property" #miname, broker, \
                                                                          context, rc);               \
    }

#define CMIndicationMIFactory(cn, miname)                                                                 \
    extern "C" CMPI_EXPORT CMPIIndicationMI* miname##_Create_IndicationMI(                                \
        const CMPIBroker* broker, const CMPIContext* context, CMPIStatus* rc) {                           \
        return CMPIIndicationAdapter<cn, cmpiProviderBase_##miname>::create("indication" #miname, broker, \
                                                                            context, rc);                 \
    }
/** @} */

#endif

#endif
