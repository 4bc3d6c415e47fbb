/* The process layer: nobody calls LXInit, codepages go by number, and each thread has a locale. Directory: NLS1_LOCALEDIR */
#include <nls1.h>
#include <stdio.h>

int main(void) {
  uint32_t code = 0;
  char field[16];
  const int32_t bytes = NLS1_TranslateString(1141, 57352, field, sizeof field, "Größe", -1, NULL, 0, &code);
  printf("%s: %d bytes,", LXGetErrorText((int32_t)code), (int)bytes);
  for (int32_t i = 0; i < bytes; ++i) printf(" %02X", (unsigned char)field[i]);
  puts("");

  int32_t rc = 0;
  const int32_t german = NLS1_GetLanguageId("German", &rc), austria = NLS1_GetTerritoryId("Austria", &rc);
  LXLocale* locale = NLS1_GetLocale(NLS1_LANGUAGE_TERRITORY(german, austria), 0, 0, &rc);
  char text[64];
  LXLongToString(locale, 1234567, text, sizeof text, LX_TERMINATE);
  puts(text);
  return LXReleaseLocale(locale);
}

/* Prints:
success: 6 bytes, C7 99 6A A1 85 00
1 234 567
*/
