/* Locales: names, items, changed items, the operating system's names. */
#include <lx.h>
#include <stdio.h>

int main(void) {
  char text[128];
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS); /* the directory of LX_LOCALEDIR */
  if (code != LX_OK) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  LXLocale* german = LXGetLocale("German_Austria", 0, &code);
  LXGetLocaleTextInfo(german, LX_ITEM_LOCALE_STRING, text, sizeof text, 0);
  puts(text);
  LXGetLocaleTextInfo(german, LX_ITEM_CURRENCY, text, sizeof text, 0);
  printf("%s, %d digits\n", text, (int)LXGetLocaleNumInfo(german, LX_ITEM_CURRENCY_DIGITS, 0));
  LXSetLocaleTextInfo(german, LX_ITEM_THOUSANDS, "'", -1, 0);
  LXDoubleToString(german, 1234567.5, text, sizeof text, LX_TERMINATE);
  puts(text);
  LXReleaseLocale(german);

  LXLocale* native = LXConvertNativeLocale("sv_SE.utf8", 0, &code);
  LXGetLocaleTextInfo(native, LX_ITEM_LOCALE_STRING, text, sizeof text, 0);
  puts(text);
  LXReleaseLocale(native);

  if (LXGetLocale("Klingon", 0, &code) == NULL) printf("%d: %s\n", (int)code, LXGetErrorText(code));
  return LXTerm();
}

/* Prints:
German_Austria.UTF-8@Default
€, 2 digits
1'234'567,50
Swedish_Sweden.UTF-8@Swedish
31: language not found
*/
