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

enum class Kind {
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
    virtual std::unique_ptr<Object> clone() const = 0;
    // The CMPI record, as a handle of any kind.
    virtual void* record() = 0;

private:
    friend class Owner;
    Core& core_;
    Kind kind_;
    Owner* owner_ = nullptr;
    Object* newer_ = nullptr; // the owner's list
    Object* older_ = nullptr;
};

// Frees its objects when it dies: a request's, an attached thread's, or the broker's.
class Owner {
public:
    explicit Owner(Core& core) : core_(&core) {}
    ~Owner();
    Owner(const Owner&) = delete;
    Owner& operator=(const Owner&) = delete;

    bool isOf(const Core& core) const { return core_.load(std::memory_order_relaxed) == &core; }
    void adopt(std::unique_ptr<Object> object);
    std::unique_ptr<Object> release(Object& object);
    // Frees what was adopted after `mark`, and `mark` itself.
    void freeSince(const Object& mark);
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

    // Atomic, since a thread looks through its owners while a broker of one of them may die.
    std::atomic<Core*> core_;
    std::mutex mutex_;
    Object* newest_ = nullptr;
    Owner* outer_ = nullptr;
};

// Gives a new object to the current owner of the thread and hands out its record.
template <class Class>
auto handOut(std::unique_ptr<Class> object) {
    Class& given = *object;
    Owner::current(given.core()).adopt(std::move(object));
    return &given;
}

} // namespace oxahv
