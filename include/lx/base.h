/* Lexicor: types, return codes and flags that every family of functions shares. */
#ifndef LX_BASE_H
#define LX_BASE_H

#include <stddef.h>
#include <stdint.h>

#if defined(__GNUC__)
#define LX_API __attribute__((visibility("default")))
#else
#define LX_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* Handles. Their records are private to the library. */
typedef struct LXLocale LXLocale;         /* language + territory + codepage + sort */
typedef struct LXObject LXObject;         /* one data object; begins with an LXObjDisk (lx/object.h) */
typedef struct LXObjManager LXObjManager; /* the objects of one locale directory */
typedef struct LXConversion LXConversion; /* a streaming conversion between two locales */
typedef struct LXFile LXFile;             /* an open file */
typedef struct LXStream LXStream;         /* a character stream over a caller's transfer callback */
typedef struct LXCatalog LXCatalog;       /* an open message catalog */

/* One multibyte character packed into an integer, its bytes in order with the first byte most
 * significant: the single byte 0x41 is 0x41, the bytes 0x82 0xA0 are 0x82A0. Not a Unicode value. */
typedef uint32_t LXWChar;

/* One 16-bit Unicode code unit, taken as a code point: there is no surrogate handling. */
typedef uint16_t LXUChar;

/* Shift state of a shift-sensitive codepage: 0 after Shift-In and at the start of a text (one byte a
 * character), 1 after Shift-Out (the codepage's width in bytes a character). */
typedef uint32_t LXShiftState;
enum { LX_SHIFT_SINGLE = 0, LX_SHIFT_DOUBLE = 1 };

/* Return codes, and the values of LXGetError. */
enum {
  LX_OK = 0,
  LX_E_OPEN = 1,              /* a file could not be opened or created, for no reason listed below */
  LX_E_INVALID = 2,           /* invalid flags, option, mode or argument */
  LX_W_DEFAULTS = 10,         /* LXInit: usable, but on the built-in objects */
  LX_E_NOT_INITIALIZED = 11,  /* LXInit failed, or was not called, or no default locale is set */
  LX_E_MEMORY = 20,           /* the allocation hook returned null */
  LX_E_FREE = 21,             /* the free hook reported failure */
  LX_E_NO_CODEPAGE = 30,      /* codepage not found */
  LX_E_NO_LANGUAGE = 31,      /* language not found */
  LX_E_NO_NATIVE = 32,        /* no operating-system locale for this locale, or none that works */
  LX_E_NO_SORT = 33,          /* sort not found */
  LX_E_NO_TERRITORY = 34,     /* territory not found */
  LX_E_ITEM = 35,             /* unknown or unsettable locale item */
  LX_E_SEPARATOR = 36,        /* codepage change refused: a separator has no single-byte form */
  LX_E_NOT_FOUND = 37,        /* object not found, value refused, or text does not match */
  LX_E_SIZE = 40,             /* output buffer too small; the partial output stays */
  LX_E_BASE = 50,             /* bad number base */
  LX_E_FORMAT = 51,           /* bad time format */
  LX_E_OUTPUT_FULL = 52,      /* conversion output full, more is pending */
  LX_E_INPUT_CUT = 53,        /* conversion input ended inside a character */
  LX_E_STREAM_DIRECTION = 60, /* the operation does not fit the stream's direction */
  LX_E_STREAM_READ = 61,      /* the callback failed inside a character or a 16-bit unit */
  LX_E_STREAM_FLUSH = 62,     /* flushing failed; the buffered bytes are dropped */
  LX_E_STREAM_HALF = 63,      /* only a part of a character could be read; it is kept */
  LX_E_STREAM_COUNT = 64,     /* the callback returned a count that cannot be */
  LX_E_STREAM_KEPT = 65,      /* the callback stopped taking bytes; the rest is kept in the buffer */
  LX_E_CATALOG_NULL = 70,     /* the catalog handle is null */
  LX_E_CATALOG = 71,          /* message catalog not found, damaged or unreadable */
  LX_E_MESSAGE = 72,          /* message missing, and no default text given */
  LX_E_FILE_NOT_FOUND = 1000, /* file not found */
  LX_E_FILE_ACCESS = 1001,    /* access denied */
  LX_E_FILE_MODE = 1002,      /* read on a file that was opened for writing */
  LX_E_FILE_IO = 1003,        /* no data location, name too long, seek or read failure */
  LX_E_CORRUPT = 2000         /* a data file does not hold what it should */
};

/* Flags shared by many families. */
enum {
  LX_TERRITORY_VALUES = 0x0001, /* read the territory's own values, not the locale's changed ones */
  LX_TERMINATE = 0x0008,        /* end the output with a null unit and count it */
  LX_CHARACTERS = 0x4000        /* lengths and sizes count characters, not bytes */
};

/* Object types. */
enum { LX_LANGUAGE = 0, LX_TERRITORY = 1, LX_CODEPAGE = 2, LX_SORT = 3 };

#ifdef __cplusplus
}
#endif
#endif
