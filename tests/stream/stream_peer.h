// The far end of a stream: what each call of its callback does.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

namespace lx::test {

struct Peer {
  static constexpr int32_t kAll = 1000;       // moves what it is asked to
  static constexpr int32_t kNonsense = 2000;  // claims more than that

  bool sends;                     // else it receives
  std::string bytes{};            // what a read stream is to get, or what a write stream sent
  std::vector<int32_t> script{};  // moves so many bytes, fails below 0; behind the script kAll
  size_t calls = 0;
  size_t given = 0;

  static int32_t transfer(void* user, char* buffer, int32_t wanted) {
    Peer& peer = *static_cast<Peer*>(user);
    const int32_t step = peer.over() ? kAll : peer.script[peer.calls];
    ++peer.calls;
    EXPECT_GE(wanted, 1);
    if (step == kNonsense) return wanted + 1;
    if (step < 0) return step;
    const size_t most = static_cast<size_t>(std::min(step, wanted));
    if (!peer.sends) return peer.bytes.append(buffer, most), static_cast<int32_t>(most);
    const size_t count = peer.bytes.copy(buffer, most, peer.given);
    peer.given += count;
    return static_cast<int32_t>(count);
  }
  bool over() const { return calls >= script.size(); }
};

}  // namespace lx::test
