#include "wavemill/instrument/WSAClass.h"

#include <gtest/gtest.h>

#include <optional>

using namespace Corvane::Wavemill;

// The starts themselves are counted inside the library and are checked with
// the platform layer; here an instance must come up started however the
// lifetimes of others overlap, also after all earlier ones have ended.
TEST(WSAClassTest, EveryInstanceStartsTheSocketLibraryWhateverOthersHold) {
  std::optional<WSAClass> outer(std::in_place);
  EXPECT_TRUE(outer->isStarted());
  {
    const WSAClass inner;
    EXPECT_TRUE(inner.isStarted());
  }
  outer.reset();
  EXPECT_TRUE(WSAClass().isStarted());
}
