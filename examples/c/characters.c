/* Characters: walking a multibyte text, types, case and width. */
#include <lx.h>
#include <stdio.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("German.UTF-8", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  const char* text = "Aß７";
  printf("%d characters:", (int)LXNumChars(locale, text, -1));
  for (const char* at = text; *at != 0; at = LXNextChar(locale, at)) {
    const uint32_t type = LXGetCharType(locale, at, LX_CTYPE1);
    printf(" %X (%d bytes,%s%s)", (unsigned)LXGetChar(locale, at), (int)LXByteLength(locale, at),
           (type & LX_C1_UPPER) != 0 ? " upper" : "", (type & LX_C1_DIGIT) != 0 ? " digit" : "");
  }
  puts("");

  char mapped[32];
  LXMapString(locale, mapped, sizeof mapped, text, -1, LX_MAP_UPPER);
  puts(mapped);
  LXMapString(locale, mapped, sizeof mapped, text, -1, LX_MAP_HALF_WIDTH);
  puts(mapped);
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
3 characters: 41 (1 bytes, upper) C39F (2 bytes,) EFBC97 (3 bytes, digit)
ASS７
Aß7
*/
