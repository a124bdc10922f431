#include "wavemill/models/TextMap.h"
#include "support/TestModels.h"
#include "wavemill/models/TextModel.h"

#include <gtest/gtest.h>

using namespace Corvane::Wavemill;

// Storing, overwriting and looking keys up, and the index after a recall,
// are read in TextMapConcurrencyTest.
TEST(TextMapTest, CopyBringsTheIndexAlongIntoAMapOfAnotherTree) {
  Testing::LiveTree<TextMap> tree;
  tree.root->setItem("Unit", "Hz");
  tree.root->setItem("Mode", "CW");
  auto other = std::make_shared<TextMap>();
  EXPECT_TRUE(other->copyFrom(tree.root));
  EXPECT_EQ(other->getItem("Mode"), "CW");
  EXPECT_FALSE(other->copyFrom(std::make_shared<TextModel>()));
  EXPECT_FALSE(other->copyFrom(other));
}
