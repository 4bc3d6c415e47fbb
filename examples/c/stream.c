/* Streams: lines of a codepage through a callback, and characters written through another one. */
#include <lx.h>
#include <stdio.h>
#include <string.h>

static int32_t from_text(void* user, char* buffer, int32_t bytes) {
  const char** text = user;
  const size_t left = strlen(*text), count = left < (size_t)bytes ? left : (size_t)bytes;
  memcpy(buffer, *text, count);
  *text += count;
  return (int32_t)count;
}

static int32_t to_output(void* user, char* buffer, int32_t bytes) {
  return (int32_t)fwrite(buffer, 1, (size_t)bytes, user);
}

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("German.UTF-8", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  const char* text = "größer\r\nkleiner\n";
  char line[32];
  LXStream* in = LXOpenStream(locale, from_text, &text, LX_STREAM_READ);
  LXStream* out = LXOpenStream(locale, to_output, stdout, LX_STREAM_WRITE);
  for (int32_t bytes;
       (bytes = LXReadString(in, locale, line, sizeof line, LX_EOL_LF | LX_DROP_RETURNS | LX_TERMINATE)) > 0;) {
    LXWriteChar(out, locale, ">");
    for (const char* at = line; *at != 0; at = LXNextChar(locale, at)) LXWriteChar(out, locale, at);
  }
  LXCloseStream(in, locale);
  LXCloseStream(out, locale);
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
>größer
>kleiner
*/
