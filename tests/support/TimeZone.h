// The time zone of the process, for one test.

#pragma once

#include <cstdlib>
#include <ctime>
#include <optional>
#include <string>

namespace oxmv::test {

// `rule` as POSIX writes it ("CET-1CEST,M3.5.0,M10.5.0/3"): it needs no files of time zones. While
// no other thread asks for the time.
class TimeZone {
 public:
  explicit TimeZone(const char* rule) {
    if (const char* before = std::getenv("TZ")) before_ = before;
    set(rule);
  }
  ~TimeZone() { set(before_ ? before_->c_str() : nullptr); }
  TimeZone(const TimeZone&) = delete;
  TimeZone& operator=(const TimeZone&) = delete;

 private:
  static void set(const char* rule) {
    if (rule == nullptr) {
      ::unsetenv("TZ");
    } else {
      ::setenv("TZ", rule, 1);
    }
    ::tzset();
  }

  std::optional<std::string> before_;
};

}  // namespace oxmv::test
