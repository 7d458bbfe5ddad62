// The base of every CMPI object that the broker makes, and the owners that free them. An owner is a request,
// an attached thread, or the broker itself. Knows nothing of CMPI's records and values.
#pragma once

#include "EmbeddedBroker.h"

#include <Names.h>

#include <atomic>
#include <cxxabi.h>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>

namespace oxahv {

using Core = EmbeddedBroker::Impl;

// What an operation of a slot throws; the slot reports it as a status.
struct Failure {
    CMPIrc code;
    std::shared_ptr<const std::string>
        text{}; // for a person; null: none. Shared, since copies must not throw
};
[[noreturn]] inline void failWith(CMPIrc code, std::string text) {
    throw Failure{code, std::make_shared<const std::string>(std::move(text))};
}

// In a handler of everything: a thread that ends unwinds its stack by what is no C++ exception and must go
// on.
inline void passOnTheEndOfAThread() {
    if (abi::__cxa_current_exception_type() == nullptr) {
        throw;
    }
}

using encoding::foldedName;
using encoding::sameName;

enum class Kind : unsigned char {
    instance,
    objectPath,
    arguments,
    string,
    array,
    dateTime,
    enumeration,
    context,
    result,
    other
};
constexpr std::size_t kindCount = 10;

class Owner;

// What all objects of the broker have in common.
class Object {
public:
    Object(Core& core, Kind kind);
    virtual ~Object();
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;

    Core& core() const { return core_; }
    Kind kind() const { return kind_; }
    // The owner that frees this object; null while it is part of another object.
    Owner* owner() const { return owner_; }
    // Notes a use by a handle.
    inline void touch() const;
    // Notes that a caller has got something of it which he can use without its handle.
    void keep() const { isKept_.store(true, std::memory_order_relaxed); }
    bool isKept() const { return isKept_.load(std::memory_order_relaxed); }
    virtual std::unique_ptr<Object> clone() const = 0;
    // The CMPI record, as a handle of any kind.
    virtual void* record() = 0;
    // How many bytes of memory it is in.
    virtual std::size_t size() const = 0;

private:
    friend class Owner;
    Core& core_;
    Kind kind_;
    mutable std::atomic<bool> isKept_{false}; // whether it stays when its owner looks for what is done with
    unsigned int madeAt_ = 0;                 // how many results the owner had counted
    Owner* owner_ = nullptr;
    Object* newer_ = nullptr; // the owner's list
    Object* older_ = nullptr;
};

// Ends an object of which somebody may still have a handle.
void bury(Object* object) noexcept;

struct Burial {
    void operator()(Object* object) const noexcept { bury(object); }
};
// Owns an object whose handle others get.
template <class Class>
using Exposed = std::unique_ptr<Class, Burial>;

// Frees its objects when it dies: a request's, an attached thread's, or the broker's.
class Owner {
public:
    explicit Owner(Core& core) : core_(&core) {}
    ~Owner();
    Owner(const Owner&) = delete;
    Owner& operator=(const Owner&) = delete;

    bool isOf(const Core& core) const { return core_.load(std::memory_order_relaxed) == &core; }
    void adopt(std::unique_ptr<Object> object);
    // Frees an object.
    void release(Object& object);
    // Gives an object up.
    std::unique_ptr<Object> detach(Object& object);
    // Frees what was adopted after `mark`, and `mark` itself.
    void freeSince(const Object& mark);
    // Counts a result that has been handed on at once. From the first one on, an object that a provider makes
    // for one result, and has done with, is freed long before the request ends: what belongs to the last
    // results stays, and so does all that was there before the first one or is used again and again.
    void countResult();
    unsigned int results() const { return results_.load(std::memory_order_relaxed); }
    // Frees all objects, and belongs to no broker from then on: the broker dies before its owner does.
    void end();

    // The innermost owner of the calling thread, the broker itself when it has none.
    static Owner& current(Core& core);

    // Makes an owner the innermost one of the thread while it lives.
    class Scope {
    public:
        explicit Scope(Owner& owner) : owner_(owner) { owner_.enter(); }
        ~Scope() { owner_.leave(); }
        Scope(const Scope&) = delete;
        Scope& operator=(const Scope&) = delete;

    private:
        Owner& owner_;
    };

private:
    // The owners of a thread, innermost first.
    void enter();
    void leave();
    void unlink(Object& object);
    static void buryAll(Object* object);

    // Atomic, since a thread looks through its owners while a broker of one of them may die.
    std::atomic<Core*> core_;
    std::mutex mutex_;
    Object* newest_ = nullptr;
    Object* oldest_ = nullptr;
    Object* lastKept_ = nullptr; // this and the older ones stay to the end; null: none has been looked at
    std::atomic<unsigned int> results_{0};
    Owner* outer_ = nullptr;
};

void Object::touch() const {
    constexpr unsigned int soon = 100;
    if (owner_ != nullptr && owner_->results() - madeAt_ > soon) {
        keep();
    }
}

// Gives a new object to the current owner of the thread and hands out its record.
template <class Class>
auto handOut(std::unique_ptr<Class> object) {
    Class& given = *object;
    Owner::current(given.core()).adopt(std::move(object));
    return &given;
}

} // namespace oxahv
