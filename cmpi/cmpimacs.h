/**
 * @file
 * CMPI's convenience names, and what defines a provider's factory functions.
 *
 * The names that call one slot each are in cmpicalls.h. Here are those that look into a value, set a status
 * or return from a function; they are macros always.
 */
#ifndef CMPIMACS_H
#define CMPIMACS_H

#include "cmpicalls.h"
#include "cmpift.h"

/** @name Looking at objects and values */
/** @{ */
#define CMIsNullObject(objptr) ((objptr) == NULL || *(void* CMPI_CONST_SINCE_210*)(objptr) == NULL)
#define CMIsNullValue(data) (((data).state & CMPI_nullValue) != 0)
#define CMIsKeyValue(data) (((data).state & CMPI_keyValue) != 0)
#define CMIsArray(data) (((data).type & CMPI_ARRAY) != 0)
/** @} */

/** A copy of any object, which belongs to the caller. */
#define CMClone(obj, rc) ((obj)->ft->clone((obj), (rc)))
/** Releases any object. */
#define CMRelease(obj) ((obj)->ft->release((obj)))

/** The text of a CMPIString, without a status. */
#define CMGetCharPtr(str) CMGetCharsPtr((str), NULL)

/** @name What the broker says of itself */
/** @{ */
#define CBGetCapabilities(mb) ((mb)->bft->brokerCapabilities) /**< bits `CMPI_MB_…` */
#define CBBrokerVersion(mb) ((mb)->bft->brokerVersion)
#define CBBrokerName(mb) ((mb)->bft->brokerName)
/** @} */

/**
 * @name Setting a status
 * The status is given by a pointer that may be null. The text is a CMPIString, or characters that the broker
 * makes one of; where it cannot, the status has no text.
 */
/** @{ */
#define CMSetStatus(st, rc_) CMSetStatusWithString(st, rc_, NULL)
#define CMSetStatusWithString(st, rc_, msg_) \
    do {                                     \
        CMPIStatus* cmpiStatus_ = (st);      \
        if (cmpiStatus_ != NULL) {           \
            cmpiStatus_->rc = (rc_);         \
            cmpiStatus_->msg = (msg_);       \
        }                                    \
    } while (0)
#define CMSetStatusWithChars(mb, st, rc_, msg_) \
    CMSetStatusWithString(st, rc_, CMNewString((mb), (msg_), NULL))
/** @} */

/** @name Returning a status from a provider function */
/** @{ */
#define CMReturn(rc) CMReturnWithString(rc, NULL)
#define CMReturnWithString(rc, str)             \
    do {                                        \
        CMPIStatus cmpiStatus_ = {(rc), (str)}; \
        return cmpiStatus_;                     \
    } while (0)
#define CMReturnWithChars(mb, rc, chars) CMReturnWithString(rc, CMNewString((mb), (chars), NULL))
/** @} */

/**
 * @name Messages with insertions
 * The last argument of CMGetMessage and CMGetMessage2 is `CMFmtArgsN`, with N insertions `CMFmt…`:
 * @code
 * CMGetMessage(broker, "id", "{0} of {1}", NULL, CMFmtArgs2(CMFmtUint(3), CMFmtChars("four")))
 * @endcode
 * Each insertion is a type and a value, in the width that a broker reads from a variable argument list.
 */
/** @{ */
#define CMGetMessage(mb, msgId, defMsg, rc, args) ((mb)->eft->getMessage((mb), (msgId), (defMsg), (rc), args))
#if CMPI_VERSION >= 200
#define CMGetMessage2(mb, msgId, msgFileHandle, defMsg, rc, args) \
    ((mb)->eft->getMessage2((mb), (msgId), (msgFileHandle), (defMsg), (rc), args))
#endif
#define CMFmtSint(v) CMPI_sint32, ((long)(v))
#define CMFmtUint(v) CMPI_uint32, ((unsigned long)(v))
#define CMFmtSint64(v) CMPI_sint64, ((long long)(v))
#define CMFmtUint64(v) CMPI_uint64, ((unsigned long long)(v))
#define CMFmtReal(v) CMPI_real64, ((double)(v))
#define CMFmtBoolean(v) CMPI_boolean, ((int)(v))
#define CMFmtChars(v) CMPI_chars, ((const char*)(v))
#define CMFmtString(v) CMPI_string, ((const CMPIString*)(v))
#define CMFmtArgs0() 0
#define CMFmtArgs1(v1) 1, v1
#define CMFmtArgs2(v1, v2) 2, v1, v2
#define CMFmtArgs3(v1, v2, v3) 3, v1, v2, v3
#define CMFmtArgs4(v1, v2, v3, v4) 4, v1, v2, v3, v4
#define CMFmtArgs5(v1, v2, v3, v4, v5) 5, v1, v2, v3, v4, v5
#define CMFmtArgs6(v1, v2, v3, v4, v5, v6) 6, v1, v2, v3, v4, v5, v6
#define CMFmtArgs7(v1, v2, v3, v4, v5, v6, v7) 7, v1, v2, v3, v4, v5, v6, v7
#define CMFmtArgs8(v1, v2, v3, v4, v5, v6, v7, v8) 8, v1, v2, v3, v4, v5, v6, v7, v8
#define CMFmtArgs9(v1, v2, v3, v4, v5, v6, v7, v8, v9) 9, v1, v2, v3, v4, v5, v6, v7, v8, v9
#define CMFmtArgs10(v1, v2, v3, v4, v5, v6, v7, v8, v9, v10) 10, v1, v2, v3, v4, v5, v6, v7, v8, v9, v10
/** @} */

/* The slots of later versions that a provider need not have. They are there and null, since a CIM server of
 * that version reads them. */
#if CMPI_VERSION >= 200
#define CMPI_NO_PROPERTY_ORIGIN , NULL
#else
#define CMPI_NO_PROPERTY_ORIGIN
#endif
#if CMPI_VERSION >= 210
#define CMPI_NO_FILTERED_INSTANCES , NULL
#define CMPI_NO_FILTERED_ASSOCIATIONS , NULL, NULL
#define CMPI_NO_FILTER_COLLECTIONS , NULL, NULL, NULL
#else
#define CMPI_NO_FILTERED_INSTANCES
#define CMPI_NO_FILTERED_ASSOCIATIONS
#define CMPI_NO_FILTER_COLLECTIONS
#endif

/**
 * @name Factories of a provider written as functions
 * Each defines the factory function of the MI `miname` for the functions of its kind, whose names begin with
 * `pfx`. `mbvar` is the variable that keeps the broker, `hook` a statement that is run when the CIM server
 * calls the factory; it may be empty. It can use the factory's `brkr`, `ctx` and `rc`, and the record `mi`.
 */
/** @{ */

/** A `hook` that does nothing. */
#define CMNoHook
/** A `hook` that calls the provider's function `pfx##mitype##Initialize(&mi, ctx, rc)`; `mitype` is
 * `Instance`, `Association`, `Method`, `Property` or `Indication`. */
#define CMInitHook(pfx, mitype) pfx##mitype##Initialize(&mi, ctx, rc)

/** Functions: `pfx##Cleanup`, `pfx##EnumInstanceNames`, `pfx##EnumInstances`, `pfx##GetInstance`,
 * `pfx##CreateInstance`, `pfx##ModifyInstance`, `pfx##DeleteInstance`, `pfx##ExecQuery`. */
#define CMInstanceMIStub(pfx, miname, mbvar, hook)                          \
    static CMPI_CONST_SINCE_210 CMPIInstanceMIFT miname##InstanceTable_ = { \
        CMPICurrentVersion,                                                 \
        CMPICurrentVersion,                                                 \
        "instance" #miname,                                                 \
        pfx##Cleanup,                                                       \
        pfx##EnumInstanceNames,                                             \
        pfx##EnumInstances,                                                 \
        pfx##GetInstance,                                                   \
        pfx##CreateInstance,                                                \
        pfx##ModifyInstance,                                                \
        pfx##DeleteInstance,                                                \
        pfx##ExecQuery CMPI_NO_FILTERED_INSTANCES};                         \
    CMPI_EXTERN_C CMPI_EXPORT CMPIInstanceMI* miname##_Create_InstanceMI(   \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc);    \
    CMPI_EXTERN_C CMPI_EXPORT CMPIInstanceMI* miname##_Create_InstanceMI(   \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc) {   \
        static CMPIInstanceMI mi = {NULL, &miname##InstanceTable_};         \
        (void)ctx;                                                          \
        mbvar = brkr;                                                       \
        CMSetStatus(rc, CMPI_RC_OK);                                        \
        hook;                                                               \
        return &mi;                                                         \
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
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc);           \
    CMPI_EXTERN_C CMPI_EXPORT CMPIAssociationMI* miname##_Create_AssociationMI(    \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc) {          \
        static CMPIAssociationMI mi = {NULL, &miname##AssociationTable_};          \
        (void)ctx;                                                                 \
        mbvar = brkr;                                                              \
        CMSetStatus(rc, CMPI_RC_OK);                                               \
        hook;                                                                      \
        return &mi;                                                                \
    }

/** Functions: `pfx##MethodCleanup`, `pfx##InvokeMethod`. */
#define CMMethodMIStub(pfx, miname, mbvar, hook)                                                          \
    static CMPI_CONST_SINCE_210 CMPIMethodMIFT miname##MethodTable_ = {                                   \
        CMPICurrentVersion, CMPICurrentVersion, "method" #miname, pfx##MethodCleanup, pfx##InvokeMethod}; \
    CMPI_EXTERN_C CMPI_EXPORT CMPIMethodMI* miname##_Create_MethodMI(                                     \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc);                                  \
    CMPI_EXTERN_C CMPI_EXPORT CMPIMethodMI* miname##_Create_MethodMI(                                     \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc) {                                 \
        static CMPIMethodMI mi = {NULL, &miname##MethodTable_};                                           \
        (void)ctx;                                                                                        \
        mbvar = brkr;                                                                                     \
        CMSetStatus(rc, CMPI_RC_OK);                                                                      \
        hook;                                                                                             \
        return &mi;                                                                                       \
    }

/** Functions: `pfx##PropertyCleanup`, `pfx##SetProperty`, `pfx##GetProperty`. */
#define CMPropertyMIStub(pfx, miname, mbvar, hook)                                           \
    static CMPI_CONST_SINCE_210 CMPIPropertyMIFT miname##PropertyTable_ = {                  \
        CMPICurrentVersion,   CMPICurrentVersion, "property" #miname,                        \
        pfx##PropertyCleanup, pfx##SetProperty,   pfx##GetProperty CMPI_NO_PROPERTY_ORIGIN}; \
    CMPI_EXTERN_C CMPI_EXPORT CMPIPropertyMI* miname##_Create_PropertyMI(                    \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc);                     \
    CMPI_EXTERN_C CMPI_EXPORT CMPIPropertyMI* miname##_Create_PropertyMI(                    \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc) {                    \
        static CMPIPropertyMI mi = {NULL, &miname##PropertyTable_};                          \
        (void)ctx;                                                                           \
        mbvar = brkr;                                                                        \
        CMSetStatus(rc, CMPI_RC_OK);                                                         \
        hook;                                                                                \
        return &mi;                                                                          \
    }

/** Functions: `pfx##IndicationCleanup`, `pfx##AuthorizeFilter`, `pfx##MustPoll`, `pfx##ActivateFilter`,
 * `pfx##DeActivateFilter`, `pfx##EnableIndications`, `pfx##DisableIndications`. */
#define CMIndicationMIStub(pfx, miname, mbvar, hook)                                 \
    static CMPI_CONST_SINCE_210 CMPIIndicationMIFT miname##IndicationTable_ = {      \
        CMPICurrentVersion,     CMPICurrentVersion,                                  \
        "indication" #miname,   pfx##IndicationCleanup,                              \
        pfx##AuthorizeFilter,   pfx##MustPoll,                                       \
        pfx##ActivateFilter,    pfx##DeActivateFilter,                               \
        pfx##EnableIndications, pfx##DisableIndications CMPI_NO_FILTER_COLLECTIONS}; \
    CMPI_EXTERN_C CMPI_EXPORT CMPIIndicationMI* miname##_Create_IndicationMI(        \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc);             \
    CMPI_EXTERN_C CMPI_EXPORT CMPIIndicationMI* miname##_Create_IndicationMI(        \
        const CMPIBroker* brkr, const CMPIContext* ctx, CMPIStatus* rc) {            \
        static CMPIIndicationMI mi = {NULL, &miname##IndicationTable_};              \
        (void)ctx;                                                                   \
        mbvar = brkr;                                                                \
        CMSetStatus(rc, CMPI_RC_OK);                                                 \
        hook;                                                                        \
        return &mi;                                                                  \
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
        static CMPI_CONST_SINCE_210 CMPIPropertyMIFT table = {CMPICurrentVersion,
                                                              CMPICurrentVersion,
                                                              name,
                                                              cleanup,
                                                              setProperty,
                                                              getProperty CMPI_NO_PROPERTY_ORIGIN};
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
                                       const CMPIObjectPath* classPath, CMPIBoolean lastDeActivation) {
        return CMPIProviderBase::guarded([&] {
            return static_cast<Provider*>(CMPIProviderBase::of(mi).object())
                ->deActivateFilter(ctx, filter, className, classPath, lastDeActivation);
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
            CMPICurrentVersion,
            CMPICurrentVersion,
            name,
            cleanup,
            authorizeFilter,
            mustPoll,
            activateFilter,
            deActivateFilter,
            enableIndications,
            disableIndications CMPI_NO_FILTER_COLLECTIONS};
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
