// One clip's metadata.

#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>
#include <vector>

#include "oxmv/metadata/StreamObserver.h"
#include "oxmv/metadata/TagLabels.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/values/Dictionary.h"
#include "oxmv/values/myGUID.h"

namespace oxmv {

class CameraTables;

// The identifier under which the library's preferences are kept.
constexpr std::string_view preferencesAppID = "com.ombrix.oxmv";

// Why an object that was to be loaded from a file has no tags. A file of no bytes at all is what
// saving an object without tags leaves, and is no failure; but an eye's file is removed then, so
// that one of no bytes is too short.
enum class LoadError {
  none,        // it was loaded
  missing,     // there is no such file
  unreadable,  // the system's reason is in MetadataDictionary::loadErrorCode()
  tooShort,    // 1 to 11 bytes are not decoded; a "last" file needs its GUID
};

// One clip's metadata as a dictionary keyed by four-character tags, the clip's GUID and, for a
// stereo clip, which eye the object stands for.
//
//   auto clip = MetadataDictionary().initWithData(bytes);
//   std::cout << clip.metadata()["REEL"].text();
//
// The initialisers work on the object they are called on and give it back: a temporary by value.
// Copies are independent of each other, and cheap. One object is used from one thread at a time;
// different objects from different threads as one likes.
//
// Whatever has to do with files is in the library oxmv, all else also in oxmv_core.
class MetadataDictionary {
 public:
  // As after init(), with a zero GUID.
  MetadataDictionary() { init(); }

  // Back to no tags at all, a combined object (not one eye's). The GUID stays. Also forgets the
  // table of labels, for all objects: the next translateTag() makes it anew. Kept on purpose, and
  // without effect on labels handed out.
  MetadataDictionary& init() &;
  MetadataDictionary init() && { return std::move(init()); }

  // Takes the tags from a stream; see processBytes(). Everything else stays as it was.
  MetadataDictionary& initWithBytes(std::span<const std::uint8_t> bytes, std::int32_t length,
                                    StreamObserver* observer = nullptr) &;
  MetadataDictionary initWithBytes(std::span<const std::uint8_t> bytes, std::int32_t length,
                                   StreamObserver* observer = nullptr) && {
    return std::move(initWithBytes(bytes, length, observer));
  }

  // The same for a whole stream. Fewer than 12 bytes, the shortest record with a value, change
  // nothing. The length is cut to 32 bits, so data of 2 GiB and more count as a length that may be
  // negative, which gives no tags.
  MetadataDictionary& initWithData(std::span<const std::uint8_t> data,
                                   StreamObserver* observer = nullptr) &;
  MetadataDictionary initWithData(std::span<const std::uint8_t> data,
                                  StreamObserver* observer = nullptr) && {
    return std::move(initWithData(data, observer));
  }

  // The initialisers below load a file. They never fail: without a file that can be read, or memory
  // for it, the object has no tags, and loadError() says why. Ask it before saving such an object:
  // over a file that could not be read just now, saving would lose everything in it.

  // A combined object with the tags of the override file.
  static MetadataDictionary initFromOverride();

  // A combined object with GUID and tags of the "last" file; see LastRecord.h. Kept on purpose: a
  // GUID record in its stream replaces the GUID that the file begins with.
  static MetadataDictionary initFromLast();

  // The GUID at the head of the "last" file; zero in every byte that is not there. std::bad_alloc
  // may leave it, as it may leave the paths below.
  static myGUID lastGUID();

  // A clip of the database: the combined object of that GUID.
  static MetadataDictionary initFromGUID(const myGUID& guid);

  // With `rightEye` the object of eye 1, else the combined object. That one keeps the GUID that is
  // asked for, whatever GUID record its file has.
  static MetadataDictionary initFromGUIDForRightEye(const myGUID& guid, bool rightEye);

  // The object of one eye, 0 left, 1 right. Kept on purpose: a GUID record in its file replaces the
  // GUID, and with it where the object is saved.
  static MetadataDictionary initFromGUIDForSingleEye(const myGUID& guid, std::size_t eye);

  // What kept the tags from being loaded. init() and initWithBytes() set it back to none.
  LoadError loadError() const { return loadError_; }
  // The system's error behind LoadError::missing and LoadError::unreadable.
  std::error_code loadErrorCode() const { return loadErrorCode_; }

  // The path of the override file. Stores the default of the preference "OverridePath", as do
  // initFromOverride(), initFromLast(), lastGUID() and writeToOverride(), if it is missing or no
  // text. For this and the two below see Locations.h.
  static std::string overridePath();

  // Where the combined file of this object's GUID is, whether it is there or not.
  std::filesystem::path fileURL() const;

  // The same for the file of one eye.
  std::filesystem::path fileURLS(std::size_t eye) const;

  // Saves the object where it belongs by GUID and eye, in place of what is there; see
  // writeWholeFile(). An object of one eye without tags has no file: saving it removes the file,
  // and fails if there is none. Kept on purpose: a combined object without tags leaves an empty
  // file. Folders are not made.
  //
  // Answers whether that succeeded. If not, the cause is in `error` unless that is null; where the
  // tags could not be encoded for want of memory, `error` stays as it was. Then the old file is
  // there still, but for the one case that writeWholeFile() and removeFile() name. std::bad_alloc
  // may leave, for want of memory to make the path or to write, and leaves the old file, too.
  [[nodiscard]] bool writeToGUIDFile(std::error_code* error = nullptr) const;

  // The same for the override file, which is never removed: an object without tags leaves it empty.
  [[nodiscard]] bool writeToOverride(std::error_code* error = nullptr) const;

  // Decodes a stream of `length` bytes into a dictionary of its own; the object's tags stay as they
  // are. `bytes` are the bytes really there, see decodeStream(). A GUID record in the stream
  // changes the object's GUID.
  Dictionary processBytes(std::span<const std::uint8_t> bytes, std::int32_t length,
                          StreamObserver* observer = nullptr);

  myGUID GUID() const { return _guid; }

  // Whether there is at least one tag.
  bool haveMetadata() const { return _simpleTags && !_simpleTags->empty(); }

  // A copy of the tags; changes to it reach the object through setMetadata() only.
  Dictionary metadata() const { return _simpleTags.value_or(Dictionary()); }

  // Takes over a copy of the entries. None (std::nullopt) gives an empty dictionary.
  void setMetadata(const std::optional<Dictionary>& tags);

  // Stores the value under the key, in place of an earlier one, if the tag table lets that tag take
  // it: of the 188 tags accepted here 71 take any value, 95 a number of whatever range, 14 an array
  // (or dictionary) of exactly so many elements; 8, the data tags, refuse everything, and enter a
  // dictionary by decoding or setMetadata(). The value is stored as it is, never converted or cut.
  //
  // Answers whether the value is stored now; if not (unknown tag, wrong kind, wrong count, nothing)
  // all is as it was.
  bool addObject(Value value, std::string_view key);

  // Does nothing when there is no such key.
  void removeObject(std::string_view key);

  // Encodes a dictionary, none giving an empty stream; see encodeStream(). `layout`: the object's
  // unless given. Answers nothing when there is no memory.
  std::optional<std::vector<std::uint8_t>> parseMetadata(
      const std::optional<Dictionary>& tags, std::optional<Layout> layout = std::nullopt) const;

  // The object's tags, encoded.
  std::optional<std::vector<std::uint8_t>> metaDataData(
      std::optional<Layout> layout = std::nullopt) const;

  // metaDataData() as hexadecimal digits, two lower-case ones a byte; empty when there are no
  // bytes.
  std::string metadataString() const;

  // The tags that a still from a camera tells of its clip: when it was taken, the camera's model
  // and firmware, how wide it looks, and the reel name unless that is empty. Which tags there are,
  // and where they come from: see tagsOfStill(). They are nobody's until setMetadata() is called
  // with them. `tables`: the cameras that are recognised; null: those built in.
  //
  // Answers nothing when there is no path, no such file (of at most 256 MiB) or no JPEG image in
  // it. Throws std::out_of_range when the still has a firmware text of fewer than 3 characters, or
  // of fewer than 6 that does not begin with one of the short prefixes.
  static std::optional<Dictionary> metadataFromJPEGFile(
      const std::optional<std::filesystem::path>& path, std::string_view reelName,
      const CameraTables* tables = nullptr);

  // What people call a tag; null if it has no label. See tagLabel().
  static std::shared_ptr<const std::string> translateTag(std::string_view tag) {
    return tagLabel(tag);
  }

  // How this object's tags are encoded unless a call says otherwise. init() leaves it as it is.
  Layout layout() const { return layout_; }
  void setLayout(Layout layout) { layout_ = layout; }

  // Whether the object stands for one eye of a stereo clip, and which: 0 left, 1 right.
  bool isSingle() const { return _isSingle; }
  std::size_t eye() const { return _eye; }

 private:
  // Calls `read`, which loads a file by a path of its own making.
  template <class Read>
  void load(Read read);
  template <class MakePath>
  void loadStream(MakePath makePath, bool mayBeEmpty);
  void setLoadError(std::error_code error);

  std::optional<Dictionary> _simpleTags;  // none until something is loaded or set
  myGUID _guid;
  bool _isSingle = false;
  std::size_t _eye = 0;
  std::string_view _appID = preferencesAppID;
  Layout layout_ = Layout::exact;
  LoadError loadError_ = LoadError::none;
  std::error_code loadErrorCode_;
};

}  // namespace oxmv
