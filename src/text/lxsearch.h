// The frame of the functions that look into a text for what another text holds, and the places that they
// return.
#pragma once

#include "core/lxcall.h"
#include "text/lxwalk.h"

namespace lx {

/// The frame of a function that looks into one text for what another one holds: `body` is given the call and
/// both readers.
template <class Result, class Unit, class Body>
Result search(RAS1_Unit& unit, LXLocale* given, Form form, const Text<Unit>& text, const Text<Unit>& other,
              uint32_t flags, uint32_t allowed_flags, Result none, Body body) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, none);
  if ((flags & ~allowed_flags) != 0) return call.fail(LX_E_INVALID, none);
  const Codepage& cp = codepage_of(call.codepage());
  const bool characters = (flags & LX_CHARACTERS) != 0;
  const size_t units = units_of(cp, text, characters);
  const size_t other_units = units_of(cp, other, characters);
  return with_cursor(cp, form, text, units, [&](const auto& in) {
    return body(call, in, like(in, other.p, other_units, other.state));
  });
}

template <class Unit>
Unit* writable(const Unit* p) {
  return const_cast<Unit*>(p);
}

/// A character in a text.
template <class Cursor>
struct Place {
  const typename Cursor::Unit* p;  // null: none
  Cursor in;                       // in its state
};

}  // namespace lx
