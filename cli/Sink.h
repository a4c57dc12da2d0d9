// Where text goes.

#pragma once

#include <string>
#include <string_view>

namespace oxmv::cli {

class Sink {
 public:
  virtual ~Sink() = default;
  virtual void write(std::string_view text) = 0;

 protected:
  Sink() = default;
  Sink(const Sink&) = default;
  Sink& operator=(const Sink&) = default;
};

// Keeps it.
class StringSink final : public Sink {
 public:
  void write(std::string_view more) override { text += more; }

  std::string text;
};

}  // namespace oxmv::cli
