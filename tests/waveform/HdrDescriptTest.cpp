#include "wavemill/waveform/HdrDescript.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using Bytes = std::vector<unsigned char>;

TEST(HdrDescriptTest, DescriptorLayoutDropsTheLastTextCharacterAndBiasesTheResolution) {
  hdrDescript built("ABCDEFGHIJKLMNOPQRSTUVWXYZ", DataRes4, -2.5);
  Bytes descriptor(32);
  built.getDescript(descriptor.data());
  Bytes expected(32, 0);
  for (int i = 0; i < 22; ++i) {
    expected[static_cast<std::size_t>(i)] = static_cast<unsigned char>('A' + i);
  }
  expected[23] = 206;
  expected[24] = 0xC0, expected[25] = 0x04;
  EXPECT_EQ(descriptor, expected);
  char text[23];
  built.getText(text);
  EXPECT_EQ(std::string(text, 23), "ABCDEFGHIJKLMNOPQRSTUVW");

  hdrDescript back(descriptor.data());
  EXPECT_EQ(back.getFreq(), -2.5);
  back.getText(text);
  EXPECT_EQ(std::string(text, 23), std::string("ABCDEFGHIJKLMNOPQRSTUV") + '\0');

  const struct {
    unsigned char stored;
    DataRes res;
  } codes[] = {{201, DataResNone}, {202, DataResNone}, {203, DataRes1}, {204, DataRes2},
               {205, DataResNone}, {206, DataRes4},    {0, DataResNone}};
  for (const auto &row : codes) {
    SCOPED_TRACE(static_cast<int>(row.stored));
    descriptor[23] = row.stored;
    EXPECT_EQ(hdrDescript(descriptor.data()).getRes(), row.res);
  }
}
