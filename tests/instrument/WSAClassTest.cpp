#include "wavemill/instrument/WSAClass.h"

#include "platform/Network.h"

#include <gtest/gtest.h>

#include <optional>

using namespace Corvane::Wavemill;

TEST(WSAClassTest, EachInstanceHoldsOneStartOfTheSocketLibraryForItsLifetime) {
  const int before = Platform::socketUsers();
  std::optional<WSAClass> outer(std::in_place);
  EXPECT_TRUE(outer->isStarted());
  EXPECT_EQ(Platform::socketUsers(), before + 1);
  {
    const WSAClass inner;
    EXPECT_TRUE(inner.isStarted());
    EXPECT_EQ(Platform::socketUsers(), before + 2);
  }
  EXPECT_EQ(Platform::socketUsers(), before + 1);
  outer.reset();
  EXPECT_EQ(Platform::socketUsers(), before);
}
