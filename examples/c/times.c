/* Times, written and read. */
#include <lx.h>
#include <stdio.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("French_France.UTF-8", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  const LXTime moment = {9, 5, 14, 21, 10, 126, 6, 324}; /* 14:05:09, 21 November 2026, a Saturday */
  char text[64];
  LXTimeToString(locale, &moment, text, sizeof text, "%A, %#d %B %Y", -1, LX_TERMINATE);
  puts(text);
  LXTime read = {0, 0, 0, 0, 0, 0, 0, 0};
  LXStringToTime(locale, &read, "3 octobre 1990", -1, "%d %B %Y", -1, 0);
  printf("day %d of month %d of %d\n", (int)read.day, (int)read.month, (int)read.year + 1900);
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
samedi, 21 novembre 2026
day 3 of month 9 of 1990
*/
