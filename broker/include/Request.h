/**
 * @file
 * A client's requests to the providers of a broker, and the replies.
 *
 * A request belongs to the thread that made it, and owns what the broker makes on that thread while it lives.
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>
#include <cmpift.h>

#include "TKExport.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace oxahv {

class EmbeddedBroker;

/** What one provider answered to a request. */
struct ProviderAnswer {
    std::string provider;     ///< its name in the broker
    CMPIrc code = CMPI_RC_OK; ///< the status's code
    std::string message;      ///< the status's text, empty if none
    std::size_t results = 0;  ///< how many instances or object paths of the reply are its own
};

/** What a request yielded: its status, and what the provider returned, in order. All of it dies with the
 * request. */
struct Reply {
    CMPIrc code = CMPI_RC_OK;                 ///< the status's code
    std::string message;                      ///< the status's text, empty if none
    std::vector<CMPIInstance*> instances;     ///< returned by returnInstance
    std::vector<CMPIObjectPath*> objectPaths; ///< returned by returnObjectPath
    std::vector<CMPIData> data;               ///< returned by returnData; a method's return value
    CMPIArgs* out = nullptr;                  ///< a method's output arguments
    bool done = false;                        ///< whether the provider called returnDone
    /** What the provider returned by returnError, all fields of it, in order. A status without a text that
     * follows an error leaves the error's text in `message`. */
    std::vector<CMPIError*> errors{};
    /** Of each provider that was asked, in order; the reply holds their results in the same order. */
    std::vector<ProviderAnswer> answers{};
    bool isServed = true; ///< whether there was a provider to ask, and not all of them refused the class
    /** Whether the code is `CMPI_RC_OK`. */
    bool ok() const { return code == CMPI_RC_OK; }
};

/** Gets an instance that a request yields. The instance, and what the handler makes in the broker on this
 * thread, are freed when it returns. Its calls of slots are not recorded, and no fault strikes them. What it
 * throws, the provider gets as `CMPI_RC_ERR_FAILED`. */
using InstanceHandler = std::function<void(const CMPIInstance* instance)>;
/** The same for an object path. */
using PathHandler = std::function<void(const CMPIObjectPath* path)>;

/** Filters of an association request; an empty text is no filter. */
struct AssociationFilter {
    std::string associationClass; ///< only by associations of this class; for references: not looked at
    std::string resultClass;      ///< only instances of this class; for references: of the association
    std::string role;             ///< only where the path is the value of this reference
    std::string resultRole;       ///< only what is the value of this reference; for references: not looked at
};

/**
 * A client's request, with its CMPI context. While it lives, it owns what the broker makes on this thread.
 * Requests nest: an upcall of a provider runs in the request that it serves.
 *
 * The operations find the provider by the class of the path, call its MI function, and collect what it
 * returns. Of several providers that serve the class, the next is asked where one refuses it
 * (`CMPI_RC_ERR_NOT_SUPPORTED`, `CMPI_RC_ERR_INVALID_CLASS`) without a result; providers that serve all
 * classes are asked where none names it. A request along associations goes to every provider whose
 * associations can reach the path's class, or to those of the association class that it names, and brings all
 * their results; an error of one is its error, but for a refusal or `CMPI_RC_ERR_NOT_FOUND` where another
 * succeeds. A provider that calls up comes last, and one that serves all classes never gets the call that it
 * is in once more. Requests nest at most 1,000 deep; a deeper one answers `CMPI_RC_ERR_FAILED`.
 *
 * The path is delivered as the broker's KeyMode and PathDelivery say. With declarations, an unknown class
 * answers `CMPI_RC_ERR_INVALID_CLASS`, a method that its class does not have `CMPI_RC_ERR_METHOD_NOT_FOUND`;
 * a class that no provider serves answers `CMPI_RC_ERR_NOT_SUPPORTED`. None of them throws, but for
 * `std::bad_alloc`.
 */
class TK_EXPORT Request {
public:
    /** Begins a request. @param broker has to outlive it. */
    explicit Request(EmbeddedBroker& broker);
    /** Frees what the broker made for the request. */
    ~Request();
    Request(const Request&) = delete;
    Request& operator=(const Request&) = delete;

    /** The request's context, as provider functions receive it. */
    const CMPIContext* context() const;

    /**
     * Sets an entry of the context from here on, such as the standard's `CMPIPrincipal` (who asks; empty at
     * first), `CMPIRole`, `CMPIAcceptLanguage` and `CMPIContentLanguage`. `CMPIInitNameSpace` is always the
     * namespace of an operation's path.
     * @param name the entry's name.
     * @param text its value, a `CMPI_string`.
     */
    void setContextEntry(const std::string& name, const std::string& text);
    /** Sets the context's `CMPIInvocationFlags` from here on. @param flags `CMPI_FLAG_…` bits; 0 at first. */
    void setInvocationFlags(CMPIFlags flags);

    /**
     * Tells how far the operations of this request have come, while they run.
     * @param handler called with the number of instances and object paths that the provider has returned so
     * far, after each of them and on the thread that returned it; null: nobody. It must not throw.
     */
    void setProgressHandler(std::function<void(std::size_t results)> handler);

    /**
     * Hands the results of the operations that follow to functions, in place of putting them into the reply:
     * each as soon as the provider returns it, on the thread that returned it; it is freed then. The reply
     * has the status and the rest.
     *
     * So memory does not grow with the number of results, even where the provider releases nothing: an
     * instance, object path, string, array or date/time that it made after its first result, and that it has
     * not used again in the meantime, is freed a thousand results later. Whoever uses it after that gets
     * `CMPI_RC_ERR_INVALID_HANDLE`. What the provider has looked into stays until the request ends.
     * @param instances gets the instances; null: they are in the reply.
     * @param paths gets the object paths; null: they are in the reply.
     */
    void setResultHandlers(InstanceHandler instances, PathHandler paths);

    /** A new object path, made through the broker's own slot; null when that refuses. */
    CMPIObjectPath* objectPath(const std::string& nameSpace, const std::string& className);
    /**
     * The object path of a text: `Class.Key="text",Number=3`, a namespace and a colon may stand before it,
     * before that a host as in `//host:5989/root/cimv2:Class`; `\"` and `\\` inside quotes. Numbers get
     * their declared type; without declaration unsigned ones are `CMPI_uint64`, ones with a sign
     * `CMPI_sint64`; `TRUE` and `FALSE` are booleans.
     * @param nameSpace the namespace of a text that names none.
     * @throws BrokerError naming the column (from 1) and what is wrong there.
     */
    CMPIObjectPath* objectPathFromText(const std::string& text, const std::string& nameSpace);
    /**
     * The value of a text, written as those in an object path are. A text, date/time, path or instance needs
     * no quotes, and is then taken as it is. An instance is written as in MOF,
     * `instance of Class { Name = value; ... }`.
     * @param type the type of the value, no array; `CMPI_null`: what it looks like, as in a path of an
     * undeclared class, a text when it is neither a number nor `TRUE` or `FALSE`.
     * @throws BrokerError naming the column (from 1) and what is wrong there.
     */
    CMPIData valueFromText(const std::string& text, CMPIType type);
    /** A copy of the path as a client's request would bring it to a provider: as the broker's KeyMode and
     * PathDelivery say. */
    CMPIObjectPath* deliver(const CMPIObjectPath* path);

    /** @name Operations of instances
     * @param classPath a path whose namespace and class count.
     * @param path names the instance.
     * @param properties the property list; null is none.
     */
    /** @{ */
    /** All instances of a class. */
    Reply enumerateInstances(const CMPIObjectPath* classPath,
                             const std::vector<std::string>* properties = nullptr);
    /** The paths of all instances of a class. */
    Reply enumerateInstanceNames(const CMPIObjectPath* classPath);
    /** One instance. */
    Reply getInstance(const CMPIObjectPath* path, const std::vector<std::string>* properties = nullptr);
    /** Makes an instance; the reply holds its path. */
    Reply createInstance(const CMPIObjectPath* classPath, const CMPIInstance* instance);
    /** Changes an instance, with a property list the listed properties alone. */
    Reply modifyInstance(const CMPIObjectPath* path, const CMPIInstance* instance,
                         const std::vector<std::string>* properties = nullptr);
    /** Deletes an instance. */
    Reply deleteInstance(const CMPIObjectPath* path);
    /** The instances that a query selects. Where the provider of the class does no queries
     * (`CMPI_RC_ERR_NOT_SUPPORTED`), the broker applies the query to all instances of the class that it
     * names: the WHERE clause, and of the select list what is no key. Its errors are those of `newSelectExp`,
     * with the place in the reply's message. */
    Reply execQuery(const CMPIObjectPath* classPath, const std::string& query, const std::string& language);
    /** @} */

    /** @name Operations of associations
     * @param path names the instance at one end.
     * @param filter which of the associations count.
     * @param properties the property list; null is none.
     */
    /** @{ */
    /** The instances at the other ends. */
    Reply associators(const CMPIObjectPath* path, const AssociationFilter& filter = {},
                      const std::vector<std::string>* properties = nullptr);
    /** The paths of the instances at the other ends. */
    Reply associatorNames(const CMPIObjectPath* path, const AssociationFilter& filter = {});
    /** The associations themselves. */
    Reply references(const CMPIObjectPath* path, const AssociationFilter& filter = {},
                     const std::vector<std::string>* properties = nullptr);
    /** The paths of the associations themselves. */
    Reply referenceNames(const CMPIObjectPath* path, const AssociationFilter& filter = {});
    /** @} */

    /** @name Operations of single properties
     * A property MI serves them. Where no provider of the class has one, or it answers
     * `CMPI_RC_ERR_NOT_SUPPORTED`, the property is read by getInstance or written by modifyInstance, with the
     * property alone in the property list. A property that the class does not declare answers
     * `CMPI_RC_ERR_NO_SUCH_PROPERTY`.
     * @param path names the instance.
     * @param name the property's name.
     */
    /** @{ */
    /** Reads a property; its value is in Reply::data. */
    Reply getProperty(const CMPIObjectPath* path, const std::string& name);
    /** Sets a property.
     * @param value its new value, such as valueFromText makes; of another type than is declared it answers
     * `CMPI_RC_ERR_TYPE_MISMATCH`. */
    Reply setProperty(const CMPIObjectPath* path, const std::string& name, const CMPIData& value);
    /** @} */

    /**
     * Calls a method.
     * @param path names the instance, or the class of a static method.
     * @param method the method's name.
     * @param in its input arguments.
     * @return the return value is in Reply::data, output arguments are in Reply::out.
     */
    Reply invokeMethod(const CMPIObjectPath* path, const std::string& method, const CMPIArgs* in);

private:
    class TK_HIDDEN Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace oxahv
