// The standalone base services on POSIX threads: locks, environment, and the once-only blocks of the process
// and of its threads. One mutex guards the tables; no routine of a caller runs under it.
#include "platform/bss1.h"

#include <pthread.h>
#include <stdlib.h>

#include <cstddef>

namespace {

static_assert(sizeof(pthread_mutex_t) <= sizeof(BSS1_Lock) && alignof(pthread_mutex_t) <= alignof(BSS1_Lock),
              "BSS1_Lock must hold a mutex of this system");

pthread_mutex_t* mutex_of(BSS1_Lock* lock) {
  return reinterpret_cast<pthread_mutex_t*>(lock->opaque);
}

// Each record stands in front of its block, in one piece of memory; the alignment carries over to the block.

struct alignas(std::max_align_t) ProcessRecord {
  BSS1_ProcessBlock* descriptor;
  ProcessRecord* earlier;  // initialised before this one
  pthread_t initialiser;
};

enum class Phase { kInitialising, kReady, kEnding };

struct alignas(std::max_align_t) ThreadRecord {
  const BSS1_ThreadBlock* descriptor;
  ThreadRecord* earlier;  // made before this one
  Phase phase;
};

/// The blocks of one thread. Only the thread itself touches `last`.
struct Thread {
  Thread* next;
  Thread** link;  // what points to this record
  ThreadRecord* last;
  bool ending;
};

// Guards everything below; `changed` tells that a process block is ready or that a thread has ended its blocks.
pthread_mutex_t tables = PTHREAD_MUTEX_INITIALIZER;
pthread_cond_t changed = PTHREAD_COND_INITIALIZER;
ProcessRecord* last_process_record;
Thread*
    threads;  // also keeps the blocks of threads that outlive the process's blocks in a leak checker's sight
size_t threads_ending;
bool end_is_registered;
bool closed;  // the end of the process has begun: no new blocks

pthread_key_t thread_key;
bool thread_key_exists;  // read without the mutex

class TablesHeld {
 public:
  TablesHeld() { pthread_mutex_lock(&tables); }
  ~TablesHeld() { pthread_mutex_unlock(&tables); }
  TablesHeld(const TablesHeld&) = delete;
  TablesHeld& operator=(const TablesHeld&) = delete;
};

/// A thread that is cancelled while it makes or ends a process block would leave the others waiting for ever.
class NotCancellable {
 public:
  NotCancellable() { pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &state_); }
  ~NotCancellable() { pthread_setcancelstate(state_, nullptr); }
  NotCancellable(const NotCancellable&) = delete;
  NotCancellable& operator=(const NotCancellable&) = delete;

 private:
  int state_;
};

/// A zeroed record with a zeroed block behind it.
template <class Record>
Record* make_record(size_t block_bytes) {
  if (block_bytes > SIZE_MAX - sizeof(Record)) return nullptr;
  return static_cast<Record*>(calloc(1, sizeof(Record) + block_bytes));
}

template <class Record>
void* block_of(Record* record) {
  return record + 1;
}

/// The calling thread's blocks, or null when it has none or the key is gone.
Thread* this_thread() {
  if (!__atomic_load_n(&thread_key_exists, __ATOMIC_ACQUIRE)) return nullptr;
  return static_cast<Thread*>(pthread_getspecific(thread_key));
}

/// Terminates and frees the thread's blocks, the last one made first. A block that was interrupted in its own
/// initialisation or termination, because that routine ended the thread or the process, is only freed.
void end_blocks(Thread* thread) {
  while (ThreadRecord* record = thread->last) {
    if (record->phase == Phase::kReady) {
      record->phase = Phase::kEnding;
      if (record->descriptor->term != nullptr) record->descriptor->term(block_of(record));
    }
    // The routine may have resolved further blocks, which then stand before this one.
    ThreadRecord** link = &thread->last;
    while (*link != record) link = &(*link)->earlier;
    *link = record->earlier;
    free(record);
  }
}

/// The tables are held. The caller frees the record when they are not.
void unlink_thread(Thread* thread) {
  *thread->link = thread->next;
  if (thread->next != nullptr) thread->next->link = thread->link;
}

/// The destructor of `thread_key`.
void end_thread(void* value) {
  Thread* thread = static_cast<Thread*>(value);
  {
    TablesHeld held;
    if (closed) return;
    thread->ending = true;
    ++threads_ending;
  }
  // The system has cleared the value; terminations must still find the blocks that are left.
  pthread_setspecific(thread_key, thread);
  end_blocks(thread);
  pthread_setspecific(thread_key, nullptr);
  {
    TablesHeld held;
    --threads_ending;
    unlink_thread(thread);
    pthread_cond_broadcast(&changed);
  }
  free(thread);
}

/// Runs at the end of the process, or when the library is unloaded.
void end_process() {
  NotCancellable whole_end;
  Thread* const self = this_thread();
  {
    TablesHeld held;
    closed = true;
    // Threads in the middle of their termination still need the process's blocks. The caller itself is one of
    // them when its termination routine ends the process.
    const size_t own = self != nullptr && self->ending ? 1 : 0;
    while (threads_ending > own) pthread_cond_wait(&changed, &tables);
  }
  if (self != nullptr) {
    end_blocks(self);
    TablesHeld held;
    unlink_thread(self);
    free(self);
  }
  bool delete_key;
  {
    TablesHeld held;
    delete_key = thread_key_exists;
    __atomic_store_n(&thread_key_exists, false, __ATOMIC_RELEASE);
  }
  // Without the key a thread that ends later does not come back to code that may be unloaded.
  if (delete_key) pthread_key_delete(thread_key);

  for (;;) {
    ProcessRecord* record;
    {
      TablesHeld held;
      record = last_process_record;
      if (record == nullptr) return;
      last_process_record = record->earlier;
    }
    BSS1_ProcessBlock* descriptor = record->descriptor;
    if (descriptor->term != nullptr) descriptor->term(block_of(record));
    {
      TablesHeld held;
      __atomic_store_n(&descriptor->ready, nullptr, __ATOMIC_RELEASE);
      descriptor->record = nullptr;
    }
    free(record);
  }
}

/// Whether new blocks may be made; they must not be made when nobody would end them. The tables are held.
bool open_for_blocks() {
  if (closed) return false;
  if (!end_is_registered) end_is_registered = atexit(end_process) == 0;
  return end_is_registered;
}

/// Gives the calling thread its own record; null when that is impossible.
Thread* register_thread() {
  TablesHeld held;
  if (!open_for_blocks()) return nullptr;
  if (!thread_key_exists) {
    if (pthread_key_create(&thread_key, end_thread) != 0) return nullptr;
    __atomic_store_n(&thread_key_exists, true, __ATOMIC_RELEASE);
  }
  Thread* thread = static_cast<Thread*>(calloc(1, sizeof(Thread)));
  if (thread == nullptr) return nullptr;
  if (pthread_setspecific(thread_key, thread) != 0) {
    free(thread);
    return nullptr;
  }
  thread->next = threads;
  thread->link = &threads;
  if (threads != nullptr) threads->link = &thread->next;
  threads = thread;
  return thread;
}

bool may_make_blocks() {
  TablesHeld held;
  return open_for_blocks();
}

}  // namespace

extern "C" {

int32_t BSS1_InitializeLock(BSS1_Lock* lock) {
  return pthread_mutex_init(mutex_of(lock), nullptr);
}
int32_t BSS1_GetLock(BSS1_Lock* lock) {
  return pthread_mutex_lock(mutex_of(lock));
}
int32_t BSS1_ReleaseLock(BSS1_Lock* lock) {
  return pthread_mutex_unlock(mutex_of(lock));
}
int32_t BSS1_DestroyLock(BSS1_Lock* lock) {
  return pthread_mutex_destroy(mutex_of(lock));
}

const char* BSS1_GetEnv(const char* name) {
  return secure_getenv(name);
}

void* BSS1_ResolveProcess(BSS1_ProcessBlock* descriptor) {
  if (void* block = __atomic_load_n(&descriptor->ready, __ATOMIC_ACQUIRE)) return block;

  NotCancellable whole_initialisation;
  ProcessRecord* record;
  {
    TablesHeld held;
    while (descriptor->record != nullptr) {
      if (descriptor->ready != nullptr) return descriptor->ready;
      record = static_cast<ProcessRecord*>(descriptor->record);
      if (pthread_equal(record->initialiser, pthread_self())) return block_of(record);
      pthread_cond_wait(&changed, &tables);
    }
    if (!open_for_blocks()) return nullptr;
    record = make_record<ProcessRecord>(descriptor->size_bytes);
    if (record == nullptr) return nullptr;
    record->descriptor = descriptor;
    record->initialiser = pthread_self();
    descriptor->record = record;
  }
  if (descriptor->init != nullptr) descriptor->init(block_of(record));

  TablesHeld held;
  // Linked only now: a block that this one resolved in its initialisation must outlive it.
  record->earlier = last_process_record;
  last_process_record = record;
  __atomic_store_n(&descriptor->ready, block_of(record), __ATOMIC_RELEASE);
  pthread_cond_broadcast(&changed);
  return block_of(record);
}

void* BSS1_ResolveThread(const BSS1_ThreadBlock* descriptor) {
  Thread* thread = this_thread();
  if (thread != nullptr) {
    for (ThreadRecord* record = thread->last; record != nullptr; record = record->earlier)
      if (record->descriptor == descriptor) return block_of(record);
    if (!may_make_blocks()) return nullptr;
  } else {
    thread = register_thread();
    if (thread == nullptr) return nullptr;
  }

  ThreadRecord* record = make_record<ThreadRecord>(descriptor->size_bytes);
  if (record == nullptr) return nullptr;
  record->descriptor = descriptor;
  record->phase = Phase::kInitialising;
  record->earlier = thread->last;
  thread->last = record;
  if (descriptor->init != nullptr) descriptor->init(block_of(record));
  record->phase = Phase::kReady;
  return block_of(record);
}

}  // extern "C"
