#include "oxmv/looks/LookImport.h"

#include <map>
#include <set>
#include <string>
#include <vector>

#include "oxmv/host/Host.h"
#include "oxmv/looks/Crc32.h"
#include "oxmv/looks/LookTableFile.h"
#include "oxmv/platform/WholeFile.h"

namespace oxmv {
namespace {

class Import {
 public:
  Import(const std::filesystem::path& path, LookImportObserver* observer, std::uint64_t mostBytes,
         std::size_t mostFiles)
      : path_(path),
        fileName_(lastPathComponent(path.native())),
        folder_(lookTableFolder()),
        observer_(observer),
        bytesLeft_(mostBytes),
        filesLeft_(mostFiles) {}

  std::optional<LookFileRef> run() {
    std::error_code error;
    file_ = readWholeFile(path_, error);
    if (!file_) {
      stop({LookImportStop::unreadable, error, 0, {}, 0});
      return look_;
    }
    // The whole file is judged before anything is written.
    LookProblem problem;
    const auto description = LookDescription::parse(*file_, &problem);
    if (!description) {
      stop({LookImportStop::notWellFormed, {}, problem.offset, problem.what, 0});
      return look_;
    }
    for (std::size_t i = 0; i < description->nodeCount(); ++i) {
      const LookNode node = description->node(i);
      const auto reason = take(node);
      if (!reason) continue;
      stop({*reason, {}, node.offset, {}, size_});
      if (*reason == LookImportStop::tooMuch) break;
      alert(*reason);
      return std::nullopt;
    }
    return look_;
  }

 private:
  // Answers why the import ends here; nothing if it does not.
  std::optional<LookImportStop> take(const LookNode& node) {
    switch (node.kind) {
      case LookNode::Kind::lut: size_ = 0; return std::nullopt;
      case LookNode::Kind::size:
        size_ = lookSizeFrom(node.text);
        if (size_ > maxLookSize) return LookImportStop::tooLarge;
        return std::nullopt;
      case LookNode::Kind::table: break;
    }
    if (size_ < 1) return LookImportStop::noSize;
    if (lookFileSize(size_) > bytesLeft_ || filesLeft_ == 0) return LookImportStop::tooMuch;
    table(node);
    return std::nullopt;
  }

  void table(const LookNode& node) {
    LookTableReport report;
    report.node = node;
    report.size = size_;
    record_.reset(size_);
    report.values = record_.readTable(node.text);
    report.crc =
        calccrc(record_.table().data(), static_cast<std::ptrdiff_t>(report.values.stored * 4));
    if (!current_.contains(report.crc)) write(report);
    if (report.isNew) copyDescription(report);
    if (observer_ != nullptr) observer_->onTable(report);
  }

  void write(LookTableReport& report) {
    if (const auto failed = failed_.find(report.crc); failed != failed_.end()) {
      report.isNew = true;
      report.writeError = failed->second.error;
      look_ = failed->second.look;
      return;
    }
    report.isNew = look_.generateLUTFile(static_cast<std::int32_t>(report.crc), record_.bytes(),
                                         size_, fileName_, &report.writeError);
    if (report.isNew) {
      bytesLeft_ -= lookFileSize(size_);
      --filesLeft_;
    }
    if (report.writeError) {
      failed_[report.crc] = {report.writeError, look_};
    } else {
      current_.insert(report.crc);
    }
  }

  // A copy that failed is not tried again either: what fails for a large file may take long.
  void copyDescription(LookTableReport& report) {
    if (!copyError_ && writeNewFile(folder_ + '/' + fileName_, *file_, copyError_)) {
      report.copy = LookTableReport::Copy::copied;
    } else if (copyError_ == std::errc::file_exists) {
      report.copy = LookTableReport::Copy::alreadyThere;
      copyError_.clear();
    } else {
      report.copy = LookTableReport::Copy::failed;
      report.copyError = copyError_;
    }
  }

  void stop(const LookImportEnd& end) const {
    if (observer_ != nullptr) observer_->onStop(end);
  }

  void alert(LookImportStop reason) const {
    const std::string about = "Error : LUT (" + fileName_ + ") ";
    host()->alert(about + (reason == LookImportStop::tooLarge
                               ? "is too large, a maximum of 64x64x64 is supported"
                               : "has no defined table size"));
  }

  const std::filesystem::path& path_;
  const std::string fileName_;
  const std::string folder_;
  LookImportObserver* observer_;
  std::uint64_t bytesLeft_;
  std::size_t filesLeft_;

  std::optional<std::vector<std::uint8_t>> file_;
  std::int32_t size_ = 0;  // N, of the "LUT" element at hand
  OXLookFileRecord record_;
  // The files met or written that are current. They are not looked for again: a hostile description
  // may have millions of tables, all alike.
  std::set<std::uint32_t> current_;
  // The same for the files that could not be written, with the answer that each gave.
  struct Failed {
    std::error_code error;
    LookFileRef look;
  };
  std::map<std::uint32_t, Failed> failed_;
  std::error_code copyError_;
  LookFileRef look_;
};

}  // namespace

std::size_t LookTableReport::missing() const { return lookValueCount(size) - values.stored; }

std::optional<LookFileRef> importLook(const std::filesystem::path& path,
                                      LookImportObserver* observer, std::uint64_t mostBytes,
                                      std::size_t mostFiles) {
  return Import(path, observer, mostBytes, mostFiles).run();
}

std::optional<LookFileRef> LookFileRef::initFromLookFile(const std::filesystem::path& path,
                                                         LookImportObserver* observer) {
  return importLook(path, observer);
}

}  // namespace oxmv
