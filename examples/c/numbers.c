/* Numbers and money, written and read. */
#include <lx.h>
#include <stdio.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("Hindi_India.UTF-8", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  char text[64];
  const char* end;
  LXLongToString(locale, 12345678, text, sizeof text, LX_TERMINATE);
  puts(text);
  printf("%ld\n", (long)LXStringToLong(locale, text, -1, &end, 10, 0));
  LXCurrencyToString(locale, -1234567.5, text, sizeof text, LX_TERMINATE);
  puts(text);
  const double value = LXStringToDouble(locale, "1,234.5 kg", -1, &end, 0);
  printf("%.1f, then \"%s\"\n", value, end);
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
1,23,45,678
12345678
-₹12,34,567.50
1234.5, then " kg"
*/
