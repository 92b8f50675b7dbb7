#include "broker/BrokerTables.h"

#include <pthread.h>

#include <atomic>
#include <cerrno>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <mutex>
#include <string>

namespace cimom::broker {

namespace {

static_assert(sizeof(pthread_t) == sizeof(void*), "a thread's name travels as a pointer");

pthread_t threadOf(CMPI_THREAD_TYPE thread) noexcept {
    return reinterpret_cast<pthread_t>(thread);
}

/// The caller frees the name.
char* resolveFileName(const char* library) {
    if (library == nullptr) {
        return nullptr;
    }
    char* name = nullptr;
    return ::asprintf(&name, "lib%s.so", library) < 0 ? nullptr : name;
}

CMPI_THREAD_TYPE newThread(CMPIThreadFunc start, void* parameter, int detached) {
    if (start == nullptr) {
        return nullptr;
    }
    pthread_attr_t attributes;
    if (pthread_attr_init(&attributes) != 0) {
        return nullptr;
    }
    pthread_attr_setdetachstate(&attributes,
                                detached != 0 ? PTHREAD_CREATE_DETACHED : PTHREAD_CREATE_JOINABLE);
    pthread_t thread{};
    const int failure = pthread_create(&thread, &attributes, start, parameter);
    pthread_attr_destroy(&attributes);
    // NOLINTNEXTLINE(performance-no-int-to-ptr): the type that CMPI gives to threads
    return failure == 0 ? reinterpret_cast<CMPI_THREAD_TYPE>(thread) : nullptr;
}

int joinThread(CMPI_THREAD_TYPE thread, CMPI_THREAD_RETURN* result) {
    return thread == nullptr ? ESRCH : pthread_join(threadOf(thread), result);
}

int exitThread(CMPI_THREAD_RETURN result) {
    pthread_exit(result);
}

int cancelThread(CMPI_THREAD_TYPE thread) {
    return thread == nullptr ? ESRCH : pthread_cancel(threadOf(thread));
}

int threadSleep(CMPIUint32 milliseconds) {
    timespec rest{static_cast<time_t>(milliseconds / 1000),
                  static_cast<long>(milliseconds % 1000) * 1'000'000};
    while (nanosleep(&rest, &rest) != 0) {
        if (errno != EINTR) {
            return errno;
        }
    }
    return 0;
}

/// The states of a once variable; the provider's starts as zero.
constexpr int notYet = 0;
constexpr int running = 1;
constexpr int finished = 2;

std::mutex onceMutex;
std::condition_variable onceChanged;

/// Sets the state after the function, whichever way it ends.
class OnceRun {
  public:
    explicit OnceRun(std::atomic_ref<int> state) noexcept : state_(state) {}
    ~OnceRun() {
        {
            const std::lock_guard lock(onceMutex);
            state_.store(outcome_, std::memory_order_release);
        }
        onceChanged.notify_all();
    }
    OnceRun(const OnceRun&) = delete;
    OnceRun& operator=(const OnceRun&) = delete;
    void succeeded() noexcept { outcome_ = finished; }

  private:
    std::atomic_ref<int> state_;
    int outcome_ = notYet;
};

// NOLINTNEXTLINE(readability-non-const-parameter): a slot of the function table
int threadOnce(int* once, CMPIThreadOnceFunc function) {
    if (once == nullptr || function == nullptr) {
        return EINVAL;
    }
    const std::atomic_ref<int> state(*once);
    if (state.load(std::memory_order_acquire) == finished) {
        return 0;
    }
    {
        std::unique_lock lock(onceMutex);
        onceChanged.wait(lock, [&] { return state.load() != running; });
        if (state.load() == finished) {
            return 0;
        }
        state.store(running);
    }
    OnceRun run(state);
    function();
    run.succeeded();
    return 0;
}

static_assert(sizeof(pthread_key_t) <= sizeof(CMPI_THREAD_KEY_TYPE));

int createThreadKey(CMPI_THREAD_KEY_TYPE* key, CMPIThreadKeyCleanupFunc cleanup) {
    if (key == nullptr) {
        return EINVAL;
    }
    pthread_key_t created = 0;
    const int failure = pthread_key_create(&created, cleanup);
    if (failure == 0) {
        *key = created;
    }
    return failure;
}

int destroyThreadKey(CMPI_THREAD_KEY_TYPE key) {
    return pthread_key_delete(static_cast<pthread_key_t>(key));
}

void* getThreadSpecific(CMPI_THREAD_KEY_TYPE key) {
    return pthread_getspecific(static_cast<pthread_key_t>(key));
}

int setThreadSpecific(CMPI_THREAD_KEY_TYPE key, void* value) {
    return pthread_setspecific(static_cast<pthread_key_t>(key), value);
}

// Made and destroyed through C functions, between which only a pointer is known.
// NOLINTBEGIN(cppcoreguidelines-no-malloc)

struct MutexEnd {
    void operator()(pthread_mutex_t* mutex) const noexcept {
        pthread_mutex_destroy(mutex);
        std::free(mutex);
    }
};
struct ConditionEnd {
    void operator()(pthread_cond_t* condition) const noexcept {
        pthread_cond_destroy(condition);
        std::free(condition);
    }
};

/// Recursive, as later levels of the standard demand.
CMPI_MUTEX_TYPE newMutex(int) {
    pthread_mutexattr_t attributes;
    if (pthread_mutexattr_init(&attributes) != 0) {
        return nullptr;
    }
    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_RECURSIVE);
    auto* mutex = static_cast<pthread_mutex_t*>(std::malloc(sizeof(pthread_mutex_t)));
    if (mutex != nullptr && pthread_mutex_init(mutex, &attributes) != 0) {
        std::free(mutex);
        mutex = nullptr;
    }
    pthread_mutexattr_destroy(&attributes);
    return mutex;
}

void destroyMutex(CMPI_MUTEX_TYPE mutex) {
    const std::unique_ptr<pthread_mutex_t, MutexEnd> ended(static_cast<pthread_mutex_t*>(mutex));
}

// Mistakes have no way out of the next two: they give no status.
void lockMutex(CMPI_MUTEX_TYPE mutex) {
    if (mutex != nullptr) {
        pthread_mutex_lock(static_cast<pthread_mutex_t*>(mutex));
    }
}

void unlockMutex(CMPI_MUTEX_TYPE mutex) {
    if (mutex != nullptr) {
        pthread_mutex_unlock(static_cast<pthread_mutex_t*>(mutex));
    }
}

CMPI_COND_TYPE newCondition(int) {
    auto* condition = static_cast<pthread_cond_t*>(std::malloc(sizeof(pthread_cond_t)));
    if (condition != nullptr && pthread_cond_init(condition, nullptr) != 0) {
        std::free(condition);
        condition = nullptr;
    }
    return condition;
}

// NOLINTEND(cppcoreguidelines-no-malloc)

void destroyCondition(CMPI_COND_TYPE condition) {
    const std::unique_ptr<pthread_cond_t, ConditionEnd> ended(
        static_cast<pthread_cond_t*>(condition));
}

int condWait(CMPI_COND_TYPE condition, CMPI_MUTEX_TYPE mutex) {
    if (condition == nullptr || mutex == nullptr) {
        return EINVAL;
    }
    return pthread_cond_wait(static_cast<pthread_cond_t*>(condition),
                             static_cast<pthread_mutex_t*>(mutex));
}

/// `until` is absolute, by the real-time clock.
int timedCondWait(CMPI_COND_TYPE condition, CMPI_MUTEX_TYPE mutex, timespec* until) {
    if (condition == nullptr || mutex == nullptr || until == nullptr) {
        return EINVAL;
    }
    return pthread_cond_timedwait(static_cast<pthread_cond_t*>(condition),
                                  static_cast<pthread_mutex_t*>(mutex), until);
}

int signalCondition(CMPI_COND_TYPE condition) {
    return condition == nullptr ? EINVAL
                                : pthread_cond_signal(static_cast<pthread_cond_t*>(condition));
}

}  // namespace

const CMPIBrokerExtFT threadTable{
    CMPIVersion200,    resolveFileName,   newThread,        joinThread,      exitThread,
    cancelThread,      threadSleep,       threadOnce,       createThreadKey, destroyThreadKey,
    getThreadSpecific, setThreadSpecific, newMutex,         destroyMutex,    lockMutex,
    unlockMutex,       newCondition,      destroyCondition, condWait,        timedCondWait,
    signalCondition};

}  // namespace cimom::broker
