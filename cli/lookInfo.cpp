#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include <fmt/format.h>

#include "cli/Inputs.h"
#include "cli/JsonResults.h"
#include "cli/LookTables.h"
#include "cli/ValueText.h"
#include "cli/Verb.h"
#include "oxmv/values/Characters.h"

namespace oxmv::cli {
namespace {

// A look-table file, and what is in it.
struct Info {
  OXLOOK_HEADER header;
  std::size_t size;                   // of the file
  std::optional<std::string> name;    // nothing when it is not ASCII
  std::optional<std::uint32_t> crc;   // by the file's name
  std::optional<TableValues> values;  // of files whose size is usable
  std::size_t count = 0;              // of values that are there
};

std::variant<Info, FileProblem> infoOf(const std::string& file) {
  const auto content = readInput(file);
  if (const auto* problem = std::get_if<FileProblem>(&content)) return *problem;
  const Bytes& bytes = std::get<Bytes>(content);
  const auto header = loadLookHeader(bytes);
  if (!header)
    return FileProblem{"not-a-look",
                       "is no look-table file: it does not begin with a header of 64 bytes"};
  Info info = {*header, bytes.size(), lookFileName(bytes), std::nullopt, std::nullopt};
  if (file != "-") info.crc = crcFromFileName(withoutExtension(lastPathComponent(file)));
  if (hasUsableSize(*header)) {
    const auto table = tableOf(*header, bytes);
    info.values = valuesOf(*header, table);
    info.count = table.size() / 4;
  }
  return info;
}

std::string number(float value) { return bare(Value(value)); }

std::string crcText(std::uint32_t crc) { return fmt::format("{:08X}", crc); }

std::string_view identityText(Identity identity) {
  switch (identity) {
    case Identity::no: return "no";
    case Identity::firstFastest: return "yes, the first value changes fastest";
    case Identity::lastFastest: return "yes, the last value changes fastest";
  }
  return {};
}

std::string crcLine(const Info& info) {
  const std::string crc = crcText(info.values->crc);
  if (!info.crc) return crc;
  if (*info.crc == info.values->crc) return crc + ", as the file is named";
  return fmt::format("{}, and the file is named {}", crc, crcText(*info.crc));
}

void writeLines(Call& call, const Info& info) {
  const auto line = [&](std::string_view label, std::string_view text) {
    call.output.write(call.style.label(fmt::format("{:<10}", label)) + fmt::format("{}\n", text));
  };
  const OXLOOK_HEADER& header = info.header;
  line("name", !info.name ? "(not ASCII)" : info.name->empty() ? "(none)" : visible(*info.name));
  line("version", fmt::format("{}{}", header.version,
                              isOtherByteOrder(header) ? ", in the other byte order" : ""));
  line("points", fmt::format("{0} x {0} x {0}", header.lutSize));
  line("header", fmt::format("{} bytes, constants 0x{:08X} and 0x{:08X}", header.headerSize,
                             header.constantA, header.constantB));
  line("file", counted(info.size, "byte"));
  if (!info.values) return;
  line("CRC", crcLine(info));
  constexpr std::array<std::string_view, 3> places = {"first", "second", "third"};
  for (std::size_t i = 0; i < places.size(); ++i) {
    const auto& range = info.values->ranges[i];
    line(places[i],
         range ? fmt::format("{} to {}", number(range->least), number(range->most)) : "(none)");
  }
  if (info.values->notFinite > 0)
    line("",
         fmt::format("{} not finite", info.values->notFinite == 1
                                          ? std::string("1 value is")
                                          : fmt::format("{} values are", info.values->notFinite)));
  line("identity", identityText(info.values->identity));
}

void writeRanges(JsonWriter& json, const TableValues& values) {
  json.beginArray();
  for (const auto& range : values.ranges) {
    if (!range) {
      json.null();
      continue;
    }
    json.beginArray();
    json.raw(number(range->least));
    json.raw(number(range->most));
    json.endArray();
  }
  json.endArray();
}

// The members that look list has, and behind them more.
void writeResult(JsonResults& results, const std::string& file, const Info* info,
                 const FileProblem* problem) {
  results.add([&](JsonWriter& json) {
    const auto crcMember = [&](std::string_view key, const std::optional<std::uint32_t>& crc) {
      json.key(key);
      crc ? json.text(crcText(*crc)) : json.null();
    };
    beginResult(json, "oxmv.look/1", file);
    const TableValues* values = info != nullptr && info->values ? &*info->values : nullptr;
    crcMember("crc", info != nullptr ? info->crc : std::nullopt);
    if (info == nullptr) {
      for (const std::string_view key : {"version", "size", "name"}) json.member(key, std::nullopt);
    } else {
      json.member("version", std::size_t{info->header.version});
      json.member("size", std::size_t{info->header.lutSize});
      json.member("name", info->name ? std::optional<std::string_view>(*info->name) : std::nullopt);
      json.member("byteOrder", isOtherByteOrder(info->header) ? "big" : "little");
      json.member("headerSize", std::size_t{info->header.headerSize});
      json.member("constantA", std::size_t{info->header.constantA});
      json.member("constantB", std::size_t{info->header.constantB});
      json.member("bytes", info->size);
    }
    if (values != nullptr) {
      json.member("values", info->count);
      crcMember("computedCrc", values->crc);
      json.key("ranges");
      writeRanges(json, *values);
      json.member("notFinite", values->notFinite);
      json.key("identity");
      json.boolean(values->identity != Identity::no);
    }
    endResult(json, problem);
  });
}

void run(Call& call) {
  const bool isJson = wantsJson(call);
  JsonResults results(call);
  const std::vector<std::string> names = namedInputs(call);
  bool isFirst = true;
  for (const std::string& name : names) {
    const auto read = infoOf(name);
    const auto* problem = std::get_if<FileProblem>(&read);
    const auto* info = std::get_if<Info>(&read);
    if (problem != nullptr) call.messages.error(name, problem->message, problem->code);
    if (isJson) {
      writeResult(results, name, info, problem);
    } else if (info != nullptr) {
      if (!std::exchange(isFirst, false)) call.output.write("\n");
      if (names.size() > 1) call.output.write(call.style.heading(nameInMessages(name)) + '\n');
      writeLines(call, *info);
    }
  }
  if (isJson) results.finish();
}

constexpr auto flags = std::to_array({Flag::json, Flag::ndjson, Flag::filesFrom, Flag::null});

}  // namespace

const Verb lookInfoVerb = {
    .name = "look info",
    .words = "FILE...",
    .summary = "show what is in look-table files",
    .examples =
        "oxmv look info 43B0C2CA.oxlook\n"
        "oxmv look info --json *.oxlook | jq -r '.[] | select(.identity).file'\n",
    .details =
        "The header, the CRC of the values that are there, the least and the greatest of the\n"
        "first, second and third value of the points, and whether the look changes nothing: then\n"
        "every point is its own place, and a millionth counts as rounding. oxmv look check\n"
        "judges all that. JSON has the members of oxmv look list, and more.\n",
    .flags = flags,
    .fewestWords = 0,
    .mostWords = anyNumber,
    .run = run,
};

}  // namespace oxmv::cli
