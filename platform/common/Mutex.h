/**
 * @file
 * TK::Mutex, the agent's lock.
 *
 * @code
 * TK::Mutex mutex;
 * const std::lock_guard<TK::Mutex> lock(mutex);
 * @endcode
 *
 * A mutex at namespace scope is constant-initialised: it can be used before and after every other static
 * object. Clang's thread safety analysis (`-Wthread-safety`) knows it as a capability, so that data can be
 * declared to be guarded by it.
 *
 * **Threads.** Made for several at once.
 */
#pragma once

#include "TKExport.h"

#include <mutex>

#ifdef __clang__
#define TK_THREAD_ANNOTATION(attribute) __attribute__((attribute))
#else
/** Tells Clang's thread safety analysis about a declaration; empty for other compilers. */
#define TK_THREAD_ANNOTATION(attribute)
#endif

namespace TK {

/** A lock that one thread holds at a time; not recursive, neither copied nor moved. */
class TK_EXPORT TK_THREAD_ANNOTATION(capability("mutex")) Mutex {
public:
    /** Creates an unlocked mutex. */
    constexpr Mutex() noexcept = default;
    Mutex(const Mutex&) = delete;
    Mutex& operator=(const Mutex&) = delete;

    /**
     * Waits until no other thread holds the mutex, and takes it. The calling thread does not hold it.
     * @throws std::system_error when the system refuses.
     */
    void lock() TK_THREAD_ANNOTATION(acquire_capability());

    /** Gives the mutex back. The calling thread holds it. */
    void unlock() TK_THREAD_ANNOTATION(release_capability());

    /**
     * Takes the mutex without waiting. The calling thread does not hold it.
     * @return whether it was taken.
     */
    bool try_lock() TK_THREAD_ANNOTATION(try_acquire_capability(true));

private:
    std::mutex mutex_;
};

} // namespace TK
