// The library on tiny codepages, catalogs written to a scratch directory, and messages as strings.
#pragma once

#include <cstdlib>
#include <memory>

#include "core/library_fixture.h"
#include "support/catalog_builder.h"
#include "support/tiny_codepages.h"

namespace lx::test {

struct CatalogCloser {
  void operator()(LXCatalog* catalog) const { EXPECT_EQ(LXCloseCatalog(catalog), LX_OK); }
};
using CatalogPtr = std::unique_ptr<LXCatalog, CatalogCloser>;

inline constexpr uint32_t kModes[] = {0, LX_CATALOG_LOAD};

class CatalogTest : public LibraryTest {
 protected:
  void SetUp() override {
    unsetenv("LX_NLSPATH");
    // What catalogs need of the locale directory is loaded before files and memory are looked at.
    library.locale(tiny_shift_jis());
    LXReleaseLocale(LXGetLocale("", LX_FALLBACK, nullptr));
  }
  void TearDown() override { EXPECT_TRUE(library.close()); }

  LXLocale* single() { return library.locale(tiny_single()); }

  /// Opens the catalog that was written last, or writes one.
  CatalogPtr open(uint32_t flags) {
    return CatalogPtr(LXOpenCatalog(single(), nullptr, directory.file("catalog").c_str(), flags));
  }
  CatalogPtr open(const ByteString& file, uint32_t flags) {
    directory.write("catalog", file);
    return open(flags);
  }

  /// The message, or its code as a number.
  static std::string message(const CatalogPtr& catalog, uint32_t set, uint32_t number,
                             const char* default_text = nullptr) {
    char text[300] = "";
    const int32_t code = LXGetMessage(catalog.get(), set, number, text, sizeof(text), default_text);
    return code == LX_OK ? text : std::to_string(code);
  }

  TinyLibrary library;
};

}  // namespace lx::test
