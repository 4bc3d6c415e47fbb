/* Messages of a catalog, in the codepage of the caller. Its source: printf '$set 1\n1 Disk full\n' | lexicor-gencat app.cat */
#include <lx.h>
#include <stdio.h>

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  LXLocale* locale = LXGetLocale("English.UTF-8", 0, &code);
  if (locale == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(code)), 1;

  LXCatalog* catalog = LXOpenCatalog(locale, "./%N.cat", "app", LX_CATALOG_LOAD);
  if (catalog == NULL) return fprintf(stderr, "%s\n", LXGetErrorText(LXGetError(locale))), 1;
  char text[64];
  LXGetMessage(catalog, 1, 1, text, sizeof text, "none");
  puts(text);
  LXGetMessage(catalog, 1, 2, text, sizeof text, "Printer on fire");
  puts(text);
  LXCloseCatalog(catalog);
  LXReleaseLocale(locale);
  return LXTerm();
}

/* Prints:
Disk full
Printer on fire
*/
