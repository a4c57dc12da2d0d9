// What the library does when there is no memory: wherever that happens, the answer is the right
// one, std::bad_alloc or none, nothing is leaked, and every file is the old one or the new one,
// whole.

#include <algorithm>
#include <filesystem>
#include <map>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "oxmv/host/LinuxHost.h"
#include "oxmv/host/PreferencesFile.h"
#include "oxmv/import/CameraTables.h"
#include "oxmv/looks/LookFileRef.h"
#include "oxmv/looks/LookImport.h"
#include "oxmv/metadata/Losses.h"
#include "oxmv/metadata/MetadataDictionary.h"
#include "oxmv/metadata/TagLabels.h"
#include "oxmv/metadata/TagPicker.h"
#include "oxmv/metadata/TagStreamDecoder.h"
#include "oxmv/metadata/TagStreamEditor.h"
#include "oxmv/metadata/TagStreamEncoder.h"
#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/platform/JpegImage.h"
#include "oxmv/store/Locations.h"
#include "oxmv/values/Array.h"
#include "tests/memory/Allocations.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/EnvironmentVariable.h"
#include "tests/support/Files.h"
#include "tests/support/Printing.h"
#include "tests/support/StillBuilder.h"
#include "tests/support/TempDir.h"

namespace oxmv::test {
namespace {

namespace fs = std::filesystem;

// Answers every preference with one folder, and keeps nothing of what it is told.
class FolderHost final : public Host {
 public:
  explicit FolderHost(std::string folder) : folder_(std::move(folder)) {}

  Value copyPreference(std::string_view, std::string_view) override { return folder_; }
  void setPreference(std::string_view, const Value&, std::string_view) override {}
  bool synchronizePreferences(std::string_view, std::error_code*) override { return true; }
  std::string localizedString(std::string_view key, std::string_view builtIn) override {
    return key == "OXMVLutsPath" ? folder_ : std::string(builtIn);
  }
  void alert(std::string_view) override {}
  void log(std::string_view) override {}

 private:
  std::string folder_;
};

// A folder in which all files are: the database of clips, the override file, look tables.
class NoMemoryForFiles : public testing::Test {
 protected:
  NoMemoryForFiles() {
    fs::create_directory(folder_ / "db");
    fs::create_directory(folder_ / "looks");
    installHost(std::make_shared<FolderHost>((folder_ / "looks").string()));
  }
  ~NoMemoryForFiles() override { installHost(nullptr); }

  TempDir folder_;
};

// Text longer than what is kept in place, so that it takes memory of its own.
const std::string longText = "a text that is too long to be kept within a value or a string";

// Of every kind; the data make a stream of more than a page.
Dictionary someTags() {
  const Dictionary nested = {{"SATU", 0.5f}, {"REEL", longText}};
  Dictionary point = nested;
  point.set(controlPointKey, Array::of(1, 2));
  return {{"TIMC", "01:00:00:00"},
          {"REEL", longText},
          {"WBAL", Array::of(1.0f, 1.25f, 1.0f, 1.5f)},
          {"KWRd", Array::of(longText, "second")},
          {"TAG ", Dictionary{{"ISO", 400}, {longText, longText}}},
          {"REG ", Dictionary{{"Mode", 2}, {longText, 3}}},
          {"TAKE", 3},
          {"SCPg", Array::of(7, 8, 9)},
          {"FREE", Value::data(Bytes(5000, 0x5A))},
          {"GUID", Value::data(Bytes(16, 7))},
          {"DSPm", Array::of(nested, Dictionary{{"TAKE", 1}})},
          {"COL1", nested},
          {"CTLp", Array::of(point, nested)}};
}

Bytes encodedBefore(const Dictionary& tags) { return encodeStream(tags, Layout::readable).value(); }

TEST(NoMemory, DecodingGivesAllOrThrows) {
  const Bytes stream = encodedBefore(someTags());
  const auto length = static_cast<std::int32_t>(stream.size());
  const Dictionary expected = decodeStream(stream, length);
  failEachAllocation([&] { return decodeStream(stream, length); },
                     [&](const auto& tags) {
                       if (tags) {
                         EXPECT_EQ(*tags, expected);
                       }
                     });
}

TEST(NoMemory, PickedTagsAreThereOrItThrows) {
  const Bytes stream = encodedBefore(someTags());
  const Dictionary tags = decodeStream(stream, static_cast<std::int32_t>(stream.size()));
  const std::vector<Tag> few = {"REEL"_tag, "TAKE"_tag, "NAME"_tag};
  const std::vector<Tag> odd = {"REEL"_tag, "KWRd"_tag, "COL1"_tag, "FREE"_tag};
  for (const std::vector<Tag>& wanted : {few, odd}) {
    failEachAllocation(
        [&] {
          std::vector<Value> values;
          pickTags(stream, wanted, values);
          return values;
        },
        [&](const auto& values) {
          if (!values) return;
          ASSERT_EQ(values->size(), wanted.size());
          for (std::size_t i = 0; i < wanted.size(); ++i) {
            const auto key = charactersOf(wanted[i]);
            EXPECT_EQ((*values)[i], tags[std::string_view(key.data(), key.size())]);
          }
        });
  }
}

TEST(NoMemory, ValueIsAddedOrTheObjectIsAsItWas) {
  for (const Dictionary& before : {Dictionary(), someTags()}) {
    Dictionary after = before;
    after.set("NAME", longText);
    failEachAllocation(
        [&] {
          MetadataDictionary clip;
          clip.setMetadata(before);
          bool isAdded = false;
          bool wasThrown = false;
          try {
            isAdded = clip.addObject(longText, "NAME");
          } catch (const std::bad_alloc&) {
            wasThrown = true;
          }
          return std::tuple(clip.metadata(), isAdded, wasThrown);
        },
        [&](const auto& answer) {
          if (!answer) return;
          const auto& [tags, isAdded, wasThrown] = *answer;
          EXPECT_NE(isAdded, wasThrown) << "the tag takes the value";
          EXPECT_EQ(tags, isAdded ? after : before);
        });
  }
}

TEST(NoMemory, EncodingGivesAllOrNothing) {
  const Dictionary tags = someTags();
  for (const Layout layout : {Layout::exact, Layout::readable}) {
    const auto expected = encodeStream(tags, layout);
    failEachAllocation([&] { return encodeStream(tags, layout); },
                       [&](const auto& stream) {
                         ASSERT_TRUE(stream) << "it never throws";
                         if (*stream) {
                           EXPECT_EQ(*stream, expected);
                         }
                       });
  }
}

// Few entries and many: those are found in different ways.
TEST(NoMemory, DictionaryIsChangedOrAsItWas) {
  for (const int size : {0, 1, 7, 8, 9, 16, 17, 100}) {
    Dictionary before;
    for (int i = 0; i < size; ++i) before.set(longText + std::to_string(i), longText);
    Dictionary after = before;
    after.set("new " + longText, "new");
    Dictionary shorter = before;
    const std::string first = longText + "0";
    shorter.remove(first);

    for (const bool isShared : {false, true}) {
      Dictionary changed;
      const Value copy = isShared ? Value(before) : Value();
      const auto restore = [&] {
        changed = {};
        changed = before;
        if (!isShared && size > 0) changed.set(first, longText);  // now it has its own entries
      };
      restore();
      // What it holds while it is looked at is given back by restore().
      failEachAllocation(
          [&] {
            Dictionary mine = changed;
            bool wasThrown = false;
            try {
              mine.set("new " + longText, "new");
            } catch (const std::bad_alloc&) {
              wasThrown = true;
            }
            return std::pair(mine, wasThrown);
          },
          [&](const auto& answer) {
            if (answer) {
              EXPECT_EQ(answer->first, answer->second ? before : after);
            }
          });
      if (size == 0) continue;
      failEachAllocation(
          [&] {
            Dictionary mine = changed;
            bool wasThrown = false;
            try {
              mine.remove(first);
            } catch (const std::bad_alloc&) {
              wasThrown = true;
            }
            return std::pair(mine, wasThrown);
          },
          [&](const auto& answer) {
            if (answer) {
              EXPECT_EQ(answer->first, answer->second ? before : shorter);
            }
          });
    }
  }
}

TEST(NoMemory, EditIsMadeOrTheStreamIsAsItWas) {
  const Bytes before = encodedBefore(someTags());
  struct Edit {
    std::string path;
    Value value;  // nothing: is removed
    bool isAppended = false;
  };
  const std::vector<Edit> edits = {{"REEL", "B002"},        {"SATU", 0.25f},
                                   {"COL1/REEL", "B002"},   {"COL2/REEL", "B002"},
                                   {"TAG /ISO", 800},       {"TAG ", Dictionary{{"A", longText}}},
                                   {"KWRd", "third", true}, {"REEL", Value()},
                                   {"TAG /ISO", Value()},   {"nothing of that name", "x"}};
  for (const Edit& edit : edits) {
    SCOPED_TRACE(edit.path);
    const auto apply = [&](TagStreamEditor& editor) {
      if (edit.value.isNothing()) return editor.remove(edit.path);
      return edit.isAppended ? editor.append(edit.path, edit.value)
                             : editor.set(edit.path, edit.value);
    };
    TagStreamEditor good(before);
    const auto expected = apply(good);
    failEachAllocation(
        [&] {
          TagStreamEditor editor(before);
          bool isMade = false;
          bool wasThrown = false;
          try {
            const auto error = apply(editor);
            isMade = !error;
            // A refusal has its reason, and want of memory is none.
            if (error && (!expected || error->refusal != expected->refusal))
              wasThrown = isMade = true;
          } catch (const std::bad_alloc&) {
            wasThrown = true;
          }
          return std::tuple(editor.stream(), isMade, wasThrown);
        },
        [&](const auto& answer) {
          if (!answer) return;
          const auto& [stream, isMade, wasThrown] = *answer;
          EXPECT_FALSE(isMade && wasThrown) << "refused for another reason";
          EXPECT_EQ(stream, isMade ? good.stream() : before);
          if (!wasThrown) {
            EXPECT_EQ(isMade, !expected);
          }
        });
  }
}

TEST(NoMemory, LossesAreAllNamedOrItThrows) {
  Dictionary tags = someTags();
  tags.set("TAKE", 300000000000);
  tags.set("SCEN", "Caf\u00E9 " + longText);
  tags.set("nope", longText);
  tags.set("COL2", Dictionary{{"KWRd", Array::of(Value(1))}});
  const auto textOf = [](const std::vector<Loss>& losses) {
    std::string text;
    for (const Loss& loss : losses) text += loss.path + ": " + loss.message + '\n';
    return text;
  };
  for (const Layout layout : {Layout::exact, Layout::readable}) {
    const std::string expected = textOf(findLosses(tags, layout));
    EXPECT_GT(std::count(expected.begin(), expected.end(), '\n'), 3);
    failEachAllocation([&] { return findLosses(tags, layout); },
                       [&](const auto& losses) {
                         if (losses) {
                           EXPECT_EQ(textOf(*losses), expected);
                         }
                       });
  }
}

TEST(NoMemory, LabelIsThereOrItThrows) {
  failEachAllocation(
      [] {
        resetTagLabels();
        auto label = tagLabel("REEL");
        resetTagLabels();
        return label;
      },
      [](const auto& label) {
        resetTagLabels();
        if (label) {
          EXPECT_EQ(**label, "Reel name");
        }
      });
}

TEST(NoMemory, CameraTablesAreReadOrItThrows) {
  const Bytes file = getFile(OXMV_SOURCE_DIR "/oxmv/import/cameras.toml");
  const std::string text(file.begin(), file.end());
  for (const std::string& each : {text, text + "[x]\n", std::string("a = [1, {")}) {
    const auto expected = CameraTables::fromText(each);
    failEachAllocation([&] { return CameraTables::fromText(each); },
                       [&](const auto& tables) {
                         if (!tables) return;
                         ASSERT_EQ(tables->index(), expected.index());
                         if (tables->index() == 0) {
                           EXPECT_EQ(std::get<0>(*tables), std::get<0>(expected));
                         }
                       });
  }
}

// Those that are made once for the process, each time in a process of its own.
template <class Work>
void failEachFirstAllocation(Work work) {
  bool wasFelt = true;
  for (std::size_t nth = 1; wasFelt && !testing::Test::HasFailure(); ++nth) {
    constexpr int good = 0, wrong = 1, notFelt = 2;
    const int status = exitStatusOf(startChild([&] {
      armShortage(nth, Shortage::once);
      bool isGood = true;
      try {
        isGood = work();
      } catch (const std::bad_alloc&) {
      }
      if (!disarmShortage()) return isGood ? notFelt : wrong;
      // And afterwards, with memory, all is well.
      return isGood && work() ? good : wrong;
    }));
    EXPECT_TRUE(status == good || status == notFelt) << nth << ": " << status;
    wasFelt = status != notFelt;
  }
}

TEST(NoMemory, WhatIsMadeOnceIsMadeNextTime) {
  failEachFirstAllocation(
      [] { return CameraTables::builtIn().shortPrefixes()[0].prefix.size() == 3; });
  failEachFirstAllocation([] { return host() != nullptr; });
  failEachFirstAllocation([] { return tagLabel("REEL") != nullptr; });
}

TEST(NoMemory, PreferencesAreTheOldOnesOrTheNew) {
  const TempDir folder;
  const EnvironmentVariable home("XDG_CONFIG_HOME", folder.path().string());
  const EnvironmentVariable none("XDG_CONFIG_DIRS", "/nowhere");
  const fs::path file = folder / "com.ombrix.oxmv.toml";
  const Bytes before = bytesOf("# mine\na = \"" + longText + "\" # keep\n[b]\nc = [1, 2]\n");
  const Bytes after = bytesOf("# mine\na = \"new " + longText + "\" # keep\n[b]\nc = [1, 2]\n");
  struct Answer {
    bool isSynchronized = false;
    std::error_code error;
    Value value;
  };
  putFile(file, before);
  failEachAllocation(
      [&] {
        LinuxHost host;
        Answer answer;
        host.setPreference("a", "new " + longText, preferencesAppID);
        answer.isSynchronized = host.synchronizePreferences(preferencesAppID, &answer.error);
        answer.value = host.copyPreference("a", preferencesAppID);
        return answer;
      },
      [&](const auto& answer) {
        const Bytes now = getFile(file);
        EXPECT_TRUE(now == before || now == after);
        if (answer) {
          EXPECT_EQ(answer->isSynchronized, !answer->error);
          EXPECT_EQ(answer->value, Value("new " + longText));
          EXPECT_EQ(now, answer->isSynchronized ? after : before);
        }
        EXPECT_LE(namesIn(folder.path()).size(), 1u);
        putFile(file, before);
      });
}

TEST(NoMemory, PreferenceIsTheRightOneOrItThrows) {
  const TempDir folder;
  const EnvironmentVariable home("XDG_CONFIG_HOME", (folder / "none").string());
  const EnvironmentVariable system("XDG_CONFIG_DIRS", folder.path().string());
  putFile(folder / "com.ombrix.oxmv.toml", bytesOf("a = [\"" + longText + "\"]\n"));
  failEachAllocation([&] { return LinuxHost().copyPreference("a", preferencesAppID); },
                     [&](const auto& value) {
                       if (value) {
                         EXPECT_EQ(*value, Value(Array::of(longText)));
                       }
                     });
}

constexpr myGUID guid = {1, 2, 3, {4, 5, 6, 7, 8, 9, 10, 11}};

TEST_F(NoMemoryForFiles, ClipIsTheOldOneOrTheNew) {
  auto clip = MetadataDictionary::initFromGUID(guid);
  clip.setMetadata(someTags());
  const Bytes after = clip.metaDataData().value();
  const Bytes before = bytesOf("what is there");
  fs::create_directories(clip.fileURL().parent_path());
  putFile(clip.fileURL(), before);
  const std::string name = clip.fileURL().filename();
  failEachAllocation(
      [&] {
        std::error_code error;
        return std::pair(clip.writeToGUIDFile(&error), error);
      },
      [&](const auto& answer) {
        const bool isWritten = answer && answer->first;
        EXPECT_EQ(getFile(clip.fileURL()), isWritten ? after : before);
        EXPECT_EQ(namesIn(clip.fileURL().parent_path()), std::set<std::string>{name});
        putFile(clip.fileURL(), before);
      });
}

TEST_F(NoMemoryForFiles, OverrideIsTheOldOneOrTheNew) {
  MetadataDictionary clip;
  clip.setMetadata(someTags());
  const Bytes after = clip.metaDataData().value();
  const Bytes before = bytesOf("what is there");
  const fs::path file = MetadataDictionary::overridePath();
  putFile(file, before);
  failEachAllocation([&] { return clip.writeToOverride(); },
                     [&](const auto& isWritten) {
                       EXPECT_EQ(getFile(file), isWritten && *isWritten ? after : before);
                       EXPECT_EQ(namesIn(file.parent_path()),
                                 std::set<std::string>{file.filename()});
                       putFile(file, before);
                     });
}

TEST_F(NoMemoryForFiles, FileOfAnEyeIsThereOrRemoved) {
  const auto eye = MetadataDictionary::initFromGUIDForSingleEye(guid, 1);
  const fs::path file = eye.fileURLS(1);
  fs::create_directories(file.parent_path());
  const Bytes before = bytesOf("what is there");
  putFile(file, before);
  failEachAllocation([&] { return eye.writeToGUIDFile(); },
                     [&](const auto& isRemoved) {
                       const bool isGone = isRemoved && *isRemoved;
                       EXPECT_EQ(fs::exists(file), !isGone);
                       if (!isGone) {
                         EXPECT_EQ(getFile(file), before);
                       }
                       putFile(file, before);
                     });
}

// All of it, or nothing and the reason.
template <class Load>
void expectLoadedOrWhyNot(Load load) {
  const Dictionary expected = load().metadata();
  EXPECT_FALSE(expected.empty());
  failEachAllocation(load, [&](const auto& loaded) {
    ASSERT_TRUE(loaded) << "it never throws";
    const bool isLoaded = loaded->loadError() == LoadError::none;
    EXPECT_EQ(loaded->metadata(), isLoaded ? expected : Dictionary());
    if (!isLoaded) {
      EXPECT_EQ(loaded->loadErrorCode(), std::errc::not_enough_memory);
    }
  });
}

TEST_F(NoMemoryForFiles, ClipIsLoadedOrSaysWhyNot) {
  const auto clip = MetadataDictionary::initFromGUID(guid);
  fs::create_directories(clip.fileURL().parent_path());
  putFile(clip.fileURL(), encodedBefore(someTags()));
  expectLoadedOrWhyNot([] { return MetadataDictionary::initFromGUID(guid); });
}

TEST_F(NoMemoryForFiles, OverrideIsLoadedOrSaysWhyNot) {
  putFile(MetadataDictionary::overridePath(), encodedBefore(someTags()));
  expectLoadedOrWhyNot([] { return MetadataDictionary::initFromOverride(); });
}

TEST_F(NoMemoryForFiles, LastIsLoadedOrSaysWhyNot) {
  Bytes content(sizeof(myGUID), 9);
  const Bytes stream = encodedBefore(someTags());
  content.insert(content.end(), stream.begin(), stream.end());
  putFile(lastFilePath(preferencesAppID), content);
  expectLoadedOrWhyNot([] { return MetadataDictionary::initFromLast(); });
}

TEST_F(NoMemoryForFiles, LookTablesAreWhole) {
  const fs::path description = folder_ / "look.xml";
  const std::string text = "<!DOCTYPE look [<!ENTITY one '0000803F'>]><look a='" + longText +
                           "'><!--" + longText +
                           "--><LUT><size>1</size><data>&one;0000003F0000803E</data></LUT>"
                           "<LUT><size>2</size><![CDATA[0000003F 0000003F 0000803E]]></LUT></look>";
  putFile(description, bytesOf(text));
  const auto all = [&] {
    std::map<std::string, Bytes> files;
    for (const std::string& name : namesIn(folder_ / "looks"))
      files[name] = getFile(folder_ / "looks" / name);
    return files;
  };
  const auto clear = [&] {
    for (const std::string& name : namesIn(folder_ / "looks")) fs::remove(folder_ / "looks" / name);
  };
  const auto look = LookFileRef::initFromLookFile(description);
  ASSERT_TRUE(look);
  const auto expected = all();
  EXPECT_GT(expected.size(), 2u);
  clear();

  class Witness final : public LookImportObserver {
   public:
    void onTable(const LookTableReport& report) override {
      isComplete = isComplete && !report.writeError && !report.copyError;
    }
    void onStop(const LookImportEnd&) override { isComplete = false; }
    bool isComplete = true;
  };
  failEachAllocation(
      [&] {
        Witness witness;
        const auto answer = LookFileRef::initFromLookFile(description, &witness);
        return std::pair(answer.has_value(), witness.isComplete);
      },
      [&](const auto& answer) {
        const auto files = all();
        for (const auto& [name, content] : files) {
          const auto found = expected.find(name);
          ASSERT_NE(found, expected.end()) << name;
          EXPECT_EQ(content, found->second) << name;
        }
        if (answer) {
          EXPECT_TRUE(answer->first);
          EXPECT_TRUE(answer->second) << "an import that does not throw is not cut short";
          EXPECT_EQ(files, expected);
        }
        clear();
      });
}

TEST_F(NoMemoryForFiles, LooksAreToldApartOrItThrows) {
  const fs::path file = folder_ / "43B0C2CA.oxlook";
  Bytes content =
      bytesOf(std::string("OXLK\x02\0\0\0\x40\0\0\0\x01\0\0\0\x01\x5A\x01\0\x0A\x16\x02\0", 24) +
              "Warm look of a long name");
  content.resize(64 + 12);
  putFile(file, content);
  failEachAllocation(
      [&] {
        const auto look = LookFileRef::initFromPath(file);
        if (!look) return std::string("none");
        const bool isFirst = look->lookNameCompare(LookFileRef::initNone()) > 0;
        return look->displayName().value_or("no name") + (isFirst ? " behind" : " before");
      },
      [](const auto& name) {
        if (name) {
          EXPECT_EQ(*name, "Warm look of a long name behind");
        }
      });
}

// TurboJPEG, which cannot begin for want of memory, does not give back the pool that it has by
// then.
constexpr std::ptrdiff_t lostByTheImageTest = 1;

TEST(NoMemory, ImageIsOneOrItThrows) {
  const Bytes image = picture();
  failEachAllocation([&] { return isJpegImage(image); },
                     [](const auto& isImage) {
                       if (isImage) {
                         EXPECT_TRUE(*isImage);
                       }
                     },
                     lostByTheImageTest);
}

TEST_F(NoMemoryForFiles, StillHasAllItsTagsOrItThrows) {
  const fs::path still = folder_ / "still.jpg";
  putFile(still, exampleStill());
  const auto expected = MetadataDictionary::metadataFromJPEGFile(still, longText);
  ASSERT_TRUE(expected);
  EXPECT_GE(expected->size(), 5u);
  failEachAllocation([&] { return MetadataDictionary::metadataFromJPEGFile(still, longText); },
                     [&](const auto& tags) {
                       if (tags) {
                         EXPECT_EQ(*tags, expected);
                       }
                     },
                     lostByTheImageTest);
}

}  // namespace
}  // namespace oxmv::test
