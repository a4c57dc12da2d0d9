#include <atomic>
#include <memory>
#include <thread>
#include <vector>

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

TEST(Host, IsInstalledAndAskedForByThreadsAtOnce) {
  const auto one = std::make_shared<test::FakeHost>();
  const auto other = std::make_shared<test::FakeHost>();
  installHost(one);
  std::atomic<int> strangers = 0;
  {
    const auto isOneOfTheTwo = [&](const std::shared_ptr<Host>& found) {
      return found == one || found == other;
    };
    std::vector<std::thread> threads;
    for (const auto& mine : {one, other}) {
      threads.emplace_back([&, mine] {
        for (int i = 0; i < 1000; ++i) {
          if (!isOneOfTheTwo(installHost(mine))) ++strangers;
        }
      });
      threads.emplace_back([&] {
        for (int i = 0; i < 1000; ++i) {
          if (!isOneOfTheTwo(host())) ++strangers;
        }
      });
    }
    for (std::thread& thread : threads) thread.join();
  }
  EXPECT_EQ(strangers, 0);
  installHost(nullptr);
  EXPECT_EQ(one.use_count(), 1);
  EXPECT_EQ(other.use_count(), 1);
}

}  // namespace
}  // namespace oxmv
