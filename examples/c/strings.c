/* Strings by whole characters: in MS932 the second byte of a character may be 5C, a backslash elsewhere. */
#include <lx.h>
#include <stdio.h>
#include <string.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("Japanese.MS932", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  char path[] = "\x95\x5C\\\x83\x5C.txt"; /* 表\ソ.txt */
  printf("strchr: %d, LXStrchr: %d\n", (int)(strchr(path, '\\') - path),
         (int)(LXStrchr(locale, path, -1, '\\', 0) - path));
  char buffer[8];
  printf("copied: %d of 8 bytes\n", (int)LXStrcpy(locale, buffer, sizeof buffer, path, 4, 0));

  char list[] = "one, two,three", *next = NULL;
  int32_t length = -1;
  for (char* rest = list; rest != NULL; rest = next) {
    const char* word = LXStrtok(locale, rest, &length, ", ", -1, &next, 0);
    if (word != NULL) printf("[%s]", word);
  }
  puts("");
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
strchr: 1, LXStrchr: 2
copied: 3 of 8 bytes
[one][two][three]
*/
