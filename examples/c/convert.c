/* Conversion: a whole string, to and from Unicode, and a text that comes in pieces. */
#include <lx.h>
#include <stdio.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* utf8 = LXGetLocale("Japanese.UTF-8", 0, &code);
  LXLocale* host = LXGetLocale("Japanese.IBM930", 0, &code);
  if (host == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  char field[32], text[64];
  const int32_t bytes = LXConvertStringEx(host, field, LX_SHIFT_SINGLE, sizeof field, utf8, "日本A",
                                          LX_SHIFT_SINGLE, -1, LX_TERMINATE);
  for (int32_t i = 0; i < bytes; ++i) printf("%s%02X", i > 0 ? " " : "", (unsigned char)field[i]);
  puts("");

  LXUChar units[16];
  printf("%d units\n", (int)LXStringToUnicode(units, 16, utf8, "日本A", -1, 0));

  LXConversion* conversion = LXOpenConversion(utf8, host);
  char* output = text;
  int32_t room = sizeof text - 1;
  for (const char* piece = field; piece < field + bytes - 1; ++piece) { /* one byte at a time */
    const char* input = piece;
    int32_t left = 1;
    LXConvertBuffer(conversion, &output, &room, &input, &left);
  }
  *output = 0;
  puts(text);
  LXCloseConversion(conversion);
  LXReleaseLocale(utf8);
  LXReleaseLocale(host);
  return LXTerm();
}

/* Prints:
0E 45 62 45 66 0F C1 00
4 units
日本A
*/
