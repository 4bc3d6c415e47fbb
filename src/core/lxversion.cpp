// What a program can ask of the library that it runs with: its version, and the words for a return code.
#include "lx.h"

extern "C" {

uint32_t LXVersion(const char** text) {
  if (text != nullptr) *text = LX_VERSION;
  return LX_VERSION_NUMBER;
}

const char* LXGetErrorText(int32_t code) {
  switch (code) {
    case LX_OK:
      return "success";
    case LX_E_OPEN:
      return "the file cannot be opened";
    case LX_E_INVALID:
      return "invalid flags, option, mode or argument";
    case LX_W_DEFAULTS:
      return "no locale directory can be used, the built-in objects are in force";
    case LX_E_NOT_INITIALIZED:
      return "the library is not initialised";
    case LX_E_MEMORY:
      return "out of memory";
    case LX_E_FREE:
      return "memory could not be freed";
    case LX_E_NO_CODEPAGE:
      return "codepage not found";
    case LX_E_NO_LANGUAGE:
      return "language not found";
    case LX_E_NO_NATIVE:
      return "no locale of the operating system for this one, or none that works";
    case LX_E_NO_SORT:
      return "sort not found";
    case LX_E_NO_TERRITORY:
      return "territory not found";
    case LX_E_ITEM:
      return "no such locale item, or one that cannot be set";
    case LX_E_SEPARATOR:
      return "a separator has no single byte in the new codepage";
    case LX_E_NOT_FOUND:
      return "object not found, value refused, or text that does not match";
    case LX_E_SIZE:
      return "the output buffer is too small";
    case LX_E_BASE:
      return "the number base is neither 0 nor from 2 to 36";
    case LX_E_FORMAT:
      return "the time format is not valid";
    case LX_E_OUTPUT_FULL:
      return "the output of the conversion is full, and more is pending";
    case LX_E_INPUT_CUT:
      return "the input of the conversion ends inside a character";
    case LX_E_STREAM_DIRECTION:
      return "the stream does not go in this direction";
    case LX_E_STREAM_READ:
      return "reading from the stream failed inside a character";
    case LX_E_STREAM_FLUSH:
      return "flushing the stream failed, and the kept bytes are lost";
    case LX_E_STREAM_HALF:
      return "the stream has only a part of the character yet";
    case LX_E_STREAM_COUNT:
      return "the callback of the stream returned a count that cannot be";
    case LX_E_STREAM_KEPT:
      return "the callback of the stream takes no more bytes, and the rest is kept";
    case LX_E_CATALOG_NULL:
      return "the catalog handle is null";
    case LX_E_CATALOG:
      return "the message catalog is not there, or cannot be read";
    case LX_E_MESSAGE:
      return "the message is not in the catalog, and there is no default text";
    case LX_E_FILE_NOT_FOUND:
      return "file not found";
    case LX_E_FILE_ACCESS:
      return "permission denied";
    case LX_E_FILE_MODE:
      return "the file was opened for writing and cannot be read";
    case LX_E_FILE_IO:
      return "the file is too short or cannot be read, or its name is too long";
    case LX_E_CORRUPT:
      return "the file is damaged or not of this kind";
    default:
      return "unknown code";
  }
}

}  // extern "C"
