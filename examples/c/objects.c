/* Objects and aliases of the locale directory, and paths. */
#include <lx.h>
#include <stdio.h>
#include <string.h>

static int32_t count_sorts(void* user, int32_t type, const char* name) {
  (void)name;
  if (type == LX_SORT) ++*(int*)user;
  return 1;
}

int main(void) {
  int32_t code = LXInit(NULL, NULL, NULL, NULL, LX_NO_DEFAULTS);
  const char* name = LXGetCodepageFromAlias(NULL, "windows-31j");
  if (name == NULL) return fprintf(stderr, "no locale directory: code %d\n", (int)code), 1;
  const LXObject* codepage =
      LXGetObjFromName(NULL, LX_CODEPAGE, name, (int32_t)strlen(name), LX_FIND_AND_LOAD, &code);
  char bytes[8], file[64], path[64];
  const int32_t count = LXCpUnicodeToChar(codepage, 0x3042, bytes);
  printf("%s has U+3042 in %d bytes\n", name, (int)count);
  int sorts = 0;
  LXEnumLocales(count_sorts, &sorts);
  printf("%s orders\n", sorts > 50 ? "many" : "few");

  LXGetDataFileName("/tmp", LX_CODEPAGE, ((const LXObjDisk*)codepage)->id, path, sizeof path);
  SplitFile(path, file);
  printf("%s, %s\n", path, file);
  return LXTerm();
}

/* Prints:
MS932 has U+3042 in 2 bytes
many orders
/tmp/cp_00932.nls, cp_00932
*/
