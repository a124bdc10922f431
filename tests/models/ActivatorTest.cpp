#include "wavemill/models/Activator.h"
#include "wavemill/models/ApplicationManager.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/SubSetting.h"

#include <gtest/gtest.h>

#include <stdexcept>

using namespace Corvane::Wavemill;

namespace RegistryTests {

struct Bar : ModelBase {
  WAVEMILL_MODEL(Bar)
  Bar() : ModelBase("RegistryTests::Bar") {}
  std::shared_ptr<Int32Setting> level = init(std::make_shared<Int32Setting>("Level"));
};

struct Foo : ModelBase {
  WAVEMILL_MODEL(Foo)
  Foo() : ModelBase("RegistryTests::Foo") {}
  std::shared_ptr<SubSetting<ModelCollection<Bar>>> bars =
      init(std::make_shared<SubSetting<ModelCollection<Bar>>>("Bars"));
};

// Known to the registry without a registerType call.
struct Unlisted : ModelBase {
  WAVEMILL_MODEL(Unlisted)
  Unlisted() : ModelBase("RegistryTests::Unlisted") {}
};

// A collection whose type name is too short for the collection naming.
struct Stub : ModelCollection<Bar> {
  std::string getTypeName() const override { return "Col"; }
};

} // namespace RegistryTests

WAVEMILL_REGISTER_MODEL(RegistryTests::Bar)
WAVEMILL_REGISTER_MODEL(RegistryTests::Foo)

using namespace RegistryTests;

TEST(ActivatorTest, ShortTypeNames) {
  const std::pair<const char *, const char *> table[] = {
      {"Corvane.Wavemill.TextModel, Ns.Lib", "TextModel"},
      {"Models.ModelCollection`1[[Models.TextModel]]", "ModelCollection`1[[TextModel]]"},
      {"System.Collections.ObjectModel.Collection`1[[Corvane.Wavemill.TextModel, Ns.Lib]], mscorlib",
       "Collection`1[[TextModel]]"},
      {"System.Collections.ObjectModel.Collection`1[[System.Collections.ObjectModel.Collection`1[[Ns.Foo, Asm]], "
       "mscorlib]], mscorlib",
       "Collection`1[[Collection`1[[Foo]]]]"},
      // Edge cases: nothing to read, a leading comma, another arity digit,
      // blanks in front of the comma.
      {"", ""},
      {"`1[[A]]", ""},
      {",Ns.Foo", ""},
      {"Ns.Map`2[[Ns.Key, Asm]]", "Map`1[[Key]]"},
      {"Ns.Foo  , Asm", "Foo"},
  };
  for (const auto &row : table)
    EXPECT_EQ(Activator::makeShortTypeName(row.first), row.second) << row.first;

  // Malformed nesting never throws and never reads outside the text.
  for (const char *odd : {"A`1[[]", "A`1[[]]", "A`1[", "A`", "a,b`1[[X]]", "A`1x[B]]", "...", "   , x", "]]`1[["})
    EXPECT_NO_THROW(Activator::makeShortTypeName(odd)) << odd;
}

TEST(ActivatorTest, NamesGoOutAndObjectsComeBack) {
  Activator activator;
  // The constructor knows the application classes by their full names.
  EXPECT_EQ(activator.toName(Prototype::getInstance<ApplicationBase>()), "Corvane.Wavemill.ApplicationBase");
  EXPECT_TRUE(std::dynamic_pointer_cast<ApplicationManager>(activator.toInstance("ApplicationManager")));
  EXPECT_EQ(activator.toName(Prototype::getInstance<ModelCollection<ApplicationBase>>()),
            "System.Collections.ObjectModel.Collection`1[[Corvane.Wavemill.ApplicationBase]], mscorlib");

  // Load-time registered classes are unknown until the names are updated.
  EXPECT_FALSE(activator.toInstance("Foo"));
  EXPECT_EQ(activator.toName(Prototype::getInstance<Foo>()), "RegistryTests.Foo");
  activator.updateFullTypeNames("Asm", "Ns");

  for (const char *name : {"Ns.Foo, Asm", "Other.Foo, Lib", "Models.Foo", "Foo", "RegistryTests.Foo"})
    EXPECT_TRUE(std::dynamic_pointer_cast<Foo>(activator.toInstance(name))) << name;

  // The collection held by Foo was given a descriptor and a .NET name.
  const std::string bars = "System.Collections.ObjectModel.Collection`1[[Ns.Bar, Asm]], mscorlib";
  EXPECT_EQ(activator.toName(std::make_shared<ModelCollection<Bar>>()), bars);
  for (const std::string &name : {bars, std::string("Collection`1[[Bar]]"), std::string("ModelCollection`1[[Bar]]"),
                                  std::string("System.Collections.ObjectModel.Collection`1[[X.Bar, Y]], mscorlib")})
    EXPECT_TRUE(std::dynamic_pointer_cast<ModelCollection<Bar>>(activator.toInstance(name))) << name;

  // Unknown names give nothing, also on a second look.
  for (int round = 0; round < 2; ++round) {
    EXPECT_FALSE(activator.findPrototype("Ns.Missing, Asm"));
    EXPECT_FALSE(activator.toInstance("Ns.Missing, Asm"));
  }
  EXPECT_EQ(activator.findPrototype("Ns.Bar, Asm"), Prototype::getInstance<Bar>());

  // An explicit name wins over the full name; a collection's short name
  // must be long enough to lose its "Model" prefix.
  activator.registerType<Unlisted>("Vendor.Unlisted, Tools");
  EXPECT_EQ(activator.toName(std::make_shared<Unlisted>()), "Vendor.Unlisted, Tools");
  try {
    activator.registerModel(std::make_shared<Stub>(), "");
    ADD_FAILURE() << "no exception";
  } catch (const std::out_of_range &e) {
    EXPECT_STREQ(e.what(), "invalid string position");
  }
}

TEST(ActivatorTest, ContainerKeepsTheFirstDescriptorAndAddsCollections) {
  ModelContainer container;
  container.add(std::make_shared<Bar>(), Prototype::getInstance<RuntimeType<Bar>>());
  container.add(std::make_shared<Bar>(), std::make_shared<RuntimeType<Bar>>());
  EXPECT_EQ(container.getModels().size(), 1u);

  EXPECT_EQ(container.getCollectionPrototype(std::make_shared<Bar>()), Prototype::getInstance<ModelCollection<Bar>>());
  EXPECT_FALSE(container.getCollectionPrototype(std::make_shared<Foo>()));

  // Foo's list of Bar gets a descriptor because Bar is known.
  container.add(std::make_shared<Foo>(), Prototype::getInstance<RuntimeType<Foo>>());
  container.addCollectionRuntimeTypes();
  ASSERT_EQ(container.getModels().size(), 3u);
  EXPECT_EQ(container.getModels()[2], Prototype::getInstance<ModelCollection<Bar>>());

  container.updateFullTypeNamesInternal("Asm", "Ns");
  EXPECT_EQ(container.getModels()[0]->getMetadata().getText("FullTypeName"), "Ns.Bar, Asm");
  EXPECT_EQ(container.getModels()[2]->getMetadata().getText("FullTypeName"),
            "System.Collections.ObjectModel.Collection`1[[RegistryTests.Bar]], mscorlib");
}
