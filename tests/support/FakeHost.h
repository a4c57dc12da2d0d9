// A host for tests: it answers from maps and remembers what it was told.

#pragma once

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "oxmv/host/Host.h"

namespace oxmv::test {

class FakeHost final : public Host {
 public:
  using Preferences = std::map<std::string, Value, std::less<>>;

  // By application identifier.
  std::map<std::string, Preferences, std::less<>> preferences;
  std::map<std::string, std::string, std::less<>> strings;
  std::vector<std::string> alerts;
  std::vector<std::string> logLines;
  // The application identifiers of the synchronisations, in order.
  std::vector<std::string> synchronisations;
  // What it was asked for, in order: "get KEY", "set KEY", "synchronise", "string KEY".
  std::vector<std::string> questions;

  Value copyPreference(std::string_view key, std::string_view appID) override {
    questions.push_back("get " + std::string(key));
    const auto domain = preferences.find(appID);
    if (domain == preferences.end()) return {};
    const auto found = domain->second.find(key);
    return found == domain->second.end() ? Value() : found->second;
  }
  void setPreference(std::string_view key, const Value& value, std::string_view appID) override {
    questions.push_back("set " + std::string(key));
    Preferences& domain = preferences[std::string(appID)];
    if (value.isNothing()) {
      domain.erase(std::string(key));
    } else {
      domain.insert_or_assign(std::string(key), value);
    }
  }
  bool synchronizePreferences(std::string_view appID, std::error_code*) override {
    questions.emplace_back("synchronise");
    synchronisations.emplace_back(appID);
    return true;
  }
  std::string localizedString(std::string_view key, std::string_view builtIn) override {
    questions.push_back("string " + std::string(key));
    const auto found = strings.find(key);
    return found == strings.end() ? std::string(builtIn) : found->second;
  }
  void alert(std::string_view message) override { alerts.emplace_back(message); }
  void log(std::string_view line) override { logLines.emplace_back(line); }
};

// Puts a fake host in use while it lives.
class InstalledFakeHost {
 public:
  InstalledFakeHost() : before_(installHost(fake_)) {}
  ~InstalledFakeHost() { installHost(before_); }
  InstalledFakeHost(const InstalledFakeHost&) = delete;
  InstalledFakeHost& operator=(const InstalledFakeHost&) = delete;

  FakeHost* operator->() const { return fake_.get(); }
  FakeHost& operator*() const { return *fake_; }

 private:
  std::shared_ptr<FakeHost> fake_ = std::make_shared<FakeHost>();
  std::shared_ptr<Host> before_;
};

}  // namespace oxmv::test
