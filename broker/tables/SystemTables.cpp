// CMPIBrokerExtFT and CMPIBrokerMemFT: threads and memory of the operating system.

#include "tables/Slots.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <pthread.h>

namespace oxahv {

namespace {

// A thread is handed out as its POSIX id, a mutex and a condition as a pointer to theirs.

static_assert(sizeof(pthread_t) == sizeof(CMPI_THREAD_TYPE));

CMPI_THREAD_TYPE threadOf(pthread_t id) {
    CMPI_THREAD_TYPE thread = nullptr;
    std::memcpy(&thread, &id, sizeof id);
    return thread;
}

pthread_t idOf(CMPI_THREAD_TYPE thread) {
    pthread_t id{};
    std::memcpy(&id, &thread, sizeof id);
    return id;
}

pthread_mutex_t* mutexOf(CMPI_MUTEX_TYPE mutex) {
    return static_cast<pthread_mutex_t*>(mutex);
}
pthread_cond_t* conditionOf(CMPI_COND_TYPE condition) {
    return static_cast<pthread_cond_t*>(condition);
}

// The platform's file name of a library.
char* resolveFileName(const char* library) {
    if (library == nullptr) {
        return nullptr;
    }
    try {
        return strdup(("lib" + std::string(library) + ".so").c_str());
    } catch (const std::bad_alloc&) {
        return nullptr;
    }
}

CMPI_THREAD_TYPE newThread(CMPIThreadFunc start, void* parameter, int isDetached) {
    pthread_t id{};
    if (start == nullptr || pthread_create(&id, nullptr, start, parameter) != 0) {
        return nullptr;
    }
    if (isDetached != 0) {
        pthread_detach(id);
    }
    return threadOf(id);
}

int joinThread(CMPI_THREAD_TYPE thread, CMPI_THREAD_RETURN* result) {
    return thread != nullptr ? pthread_join(idOf(thread), result) : EINVAL;
}

int exitThread(CMPI_THREAD_RETURN result) {
    pthread_exit(result);
}

int cancelThread(CMPI_THREAD_TYPE thread) {
    return thread != nullptr ? pthread_cancel(idOf(thread)) : EINVAL;
}

int threadSleep(CMPIUint32 milliseconds) {
    const timespec time = {static_cast<std::time_t>(milliseconds / 1000),
                           static_cast<long>(milliseconds % 1000) * 1'000'000};
    return nanosleep(&time, nullptr) == 0 ? 0 : errno;
}

int threadOnce(int* once, CMPIThreadOnceFunc function) {
    static_assert(std::is_same_v<pthread_once_t, int> && PTHREAD_ONCE_INIT == 0);
    return once != nullptr && function != nullptr ? pthread_once(once, function) : EINVAL;
}

int createThreadKey(CMPI_THREAD_KEY_TYPE* key, CMPIThreadKeyCleanupFunc cleanup) {
    return key != nullptr ? pthread_key_create(key, cleanup) : EINVAL;
}

int destroyThreadKey(CMPI_THREAD_KEY_TYPE key) {
    return pthread_key_delete(key);
}
void* getThreadSpecific(CMPI_THREAD_KEY_TYPE key) {
    return pthread_getspecific(key);
}
int setThreadSpecific(CMPI_THREAD_KEY_TYPE key, void* value) {
    return pthread_setspecific(key, value);
}

CMPI_MUTEX_TYPE newMutex(int /*options*/) {
    auto* const mutex = new (std::nothrow) pthread_mutex_t;
    if (mutex != nullptr) {
        pthread_mutex_init(mutex, nullptr);
    }
    return mutex;
}

int destroyMutexWithResult(CMPI_MUTEX_TYPE mutex) {
    if (mutex == nullptr) {
        return EINVAL;
    }
    const int result = pthread_mutex_destroy(mutexOf(mutex));
    if (result == 0) {
        delete mutexOf(mutex);
    }
    return result;
}

int lockMutexWithResult(CMPI_MUTEX_TYPE mutex) {
    return mutex != nullptr ? pthread_mutex_lock(mutexOf(mutex)) : EINVAL;
}

int unlockMutexWithResult(CMPI_MUTEX_TYPE mutex) {
    return mutex != nullptr ? pthread_mutex_unlock(mutexOf(mutex)) : EINVAL;
}

void destroyMutex(CMPI_MUTEX_TYPE mutex) {
    destroyMutexWithResult(mutex);
}
void lockMutex(CMPI_MUTEX_TYPE mutex) {
    lockMutexWithResult(mutex);
}
void unlockMutex(CMPI_MUTEX_TYPE mutex) {
    unlockMutexWithResult(mutex);
}

CMPI_COND_TYPE newCondition(int /*options*/) {
    auto* const condition = new (std::nothrow) pthread_cond_t;
    if (condition != nullptr) {
        pthread_cond_init(condition, nullptr);
    }
    return condition;
}

int destroyConditionWithResult(CMPI_COND_TYPE condition) {
    if (condition == nullptr) {
        return EINVAL;
    }
    const int result = pthread_cond_destroy(conditionOf(condition));
    if (result == 0) {
        delete conditionOf(condition);
    }
    return result;
}

void destroyCondition(CMPI_COND_TYPE condition) {
    destroyConditionWithResult(condition);
}

int condWait(CMPI_COND_TYPE condition, CMPI_MUTEX_TYPE mutex) {
    return condition != nullptr && mutex != nullptr
               ? pthread_cond_wait(conditionOf(condition), mutexOf(mutex))
               : EINVAL;
}

// `until` is a point in time, as POSIX has it.
int timedCondWait(CMPI_COND_TYPE condition, CMPI_MUTEX_TYPE mutex, timespec* until) {
    return condition != nullptr && mutex != nullptr && until != nullptr
               ? pthread_cond_timedwait(conditionOf(condition), mutexOf(mutex), until)
               : EINVAL;
}

int signalCondition(CMPI_COND_TYPE condition) {
    return condition != nullptr ? pthread_cond_signal(conditionOf(condition)) : EINVAL;
}

// Memory. Blocks are their caller's until cmpiFree.

CMPIGcStat* mark(Core& core) {
    MarkRecord* const mark = handOut(std::make_unique<Mark>(core));
    return reinterpret_cast<CMPIGcStat*>(mark);
}

void releaseSince(Core& /*core*/, const CMPIGcStat* gcStat) {
    const Mark* const mark = Mark::of(reinterpret_cast<const MarkRecord*>(gcStat));
    if (mark == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    mark->owner()->freeSince(*mark);
}

void* allocate(Core& /*core*/, std::size_t size) {
    return std::malloc(size);
}
void* allocateZeroed(Core& /*core*/, std::size_t count, std::size_t size) {
    return std::calloc(count, size);
}
void* reallocate(Core& /*core*/, void* block, std::size_t size) {
    return std::realloc(block, size);
}
char* duplicate(Core& /*core*/, const char* text) {
    return strdup(required(text));
}
void freeBlock(Core& /*core*/, void* block) {
    std::free(block);
}
void freeChars(Core& /*core*/, char* text) {
    std::free(text);
}

template <class Class, class Record>
void freeObject(Core& /*core*/, Record* handle) {
    Class* const object = Class::of(handle);
    if (object != nullptr) {
        releaseObject(*object);
    }
}

} // namespace

const CMPIBrokerExtFT systemTable = {
    CMPICurrentVersion,
    resolveFileName,
    newThread,
    joinThread,
    exitThread,
    cancelThread,
    threadSleep,
    threadOnce,
    createThreadKey,
    destroyThreadKey,
    getThreadSpecific,
    setThreadSpecific,
    newMutex,
    destroyMutex,
    lockMutex,
    unlockMutex,
    newCondition,
    destroyCondition,
    condWait,
    timedCondWait,
    signalCondition,
    destroyMutexWithResult,
    lockMutexWithResult,
    unlockMutexWithResult,
    destroyConditionWithResult,
};

const CMPIBrokerMemFT memoryTable = {
    CMPICurrentVersion,
    SLOT(CMPIBrokerMemFT, mark, mark),
    SLOT(CMPIBrokerMemFT, release, releaseSince),
    SLOT(CMPIBrokerMemFT, cmpiMalloc, allocate),
    SLOT(CMPIBrokerMemFT, cmpiCalloc, allocateZeroed),
    SLOT(CMPIBrokerMemFT, cmpiRealloc, reallocate),
    SLOT(CMPIBrokerMemFT, cmpiStrDup, duplicate),
    SLOT(CMPIBrokerMemFT, cmpiFree, freeBlock),
    SLOT(CMPIBrokerMemFT, freeInstance, (freeObject<Instance, CMPIInstance>)),
    SLOT(CMPIBrokerMemFT, freeObjectPath, (freeObject<ObjectPath, CMPIObjectPath>)),
    SLOT(CMPIBrokerMemFT, freeArgs, (freeObject<Arguments, CMPIArgs>)),
    SLOT(CMPIBrokerMemFT, freeString, (freeObject<String, CMPIString>)),
    SLOT(CMPIBrokerMemFT, freeArray, (freeObject<Array, CMPIArray>)),
    SLOT(CMPIBrokerMemFT, freeDateTime, (freeObject<DateTime, CMPIDateTime>)),
    SLOT(CMPIBrokerMemFT, freeSelectExp, (freeObject<SelectExpression, CMPISelectExp>)),
    SLOT(CMPIBrokerMemFT, freeChars, freeChars),
};

} // namespace oxahv
