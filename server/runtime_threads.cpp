// What the C++ runtime in the DLL needs of POSIX threads, in place of mingw's library of that name.
//
// The DLL is a guest in its process: it must leave nothing behind when it is unloaded, and the process may
// load and unload it thousands of times. The library takes a thread-local slot, memory and event handles per
// thread and an exception handler for the whole process, and gives back none but the last. The runtime uses
// only these few of its functions: for initialisation on first use, short critical sections, and the
// thread-local state of exceptions. Defined here, they keep the library out of the DLL; using more of it
// (std::thread, say) makes the DLL fail to link, as these would then be defined twice.
#include <pthread.h>
#include <windows.h>

#include <array>
#include <atomic>

// Frees the memory that libstdc++ sets aside for exceptions that are thrown when there is no memory. Not
// declared in any of its headers.
namespace __gnu_cxx {
void __freeres();
}

namespace {

/// One lock for everything: the runtime holds a mutex for a few instructions and never waits inside, so that
/// sharing it costs nothing. The thread that holds it may lock it again.
class RuntimeLock {
 public:
  void Lock() {
    const DWORD self = GetCurrentThreadId();
    if (owner_ != self) {
      AcquireSRWLockExclusive(&lock_);
      owner_ = self;
    }
    ++depth_;
  }

  void Unlock() {
    if (--depth_ > 0) return;
    owner_ = 0;
    ReleaseSRWLockExclusive(&lock_);
  }

  /// Waits for NotifyAll with the lock, which this thread holds once, given up meanwhile.
  void Wait() {
    owner_ = 0;
    depth_ = 0;
    SleepConditionVariableSRW(&changed_, &lock_, INFINITE, 0);
    owner_ = GetCurrentThreadId();
    depth_ = 1;
  }

  void NotifyAll() { WakeAllConditionVariable(&changed_); }

 private:
  SRWLOCK lock_ = SRWLOCK_INIT;
  CONDITION_VARIABLE changed_ = CONDITION_VARIABLE_INIT;
  std::atomic<DWORD> owner_ = 0;  // a thread's id, never 0
  int depth_ = 0;
};

constinit RuntimeLock g_lock;

/// The keys that are in use. Freeing one runs its destructor on the value of every thread, also of those that
/// live on.
class Keys {
 public:
  ~Keys() {
    for (std::size_t i = 0; i < count_; ++i) FlsFree(keys_[i]);
    __gnu_cxx::__freeres();
  }

  int Create(pthread_key_t* key, void (*destructor)(void*)) {
    g_lock.Lock();
    const DWORD index = count_ < keys_.size() ? FlsAlloc(destructor) : FLS_OUT_OF_INDEXES;
    if (index != FLS_OUT_OF_INDEXES) keys_[count_++] = index;
    g_lock.Unlock();
    *key = index;
    return index != FLS_OUT_OF_INDEXES ? 0 : EAGAIN;
  }

 private:
  std::array<DWORD, 4> keys_{};
  std::size_t count_ = 0;
};

// Made before every other static object and so destroyed after it.
[[gnu::init_priority(101)]] Keys g_keys;

// States of a pthread_once_t.
constexpr pthread_once_t kNotRun = PTHREAD_ONCE_INIT;
constexpr pthread_once_t kRunning = 1;
constexpr pthread_once_t kDone = 2;

}  // namespace

extern "C" {

int pthread_mutex_init(pthread_mutex_t*, const pthread_mutexattr_t*) {
  return 0;
}

int pthread_mutex_destroy(pthread_mutex_t*) {
  return 0;
}

int pthread_mutex_lock(pthread_mutex_t*) {
  g_lock.Lock();
  return 0;
}

int pthread_mutex_unlock(pthread_mutex_t*) {
  g_lock.Unlock();
  return 0;
}

int pthread_cond_wait(pthread_cond_t*, pthread_mutex_t*) {
  g_lock.Wait();
  return 0;
}

int pthread_cond_broadcast(pthread_cond_t*) {
  g_lock.NotifyAll();
  return 0;
}

int pthread_once(pthread_once_t* once, void (*run)()) {
  std::atomic_ref state(*once);
  if (state == kDone) return 0;
  g_lock.Lock();
  while (state == kRunning) g_lock.Wait();
  const bool isFirst = state == kNotRun;
  if (isFirst) state = kRunning;
  g_lock.Unlock();
  if (isFirst) {
    run();
    g_lock.Lock();
    state = kDone;
    g_lock.NotifyAll();
    g_lock.Unlock();
  }
  return 0;
}

int pthread_key_create(pthread_key_t* key, void (*destructor)(void*)) {
  return g_keys.Create(key, destructor);
}

void* pthread_getspecific(pthread_key_t key) {
  // A throw between a failed call and the question for its error must not change the answer.
  const DWORD error = GetLastError();
  void* const value = FlsGetValue(key);
  SetLastError(error);
  return value;
}

int pthread_setspecific(pthread_key_t key, const void* value) {
  return FlsSetValue(key, const_cast<void*>(value)) != FALSE ? 0 : ENOMEM;
}

}  // extern "C"
