#include "wavemill/services/LibraryService.h"
#include "wavemill/models/Activator.h"
#include "wavemill/models/ModelContainer.h"
#include "wavemill/models/TextModel.h"

#include "platform/Module.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace Corvane::Wavemill;

namespace LibraryTests {

struct Probe : ModelBase {
  WAVEMILL_MODEL(Probe)
  Probe() : ModelBase("LibraryTests::Probe") {}
};
struct Gauge : ModelBase {
  WAVEMILL_MODEL(Gauge)
  Gauge() : ModelBase("LibraryTests::Gauge") {}
};

std::shared_ptr<Library> find(const std::vector<std::shared_ptr<Library>> &libraries, const std::string &name) {
  for (const auto &library : libraries)
    if (library->getName() == name)
      return library;
  return nullptr;
}

// The classes listed under the library `name`, sorted; none when it is missing.
std::vector<std::string> typeNames(const std::vector<std::shared_ptr<Library>> &libraries, const std::string &name) {
  std::vector<std::string> names;
  if (const auto library = find(libraries, name))
    for (const auto &model : library->getModels())
      names.push_back(model->getTypeName());
  std::sort(names.begin(), names.end());
  return names;
}

} // namespace LibraryTests

WAVEMILL_REGISTER_MODEL(LibraryTests::Probe)
WAVEMILL_REGISTER_MODEL(LibraryTests::Gauge)

using namespace LibraryTests;

// The registered classes are listed under the module that holds them; a
// module loaded later appears after a reload, and its classes can be made
// by name once the Activator knows them.
TEST(LibraryServiceTest, ModulesListTheirClasses) {
  Activator activator;
  LibraryService service;
  auto libraries = service.getLibraries(false);
  EXPECT_EQ(typeNames(libraries, "wavemill"), std::vector<std::string>{"TextModel"});
  EXPECT_EQ(typeNames(libraries, "wavemill_services_tests"), (std::vector<std::string>{"Gauge", "Probe"}));
  ASSERT_TRUE(find(libraries, "wavemill") && find(libraries, "wavemill_services_tests"));

  // The index counts first appearance in registration order: the library
  // registers while it loads, before the program does.
  EXPECT_EQ(find(libraries, "wavemill")->getIndex(), 0U);
  EXPECT_EQ(find(libraries, "wavemill_services_tests")->getIndex(), 1U);

  std::string error;
  ASSERT_TRUE(Platform::loadModule(WAVEMILL_TEST_PLUGIN, error)) << error;

  // Cached until asked to reload.
  EXPECT_FALSE(find(service.getLibraries(false), "wavemill_test_plugin"));
  const auto reloaded = service.getLibraries(true);
  ASSERT_TRUE(find(reloaded, "wavemill_test_plugin"));
  EXPECT_EQ(find(reloaded, "wavemill_test_plugin")->getIndex(), libraries.size());

  // An Activator made before the module loaded learns its classes, with the
  // list of markers that the sweep holds, in the plug-in's module.
  activator.updateFullTypeNames("Plugins", "Vendor.Plugins");
  EXPECT_TRUE(activator.toInstance("Vendor.Plugins.Sweep, Plugins"));
  EXPECT_EQ(typeNames(service.getLibraries(true), "wavemill_test_plugin"),
            (std::vector<std::string>{"Marker", "ModelCollection`1[[Marker]]", "Sweep"}));
}
