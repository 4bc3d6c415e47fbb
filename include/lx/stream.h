/* Lexicor: character streams over a caller's transfer callback, and the line ends of a codepage. */
#ifndef LX_STREAM_H
#define LX_STREAM_H

#include "lx/base.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Moves bytes between `buffer` and whatever the caller reads from or writes to: up to `bytes` of them, at
 * least 1. Returns how many it moved, 0 when there is nothing to read or nothing can be taken now, or -1 on
 * failure; any other result counts as a failure. It must not use the stream that calls it. A read callback is
 * never asked for bytes of the next character. `user` is the value given to LXOpenStream. */
typedef int32_t (*LXTransfer)(void* user, char* buffer, int32_t bytes);

/* Modes of LXOpenStream. */
#define LX_STREAM_READ 0x80000050u
#define LX_STREAM_WRITE 0x80000051u

enum {
  LX_STREAM_BUFFER = 80, /* bytes that a stream keeps: pushed back, or not yet taken by the callback */
  LX_STREAM_OFFERS = 16  /* calls in a row that may return 0 before bytes offered to the callback are kept */
};

/* What the reading functions return when there is no character. */
#define LX_STREAM_NO_UNIT 0xFFFFu     /* LXReadCharU: end of the input (last error LX_OK) or failure */
#define LX_STREAM_END 0xFFFFFFFFu     /* LXReadCharW: end of the input */
#define LX_STREAM_FAILURE 0xFFFFFFFEu /* LXReadCharW: failure */

/* Kinds of line ends, by the four line-end bytes of a codepage: line feed, carriage return, and two further
 * ones, which are line feeds in codepages that have no others, and new line (0x15) and line feed in EBCDIC. */
#define LX_EOL_LF 0x00000100u      /* line feed */
#define LX_EOL_CRLF 0x00000200u    /* carriage return and line feed */
#define LX_EOL_THIRD 0x00000400u   /* the third byte */
#define LX_EOL_FOURTH 0x00000800u  /* the fourth byte */
#define LX_EOL_ALL 0x00000F00u     /* all of these */
#define LX_EOL_DEFAULT 0x00001000u /* LXPutEol only: line feed */
#define LX_EOL_NONE 0x80000030u    /* kind found by LXGetEol: none */
#define LX_EOL_INVALID 0x80000031u /* ... invalid flags */

/* Flag of LXReadString: takes out each carriage return that stands before a line feed. */
#define LX_DROP_RETURNS 0x00008000u

/* Streams. A stream is used by one thread at a time, and with locales of one codepage. Its characters may be
 * bytes of the codepage or, by the U forms, 16-bit units in the machine's byte order. Where the codepage is
 * shift-sensitive, a stream begins in the single-byte state; W and Ex forms write the shift bytes that are due,
 * and reading packed codes passes over all shift bytes; the plain forms move bytes as they are. Every error
 * leaves the stream usable. Without an initialised library nothing is touched and the result is that of a
 * failure. */

/* Opens a stream that moves its bytes through `transfer`; to be closed with LXCloseStream. Null with last error
 * LX_E_INVALID (another mode, or no callback) or LX_E_MEMORY. */
LX_API LXStream* LXOpenStream(LXLocale* locale, LXTransfer transfer, void* user, uint32_t mode);

/* Closes a stream; that of a write stream offers the kept bytes first and ends shift-sensitive text in the
 * single-byte state. Returns 1, or 0 with last error LX_E_STREAM_FLUSH (the callback did not take all of it;
 * the rest is dropped) or LX_E_FREE. The stream is gone in any case, but when the library is not
 * initialised. */
LX_API int32_t LXCloseStream(LXStream* stream, LXLocale* locale);

/* Offers the kept bytes of a write stream to the callback; drops those pushed back on a read stream. Returns 1,
 * or 0 with last error LX_E_STREAM_FLUSH (the callback failed: the kept bytes are dropped) or LX_E_STREAM_KEPT
 * (it took nothing LX_STREAM_OFFERS times: the rest is kept). */
LX_API int32_t LXFlushStream(LXStream* stream, LXLocale* locale);

/* The next 16-bit unit, or LX_STREAM_NO_UNIT. With two bytes wanted, a callback that returns -1 ends the input
 * (last error LX_OK), 1 is half a unit, which is kept (LX_E_STREAM_HALF: read on to complete it), and any other
 * count is LX_E_STREAM_COUNT. With the other half wanted, -1 gives LX_E_STREAM_READ and any other count
 * LX_E_STREAM_HALF. Last error LX_E_STREAM_DIRECTION on a write stream. */
LX_API LXUChar LXReadCharU(LXStream* stream, LXLocale* locale);
/* The next character as a packed code, however many calls it takes to get its bytes. A callback that returns 0
 * or -1 before its first byte ends the input: LX_STREAM_END, last error LX_OK, and another call reads on.
 * Otherwise LX_STREAM_FAILURE with last error LX_E_STREAM_HALF (0 inside a character), LX_E_STREAM_READ (-1
 * inside a character), LX_E_STREAM_COUNT (a count that cannot be) or LX_E_STREAM_DIRECTION (write stream). The
 * bytes read are kept for the next call. */
LX_API LXWChar LXReadCharW(LXStream* stream, LXLocale* locale);

/* Reads characters into `output` of `size` bytes until it is full, a line ends or the input does. Returns the
 * bytes stored, the terminator included; -1 when the input ends before anything is read; -2 for an error before
 * that (LX_E_STREAM_DIRECTION, LX_E_INVALID, or a code of LXReadCharW). With -1 and -2 nothing is stored. An
 * error behind that ends the string too and is left as the last error beside the bytes stored. A character that
 * does not fit stays in the stream. `flags`:
 *   LX_EOL_LF to LX_EOL_FOURTH  line ends that end the string; they are stored. Without any it reads through
 *                               line ends. A carriage return and line feed are not parted, unless nothing else
 *                               fits.
 *   LX_DROP_RETURNS             takes carriage returns before line feeds out
 *   LX_TERMINATE                keeps a byte of the size for a null, and counts it
 *   LX_CHARACTERS               size and result count characters
 * A size without room for a character returns what is stored without one, 0 or the terminator. In a
 * shift-sensitive codepage the characters are stored without shift bytes. */
LX_API int32_t LXReadString(LXStream* stream, LXLocale* locale, char* output, int32_t size, uint32_t flags);
/* As LXReadString, with shift bytes: each string begins and ends in the single-byte state. */
LX_API int32_t LXReadStringEx(LXStream* stream, LXLocale* locale, char* output, int32_t size, uint32_t flags);
/* As LXReadString; size and result count packed codes. */
LX_API int32_t LXReadStringW(LXStream* stream, LXLocale* locale, LXWChar* output, int32_t size, uint32_t flags);
/* As LXReadString of units; size and result count them. Errors are those of LXReadCharU, except that a callback
 * that returns 0 where two bytes are wanted ends the input. Line ends are the Unicode values of the codepage's
 * line-end bytes. */
LX_API int32_t LXReadStringU(LXStream* stream, LXLocale* locale, LXUChar* output, int32_t size, uint32_t flags);

/* Puts a character back, to be read before anything else; the last one put back comes first. The length of
 * `character` comes from its first byte. Returns 1, or 0 with last error LX_E_STREAM_DIRECTION (write stream)
 * or LX_E_SIZE (more than LX_STREAM_BUFFER bytes would be kept). */
LX_API int32_t LXUngetChar(LXStream* stream, LXLocale* locale, const char* character);
/* As LXUngetChar for a 16-bit unit, in the machine's byte order. */
LX_API int32_t LXUngetCharU(LXStream* stream, LXLocale* locale, LXUChar unit);
/* As LXUngetChar for a packed code. In a shift-sensitive codepage a code of more than one byte is double-byte;
 * a shift byte is kept with the character where the stream is in the other state. */
LX_API int32_t LXUngetCharW(LXStream* stream, LXLocale* locale, LXWChar code);
/* As LXUngetCharW, with the state of the character, which tells its length. */
LX_API int32_t LXUngetCharEx(LXStream* stream, LXLocale* locale, const char* character, LXShiftState state);

/* Writes a character, behind bytes that were kept earlier. The length of `character` comes from its first byte.
 * Returns 1, or 0 with last error
 *   LX_E_STREAM_KEPT       the callback failed or took nothing LX_STREAM_OFFERS times in a row; what it did not
 *                          take is kept, the next write or flush offers it again: do not write the character
 *                          again;
 *   LX_E_SIZE              the same, and there is no room to keep the character: nothing of it is written,
 *                          write it again;
 *   LX_E_STREAM_DIRECTION  a read stream. */
LX_API int32_t LXWriteChar(LXStream* stream, LXLocale* locale, const char* character);
/* As LXWriteChar for a 16-bit unit, in the machine's byte order. */
LX_API int32_t LXWriteCharU(LXStream* stream, LXLocale* locale, LXUChar unit);
/* As LXWriteChar for a packed code; in a shift-sensitive codepage as LXWriteCharEx, where a code of more than
 * one byte is double-byte. `unused` is not used. */
LX_API int32_t LXWriteCharW(LXStream* stream, LXLocale* locale, LXWChar code, int32_t unused);
/* As LXWriteChar, behind the shift byte that is due; `double_byte` tells whether the character has the width of
 * the double-byte state, or one byte. `unused` is not used. */
LX_API int32_t LXWriteCharEx(LXStream* stream, LXLocale* locale, const char* character, int32_t double_byte,
                             int32_t unused);

/* The place right behind the first line end in `length` bytes of a text (with LX_CHARACTERS characters; below
 * 0: null-terminated), or null. `*kind` and `*eol_length` receive its kind and its length in bytes: LX_EOL_NONE
 * and 0 when there is none. `flags` are LX_CHARACTERS and the kinds to look for; none means LX_EOL_LF. Where
 * several kinds fit, the first of LX_EOL_CRLF, LX_EOL_LF, LX_EOL_THIRD and LX_EOL_FOURTH is found. Other flags:
 * null, last error LX_E_INVALID, LX_EOL_INVALID and 0. */
LX_API char* LXGetEol(LXLocale* locale, const char* text, int32_t length, uint32_t* kind, int32_t* eol_length,
                      uint32_t flags);
/* As LXGetEol; the text begins in the single-byte state, and the bytes of double-byte characters end no line.
 */
LX_API char* LXGetEolEx(LXLocale* locale, const char* text, int32_t length, uint32_t* kind, int32_t* eol_length,
                        uint32_t flags);
/* As LXGetEol; packed codes, `length` and `*eol_length` count codes. */
LX_API LXWChar* LXGetEolW(LXLocale* locale, const LXWChar* text, int32_t length, uint32_t* kind,
                          int32_t* eol_length, uint32_t flags);
/* As LXGetEol; 16-bit Unicode, `length` and `*eol_length` count units, which are compared with the Unicode
 * values of the line-end bytes. */
LX_API LXUChar* LXGetEolU(LXLocale* locale, const LXUChar* text, int32_t length, uint32_t* kind,
                          int32_t* eol_length, uint32_t flags);

/* Stores the line ends that `flags` name and returns the place right behind them; nothing is terminated. Room
 * for 5 bytes is always enough. `flags` are the kinds and LX_EOL_DEFAULT; none means that one. The order is
 * fixed: fourth byte, third byte, line feed (LX_EOL_LF), carriage return, and one more line feed for
 * LX_EOL_CRLF and LX_EOL_DEFAULT together. Other flags: null and last error LX_E_INVALID, with nothing
 * stored. */
LX_API char* LXPutEol(LXLocale* locale, char* output, uint32_t flags);
/* As LXPutEol, in the single-byte state. */
LX_API char* LXPutEolEx(LXLocale* locale, char* output, uint32_t flags);
/* As LXPutEol; stores packed codes, at most 5. */
LX_API LXWChar* LXPutEolW(LXLocale* locale, LXWChar* output, uint32_t flags);
/* As LXPutEol; stores the Unicode values of the line-end bytes, at most 5 units. */
LX_API LXUChar* LXPutEolU(LXLocale* locale, LXUChar* output, uint32_t flags);

#ifdef __cplusplus
}
#endif
#endif
