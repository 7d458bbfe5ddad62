/**
 * @file
 * TK::ProviderUtilities: what a CIM provider does with CMPI objects, without building CMPI's records by hand.
 *
 * - reading a request: its class (getClassId), its keys (transformObjectPathToMoniker, getKeyProperty), a
 * method's arguments (getProperty), whether a user's text is acceptable (ValidateInput);
 * - writing a reply: createObjectPath, transformMonikerToObjectPath, createInstance, setProperty;
 * - asking the CIM server (areClassesRelated) and the host (isKVM, getNLSText).
 *
 * **Threads.** Any operation may run on any number of threads at once, if CMPI allows that for the objects
 * passed in. None takes a lock, keeps state or waits.
 *
 * **Ownership.** Nothing here releases a CMPI object or keeps a pointer that is passed in. What the broker
 * makes or hands out belongs to the request, as CMPI defines; texts, monikers and vectors belong to the
 * caller.
 *
 * **Encoding.** Names and narrow texts cross to and from the broker byte by byte. Wide texts are converted as
 * TK::CUtility does it, by the calling thread's `LC_CTYPE`; in the "C" locale only ASCII converts.
 *
 * **Arguments.** Handles, names and output pointers must be valid; null is not checked unless an operation
 * says so. `name` is that of the key, property or argument. A text needs to live during the call only.
 *
 * **Failures.** Setters report nothing: the broker's status is dropped, also when the class has no such
 * property or declares another type. Getters return false and leave their output as it was when the broker
 * reports an error, the value is NULL, or a text's characters cannot be read. `std::bad_alloc`, and what a
 * trace's logger throws, pass through everywhere; where nothing else is said, nothing else is thrown.
 *
 * **Traces.** Category "Hovara.ProviderUtilities". An operation that throws emits no EXITING trace. Only what
 * says so traces.
 */
#pragma once

#include "Moniker.h"
#include "TKExport.h"

// Some CIM servers' CMPI headers use pthread types and `__cdecl`, a calling convention that Linux lacks,
// without declaring either.
#include <pthread.h>
#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
/** @cond */
#pragma push_macro("__cdecl")
#undef __cdecl
#define __cdecl // NOLINT(bugprone-reserved-identifier,cert-dcl37-c,cert-dcl51-cpp)
#include <cmpidt.h>
#include <cmpift.h>
#pragma pop_macro("__cdecl")
/** @endcond */

#include <string>
#include <vector>

namespace TK {

/** A family of static operations. The top of ProviderUtilities.h says what holds for all of them. */
class TK_EXPORT ProviderUtilities {
public:
    ProviderUtilities() = delete;

    /** @name Instances and the texts of an object path
     * @{ */
    /** Creates an instance, which carries the path's keys.
     * @return the instance, which belongs to the request; null when the broker refuses. */
    static CMPIInstance* createInstance(const CMPIBroker* broker, CMPIObjectPath* objectPath);

    /** The class's name; empty when the broker cannot tell it. */
    static std::string getClassName(const CMPIObjectPath* objectPath);

    /** The namespace; empty when the broker cannot tell it. */
    static std::string getNamespace(const CMPIObjectPath* objectPath);

    /** The characters of a CMPI string.
     * @param str may be null, which counts as unreadable.
     * @throws FrameworkException "String Conversion Failed !!" when they cannot be read. */
    static std::string convertToString(const CMPIString* str);
    ///@}

    /** @name Keys of an object path
     * Each adds a key of the CMPI type that belongs to the value's. The broker decides what happens to a key
     * that exists already.
     * @{ */
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               unsigned char value); ///< As `CMPI_uint8`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               unsigned short value); ///< As `CMPI_uint16`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               unsigned int value); ///< As `CMPI_uint32`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               unsigned long long value); ///< As `CMPI_uint64`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               const char* value); ///< As `CMPI_chars`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               CMPIString* value); ///< As `CMPI_string`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               const std::string& value); ///< As `CMPI_chars`.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               CMPIObjectPath* value); ///< As `CMPI_ref`.
    ///@}

    /** @name Properties of an instance
     * Each sets the property with the CMPI type that belongs to the value's. No value is changed.
     * @{ */
    static void setProperty(CMPIInstance* instance, const char* name,
                            CMPIObjectPath* value); ///< As `CMPI_ref`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            unsigned char value); ///< As `CMPI_uint8`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            unsigned short value); ///< As `CMPI_uint16`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            unsigned int value); ///< As `CMPI_uint32`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            unsigned long long value);                               ///< As `CMPI_uint64`.
    static void setProperty(CMPIInstance* instance, const char* name, short value);  ///< As `CMPI_sint16`.
    static void setProperty(CMPIInstance* instance, const char* name, float value);  ///< As `CMPI_real32`.
    static void setProperty(CMPIInstance* instance, const char* name, double value); ///< As `CMPI_real64`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            const char* value); ///< As `CMPI_chars`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            CMPIString* value); ///< As `CMPI_string`.
    static void setProperty(CMPIInstance* instance, const char* name,
                            std::string& value);                                   ///< As `CMPI_chars`.
    static void setProperty(CMPIInstance* instance, const char* name, bool value); ///< As `CMPI_boolean`.
    ///@}

    /** @name Reading a key, a property or a method's argument
     * Each reads the member of the requested kind, whatever type the broker reports: ask for the kind and
     * width that the class declares. A handle is the broker's own and lives as long as the request. True when
     * `out` was written.
     * @{ */
    static bool getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                               CMPIString** out); ///< A text key, as the broker's own string.
    static bool getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                               CMPIObjectPath** out); ///< A reference key.
    static bool getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                               std::string& out); ///< A text key, copied.

    static bool getProperty(const CMPIInstance* instance, const char* name,
                            unsigned short& out); ///< A property of CIM type `uint16`.
    static bool getProperty(const CMPIInstance* instance, const char* name,
                            unsigned int& out); ///< A property of CIM type `uint32`.
    static bool getProperty(const CMPIInstance* instance, const char* name,
                            bool& out); ///< A property of CIM type `boolean`.
    static bool getProperty(const CMPIInstance* instance, const char* name,
                            CMPIString** out); ///< A text property, as the broker's own string.

    static bool getProperty(const CMPIArgs* args, const char* name,
                            unsigned short& out); ///< An argument of CIM type `uint16`.
    static bool getProperty(const CMPIArgs* args, const char* name,
                            unsigned int& out); ///< An argument of CIM type `uint32`.
    static bool getProperty(const CMPIArgs* args, const char* name,
                            bool& out); ///< An argument of CIM type `boolean`.
    ///@}

    /** @name Text properties, keys and arguments
     * The getters take the value for a CMPI string, whatever type the broker reports.
     * @{ */
    /** Sets a text, or a date/time from a text.
     * @param value the text; not changed.
     * @param isDate true: `value` is a CIM date/time text, as TK::Utils::convertCIMDateTime writes it, and
     * the property becomes a date/time (`CMPI_dateTime`), or stays as it was if the broker refuses the text.
     * Traces this argument and the text. */
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::string& value, bool isDate);
    static bool getProperty(const CMPIArgs* args, const char* name,
                            std::string& out); ///< Reads a text argument of a method.
    /** Reads a text, or a date/time as a CIM date/time text. @param isDate whether it is a date/time. */
    static bool getProperty(const CMPIInstance* instance, const char* name, std::string& out, bool isDate);
    ///@}

    /** @name Wide texts
     * As the narrow ones, with a conversion, which traces. When the locale cannot convert a text, these trace
     * "Failed to convert the data to Multi byte", in either direction; then nothing is set, or false
     * returned.
     * @{ */
    static bool getProperty(const CMPIArgs* args, const char* name, std::wstring& out); ///< A text argument.
    static bool getProperty(const CMPIInstance* instance, const char* name,
                            std::wstring& out); ///< A text property.
    static bool getKeyProperty(const CMPIObjectPath* objectPath, const char* name,
                               std::wstring& out); ///< A text key.
    static void setKeyProperty(CMPIObjectPath* objectPath, const char* name,
                               const std::wstring& value); ///< A text key, as `CMPI_chars`.
    /** A text property, as `CMPI_chars`; `value` is not changed. */
    static void setProperty(CMPIInstance* instance, const char* name, std::wstring& value);
    ///@}

    /** @name Array properties
     * The setters set the property to a new array and leave the vector alone. An empty vector, or an array
     * that the broker refuses, leaves the property as it was; an element that it refuses ends the filling,
     * and the property gets the array so far. They trace the number of elements; the first three also trace
     * entry and exit with the vector's address, which the one for `std::string` omits for "UserPassword".
     *
     * The getters **append** to `out`, also before they throw. They return false when the property is NULL or
     * no array, whatever the broker's status. They skip an element that cannot be read and ignore an
     * element's type and state.
     * @{ */
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<unsigned char>& value); ///< As `CMPI_uint8A`.
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<unsigned short>& value); ///< As `CMPI_uint16A`.
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<std::string>& value); ///< As `CMPI_stringA`.
    /** As `CMPI_stringA`. A text that the locale cannot convert becomes an empty one. **Traces every text**,
     * whatever the property, and each conversion. */
    static void setProperty(const CMPIBroker* broker, CMPIInstance* instance, const char* name,
                            std::vector<std::wstring>& value);
    static bool getProperty(const CMPIInstance* instance, const char* name,
                            std::vector<unsigned short>& out); ///< A property of CIM type `uint16[]`.
    static bool getProperty(const CMPIInstance* instance, const char* name,
                            std::vector<std::string>& out); ///< A property of CIM type `string[]`.
    ///@}

    /** @name Users' texts
     * @{ */
    /** Screens a user's text for markup, web addresses, paths and shell characters. False when it holds, in
     * any case of letters, one of these:
     *
     *     <  http:  https:  %  $  \\  www.  wap.  ftp:  sftp:  :  \
     *
     * It is no proof: what it accepts must still be quoted for wherever it goes. `tolower` (C) folds letters
     * in the calling thread's locale.
     * @param exemption one of the above, exactly as written: neither it nor **any after it** is looked for.
     * Any other text, even the empty one, exempts nothing. */
    static bool ValidateInput(std::string text, std::string exemption);
    /** The same for wide text; characters above U+00FF are not folded. */
    static bool ValidateInput(std::wstring text, std::wstring exemption);

    /** TK::CUtility::WStringToAString with its traces; the empty text needs neither. */
    static bool ConvertWideCharToMultiByte(std::wstring in, std::string& out);
    /** TK::CUtility::AStringToWString with its traces; the empty text needs neither. */
    static bool ConvertMultiByteToWideChar(std::string in, std::wstring& out);
    ///@}

    /** @name The host
     * @{ */
    /** Whether this process may read "/dev/kvm", and so use kernel virtual machines, on a system without the
     * agent's own CIM server, "/opt/oxa/vex/bin/cimserver". When it may not read it, writes "File cannot be
     * found." to the standard output, without a line end. */
    static bool isKVM();

    /** The localised text of a key, from the providers' resource library, in the language of the calling
     * thread.
     * @return the text in the encoding of `LC_CTYPE`; the key itself when there is none. It belongs to the
     * library and is valid until the calling thread has asked for eight more, or ends.
     * @throws what the locale library throws */
    static const char* getNLSText(std::wstring key);
    ///@}

    /** @name Object paths and monikers
     * They convert keys only: no namespace, host or class. These trace.
     * @{ */
    /** Counts the keys that can be read and are not NULL, among the first 65,535 at most: the broker's count
     * is taken modulo 65,536.
     * @throws FrameworkException "Could not Extract Keys from Object Path." when the broker cannot tell how
     * many there are. */
    static unsigned short getKeyCount(const CMPIObjectPath* objectPath);

    /** Appends a component to the moniker for each key that can be read and is not NULL, in the path's order.
     * `CMPI_uint8` to `CMPI_uint64` become numbers of that width, `CMPI_string` becomes text. The last one is
     * then selected. What was appended before an exception stays.
     * @throws FrameworkException "Moniker component for data type not available." for a key of any other
     * type; "String Conversion Failed !!" for a name or text that cannot be read; what getKeyCount throws. */
    static void transformObjectPathToMoniker(const CMPIObjectPath* objectPath, Moniker& moniker);

    /** Adds a key to an object path for each component of the moniker, texts as `CMPI_chars`. The moniker's
     * last component is then selected; an empty moniker keeps its selection.
     * @param[in,out] moniker walked through its selection, otherwise unchanged.
     * @param passedObjectPath points to the path's handle, which may be null when the moniker is empty; only
     * read, once.
     * @throws FrameworkException "Moniker Component Type Has Not Been Accounted." for a component of an
     * unknown type. */
    static void transformMonikerToObjectPath(Moniker& moniker, CMPIObjectPath** passedObjectPath);
    ///@}

    /** @name Class registry
     * Class ids are the agent's numbers for its CIM classes. 0 stands for no name, 255 for a name that the
     * registry does not know. Names compare as `strcasecmp` (POSIX) does, in the calling thread's
     * locale.
     * @{ */
    /** The id of a class. @param name its name; may be null. @return its id, 0 for null, 255 for an unknown
     * name. Does not trace or throw. */
    static unsigned short getClassId(const char* name);

    /** The same among the extension's classes alone, the ones from 180 on. */
    static unsigned short extend_getClassId(const char* name);

    /** The id of an object path's class; traces the class's name.
     * @param objectPath may be null.
     * @return 0 when there is no path or the broker cannot tell the name. */
    static unsigned short getClassId(const CMPIObjectPath* objectPath);

    /** Whether one of several classes is another class or derives from it. Asks the broker; traces as
     * createObjectPath does for each candidate until one is.
     * @param nameSpace the namespace of all of them.
     * @param candidates the names of the classes in question; not changed.
     * @param ancestor the name of the other class.
     * @return false also when there is no candidate. One for which the broker reports an error counts as not
     * related. */
    static bool areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace,
                                  std::vector<std::string>& candidates, const char* ancestor);

    /** The same for one class. Mind the order: here the ancestor comes first.
     * @param ancestor the name of the class that may be the ancestor.
     * @param candidate the name of the class in question. */
    static bool areClassesRelated(const CMPIBroker* broker, const std::string& nameSpace,
                                  const char* ancestor, const char* candidate);

    /** Whether two texts are there and equal as `strcasecmp` compares. Null is equal to nothing. Does not
     * trace or throw. */
    static bool textEqual(const char* a, const char* b);
    ///@}

    /** Creates an object path without keys. Traces its parameters on entry and exit, the class, and that a
     * path was made.
     * @param classname the class's name; a null pointer is passed on for the broker to judge.
     * @param nameSpace the namespace.
     * @return the path, which belongs to the request; null when the broker refuses. */
    static CMPIObjectPath* createObjectPath(const CMPIBroker* broker, const char* classname,
                                            std::string nameSpace);

private:
    TK_HIDDEN static unsigned short getKeyCount(const CMPIObjectPath* objectPath, unsigned short& keyCount);
};

} // namespace TK
