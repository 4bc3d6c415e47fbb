/* Order: collation, sort keys that order as bytes, and comparison that ignores case or width. */
#include <lx.h>
#include <stdio.h>
#include <string.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("Swedish.UTF-8", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  printf("ö %c z\n", LXStrcoll(locale, "ö", -1, "z", -1, 0) < 0 ? '<' : '>');
  uint8_t key1[64], key2[64];
  const int32_t bytes1 = LXStrxfrm(locale, key1, sizeof key1, "ö", -1, 0);
  const int32_t bytes2 = LXStrxfrm(locale, key2, sizeof key2, "z", -1, 0);
  const int order = memcmp(key1, key2, (size_t)(bytes1 < bytes2 ? bytes1 : bytes2));
  printf("as keys: ö %c z\n", order < 0 ? '<' : '>');
  printf("Zoo %c ZOO without case\n",
         LXStrcmp(locale, "Zoo", -1, "ZOO", -1, LX_CASE_INSENSITIVE) == 0 ? '=' : '/');
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
ö > z
as keys: ö > z
Zoo = ZOO without case
*/
