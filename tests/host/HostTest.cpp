#include <gtest/gtest.h>

#include "oxmv/host/Host.h"
#include "oxmv/host/LinuxHost.h"
#include "tests/support/FakeHost.h"

namespace oxmv {
namespace {

TEST(Host, IsTheDefaultUntilAnotherIsInstalled) {
  EXPECT_NE(dynamic_cast<LinuxHost*>(host().get()), nullptr);
}

TEST(Host, IsTheOneLastInstalled) {
  const auto first = std::make_shared<test::FakeHost>();
  const auto second = std::make_shared<test::FakeHost>();
  EXPECT_EQ(installHost(first), nullptr);
  EXPECT_EQ(host(), first);
  EXPECT_EQ(installHost(second), first);
  EXPECT_EQ(host(), second);
  EXPECT_EQ(installHost(nullptr), second);
  EXPECT_NE(dynamic_cast<LinuxHost*>(host().get()), nullptr);
}

TEST(Host, LivesOnWhileItIsHeld) {
  std::shared_ptr<Host> held;
  {
    const test::InstalledFakeHost fake;
    held = host();
  }
  EXPECT_EQ(held->localizedString("key", "built in"), "built in");
}

}  // namespace
}  // namespace oxmv
