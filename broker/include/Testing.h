/**
 * @file
 * What a test asks of a broker beyond serving requests: to behave like other CIM servers, to fail at chosen
 * slots, to record the calls of a provider and to count what it leaves behind. All of it is plain data; the
 * operations that take it are oxahv::EmbeddedBroker's.
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>

#include <cstddef>
#include <string>
#include <thread>

namespace oxahv {

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
    std::size_t others = 0; ///< errors, property lists, memory marks, select expressions and their parts

    /** All of them. */
    std::size_t total() const {
        return instances + objectPaths + arguments + strings + arrays + dateTimes + enumerations + contexts +
               results + others;
    }
};

/**
 * One use of what had died before: of an object after its release, its request or the object that it was part
 * of, or of a text after its string. The slot did nothing and answered `CMPI_RC_ERR_INVALID_HANDLE`.
 */
struct Misuse {
    std::string slot;       ///< table and member, for example "CMPIInstanceFT.setProperty"
    const void* handle;     ///< the dead object's handle, or the text's address
    std::thread::id thread; ///< the calling thread
};

/** A message or trace that a provider wrote through the broker's `logMessage` and `trace` slots, or a message
 * of the broker's about a provider: an exception has left its `cleanup`. */
struct BrokerMessage {
    bool isTrace = false;    ///< written by `trace`; else by `logMessage`
    int severityOrLevel = 0; ///< a `CMPILevel` of a trace, else a `CMPISeverity`
    std::string component;   ///< the id or component argument
    std::string text;        ///< the text
    bool isBrokers = false;  ///< written by the broker; `component` is then the provider's name
};

} // namespace oxahv
