// Operating-system services on POSIX threads. These calls carry no broker
// handle, so none of them can be counted or made to fail per broker, except
// newThread, which is counted through the broker of the calling request or
// attachment (or the only live broker). That broker also keeps track of the
// thread until it returns, and waits for it before it goes away.
#include "BrokerState.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <memory>
#include <pthread.h>

namespace host::detail
{
namespace
{

static_assert(sizeof(CMPI_THREAD_KEY_TYPE) == sizeof(pthread_key_t));
static_assert(sizeof(pthread_t) <= sizeof(CMPI_THREAD_TYPE));
static_assert(sizeof(pthread_once_t) == sizeof(int));

// What a started thread needs before it runs the provider's routine.
struct ThreadStart
{
    BrokerState* broker;
    CMPI_THREAD_RETURN (*start)(void*);
    void* parm;
};

void* runThread(void* raw)
{
    const std::unique_ptr<ThreadStart> thread(static_cast<ThreadStart*>(raw));
    void* const result = thread->start(thread->parm);
    if (thread->broker != nullptr)
    {
        thread->broker->threadEnded();
    }
    return result;
}

char* resolveFileName(const char* filename)
{
    if (filename == nullptr)
    {
        return nullptr;
    }
    const std::size_t size = std::strlen(filename) + sizeof("lib.so");
    char* name = static_cast<char*>(std::malloc(size));
    if (name != nullptr)
    {
        std::snprintf(name, size, "lib%s.so", filename);
    }
    return name;
}

CMPI_THREAD_TYPE newThread(CMPI_THREAD_RETURN (*start)(void*), void* parm,
                           int detached)
{
    BrokerState* b = BrokerState::forThisThread();
    if (start == nullptr ||
        (b != nullptr && b->fault(BrokerCall::NewThread).has_value()))
    {
        return nullptr;
    }
    auto thread = std::make_unique<ThreadStart>(ThreadStart{b, start, parm});
    pthread_attr_t attr;
    pthread_attr_init(&attr);
    pthread_attr_setdetachstate(&attr, detached ? PTHREAD_CREATE_DETACHED
                                                : PTHREAD_CREATE_JOINABLE);
    if (b != nullptr)
    {
        b->threadStarted();
    }
    pthread_t handle{};
    const int rc = pthread_create(&handle, &attr, runThread, thread.get());
    pthread_attr_destroy(&attr);
    if (rc != 0)
    {
        if (b != nullptr)
        {
            b->threadEnded();
        }
        return nullptr;
    }
    static_cast<void>(thread.release()); // runThread owns it now
    // CMPI's thread handle is a pointer; pthread_t is an integer here.
    // NOLINTNEXTLINE(performance-no-int-to-ptr)
    return reinterpret_cast<CMPI_THREAD_TYPE>(handle);
}

int joinThread(CMPI_THREAD_TYPE thread, CMPI_THREAD_RETURN* retval)
{
    return pthread_join(reinterpret_cast<pthread_t>(thread), retval);
}

int exitThread(CMPI_THREAD_RETURN returnCode)
{
    pthread_exit(returnCode);
}

int cancelThread(CMPI_THREAD_TYPE thread)
{
    return pthread_cancel(reinterpret_cast<pthread_t>(thread));
}

int threadSleep(CMPIUint32 msec)
{
    timespec delay{static_cast<time_t>(msec / 1000),
                   static_cast<long>(msec % 1000) * 1'000'000L};
    while (nanosleep(&delay, &delay) != 0 && errno == EINTR)
    {
    }
    return 0;
}

int threadOnce(int* once, void (*init)())
{
    if (once == nullptr || init == nullptr)
    {
        return EINVAL;
    }
    return pthread_once(reinterpret_cast<pthread_once_t*>(once), init);
}

int createThreadKey(CMPI_THREAD_KEY_TYPE* key, void (*cleanup)(void*))
{
    if (key == nullptr)
    {
        return EINVAL;
    }
    pthread_key_t k{};
    const int rc = pthread_key_create(&k, cleanup);
    if (rc == 0)
    {
        *key = k;
    }
    return rc;
}

int destroyThreadKey(CMPI_THREAD_KEY_TYPE key)
{
    return pthread_key_delete(key);
}

void* getThreadSpecific(CMPI_THREAD_KEY_TYPE key)
{
    return pthread_getspecific(key);
}

int setThreadSpecific(CMPI_THREAD_KEY_TYPE key, void* value)
{
    return pthread_setspecific(key, value);
}

CMPI_MUTEX_TYPE newMutex(int)
{
    auto mutex = std::make_unique<pthread_mutex_t>();
    if (pthread_mutex_init(mutex.get(), nullptr) != 0)
    {
        return nullptr;
    }
    return mutex.release();
}

void destroyMutex(CMPI_MUTEX_TYPE mutex)
{
    if (mutex != nullptr)
    {
        std::unique_ptr<pthread_mutex_t> owned(
            static_cast<pthread_mutex_t*>(mutex));
        pthread_mutex_destroy(owned.get());
    }
}

void lockMutex(CMPI_MUTEX_TYPE mutex)
{
    if (mutex != nullptr)
    {
        pthread_mutex_lock(static_cast<pthread_mutex_t*>(mutex));
    }
}

void unlockMutex(CMPI_MUTEX_TYPE mutex)
{
    if (mutex != nullptr)
    {
        pthread_mutex_unlock(static_cast<pthread_mutex_t*>(mutex));
    }
}

CMPI_COND_TYPE newCondition(int)
{
    auto cond = std::make_unique<pthread_cond_t>();
    if (pthread_cond_init(cond.get(), nullptr) != 0)
    {
        return nullptr;
    }
    return cond.release();
}

void destroyCondition(CMPI_COND_TYPE cond)
{
    if (cond != nullptr)
    {
        std::unique_ptr<pthread_cond_t> owned(
            static_cast<pthread_cond_t*>(cond));
        pthread_cond_destroy(owned.get());
    }
}

int condWait(CMPI_COND_TYPE cond, CMPI_MUTEX_TYPE mutex)
{
    if (cond == nullptr || mutex == nullptr)
    {
        return EINVAL;
    }
    return pthread_cond_wait(static_cast<pthread_cond_t*>(cond),
                             static_cast<pthread_mutex_t*>(mutex));
}

// wait is an absolute CLOCK_REALTIME deadline, as with pthreads.
int timedCondWait(CMPI_COND_TYPE cond, CMPI_MUTEX_TYPE mutex, timespec* wait)
{
    if (cond == nullptr || mutex == nullptr || wait == nullptr)
    {
        return EINVAL;
    }
    return pthread_cond_timedwait(static_cast<pthread_cond_t*>(cond),
                                  static_cast<pthread_mutex_t*>(mutex), wait);
}

int signalCondition(CMPI_COND_TYPE cond)
{
    if (cond == nullptr)
    {
        return EINVAL;
    }
    return pthread_cond_signal(static_cast<pthread_cond_t*>(cond));
}

} // namespace

CMPIBrokerExtFT brokerExtFT = {
    200,
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
};

} // namespace host::detail
