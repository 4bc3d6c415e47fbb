/* The trace operations of the base services, as the library calls them. Each source module owns one static
   trace unit; the unit caches its level and asks for it again only when the process-wide change counter has
   moved, so that a call with tracing off costs one load and one branch. A product puts its own implementation
   behind these names, or links the standalone one. */
#ifndef LEXICOR_PLATFORM_RAS1_H
#define LEXICOR_PLATFORM_RAS1_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* The bits of a level; a unit's level is the sum of those that are wanted. */
enum RAS1_Level {
  RAS1_LEVEL_PROCESS = 0x100, /* failures of process initialisation */
  RAS1_LEVEL_ERRORS = 0x80,   /* messages that report a failure */
  RAS1_LEVEL_EVENTS = 0x40,   /* entry and exit */
  RAS1_LEVEL_FLOW = 0x20,     /* the way that a call takes */
  RAS1_LEVEL_DETAIL = 0x10,   /* state, counts, each entry of a table */
  RAS1_LEVEL_INPUT = 0x08,    /* the arguments of a call */
  RAS1_LEVEL_NOTICES = 0x04   /* data altered on the way */
};

enum RAS1_EventKind {
  RAS1_EVENT_ENTRY = 0,      /* no value */
  RAS1_EVENT_EXIT_VALUE = 1, /* the value is the return code or the returned pointer */
  RAS1_EVENT_EXIT = 2        /* no value */
};

/* The trace unit of one source module: one static object, so that it outlives every call. Both counters are
   read and written with atomic operations, because any thread may refresh a unit at any time. */
typedef struct RAS1_Unit {
  const char* name; /* the module, such as "lxinit" */
  uint32_t seen;    /* the change counter at the last RAS1_Sync; 0: never */
  uint32_t level;   /* the level of that moment */
} RAS1_Unit;

/* The static initialiser of a unit: RAS1_Unit unit = RAS1_UNIT("lxinit"); */
#define RAS1_UNIT(module) \
  { (module), 0, 0 }

/* Moves whenever a level may have changed. Starts at 1, so that a unit that has seen 0 is stale. Read with
   relaxed order. */
extern uint32_t RAS1_ChangeCounter;

/* Refreshes the unit and returns its level. Neither this nor the next three functions change errno. */
uint32_t RAS1_Sync(RAS1_Unit* unit);

/* The caller of the next three functions has tested the unit's level. */

/* Records an event of the given RAS1_EventKind; `value` counts for RAS1_EVENT_EXIT_VALUE only. */
void RAS1_Event(RAS1_Unit* unit, int line, int kind, intptr_t value);

/* Records a message; a newline at its end is optional. */
void RAS1_Printf(RAS1_Unit* unit, int line, const char* format, ...)
#if defined(__GNUC__)
    __attribute__((format(printf, 3, 4)))
#endif
    ;

/* Records the content of a buffer under a label such as "String1". */
void RAS1_Dump(RAS1_Unit* unit, int line, const void* buffer, size_t bytes, const char* label);

/* The standalone implementation only, never called by the library: replaces the levels and the sink that the
   environment gave. `levels` and `file` are what LX_TRACE and LX_TRACE_FILE hold; null means not set. */
void RAS1_Configure(const char* levels, const char* file);

#ifdef __cplusplus
}
#endif

#endif
