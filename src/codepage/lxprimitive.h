// The frame of a per-character primitive: no trace.
#pragma once

#include "codepage/lxcodepage.h"

namespace lx {

/// What a primitive works in: the locale given, or the default, with its last error set to 0.
class Primitive {
 public:
  explicit Primitive(LXLocale* given) : locale_(locale_of(given)) {
    if (locale_ != nullptr) set_last_error(*locale_, LX_OK);
  }
  explicit operator bool() const { return locale_ != nullptr; }
  const Codepage& cp() const { return codepage_of(*locale_->codepage); }
  bool single_byte() const { return (locale_->flags & kLocaleSingleByte) != 0; }
  bool shift_sensitive() const { return (locale_->flags & kLocaleShift) != 0; }
  void fail(int32_t code) const { set_last_error(*locale_, code); }

 private:
  LXLocale* locale_;
};

}  // namespace lx
