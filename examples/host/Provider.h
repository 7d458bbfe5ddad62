// What every function of the provider needs: where it runs, how it fails, and the objects that it returns.
#pragma once

#include "HostClasses.h"

#include <cmpimacs.h>

#include <clocale>
#include <exception>
#include <string>

extern const std::string category; // of the traces
extern const CMPIBroker* broker;

// Called by the factory of each function table, with the server's context. Its entry "OXAHostStateFile" is
// the place of the file that keeps the asset tag; without one, the place is the build's default.
// Answers with what kept the provider from beginning.
CMPIStatus begin(const CMPIBroker* theBroker, const CMPIContext* context) noexcept;

// What the present request is answered from.
Machine machine();

// A request that cannot be served, with the code for the client.
struct Refusal {
    CMPIrc code;
    std::string message;
};

CMPIStatus statusOf(CMPIrc code, const char* message = nullptr) noexcept;

// Makes UTF-8 the encoding of the calling thread's texts, as CIM has it, and leaves the rest of its locale as
// it is. The process of a CIM server often runs in the "C" locale, where only ASCII converts.
class Utf8Thread {
public:
    Utf8Thread();
    ~Utf8Thread();
    Utf8Thread(const Utf8Thread&) = delete;
    Utf8Thread& operator=(const Utf8Thread&) = delete;

private:
    locale_t locale_;
    locale_t previous_;
};

// Runs a function of the provider. No exception may reach the CIM server, so each becomes a status here.
template <class Function>
CMPIStatus answer(const Function& function) noexcept {
    try {
        const Utf8Thread utf8;
        function();
        return statusOf(CMPI_RC_OK);
    } catch (const Refusal& refusal) {
        return statusOf(refusal.code, refusal.message.c_str());
    } catch (const TK::FrameworkException& exception) {
        return statusOf(CMPI_RC_ERR_INVALID_PARAMETER, exception.what());
    } catch (const std::exception& exception) {
        return statusOf(CMPI_RC_ERR_FAILED, exception.what());
    } catch (...) {
        return statusOf(CMPI_RC_ERR_FAILED, "unknown exception");
    }
}

// The objects of a reply. They throw a Refusal when the broker makes none.

CMPIObjectPath* newPath(const char* className, const std::string& nameSpace);
CMPIObjectPath* pathOf(const HostClass& hostClass, TK::Moniker keys, const std::string& nameSpace);
// With the properties of a request's property list alone; a null list is none.
CMPIInstance* newInstance(CMPIObjectPath* path, const char** properties);
CMPIInstance* instanceOf(const HostClass& hostClass, const TK::Moniker& keys, const std::string& nameSpace,
                         const char** properties);

// What the broker refuses to take cannot be told to the client in any other way.
void require(const CMPIStatus& status);
void give(const CMPIResult* result, const CMPIObjectPath* path);
void give(const CMPIResult* result, const CMPIInstance* instance);

// Names that are served.

const HostClass& classOf(const CMPIObjectPath* path);
// The keys of the instance that a path names. Throws a Refusal when there is none.
TK::Moniker keysOf(const HostClass& hostClass, const CMPIObjectPath* path);
