// Defines the POSIX thread functions that the C++ runtime in the DLL needs, in place of mingw's winpthreads.
//
// The DLL is a guest in its process. The process may load and unload it thousands of times, and unloading
// must release everything. winpthreads allocates a thread-local slot and an exception handler for the whole
// process, and memory and event handles for each thread. It frees only the exception handler. The runtime
// uses just a few of its functions: for initialisation on first use, for short critical sections and for the
// thread-local state of exceptions. Defining them here keeps winpthreads out of the DLL. Code that uses more
// of it (such as std::thread) makes the link fail, because these functions are then defined twice.
#include <cxxabi.h>
#include <pthread.h>
#include <windows.h>

#include <atomic>

// Frees the emergency memory that libstdc++ reserves for exceptions thrown when memory is exhausted. No
// header of libstdc++ declares it.
namespace __gnu_cxx {
void __freeres();
}

// Laid out as the C++ ABI defines it: the stack of caught exceptions, and the number of uncaught ones.
struct abi::__cxa_eh_globals {
  void* caughtExceptions;
  unsigned int uncaughtExceptions;
};

// The module's thread-local memory. The system's loader makes a copy for every present and future thread and
// frees it. The C runtime defines where the memory begins and the index by which a thread finds its copy.
extern "C" {
extern char _tls_start;
extern ULONG _tls_index;
}

namespace {

/// Stands for all mutexes of the runtime. Sharing one lock costs nothing, because the runtime holds a mutex
/// for a few instructions only and never waits while it holds one. The owning thread may lock it again.
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

  /// Waits for NotifyAll. Releases the lock while it waits; this thread must hold it exactly once.
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
  std::atomic<DWORD> owner_ = 0;  // the owning thread's id, or 0 for none
  int depth_ = 0;
};

constinit RuntimeLock g_lock;

/// The runtime's exception state of each thread, in thread-local memory. A throw therefore needs neither
/// memory nor a slot and reaches its handler even if the process has run out of both; the runtime's own
/// implementation would end the process. The compiler's thread_local is not used, because it needs
/// winpthreads.
[[gnu::section(".tls$")]] abi::__cxa_eh_globals g_exceptions{};

abi::__cxa_eh_globals* ExceptionsOfThisThread() {
  char* const* copies = nullptr;
  asm("mov %%gs:0x58, %0" : "=r"(copies));  // ThreadLocalStoragePointer in the thread environment block
  const auto offset = reinterpret_cast<char*>(&g_exceptions) - &_tls_start;
  return reinterpret_cast<abi::__cxa_eh_globals*>(copies[_tls_index] + offset);
}

/// Constructed before every other static object, and so destroyed after all of them.
struct ExceptionMemory {
  ~ExceptionMemory() { __gnu_cxx::__freeres(); }
};
[[gnu::init_priority(101)]] ExceptionMemory g_exceptionMemory;

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

// NOLINTNEXTLINE(readability-*): declared by the system, with names and types of its own.
int pthread_once(pthread_once_t* once, void (*run)()) {
  const std::atomic_ref state(*once);
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

}  // extern "C"

namespace __cxxabiv1 {

__cxa_eh_globals* __cxa_get_globals() noexcept {
  return ExceptionsOfThisThread();
}

__cxa_eh_globals* __cxa_get_globals_fast() noexcept {
  return ExceptionsOfThisThread();
}

}  // namespace __cxxabiv1
