// Validation of language and territory objects when they are loaded: every text that an item can name ends
// inside the payload, and every table of special mappings lies inside it.
#include "core/lxobjtypes.h"

namespace {

namespace language = lx::format::language;
namespace territory = lx::format::territory;

class TextPayload {
 public:
  explicit TextPayload(lx::Bytes payload) : payload_(payload) {}

  size_t word(size_t number) const { return lx::le16(payload_.data + 2 * number); }

  /// Whether a null-terminated text at `offset` ends before `end`.
  bool text_ends(size_t offset, size_t end) const {
    for (; offset + 2 <= end; offset += 2)
      if (lx::le16(payload_.data + offset) == 0) return true;
    return false;
  }
  bool texts_end(size_t first_word, size_t last_word) const {
    for (size_t number = first_word; number <= last_word; ++number)
      if (!text_ends(word(number), payload_.size)) return false;
    return true;
  }

 private:
  lx::Bytes payload_;
};

}  // namespace

namespace lx {

int32_t validate_language(Bytes bytes) {
  if (!bytes.holds(0, language::kHeaderBytes)) return LX_E_CORRUPT;
  const TextPayload payload(bytes);
  const bool valid = payload.texts_end(language::kFirstText, language::kLastText) &&
                     bytes.holds(payload.word(language::kUpperSpecialTable),
                                 payload.word(language::kUpperSpecials) * language::SpecialMapping::kBytes) &&
                     bytes.holds(payload.word(language::kLowerSpecialTable),
                                 payload.word(language::kLowerSpecials) * language::SpecialMapping::kBytes);
  return valid ? LX_OK : LX_E_CORRUPT;
}

int32_t validate_territory(Bytes bytes) {
  // Texts that a locale copies are taken to end where the next one begins; the others only have to end.
  constexpr size_t kCopied[] = {13, 14, 15, 17, 18, 19, 20, 21};
  if (!bytes.holds(0, territory::kHeaderBytes)) return LX_E_CORRUPT;
  const TextPayload payload(bytes);
  if (!payload.texts_end(territory::kFirstText, territory::kLastText)) return LX_E_CORRUPT;
  if (payload.word(territory::kPayloadBytes) > bytes.size) return LX_E_CORRUPT;
  for (size_t number : kCopied)
    if (payload.word(number + 1) > bytes.size ||
        !payload.text_ends(payload.word(number), payload.word(number + 1)))
      return LX_E_CORRUPT;
  return LX_OK;
}

}  // namespace lx
