// What the C++ runtime in the DLL needs of POSIX threads, in place of mingw's library of that name.
//
// The DLL is a guest in its process: it must leave nothing there when it is unloaded, and the process may
// load and unload it thousands of times. The library takes a thread-local slot, memory and event handles per
// thread and an exception handler for the whole process, and gives back none but the last. The runtime uses
// only these few of its functions, for initialisation on first use and short critical sections, and besides
// them the thread-local state of exceptions. Defined here, they keep the library out of the DLL; using more
// of it (std::thread, say) makes the DLL fail to link, as these would then be defined twice.
#include <cxxabi.h>
#include <pthread.h>
#include <windows.h>

#include <atomic>

// Frees the memory that libstdc++ sets aside for exceptions that are thrown when there is no memory. Not
// declared in any of its headers.
namespace __gnu_cxx {
void __freeres();
}

// As the C++ ABI lays it down: the stack of exceptions that are handled, and how many are on their way.
struct abi::__cxa_eh_globals {
  void* caughtExceptions;
  unsigned int uncaughtExceptions;
};

// The module's thread-local memory: the system's loader makes a copy of it for every thread that there is or
// comes to be, and frees them. The C runtime defines where it begins and under which number a thread finds
// it.
extern "C" {
extern char _tls_start;
extern ULONG _tls_index;
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

/// What the runtime keeps of the exceptions of each thread, in the thread-local memory. So a throw needs
/// neither memory nor a slot, and reaches its caller also in a process that has none left; the runtime's own
/// way ends the process then. The compiler's thread_local would be the library's again.
[[gnu::section(".tls$")]] abi::__cxa_eh_globals g_exceptions{};

abi::__cxa_eh_globals* ExceptionsOfThisThread() {
  char* const* copies = nullptr;
  asm("mov %%gs:0x58, %0" : "=r"(copies));  // ThreadLocalStoragePointer in the thread's block
  const auto offset = reinterpret_cast<char*>(&g_exceptions) - &_tls_start;
  return reinterpret_cast<abi::__cxa_eh_globals*>(copies[_tls_index] + offset);
}

/// Made before every other static object and so destroyed after it.
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

}  // extern "C"

namespace __cxxabiv1 {

__cxa_eh_globals* __cxa_get_globals() noexcept {
  return ExceptionsOfThisThread();
}

__cxa_eh_globals* __cxa_get_globals_fast() noexcept {
  return ExceptionsOfThisThread();
}

}  // namespace __cxxabiv1
