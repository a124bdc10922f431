#include "wavemill/services/ServiceProvider.h"
#include "wavemill/services/Log.h"

#include <gtest/gtest.h>

#include <typeinfo>

using namespace Corvane::Wavemill;

TEST(ServiceProviderTest, NamesAndExactClassesAreSeparateLookups) {
  ServiceProvider provider;
  const auto first = std::make_shared<ServiceBase>();
  const auto second = std::make_shared<ServiceBase>();
  const std::shared_ptr<IService> log = std::make_shared<Log>("Trace");
  provider.addService("clock", second);
  provider.addService(first);
  provider.addService(log);
  provider.addService(std::shared_ptr<IService>());
  EXPECT_EQ(provider.getService("clock"), second);
  EXPECT_EQ(provider.getService(typeid(ServiceBase)), first);
  EXPECT_EQ(provider.getService(typeid(Log)), log);
}
