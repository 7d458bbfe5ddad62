/**
 * @file
 * oxahv::IndicationProvider, a provider of indications, and oxahv::Indications, which delivers them.
 */
#pragma once

#include "Operation.h"
#include "detail/Utf8Thread.h"

#include <memory>

namespace oxahv {

/** What a client subscribes for. A handle, good as long as the provider's function runs. */
class SubscriptionFilter {
public:
    /** A filter that the broker handed out, with the class in its FROM clause. */
    SubscriptionFilter(const CMPISelectExp* handle, const char* className)
        : handle_(handle), className_(className) {}
    /** The CMPI handle, which the broker keeps until the filter is deactivated. */
    const CMPISelectExp* handle() const { return handle_; }
    /** The class of the indications that are asked for, which belongs to the request. */
    const char* className() const { return className_; }
    /** The query's text, which belongs to the request. @throws Refusal with the broker's status */
    const char* query() const {
        detail::Status status;
        const CMPIString* const text = CMGetSelExpString(detail::writable(handle_), &status);
        detail::require(status, "tell the query");
        return detail::requiredChars(text, "tell the query");
    }

private:
    const CMPISelectExp* handle_;
    const char* className_;
};

/**
 * Delivers indications, from a thread of the provider's own. The provider makes it in a function that the
 * server calls, such as `enable`, and hands it to the thread.
 *
 * Used by one thread at a time; can be moved. It must not outlive the provider's object.
 */
class Indications {
public:
    /** Prepares the delivery. For the thread that the server calls the provider on.
     * @throws Refusal with the broker's status */
    explicit Indications(const Context& context)
        : broker_(context.broker()), context_(prepared(context.broker(), context.handle())) {}

    /**
     * Delivers an indication to whoever has subscribed for it. For a thread that the server does not know:
     * it is attached to the server meanwhile, and what is made in it is released at the end.
     * @param nameSpace the namespace of the indication's class.
     * @param className the indication's class.
     * @param fill is called with the indication, to set its properties.
     * @throws Refusal with the broker's status; what `fill` throws
     */
    template <class Fill>
    void deliver(const char* nameSpace, const char* className, const Fill& fill) {
        const Attached attached(*this);
        const detail::Utf8Thread utf8(*locale_);
        Instance indication = make(nameSpace, className);
        fill(indication);
        detail::require(
            CBDeliverIndication(detail::writable(broker_), attached.context, nameSpace, indication.handle()),
            "deliver an indication of", className);
    }

private:
    struct Attached {
        explicit Attached(const Indications& indications)
            : broker(indications.broker_), context(indications.context_) {
            detail::require(CBAttachThread(detail::writable(broker), context), "attach a thread");
        }
        ~Attached() { CBDetachThread(detail::writable(broker), context); }
        Attached(const Attached&) = delete;
        Attached& operator=(const Attached&) = delete;

        const CMPIBroker* broker;
        CMPIContext* context;
    };

    static CMPIContext* prepared(const CMPIBroker* broker, const CMPIContext* context) {
        return detail::made(CBPrepareAttachThread(detail::writable(broker), detail::writable(context)),
                            detail::Status(), "prepare a thread");
    }
    Instance make(const char* nameSpace, const char* className) const {
        detail::Status status;
        CMPIObjectPath* const path =
            detail::made(CMNewObjectPath(detail::writable(broker_), nameSpace, className, &status), status,
                         "make a path of class", className);
        CMPIInstance* const instance = detail::made(CMNewInstance(detail::writable(broker_), path, &status),
                                                    status, "make an indication of", className);
        return {broker_, instance};
    }

    const CMPIBroker* broker_;
    CMPIContext* context_; // for every delivery: a broker keeps each one that it prepares
    std::unique_ptr<const detail::Utf8Locale> locale_ = std::make_unique<const detail::Utf8Locale>();
};

/**
 * A provider of indications. As it comes, it accepts every filter and does nothing else; the server applies
 * the filters to what Indications delivers. Threads, failure and locale are as of InstanceProvider; a server
 * that has to poll for indications is refused.
 */
class IndicationProvider {
public:
    /** A provider that accepts every filter. */
    IndicationProvider() = default;
    virtual ~IndicationProvider() = default;
    IndicationProvider(const IndicationProvider&) = delete;
    IndicationProvider& operator=(const IndicationProvider&) = delete;

    /** Looks at a filter before it is activated; throws a Refusal to turn it down. @param operation names the
     * indications' class @param owner who subscribes; may be empty */
    virtual void authorize([[maybe_unused]] const Operation& operation,
                           [[maybe_unused]] const SubscriptionFilter& filter,
                           [[maybe_unused]] const char* owner) {}
    /** A filter is activated. @param isFirst whether it is the first for its class */
    virtual void activate([[maybe_unused]] const Operation& operation,
                          [[maybe_unused]] const SubscriptionFilter& filter, [[maybe_unused]] bool isFirst) {}
    /** A filter is deactivated. @param isLast whether it was the last for its class */
    virtual void deactivate([[maybe_unused]] const Operation& operation,
                            [[maybe_unused]] const SubscriptionFilter& filter, [[maybe_unused]] bool isLast) {
    }
    /** Indications may be delivered from now on. */
    virtual void enable([[maybe_unused]] const Context& context) {}
    /** Indications are no longer wanted. The provider's own threads have to end here, or in its destructor.
     */
    virtual void disable([[maybe_unused]] const Context& context) {}
};

} // namespace oxahv
