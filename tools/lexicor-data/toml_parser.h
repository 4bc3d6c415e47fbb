// The TOML parser. It asserts what some malformed sources do not keep to, and says behind the assertion what is wrong with
// them: the assertions are switched off, in every build and for every compiler.
#pragma once

#pragma push_macro("NDEBUG")
#undef NDEBUG  // which would make assumptions of them
#define TOML_ASSERT(expr) static_assert(true)
#include <toml++/toml.h>
#pragma pop_macro("NDEBUG")
