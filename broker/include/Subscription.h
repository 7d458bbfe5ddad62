/**
 * @file
 * A client's subscription for the indications of the providers of a broker.
 *
 * @code
 * oxahv::Subscription subscription(broker, {"SELECT * FROM Demo_LinkDown WHERE Port = 'eth0'"});
 * takeLinkDown("eth0");
 * const CMPIInstance* indication = subscription.next(std::chrono::seconds(5));
 * @endcode
 */
#pragma once

#ifndef CMPI_PLATFORM_LINUX_GENERIC_GNU
#define CMPI_PLATFORM_LINUX_GENERIC_GNU
#endif
#include <cmpidt.h>

#include "TKExport.h"
#include "Text.h"

#include <chrono>
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

namespace oxahv {

class EmbeddedBroker;

/** Which indications a subscription is for. */
struct IndicationFilter {
    std::string query;                    ///< a `SELECT` statement, whose FROM class is the indications'
    std::string language = "WQL";         ///< or "DMTF:CQL", "CIM:CQL"
    std::string nameSpace = "root/cimv2"; ///< the namespace that they are delivered in
    std::string owner{};                  ///< who subscribes, as providers are told it; may be empty
};

/** Why there is no subscription: the filter is faulty, no provider serves it, or all of them refuse it. */
class TK_EXPORT SubscriptionError : public BrokerError {
public:
    /** An error with its code. @param code what a CIM server would answer. @param message one line. */
    SubscriptionError(CMPIrc code, const std::string& message);
    /** Copies it. */
    SubscriptionError(const SubscriptionError&) = default;
    /** Copies it. */
    SubscriptionError& operator=(const SubscriptionError&) = default;
    ~SubscriptionError() override;

    /** The code: a provider's own, one of the query, or `CMPI_RC_ERR_NOT_SUPPORTED` without a provider. */
    CMPIrc code() const { return code_; }

private:
    CMPIrc code_;
};

/**
 * A subscription, from its construction to its end().
 *
 * The filter goes to every provider with an indication MI that serves its FROM class, a class above or below
 * it, or all classes. As a CIM server does, the broker calls of each
 * - `authorizeFilter`, and leaves those out that refuse;
 * - `mustPoll`, whose answer changes nothing, and `activateFilter`, with `firstActivation` where the provider
 *   has no other active filter of that FROM class; a refusal leaves the provider out here too;
 * - `enableIndications`, where it is the provider's first active filter.
 *
 * At the end it calls `deActivateFilter`, with `lastDeActivation` where none of that FROM class is left, and
 * `disableIndications` where no filter is. Unloading a provider does the same before its `cleanup`. The
 * filter object is the same in all calls and valid between them; `classPath` names the class that
 * `SourceInstance ISA` asks for, else the FROM class. Filter collections are not used.
 *
 * What `deliverIndication` brings, on any thread, reaches each subscription of that namespace whose FROM
 * class the indication is of and whose WHERE it fulfils; of a select list, it keeps those properties and its
 * keys. A `deliverIndication` that nobody waits for is answered `CMPI_RC_OK`.
 *
 * All operations are thread-safe. A function of the indication MI must not begin or end a subscription.
 */
class TK_EXPORT Subscription {
public:
    /**
     * Subscribes.
     * @param broker has to outlive it. Providers that it hosts later do not get the filter.
     * @param filter which indications.
     * @throws SubscriptionError when the query is faulty, or no provider activates it: then with the code and
     * the text of the first refusal.
     */
    Subscription(EmbeddedBroker& broker, const IndicationFilter& filter);
    /** Ends it. */
    ~Subscription();
    Subscription(const Subscription&) = delete;
    Subscription& operator=(const Subscription&) = delete;

    /**
     * The next indication in the order of their delivery; also one that came before the end.
     * @param timeout how long to wait for one.
     * @return a copy that the request that is current on this thread owns, or the broker; null when none
     * came.
     */
    CMPIInstance* next(std::chrono::milliseconds timeout);
    /** How many indications have come that next() has not returned. All are kept. */
    std::size_t waiting() const;
    /** The names of the providers where the filter is active. */
    std::vector<std::string> providers() const;
    /**
     * Ends it: deactivates the filter at all its providers. No indication arrives any more, from the call on.
     * A provider that refuses is told of through EmbeddedBroker::setMessageHandler. Once is enough.
     */
    void end();

private:
    class TK_HIDDEN Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace oxahv
