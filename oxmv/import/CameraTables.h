// The cameras that stills are recognised by.

#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <string_view>
#include <variant>

namespace oxmv {

// The largest text that is taken for tables. Those that people write are far smaller.
constexpr std::size_t maxCameraTablesSize = std::size_t{64} << 10;

// Why a text holds no camera tables: `long-prefixes, row 3: prefix "QX301" is not like QX3.01`.
struct CameraTablesProblem {
  std::string message;
};

// The product data of the camera maker: three tables, each searched in order, the first row that
// matches wins. Prefixes and names may stand in several rows.
//
// They are configuration, and come as TOML text; import/cameras.toml is the built-in one and shows
// the shape. A host that has other cameras reads its own file (readWholeFile()) and hands the
// tables on with each still.
//
// All texts are ASCII and can be printed: prefixes are compared without regard to case, letter by
// letter, and streams of tags carry no other names. So is all else in the file.
class CameraTables {
 public:
  struct FirmwareRow {
    std::string prefix;  // what a firmware text begins with
    std::string name;    // of the model
    bool operator==(const FirmwareRow&) const = default;
  };
  struct ModelRow {
    std::string text;      // what the camera writes as its model
    std::string firmware;  // 12 characters: the row's prefix, then ".00.00.00" or ".00.00"
    std::string name;
    bool operator==(const ModelRow&) const = default;
  };

  static constexpr std::size_t shortPrefix = 3;  // characters
  static constexpr std::size_t longPrefix = 6;   // of the form letter, letter, digit, ".", 2 digits

  static const CameraTables& builtIn();

  // Exactly the three tables, each with exactly its rows, in a text of at most maxCameraTablesSize.
  static std::variant<CameraTables, CameraTablesProblem> fromText(std::string_view toml);

  const std::array<FirmwareRow, 2>& shortPrefixes() const { return shortPrefixes_; }
  const std::array<FirmwareRow, 14>& longPrefixes() const { return longPrefixes_; }
  const std::array<ModelRow, 15>& modelTexts() const { return modelTexts_; }

  bool operator==(const CameraTables&) const = default;

 private:
  CameraTables() = default;

  std::array<FirmwareRow, 2> shortPrefixes_;
  std::array<FirmwareRow, 14> longPrefixes_;
  std::array<ModelRow, 15> modelTexts_;
};

}  // namespace oxmv
