/**
 * @file
 * A CIM server's CMPI broker inside one process: for unit tests of providers, for demonstrations, and for
 * trying a provider by hand.
 *
 * A test needs three objects: an oxahv::EmbeddedBroker, a provider hosted in it, and an oxahv::Request per
 * request that a client would make.
 *
 * @code
 * oxahv::EmbeddedBroker broker;
 * broker.compileMof("DemoPort.mof");
 * broker.load("./libDemoPort.so", "DemoPort");
 *
 * oxahv::Request request(broker);
 * oxahv::Reply reply = request.enumerateInstances(request.objectPath("root/cimv2", "Demo_Port"));
 * for (CMPIInstance* port : reply.instances) { ... }
 * @endcode
 *
 * **Threads.** Setting a broker up (declare, host, load, unload) and putting faults or modes on it may be
 * done from any thread, also while requests run. A Request belongs to the thread that made it. Requests on
 * different threads run at the same time.
 *
 * **Ownership.** Every CMPI object that the broker makes belongs to the request that is current on the
 * calling thread, the innermost Request alive there; without one, to the broker itself. It dies with its
 * owner, unless the caller released it before. What a `clone` slot or `prepareAttachThread` returned belongs
 * to its caller, who releases it with its `release` slot; what is left then dies with the broker. A part of
 * an object, such as a property's string, dies with the object, or earlier when another value takes its place
 * or a filter removes it; its release does nothing. An object may be used after its release by nobody. A
 * memory mark frees what the current owner has got since.
 *
 * **Encoding.** All texts are UTF-8; a CMPIString keeps its bytes as they came.
 *
 * **Conduct.** All slots of all function tables are filled. A slot that gets a null handle or one that is not
 * of its kind answers `CMPI_RC_ERR_INVALID_HANDLE`; what a broker without a repository cannot do answers
 * `CMPI_RC_ERR_NOT_SUPPORTED`. No slot throws.
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include "TKExport.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <variant>
#include <vector>

namespace oxahv {

/** What hosting, loading, class declarations and path texts throw; `what()` is one line for a person. */
class TK_EXPORT BrokerError : public std::runtime_error {
public:
    /** An error with a message. @param message the line; copied. */
    explicit BrokerError(const std::string& message);
    /** Copies the message. */
    BrokerError(const BrokerError&) = default;
    /** Copies the message. */
    BrokerError& operator=(const BrokerError&) = default;
    ~BrokerError() override;
};

/** One plain value in a declaration: an unsigned integer (a `char16` too) or one with a sign, as its type
 * says; a text, date/time or reference as text in UTF-8; the first alternative is a NULL. */
using PlainValue = std::variant<std::monostate, bool, unsigned long long, long long, double, std::string>;

/** A value in a declaration: a property's default, or a qualifier's. */
struct DeclaredValue {
    CMPIType type = CMPI_null; ///< with `CMPI_ARRAY` for arrays; `CMPI_null`: there is no value
    bool isNull = true;        ///< whether the value is NULL
    /** One of a single value, any number of an array, none where the value is NULL. */
    std::vector<PlainValue> elements;
};

/** A qualifier of a class, property, method or parameter. */
struct QualifierDeclaration {
    std::string name;          ///< as declared
    DeclaredValue value;       ///< TRUE where MOF gives none
    bool isOverridable = true; ///< flavour EnableOverride; kept only, no override is refused
    bool reachesSubclass =
        true; ///< flavour ToSubclass; without it only the declaring class has the qualifier
    bool isTranslatable = false; ///< flavour Translatable
};

/** The qualifiers of one element, in order. A constant list: copies share it. */
class TK_EXPORT Qualifiers {
public:
    /** None. */
    Qualifiers() = default;
    /** A list. @param list each name stands in it once. */
    explicit Qualifiers(std::vector<QualifierDeclaration> list);

    /** The qualifier of a name, in any case; null when there is none. Valid as long as a copy of the list. */
    const QualifierDeclaration* find(std::string_view name) const;
    /** Whether the qualifier is there and TRUE. */
    bool isTrue(std::string_view name) const;
    /** These, and behind them those of `inherited` that reach subclasses and are not set here. */
    Qualifiers over(const Qualifiers& inherited) const;
    /** All of them. */
    const std::vector<QualifierDeclaration>& list() const;

private:
    std::shared_ptr<const std::vector<QualifierDeclaration>> list_;
};

/** One property of a class. */
struct PropertyDeclaration {
    std::string name;             ///< as declared
    CMPIType type = CMPI_null;    ///< with `CMPI_ARRAY` for arrays; `CMPI_ref` for references
    bool isKey = false;           ///< whether it names instances
    std::string referenceClass{}; ///< of a reference: the class that it leads to; empty if none is said
    DeclaredValue defaultValue{}; ///< of type `CMPI_null` when none is declared; a new instance's properties
                                  ///< are NULL all the same
    Qualifiers qualifiers{};      ///< its own
};

/** One parameter of a method. */
struct ParameterDeclaration {
    std::string name;             ///< as declared
    CMPIType type = CMPI_null;    ///< with `CMPI_ARRAY` for arrays; `CMPI_ref` for references
    std::string referenceClass{}; ///< of a reference: the class that it leads to; empty if none is said
    bool isIn = true;             ///< a qualifier In decides, where there is one
    bool isOut = false;           ///< a qualifier Out decides, where there is one
    Qualifiers qualifiers{};      ///< its own
};

/** One method of a class. */
struct MethodDeclaration {
    std::string name;                               ///< as declared
    CMPIType returnType = CMPI_null;                ///< `CMPI_ref` for references
    std::vector<ParameterDeclaration> parameters{}; ///< in order
    std::string returnClass{};                      ///< of a reference: the class that it leads to
    Qualifiers qualifiers{};                        ///< its own

    /** The parameter of a name, in any case; null when there is none. */
    TK_EXPORT const ParameterDeclaration* find(std::string_view parameter) const;
};

/**
 * The declaration of one CIM class, built in one expression. Names compare ignoring the case of ASCII
 * letters.
 *
 * @code
 * ClassDeclaration("Demo_Port").superclass("CIM_NetworkPort").key("Name", CMPI_string).property("Speed",
 * CMPI_uint64).method("SetSpeed", CMPI_uint32, {{"Speed", CMPI_uint64}})
 * @endcode
 */
class TK_EXPORT ClassDeclaration {
public:
    /** A class without superclass, properties and methods. @param name its name; not empty. */
    explicit ClassDeclaration(std::string name);

    /** Names the superclass, which must be declared before this class is. */
    ClassDeclaration& superclass(std::string name);
    /** Makes it an association, by the qualifier Association. */
    ClassDeclaration& association();
    /** Makes it abstract, by the qualifier Abstract. */
    ClassDeclaration& abstract();
    /** Adds a qualifier to the class. */
    ClassDeclaration& qualifier(QualifierDeclaration qualifier);
    /** Gives the class these qualifiers, in place of those that it has. */
    ClassDeclaration& qualifiers(Qualifiers list);
    /** Adds a key property, with the qualifier Key. */
    ClassDeclaration& key(std::string name, CMPIType type);
    /** Adds a property that is no key. */
    ClassDeclaration& property(std::string name, CMPIType type);
    /** Adds a property with all that can be said of it; a qualifier Key that is TRUE makes it a key too. */
    ClassDeclaration& property(PropertyDeclaration property);
    /** Adds a reference to instances of a class, which need not be declared. References are keys of most
     * associations: `key(name, CMPI_ref)` adds one of those. */
    ClassDeclaration& reference(std::string name, std::string className);
    /** Adds a method. */
    ClassDeclaration& method(std::string name, CMPIType returnType,
                             std::vector<ParameterDeclaration> parameters = {});
    /** Adds a method with all that can be said of it. */
    ClassDeclaration& method(MethodDeclaration method);

    /** The class's name. */
    const std::string& name() const { return name_; }
    /** The superclass's name; empty when it has none. */
    const std::string& superclass() const { return superclass_; }
    /** Whether the class itself says that it is an association. */
    bool isAssociation() const;
    /** Whether the class is abstract. */
    bool isAbstract() const;
    /** The class's own qualifiers. */
    const Qualifiers& qualifiers() const { return qualifiers_; }
    /** The class's own properties, in the order in which they were added. */
    const std::vector<PropertyDeclaration>& properties() const { return properties_; }
    /** The class's own methods, in the order in which they were added. */
    const std::vector<MethodDeclaration>& methods() const { return methods_; }

private:
    std::string name_;
    std::string superclass_;
    Qualifiers qualifiers_;
    std::vector<PropertyDeclaration> properties_;
    std::vector<MethodDeclaration> methods_;
};

/** How the keys of a request's object path reach the provider. CIM servers differ in it. */
enum class KeyMode {
    exact,          ///< with the type that they were given or that their class declares
    untyped,        ///< unsigned integers as `CMPI_uint64`, signed ones as `CMPI_sint64`
    chars,          ///< texts as `CMPI_chars` instead of `CMPI_string`
    signedIntegers, ///< all integers as `CMPI_keyInteger`, that is `CMPI_sint64`; a `CMPI_uint64` that does
                    ///< not fit keeps its bits
    text            ///< integers as decimal texts, `CMPI_string`, for a client that quotes a number
};

/** What a new instance holds. CIM servers differ in it. */
enum class NewInstances {
    full, ///< the keys of its path as properties
    bare  ///< its path alone; every property is NULL until the provider sets it
};

/** What else of a request's object path differs from server to server, and from client to client. */
struct PathDelivery {
    bool reversesKeys = false; ///< keys come last first
    bool changesCase = false;  ///< names of keys come with their capital letters small and the others capital
    std::string hostName{};    ///< the host of the path and of those among its keys; empty: as it was given
};

/** What goes wrong at a slot. The parts can be combined. */
struct Fault {
    /** The status that the call reports instead of doing its work; `CMPI_RC_OK` leaves it to the real call.
     */
    CMPIrc code = CMPI_RC_ERR_FAILED;
    /** With `code` `CMPI_RC_OK`: the call yields a null object, string or handle with an OK status; a call
     * that yields none of these is left out, and OK, 0 or false comes of it. */
    bool yieldsNull = false;
    /** Added to the state of the CMPIData that the call returns. */
    CMPIValueState stateBits = 0;
    /** The first call that it strikes, 1 being the next one. */
    unsigned int firstCall = 1;
    /** How many calls it strikes from there on; 0 means all. */
    unsigned int calls = 1;
};

/** One call of a slot, as it was recorded. */
struct Call {
    std::string slot;             ///< table and member, for example "CMPIInstanceFT.setProperty"
    const void* object = nullptr; ///< the handle that the slot was called on
    std::string name;             ///< the first text argument, mostly the name of something; empty if none
    std::string secondName;       ///< the second text argument; empty if none
    CMPICount index = 0;          ///< the index or size argument
    CMPIType type = CMPI_null;    ///< the type argument
    CMPIValue value = {};         ///< the value argument; of `CMPI_chars` the caller's own pointer
    bool hasStatus = false;       ///< whether the caller passed a status, or the slot returns one
    CMPIStatus entryStatus = {CMPI_RC_OK,
                              nullptr}; ///< the status that the caller passed, as it was before the call
    CMPIrc code = CMPI_RC_OK;           ///< the code that the call reported
    std::thread::id thread;             ///< the calling thread
};

/** How many objects of each kind are alive in a broker. */
struct LiveObjects {
    std::size_t instances = 0;    ///< `CMPIInstance`
    std::size_t objectPaths = 0;  ///< `CMPIObjectPath`
    std::size_t arguments = 0;    ///< `CMPIArgs`
    std::size_t strings = 0;      ///< `CMPIString`
    std::size_t arrays = 0;       ///< `CMPIArray`
    std::size_t dateTimes = 0;    ///< `CMPIDateTime`
    std::size_t enumerations = 0; ///< `CMPIEnumeration`
    std::size_t contexts = 0;     ///< `CMPIContext`
    std::size_t results = 0;      ///< `CMPIResult`
    std::size_t others = 0;       ///< errors, property lists, memory marks

    /** All of them. */
    std::size_t total() const {
        return instances + objectPaths + arguments + strings + arrays + dateTimes + enumerations + contexts +
               results + others;
    }
};

/** The MI factory functions of a provider that is linked into the program; a kind that it lacks stays null.
 */
struct ProviderFactories {
    /** `NAME_Create_InstanceMI`. */
    CMPIInstanceMI* (*instance)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
    /** `NAME_Create_AssociationMI`. */
    CMPIAssociationMI* (*association)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
    /** `NAME_Create_MethodMI`. */
    CMPIMethodMI* (*method)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
};

/** A broker message or trace that a provider wrote through the broker's `logMessage` and `trace` slots. */
struct BrokerMessage {
    bool isTrace = false;    ///< written by `trace`; else by `logMessage`
    int severityOrLevel = 0; ///< a `CMPILevel` of a trace, else a `CMPISeverity`
    std::string component;   ///< the id or component argument
    std::string text;        ///< the text
};

class Request;

/** The broker. The top of EmbeddedBroker.h tells how to use it. */
class TK_EXPORT EmbeddedBroker {
public:
    /** A broker without classes and providers. */
    EmbeddedBroker();
    /** Calls `cleanup` of every hosted provider, unloads the loaded ones, and frees every object that is
     * left. */
    ~EmbeddedBroker();
    EmbeddedBroker(const EmbeddedBroker&) = delete;
    EmbeddedBroker& operator=(const EmbeddedBroker&) = delete;

    /** The CMPI handle; valid as long as this object. */
    const CMPIBroker* handle() const;

    /** @name Classes */
    /** @{ */
    /**
     * Declares a class. As soon as one class is declared, the class of a request and of a new instance,
     * properties and keys with their types, methods and their input arguments are checked against the
     * declarations; without any the broker takes what comes. A path alone may name a class that is not
     * declared, since a reference may lead to one.
     * @throws BrokerError when the superclass is not declared, the class already is, a property or method
     * stands twice, or an inherited one is redeclared with another type.
     */
    void declare(const ClassDeclaration& declaration);
    /**
     * Declares the classes of a MOF file, as DSP0004 (versions 2.x) defines the language: all of them, or
     * none when there is an error. Several files may follow one another; qualifier types that one declares
     * hold for the next.
     *
     * Of the pragmas, `include` is followed, relative to the file that it stands in; the others and instances
     * are passed over. Superclasses must be declared before; classes that references lead to need not be
     * declared. A qualifier without a declared type is taken with the type that its value has.
     * @param file path of a regular file, at most 256 MiB with all that it includes.
     * @throws BrokerError whose text is `file:line:column: message`, lines and characters counted from 1, for
     * the first error; one of reading an included file stands where its pragma does.
     */
    void compileMof(const std::string& file);
    /**
     * The same for a text.
     * @param text UTF-8, with or without a byte order mark.
     * @param name what errors call the text; files that it includes are looked for beside a file of that
     * name.
     */
    void compileMofText(const std::string& text, const std::string& name);
    /** Whether any class is declared. */
    bool hasDeclarations() const;
    /** Whether the class is declared. */
    bool isDeclared(const std::string& className) const;
    /** The names of all declared classes, in the order of their letters. */
    std::vector<std::string> declaredClasses() const;
    /** All properties of a declared class, inherited ones first; empty for one that is not declared. */
    std::vector<PropertyDeclaration> propertiesOf(const std::string& className) const;
    /** All methods of a declared class, inherited ones first; empty for one that is not declared. */
    std::vector<MethodDeclaration> methodsOf(const std::string& className) const;
    /** The qualifiers of a declared class, own ones first; none for one that is not declared. */
    Qualifiers qualifiersOf(const std::string& className) const;
    /** Whether the class is declared, and is an association or derives from one. */
    bool isAssociation(const std::string& className) const;
    /** Whether the class is declared, and is abstract. */
    bool isAbstract(const std::string& className) const;
    /** Whether `className` is `ancestor` or derives from it, by the declarations. */
    bool isA(const std::string& className, const std::string& ancestor) const;
    /** @} */

    /** @name Providers */
    /** @{ */
    /**
     * Hosts a provider that is linked into the program: calls its factories at once.
     * @param name the MI name, unique in this broker.
     * @param classes the classes that it serves, with the classes derived from them; empty: all.
     * @throws BrokerError when the name is taken, no factory is given, or a factory fails (with its CMPI
     * code's name).
     */
    void host(const std::string& name, const ProviderFactories& factories,
              std::vector<std::string> classes = {});
    /**
     * Loads a provider library and hosts the provider `name` in it, by the factory functions
     * `NAME_Create_InstanceMI`, `NAME_Create_AssociationMI` and `NAME_Create_MethodMI`, or the
     * `_Generic_Create_…` ones.
     * @param file path of the library, as `dlopen` takes it.
     * @throws BrokerError when the library cannot be loaded, has none of the factories, or a factory fails.
     */
    void load(const std::string& file, const std::string& name, std::vector<std::string> classes = {});
    /**
     * Gives providers an entry of their contexts, as a CIM server's configuration would: it stands in the
     * context of every factory call and every request that begins from now on.
     * @param name the entry's name; one that begins with "CMPI" is the standard's.
     * @param text its value, a `CMPI_string`; takes the place of an earlier one.
     */
    void setContextEntry(const std::string& name, const std::string& text);
    /**
     * Calls the provider's `cleanup` as at a server's end, waits for requests that are inside it, and unloads
     * its library, whatever `cleanup` answers. Not to be called from a request that is inside it.
     * @throws BrokerError when no such provider is hosted.
     */
    void unload(const std::string& name);
    /** @} */

    /** @name Tests: modes, faults, records */
    /** @{ */
    /** How the keys of request paths reach providers from now on. */
    void setKeyMode(KeyMode mode);
    /** What instances hold that are made from now on. */
    void setNewInstances(NewInstances mode);
    /** What else becomes of request paths from now on. */
    void setPathDelivery(PathDelivery delivery);
    /**
     * Makes a slot fail. Several faults at one slot count the same calls.
     * @param slot table and member, as "CMPIObjectPathFT.getKeyAt", or the member alone where only one table
     * has it; "*" is any slot, and counts the calls of all of them together.
     * @throws BrokerError when there is no such slot, or the member alone is in several tables.
     */
    void injectFault(const std::string& slot, const Fault& fault);
    /** Takes all faults away and sets the calls' counts back. */
    void clearFaults();
    /** The names of all slots that faults can be injected into, as "Table.member". */
    static std::vector<std::string> slotNames();
    /** Starts a fresh record of calls. Recording is off at first. */
    void startRecording();
    /** Ends recording and returns the calls in order. */
    std::vector<Call> stopRecording();
    /** Counts of the objects that are alive now. */
    LiveObjects liveObjects() const;
    /**
     * Receives the name of the class whenever an upcall finds no provider. The upcall is answered as a CIM
     * server does: an empty enumeration, `CMPI_RC_ERR_NOT_FOUND`, `CMPI_RC_ERR_METHOD_NOT_AVAILABLE`, else
     * `CMPI_RC_ERR_NOT_SUPPORTED`.
     * @param handler called on the provider's thread, by several at once; null: nobody. The earlier one is
     * called no more when this returns. A handler must not set another.
     */
    void setUnservedHandler(std::function<void(const std::string& className)> handler);
    /** Receives what providers write through the `logMessage` and `trace` slots; null: dropped. Called on
     * their threads, by several at once; the earlier handler is called no more when this returns. A handler
     * must not set another. */
    void setMessageHandler(std::function<void(const BrokerMessage&)> handler);
    /** @} */

    /** The implementation; named here for its own sources only. */
    class TK_HIDDEN Impl;
    /** For its own sources too. */
    Impl& impl() { return *impl_; }

private:
    std::unique_ptr<Impl> impl_;
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
    bool isServed = true; ///< whether there was a provider to ask, and not all of them refused the class
    /** Whether the code is `CMPI_RC_OK`. */
    bool ok() const { return code == CMPI_RC_OK; }
};

/** Filters of an association request; an empty text is no filter. */
struct AssociationFilter {
    std::string associationClass; ///< only by associations of this class; for references: not looked at
    std::string resultClass;      ///< only instances of this class; for references: of the association
    std::string role;             ///< only where the path is the value of this reference
    std::string resultRole;       ///< only what is the value of this reference; for references: not looked at
};

/**
 * A client's request, with its CMPI context. While it lives, it owns what the broker makes on this thread.
 * Requests nest: an upcall of a provider runs in the request that it serves. Of one that fails the provider
 * gets the code without the message.
 *
 * The operations find the provider by the class of the path, call its MI function, and collect what it
 * returns. Each asks the first provider that serves the class; of several with associations, a request names
 * the association class of the one that it means. Of providers that serve all classes, the next is asked
 * where one refuses the class (`CMPI_RC_ERR_NOT_SUPPORTED`, `CMPI_RC_ERR_INVALID_CLASS`) without a result;
 * one that calls up comes last, and never gets the call that it is in once more. The path is delivered as the
 * broker's KeyMode and PathDelivery say. With declarations, an unknown class answers
 * `CMPI_RC_ERR_INVALID_CLASS`, a method that its class does not have `CMPI_RC_ERR_METHOD_NOT_FOUND`; a class
 * that no provider serves answers `CMPI_RC_ERR_NOT_SUPPORTED`. None of them throws, but for `std::bad_alloc`.
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
     * Tells how far the operations of this request have come, while they run.
     * @param handler called with the number of instances and object paths that the provider has returned so
     * far, after each of them and on the thread that returned it; null: nobody. It must not throw.
     */
    void setProgressHandler(std::function<void(std::size_t results)> handler);

    /** A new object path, made through the broker's own slot; null when that refuses. */
    CMPIObjectPath* objectPath(const std::string& nameSpace, const std::string& className);
    /**
     * The object path of a text: `Class.Key="text",Number=3`, a namespace and a colon may stand before it,
     * `\"` and `\\` inside quotes. Numbers get their declared type; without declaration unsigned ones are
     * `CMPI_uint64`, ones with a sign `CMPI_sint64`; `TRUE` and `FALSE` are booleans.
     * @param nameSpace the namespace of a text that names none.
     * @throws BrokerError naming the column (from 1) and what is wrong there.
     */
    CMPIObjectPath* objectPathFromText(const std::string& text, const std::string& nameSpace);
    /**
     * The value of a text, written as those in an object path are. A text, date/time or path may stand
     * without quotes, and is then taken as it is.
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
    /** The instances that a query selects. */
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
    TK_HIDDEN EmbeddedBroker::Impl& core();
    std::unique_ptr<Impl> impl_;
};

/** @name Texts */
/** @{ */
/** The name of a CMPI return code, as "CMPI_RC_ERR_NOT_FOUND"; "CMPI_RC_<number>" for one that has none.
 * Thread-safe. */
TK_EXPORT std::string codeName(CMPIrc code);
/** The return code of a name, with or without "CMPI_RC_", or of a decimal number. @throws BrokerError for any
 * other name. */
TK_EXPORT CMPIrc codeFromName(const std::string& name);
/** The CIM name of a CMPI type, as "uint32", "string" or "datetime"; that of an array's elements for an
 * array. */
TK_EXPORT std::string typeName(CMPIType type);
/** A value as MOF writes it: numbers, `TRUE`, texts and date/times in quotes, arrays in braces, paths as
 * texts, `NULL`. */
TK_EXPORT std::string valueText(const CMPIData& data);
/** The path as text, `namespace:Class.Key="text",Number=3`: what objectPathFromText reads. Empty for a
 * foreign handle. */
TK_EXPORT std::string pathText(const CMPIObjectPath* path);
/** @} */

} // namespace oxahv
