/* Lexicor: national-language support behind a C interface.
 *
 * A locale joins a language, a territory, a codepage and a sort order. Call LXInit, get a locale with
 * LXGetLocale, hand it to the functions of the family headers below, and end with LXReleaseLocale and
 * LXTerm.
 *
 * Conventions:
 *  1. Null locale. A null LXLocale means the default locale, set by LXSetLocale.
 *  2. Errors. Each function that takes a locale leaves a code of lx/base.h there; LXGetError reads it,
 *     LXGetErrorText says it in English. Before LXInit and after the last LXTerm a call that needs a
 *     locale, data or memory is refused and writes no result; where there is a shift state to hand on,
 *     it is that given. What needs none of them works all the same: reading files, listing the
 *     operating system's names, computing from the arguments alone.
 *  3. Forms. No suffix: a byte string in the locale's codepage. W: packed codes (LXWChar). U: 16-bit
 *     Unicode (LXUChar). Ex: a byte string of a shift-sensitive codepage with a shift state. S: takes a
 *     shift state in place of the lead byte's length.
 *  4. W is not Unicode: a packed code holds the bytes of one character of the codepage.
 *  5. Lengths are signed 32-bit; below 0 means null-terminated. LX_CHARACTERS makes lengths and sizes
 *     count characters in place of bytes. In a shift-sensitive codepage the byte behind the last of
 *     them is then looked at, whether it is a shift byte, so that it must be readable.
 *  6. Characters are never cut: output ends on a whole character, and a character cut by the end of
 *     the input is not entered.
 *  7. Termination. Output is terminated where a function says so; LX_TERMINATE asks for it and keeps
 *     one unit of the buffer for the null.
 *  8. Ownership. Handles are released by the function named beside the one that creates them. Data
 *     objects belong to the library.
 *  9. Memory comes from the hooks given to LXInit. Short texts are worked on without allocating.
 * 10. Threads. What may go on at the same time in several threads:
 *
 *       what is shared                  by which calls
 *       data objects                    all: they are read-only
 *       a locale that nobody changes    all that take a locale, but for LXSetLocale...Info,
 *                                       LXLocaleSetModifiable, LXLocaleChange... and
 *                                       LXReleaseLocale; LXGetError then tells of any of the threads
 *       a conversion, stream, catalog   none: one thread at a time
 *       the default locale              as a locale; LXSetLocale must not race with other calls
 *       the library                     LXInit and LXTerm while a use of it lasts; the first LXInit
 *                                       and the last LXTerm must not race with other calls
 * 11. Unicode is 16-bit: characters beyond U+FFFF become U+FFFD. */
#ifndef LX_H
#define LX_H

/* The version of these headers: major * 65536 + minor * 256 + patch, and as text. LXVersion gives the library's. */
#define LX_VERSION_NUMBER 0x010000
#define LX_VERSION "1.0.0"

#include "lx/base.h"
#include "lx/catalog.h"
#include "lx/codepage.h"
#include "lx/collate.h"
#include "lx/compare.h"
#include "lx/convert.h"
#include "lx/file.h"
#include "lx/init.h"
#include "lx/item.h"
#include "lx/locale.h"
#include "lx/map.h"
#include "lx/native.h"
#include "lx/number.h"
#include "lx/object.h"
#include "lx/stream.h"
#include "lx/string.h"
#include "lx/time.h"

#endif
