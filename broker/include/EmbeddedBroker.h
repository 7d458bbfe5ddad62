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
 * or a filter removes it; its release does nothing. Nobody may use an object after its release. A
 * memory mark frees what the current owner has got since.
 *
 * **Encoding.** All texts are UTF-8; a CMPIString keeps its bytes as they came.
 *
 * **Conduct.** All slots of all function tables are filled. A slot that gets a null handle or one that is not
 * of its kind answers `CMPI_RC_ERR_INVALID_HANDLE`; what a broker without a repository cannot do answers
 * `CMPI_RC_ERR_NOT_SUPPORTED`. No slot throws.
 *
 * **Queries.** `newSelectExp` takes WQL and the basic level of the CIM query language ("DMTF:CQL",
 * "CIM:CQL"): a select list, `FROM` one class, and `WHERE` with `= <> < <= > >=`, `AND`, `OR`, `NOT`, `IS
 * NULL`, `LIKE` and `ISA`, on properties and on those of embedded instances (`SourceInstance.Name`). What
 * depends on a NULL is unknown, and an instance of which a query is unknown is not accepted. Integers of all
 * types compare by their numbers, exactly, with reals too; texts byte by byte; date/times by their instants.
 * A fault is `CMPI_RC_ERR_INVALID_QUERY`, with the column in the status's text; what goes beyond the basic
 * level, 1,000 comparisons (in a normal form too) or 100 nested parentheses is refused with DSP0200's code 29
 * (`CMPI_RC_ERR_QUERY_FEATURE_NOT_SUPPORTED`); values that do not compare are `CMPI_RC_ERR_TYPE_MISMATCH`.
 * With declarations the names and types of a query are checked when it is made. A query without `WHERE` is an
 * empty conjunction: its disjunction of conjunctions has one part without predicates, its conjunction of
 * disjunctions has no part.
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include "Declarations.h"
#include "Request.h"
#include "Subscription.h"
#include "TKExport.h"
#include "Testing.h"
#include "Text.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace oxahv {

/** The MI factory functions of a provider that is linked into the program; a kind that it lacks stays null.
 */
struct ProviderFactories {
    /** `NAME_Create_InstanceMI`. */
    CMPIInstanceMI* (*instance)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
    /** `NAME_Create_AssociationMI`. */
    CMPIAssociationMI* (*association)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
    /** `NAME_Create_MethodMI`. */
    CMPIMethodMI* (*method)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
    /** `NAME_Create_PropertyMI`. */
    CMPIPropertyMI* (*property)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
    /** `NAME_Create_IndicationMI`. */
    CMPIIndicationMI* (*indication)(const CMPIBroker*, const CMPIContext*, CMPIStatus*) = nullptr;
};

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
     * are passed over, which have to be well-formed all the same. Superclasses must be declared before;
     * classes that references lead to need not be declared. A qualifier without a declared type is taken with
     * the type that its value has.
     * @param file path of a regular file, at most 256 MiB with all that it includes.
     * @param options a strict compilation throws at the first thing that it would else warn of.
     * @return what DSP0004 forbids and is taken all the same: qualifiers that nobody declares, such as a
     * misspelt `[Kye]`, on the wrong kind of element, of another type, or changed where their declaration
     * disables it; references outside associations, and associations with less than two; keys added to
     * inherited ones; redeclarations without Override, overrides of nothing, with other parameters, or to a
     * class that is no subclass; embedded instances that are no texts; arrays longer than declared. In order; the first 1,000.
     * @throws BrokerError whose text is `file:line:column: message`, lines and characters counted from 1, for
     * the first error; one of reading an included file stands where its pragma does.
     */
    std::vector<MofWarning> compileMof(const std::string& file, const MofOptions& options = {});
    /**
     * The same for a text.
     * @param text UTF-8, with or without a byte order mark.
     * @param name what errors call the text; files that it includes are looked for beside a file of that
     * name.
     */
    std::vector<MofWarning> compileMofText(const std::string& text, const std::string& name,
                                           const MofOptions& options = {});
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
    /** The name of a declared class's superclass; empty for a class without one, and for one that is not
     * declared. */
    std::string superclassOf(const std::string& className) const;
    /** The qualifiers that MOF has declared, in the order of their letters; with any MOF also those that CIM
     * itself fixes, such as Key. */
    std::vector<QualifierTypeDeclaration> qualifierTypes() const;
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
     * `NAME_Create_InstanceMI`, `NAME_Create_AssociationMI`, `NAME_Create_MethodMI`,
     * `NAME_Create_PropertyMI` and `NAME_Create_IndicationMI`, or the `_Generic_Create_…` ones.
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
     * Waits for requests that are inside the provider, calls its `cleanup` as at a server's end, on a thread
     * that the `cleanup` may end, and unloads its library, whatever `cleanup` answers. Not to be called from
     * a request that is inside it.
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
    /**
     * The uses of dead objects and texts since the last call, in order; at most the first 1,000 of them. The
     * broker knows an object by its memory, which it keeps for a while after the object's death: on each
     * thread until some 4,000 others have died there or their memory exceeds 1 MiB. A text is known by the
     * address that `getCharPtr` returned.
     */
    std::vector<Misuse> takeMisuses();
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
    /** Receives what providers write through the `logMessage` and `trace` slots, and the line about an
     * exception that leaves a provider's `cleanup`; null: dropped. Called on
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

} // namespace oxahv
