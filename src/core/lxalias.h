// The codepage alias list of an object manager.
#pragma once

#include "core/lxrecords.h"

/// Reads the alias file of the manager's directory into its list. False when reading stopped at an error; the
/// aliases read so far stay.
bool LXBuildAliasList(LXObjManager* manager);
void LXDestroyAliasList(LXObjManager* manager);

/// The name of the alias file of `directory`, written to `buffer` of `size` bytes; null when it does not fit.
char* LXGetAliasFileName(const char* directory, char* buffer, size_t size);
