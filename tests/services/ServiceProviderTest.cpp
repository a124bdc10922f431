#include "wavemill/services/ServiceProvider.h"
#include "wavemill/services/Log.h"
#include "wavemill/services/LogBase.h"
#include "wavemill/services/ServiceBase.h"

#include <gtest/gtest.h>

#include <memory>
#include <typeinfo>

using namespace Corvane::Wavemill;

TEST(ServiceProviderTest, NamesAndClassesAreSeparateLookupsThatKeepTheLatestEntry) {
  ServiceProvider provider;
  const auto first = std::make_shared<ServiceBase>();
  const auto second = std::make_shared<ServiceBase>();
  provider.addService("clock", first);
  provider.addService("clock", second);
  provider.addService(first);
  provider.addService(std::shared_ptr<IService>());
  EXPECT_EQ(provider.getService("clock"), second);
  EXPECT_EQ(provider.getService(typeid(ServiceBase)), first);
  EXPECT_EQ(provider.getService("ServiceBase"), nullptr);

  provider.addService("clock", nullptr);
  EXPECT_EQ(provider.getService("clock"), nullptr);
  EXPECT_EQ(provider.getService("missing"), nullptr);
}

TEST(ServiceProviderTest, ClassLookupFindsOnlyTheExactDynamicClass) {
  ServiceProvider provider;
  const std::shared_ptr<IService> log = std::make_shared<Log>("Trace");
  provider.addService(log);
  EXPECT_EQ(provider.getService(typeid(Log)), log);
  EXPECT_EQ(provider.getService(typeid(LogBase)), nullptr);
  EXPECT_EQ(provider.getService("Trace"), nullptr);
}
