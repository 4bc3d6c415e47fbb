/* The locks, the environment access and the once-only blocks of the base services, as the library calls them. A
   product puts its own implementation behind these names, or links the standalone one. */
#ifndef LEXICOR_PLATFORM_BSS1_H
#define LEXICOR_PLATFORM_BSS1_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* A mutex that its holder must not take again. It stands by value in the records of its users and must not be
   moved or copied while it is initialised; the size leaves room for the mutex of any supported platform. */
typedef struct BSS1_Lock {
  uint64_t opaque[8];
} BSS1_Lock;

/* These four return 0 or a positive error number of the system. */
int32_t BSS1_InitializeLock(BSS1_Lock* lock);
int32_t BSS1_GetLock(BSS1_Lock* lock);
int32_t BSS1_ReleaseLock(BSS1_Lock* lock);
int32_t BSS1_DestroyLock(BSS1_Lock* lock); /* nobody may hold it */

/* The value of an environment variable, or null when it is not set. Always null in a program that runs with
   more privileges than its caller, because the caller chose the variables. The value belongs to the
   environment. */
const char* BSS1_GetEnv(const char* name);

/* Describes a block of memory that exists once in the process. One static object for each block; the members
   after `size_bytes` belong to the implementation. */
typedef struct BSS1_ProcessBlock {
  void (*init)(void* block); /* called once, on the zeroed block; may be null */
  void (*term)(void* block); /* called once, at the end of the process; may be null */
  size_t size_bytes;
  void* ready;  /* the block, once `init` has returned */
  void* record; /* what the implementation keeps about the block */
} BSS1_ProcessBlock;

#define BSS1_PROCESS_BLOCK(init, term, size_bytes) \
  { (init), (term), (size_bytes), NULL, NULL }

/* Describes a block of memory that exists once in each thread that asks for it. One static object for each
 * kind. */
typedef struct BSS1_ThreadBlock {
  void (*init)(void* block); /* called once, by the thread, on the zeroed block; may be null */
  void (*term)(void* block); /* called once, by the thread, when it ends; may be null */
  size_t size_bytes;
} BSS1_ThreadBlock;

#define BSS1_THREAD_BLOCK(init, term, size_bytes) \
  { (init), (term), (size_bytes) }

/* Returns the process's block, made and initialised by the first caller; others wait until `init` has returned.
   A call from inside `init`, on its own thread, returns the block that is being initialised. Blocks are
   terminated at the end of the process (or when the library is unloaded), the last one initialised first. Null
   when memory is exhausted or the block was terminated: the caller must be ready for it. */
void* BSS1_ResolveProcess(BSS1_ProcessBlock* descriptor);

/* Returns the calling thread's block, made and initialised by its first call. `init` may resolve process blocks
   and other thread blocks; a call from inside `init` returns the block that is being initialised. A thread's
   blocks are terminated when it ends, the last one made first. At the end of the process the blocks of the
   thread that ends it are terminated before any process block; those of threads that still run are left as they
   are, because their threads may be using them, and are not terminated later either, because what they refer to
   may be gone. Null when memory is exhausted or the process has ended its blocks. */
void* BSS1_ResolveThread(const BSS1_ThreadBlock* descriptor);

#ifdef __cplusplus
}
#endif

#endif
