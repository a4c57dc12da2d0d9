#include "oxmv/metadata/TagTable.h"

#include <algorithm>
#include <array>
#include <cstddef>

#include "oxmv/metadata/TagStreamFormat.h"
#include "oxmv/values/Block.h"
#include "oxmv/values/Bytes32.h"

namespace oxmv {

using detail::Form;

namespace {

// clang-format off
// Odd rows that are kept on purpose:
// - GHTL and GHTR are written and never read; AFMT and CTFO are known and do neither.
// - MKGD has the label "Mark good take", but the tag that is written and read is MRKG, which has
//   none.
// - DTAG is read and written as text, but accepts only a number by key.
// - "TAG " and "REG " are keys of groups, and never the tag of a record; TAGN, TAGV, REGN and REGV
//   are the reverse.
constexpr auto rows = std::to_array<TagRow>({
    {"ACDL"_tag, Read::int32, Write::integerH, Accept::number},
    {"AFFI"_tag, Read::int32, Write::integerL, Accept::number},
    {"AFMT"_tag, Read::none, Write::none, Accept::unknown},
    {"ANKE"_tag, Read::text, Write::text, Accept::any, 0, "Aux Ink out"},
    {"ANKF"_tag, Read::text, Write::text, Accept::any, 0, "Aux Ink film type"},
    {"ANKG"_tag, Read::text, Write::text, Accept::any, 0, "Aux Ink edge type"},
    {"ANKN"_tag, Read::text, Write::text, Accept::any, 0, "Aux Ink"},
    {"ASCM"_tag, Read::floats, Write::floats, Accept::array, 9, "ASC_SOP"},
    {"ASCS"_tag, Read::float32, Write::float32, Accept::number, 0, "ASC_SAT"},
    {"ASPI"_tag, Read::text, Write::text, Accept::any},
    {"ATC1"_tag, Read::text, Write::text, Accept::any},
    {"ATC2"_tag, Read::text, Write::text, Accept::any},
    {"ATC3"_tag, Read::text, Write::text, Accept::any},
    {"ATC4"_tag, Read::text, Write::text, Accept::any},
    {"ATC5"_tag, Read::text, Write::text, Accept::any},
    {"ATZM"_tag, Read::int32, Write::integerH, Accept::number},
    {"AUDI"_tag, Read::text, Write::text, Accept::any},
    {"BADP"_tag, Read::integers, Write::integerArray, Accept::unknown},
    {"BFMT"_tag, Read::uint8, Write::byte8, Accept::number, 0, "Bayer format"},
    {"BLSH"_tag, Read::float32, Write::float32, Accept::number, 0, "BlurSharpen"},
    {"BMTX"_tag, Read::int32, Write::integerL, Accept::number, 0, "Unity Matrix"},
    {"CACT"_tag, Read::int32, Write::integerH, Accept::number},
    {"CADN"_tag, Read::int32, Write::integerH, Accept::number},
    {"CALI"_tag, Read::int32, Write::integerH, Accept::number},
    {"CAML"_tag, Read::text, Write::text, Accept::any},
    {"CAMR"_tag, Read::uint8, Write::byte8, Accept::number, 0, "Camera number"},
    {"CCRV"_tag, Read::int32, Write::integerH, Accept::number, 0, "Primaries Curve"},
    {"CHFP"_tag, Read::int32, Write::integerH, Accept::number},
    {"CHNL"_tag, Read::int32, Write::integerL, Accept::number},
    {"CLSF"_tag, Read::int32, Write::integerH, Accept::number},
    {"CLSR"_tag, Read::int32, Write::integerH, Accept::number, 0, "Color space RGB"},
    {"CLSY"_tag, Read::int32, Write::integerH, Accept::number, 0, "Color space YUV"},
    {"CMDL"_tag, Read::text, Write::text, Accept::any},
    {"CMIX"_tag, Read::int32, Write::integerH, Accept::number},
    {"CMId"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"CMVL"_tag, Read::int32, Write::integerH, Accept::number},
    {"COL1"_tag, Read::nested, Write::nested, Accept::any, 0, "", When::deferred},
    {"COL2"_tag, Read::nested, Write::nested, Accept::any, 0, "", When::deferred},
    {"COLM"_tag, Read::floats, Write::floats, Accept::array, 12, "Color Matrix"},
    {"CPUM"_tag, Read::int32, Write::integerL, Accept::number},
    {"CQUL"_tag, Read::int32, Write::integerH, Accept::number},
    {"CSWP"_tag, Read::int32, Write::integerH, Accept::number},
    {"CTFO"_tag, Read::none, Write::none, Accept::unknown},
    {"CTLp"_tag, Read::controlPoint, Write::controlPoint, Accept::any, 0, "", When::deferred},
    {"CTRS"_tag, Read::float32, Write::float32, Accept::number},
    {"CV67"_tag, Read::int32, Write::integerH, Accept::number},
    {"DASF"_tag, Read::floats, Write::floatPair, Accept::array, 2},
    {"DATE"_tag, Read::text, Write::text, Accept::any, 0, "Encode Date"},
    {"DBCL"_tag, Read::floats, Write::floats, Accept::array, 4},
    {"DCRV"_tag, Read::int32, Write::integerH, Accept::number, 0, "Decode Curve"},
    {"DEMO"_tag, Read::int32, Write::integerL, Accept::number},
    {"DFCL"_tag, Read::floats, Write::floats, Accept::array, 4},
    {"DFFM"_tag, Read::text, Write::text, Accept::any},
    {"DFMT"_tag, Read::text, Write::text, Accept::any},
    {"DFNT"_tag, Read::text, Write::text, Accept::any},
    {"DFSZ"_tag, Read::float32, Write::float32, Accept::number},
    {"DISK"_tag, Read::text, Write::text, Accept::any},
    {"DJST"_tag, Read::int32, Write::integerH, Accept::number},
    {"DOSF"_tag, Read::floats, Write::floatPair, Accept::unknown, 2},
    {"DPLX"_tag, Read::int32, Write::integerL, Accept::number},
    {"DPNG"_tag, Read::text, Write::text, Accept::any},
    {"DPNS"_tag, Read::floats, Write::floatPair, Accept::array, 2},
    {"DPOS"_tag, Read::floats, Write::floatPair, Accept::array, 2},
    {"DPXF"_tag, Read::text, Write::text, Accept::any},
    {"DPXI"_tag, Read::data, Write::data, Accept::never},
    {"DPXM"_tag, Read::data, Write::data, Accept::never},
    {"DPXO"_tag, Read::data, Write::data, Accept::never},
    {"DPXT"_tag, Read::data, Write::data, Accept::never},
    {"DPXU"_tag, Read::data, Write::data, Accept::never},
    {"DRPt"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"DRTr"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"DSCL"_tag, Read::floats, Write::floats, Accept::array, 4},
    {"DSCP"_tag, Read::text, Write::text, Accept::any},
    {"DSCR"_tag, Read::text, Write::text, Accept::any},
    {"DSPm"_tag, Read::nestedList, Write::nestedEach, Accept::any},
    {"DSWD"_tag, Read::float32, Write::float32, Accept::number},
    {"DTAG"_tag, Read::text, Write::fourCC, Accept::number},
    {"DTDR"_tag, Read::int32, Write::integerL, Accept::number, 0, "", When::deferred},
    {"DTFI"_tag, Read::int32, Write::integerL, Accept::number, 0, "", When::deferred},
    {"DTFO"_tag, Read::int32, Write::integerL, Accept::number, 0, "", When::deferred},
    {"DTIN"_tag, Read::int32, Write::integerL, Accept::number, 0, "", When::deferred},
    {"DTSF"_tag, Read::floats, Write::floatPair, Accept::array, 2},
    {"DXPS"_tag, Read::float32, Write::float32, Accept::number},
    {"DYPS"_tag, Read::float32, Write::float32, Accept::number},
    {"DZOM"_tag, Read::float32, Write::float32, Accept::number},
    {"ECRV"_tag, Read::int32, Write::integerH, Accept::number, 0, "Encode Curve"},
    {"EXPS"_tag, Read::float32, Write::float32, Accept::number},
    {"FIRM"_tag, Read::text, Write::text, Accept::any},
    {"FORC"_tag, Read::int32, Write::integerH, Accept::number},
    {"FREE"_tag, Read::data, Write::data, Accept::never},
    {"GAIN"_tag, Read::uint16, Write::word16, Accept::number, 0, "Camera gain"},
    {"GAMT"_tag, Read::floats, Write::floats, Accept::array, 3, "Channel gamma"},
    {"GHTL"_tag, Read::none, Write::integerH, Accept::unknown},
    {"GHTR"_tag, Read::none, Write::integerH, Accept::unknown},
    {"GPST"_tag, Read::integers, Write::integerArray, Accept::any},
    {"GUID"_tag, Read::guid, Write::guid, Accept::never},
    {"HIST"_tag, Read::int32, Write::integerL, Accept::number},
    {"HOFF"_tag, Read::float32, Write::float32, Accept::number},
    {"HPNT"_tag, Read::float32, Write::float32, Accept::number},
    {"HSAT"_tag, Read::float32, Write::float32, Accept::number},
    {"IGNR"_tag, Read::int32, Write::integerL, Accept::number},
    {"INKD"_tag, Read::text, Write::text, Accept::any},
    {"INKE"_tag, Read::text, Write::text, Accept::any},
    {"INKF"_tag, Read::text, Write::text, Accept::any},
    {"INKG"_tag, Read::text, Write::text, Accept::any},
    {"INKN"_tag, Read::text, Write::text, Accept::any},
    {"KNDU"_tag, Read::text, Write::text, Accept::any},
    {"KNED"_tag, Read::uint16, Write::word16, Accept::number},
    {"KNEN"_tag, Read::text, Write::text, Accept::any},
    {"KNST"_tag, Read::text, Write::text, Accept::any},
    {"KWRd"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"KYST"_tag, Read::float32, Write::float32, Accept::number},
    {"LABR"_tag, Read::text, Write::text, Accept::any},
    {"LCNS"_tag, Read::text, Write::text, Accept::any},
    {"LCRC"_tag, Read::int32, Write::integerH, Accept::number, 0, "LOOK CRC"},
    {"LKEX"_tag, Read::text, Write::text, Accept::any},
    {"LOCn"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"LOGC"_tag, Read::text, Write::text, Accept::any, 0, "Log comment"},
    {"LOOK"_tag, Read::text, Write::text, Accept::any, 0, "LOOK file"},
    {"LYUV"_tag, Read::int32, Write::integerH, Accept::number},
    {"MASK"_tag, Read::floats, Write::floats, Accept::array, 8},
    {"MDFr"_tag, Read::uint16, Write::word16, Accept::number},
    {"MKGD"_tag, Read::none, Write::none, Accept::unknown, 0, "Mark good take"},
    {"MRKG"_tag, Read::int32, Write::integerL, Accept::number},
    {"MSKL"_tag, Read::float32, Write::float32, Accept::number},
    {"MSKR"_tag, Read::float32, Write::float32, Accept::number},
    {"NAME"_tag, Read::text, Write::text, Accept::any},
    {"NOPP"_tag, Read::data, Write::data, Accept::never},
    {"NUMC"_tag, Read::int32, Write::integerL, Accept::number},
    {"OFFC"_tag, Read::float32, Write::float32, Accept::number},
    {"OFFD"_tag, Read::float32, Write::float32, Accept::number},
    {"OFFH"_tag, Read::float32, Write::float32, Accept::number},
    {"OFFR"_tag, Read::float32, Write::float32, Accept::number},
    {"OFFW"_tag, Read::float32, Write::float32, Accept::number},
    {"OFFX"_tag, Read::float32, Write::float32, Accept::number},
    {"OFFY"_tag, Read::float32, Write::float32, Accept::number},
    {"OVER"_tag, Read::int32, Write::integerH, Accept::number},
    {"PCRV"_tag, Read::int32, Write::integerH, Accept::number, 0, "Encode preset"},
    {"PF3D"_tag, Read::int32, Write::integerH, Accept::number},
    {"PIXR"_tag, Read::int32, Write::integerR, Accept::number, 0, "Pixel ratio"},
    {"PRCS"_tag, Read::int32, Write::integerL, Accept::number, 0, "", When::leading},
    {"PRDl"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"PRNT"_tag, Read::int32, Write::integerH, Accept::number, 0, "Fingerprint"},
    {"PROJ"_tag, Read::uint8, Write::byte8, Accept::number, 0, "Project number"},
    {"PROd"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"PULI"_tag, Read::text, Write::text, Accept::any},
    {"PULO"_tag, Read::text, Write::text, Accept::any},
    {"REEA"_tag, Read::text, Write::text, Accept::any, 0, "Reel name ALT"},
    {"REEL"_tag, Read::text, Write::text, Accept::any, 0, "Reel name"},
    {"REG "_tag, Read::none, Write::regGroup, Accept::unknown},
    {"REGN"_tag, Read::regName, Write::none, Accept::unknown},
    {"REGV"_tag, Read::regValue, Write::none, Accept::unknown},
    {"RGBG"_tag, Read::floats, Write::floats, Accept::array, 3, "RGB Gain"},
    {"RGBO"_tag, Read::floats, Write::floats, Accept::array, 3, "RGB Black Offset"},
    {"ROFF"_tag, Read::float32, Write::float32, Accept::number},
    {"SATU"_tag, Read::float32, Write::float32, Accept::number, 0, "Saturation"},
    {"SCEN"_tag, Read::uint16, Write::word16, Accept::number, 0, "Scene number"},
    {"SCES"_tag, Read::text, Write::text, Accept::any},
    {"SCPg"_tag, Read::ints, Write::integerEach, Accept::unknown},
    {"SDAT"_tag, Read::text, Write::text, Accept::any, 0, "Source Date"},
    {"SDUR"_tag, Read::text, Write::text, Accept::any},
    {"SEND"_tag, Read::text, Write::text, Accept::any},
    {"SHOT"_tag, Read::uint16, Write::word16, Accept::number, 0, "Shot number"},
    {"SHTy"_tag, Read::texts, Write::textEach, Accept::unknown},
    {"SHUT"_tag, Read::uint16, Write::word16, Accept::number, 0, "Shutter speed"},
    {"SMCR"_tag, Read::float32, Write::float32, Accept::number},
    {"SMSG"_tag, Read::float32, Write::float32, Accept::number},
    {"SMVD"_tag, Read::float32, Write::float32, Accept::number},
    {"SNID"_tag, Read::integers, Write::integerArray, Accept::any},
    {"SOUN"_tag, Read::text, Write::text, Accept::any},
    {"SPIO"_tag, Read::text, Write::text, Accept::any},
    {"SPIP"_tag, Read::int32, Write::integerL, Accept::number},
    {"SPLT"_tag, Read::float32, Write::float32, Accept::number},
    {"STIM"_tag, Read::text, Write::text, Accept::any, 0, "Source Time"},
    {"SUBT"_tag, Read::int32, Write::integerL, Accept::number, 0, "OXMV subtype"},
    {"TAG "_tag, Read::none, Write::tagGroup, Accept::unknown},
    {"TAGN"_tag, Read::tagName, Write::none, Accept::unknown},
    {"TAGV"_tag, Read::tagValue, Write::none, Accept::unknown},
    {"TAKE"_tag, Read::uint16, Write::word16, Accept::number, 0, "Take number"},
    {"TAPE"_tag, Read::text, Write::text, Accept::any},
    {"TC24"_tag, Read::text, Write::text, Accept::any},
    {"TC25"_tag, Read::text, Write::text, Accept::any},
    {"TC30"_tag, Read::text, Write::text, Accept::any},
    {"TC3N"_tag, Read::text, Write::text, Accept::any},
    {"TC4A"_tag, Read::text, Write::text, Accept::any},
    {"TC5P"_tag, Read::text, Write::text, Accept::any},
    {"TC60"_tag, Read::text, Write::text, Accept::any},
    {"TILT"_tag, Read::float32, Write::float32, Accept::number},
    {"TIMA"_tag, Read::text, Write::text, Accept::any, 0, "Timecode ALT"},
    {"TIMB"_tag, Read::uint8, Write::byte8, Accept::number, 0, "Timecode Base"},
    {"TIMC"_tag, Read::text, Write::timecode, Accept::any, 0, "Timecode", When::leading},
    {"TIMD"_tag, Read::uint8, Write::byte8, Accept::number, 0, "TC Dropframe"},
    {"TIME"_tag, Read::text, Write::text, Accept::any, 0, "Encode Time"},
    {"TIMF"_tag, Read::text, Write::text, Accept::any},
    {"TIMS"_tag, Read::text, Write::text, Accept::any},
    {"TOOL"_tag, Read::int32, Write::integerH, Accept::number},
    {"TRNS"_tag, Read::text, Write::text, Accept::any},
    {"UFRM"_tag, Read::int32, Write::integerL, Accept::number, 0, "Unique frame num", When::leading},
    {"UNCP"_tag, Read::text, Write::text, Accept::any},
    {"VCHN"_tag, Read::int32, Write::integerH, Accept::number},
    {"VFXF"_tag, Read::text, Write::text, Accept::any},
    {"VFXR"_tag, Read::text, Write::text, Accept::any},
    {"VGNE"_tag, Read::float32, Write::float32, Accept::number},
    {"VGNG"_tag, Read::float32, Write::float32, Accept::number},
    {"VGNS"_tag, Read::float32, Write::float32, Accept::number},
    {"VOFF"_tag, Read::float32, Write::float32, Accept::number},
    {"VTSP"_tag, Read::int32, Write::integerL, Accept::number},
    {"WBAL"_tag, Read::floats, Write::floats, Accept::array, 4, "White balance"},
    {"WVFM"_tag, Read::int32, Write::integerL, Accept::number},
    {"ZOOM"_tag, Read::float32, Write::float32, Accept::number},
});
// clang-format on

// Small helpers of the checks below.

constexpr std::size_t rowsThat(auto predicate) {
  return static_cast<std::size_t>(std::count_if(rows.begin(), rows.end(), predicate));
}

constexpr std::size_t read(Read rule) {
  return rowsThat([=](const TagRow& row) { return row.read == rule; });
}

constexpr std::size_t written(Write rule) {
  return rowsThat([=](const TagRow& row) { return row.write == rule; });
}

constexpr std::size_t accepted(Accept rule) {
  return rowsThat([=](const TagRow& row) { return row.accept == rule; });
}

static_assert(std::is_sorted(rows.begin(), rows.end(), [](const TagRow& a, const TagRow& b) {
  return charactersOf(a.tag) < charactersOf(b.tag);
}));
static_assert(std::adjacent_find(rows.begin(), rows.end(),
                                 [](const TagRow& a, const TagRow& b) { return a.tag == b.tag; }) ==
                  rows.end(),
              "no tag twice");

static_assert(rows.size() - read(Read::none) == 203, "tags that are read");
static_assert(read(Read::text) == 66 && read(Read::int32) == 48 && read(Read::float32) == 34);
static_assert(read(Read::uint8) == 5 && read(Read::uint16) == 7 && read(Read::floats) == 15);
static_assert(read(Read::integers) == 3 && read(Read::data) == 7 && read(Read::guid) == 1);
static_assert(read(Read::nested) == 2 && read(Read::texts) == 8 && read(Read::ints) == 1);
static_assert(read(Read::nestedList) == 1 && read(Read::controlPoint) == 1);
static_assert(read(Read::tagName) + read(Read::tagValue) + read(Read::regName) +
                  read(Read::regValue) ==
              4);

static_assert(written(Write::text) == 64 && written(Write::timecode) == 1 &&
              written(Write::fourCC) == 1);
static_assert(written(Write::float32) == 34 && written(Write::floatPair) == 5 &&
              written(Write::floats) == 10);
static_assert(written(Write::integerH) == 29 && written(Write::integerR) == 1);
static_assert(written(Write::integerL) == 14 + 2 + 4, "in order, leading, deferred pairs");
static_assert(written(Write::word16) == 7 && written(Write::byte8) == 5);
static_assert(written(Write::guid) == 1 && written(Write::data) == 7);
static_assert(written(Write::integerArray) == 3 && written(Write::integerEach) == 1 &&
              written(Write::textEach) == 8);
static_assert(written(Write::nestedEach) == 1 && written(Write::nested) == 2 &&
              written(Write::controlPoint) == 1);
static_assert(written(Write::tagGroup) == 1 && written(Write::regGroup) == 1);
static_assert(rowsThat([](const TagRow& row) { return row.when == When::leading; }) == 3);
static_assert(rowsThat([](const TagRow& row) { return row.when == When::deferred; }) == 7);

static_assert(accepted(Accept::any) == 71 && accepted(Accept::number) == 95);
static_assert(accepted(Accept::array) == 14 && accepted(Accept::never) == 8);
static_assert(rowsThat([](const TagRow& row) { return !row.label.empty(); }) == 46, "labels");
static_assert(rowsThat([](const TagRow& row) {
                return (row.count != 0) != (row.read == Read::floats);
              }) == 0);

constexpr detail::PlainRule number(const TagRow& row, Form form, std::uint32_t mask) {
  return {row.tag, row.read, form, 4, longestRecord - 4, mask, 0};
}

constexpr detail::PlainRule place(const TagRow& row, Form form, std::uint32_t least,
                                  std::uint32_t most) {
  return {row.tag, row.read, form, least, most - least, 0, 0xFFFFFFFF};
}

// Numbers with fewer than four bytes are not plain: they take some from behind their payload.
constexpr detail::PlainRule plainRuleOf(const TagRow& row) {
  const std::uint32_t listSize = row.count * 4u;
  switch (row.read) {
    case Read::int32: return number(row, Form::integer, 0xFFFFFFFF);
    case Read::uint16: return number(row, Form::integer, 0xFFFF);
    case Read::uint8: return number(row, Form::integer, 0xFF);
    case Read::float32: return number(row, Form::float32, 0xFFFFFFFF);
    case Read::text: return place(row, Form::textToNul, 0, longestRecord);
    case Read::floats: return place(row, Form::floats, listSize, listSize);
    case Read::integers: return place(row, Form::integers, 0, longestRecord);
    case Read::data: return place(row, Form::data, 0, longestRecord);
    case Read::none:
    case Read::guid:
    case Read::nested:
    case Read::texts:
    case Read::ints:
    case Read::nestedList:
    case Read::controlPoint:
    case Read::tagName:
    case Read::tagValue:
    case Read::regName:
    case Read::regValue: break;
  }
  return {row.tag, row.read};
}

// Empty texts are not plain, as they are not written; nor are texts that end past a look.
constexpr detail::PlainWrite plainWriteOf(const TagRow& row) {
  constexpr std::uint32_t all = 0xFFFFFFFF;
  detail::PlainWrite rule{.tag = row.tag};
  rule.header = headerWord(recordTypeOf(row.write), 0);
  if (row.when != When::inOrder) return rule;
  const auto number = [&](Form form, std::uint32_t mask) {
    rule.form = form;
    rule.room = 4;
    rule.least = 0;
    rule.numberMask = mask;
  };
  switch (row.write) {
    case Write::float32: number(Form::float32, all); break;
    case Write::integerH:
    case Write::integerL:
    case Write::integerR: number(Form::integer, all); break;
    case Write::word16: number(Form::integer, 0xFFFF); break;
    case Write::byte8: number(Form::integer, 0xFF); break;
    case Write::text:
      rule.form = Form::textToNul;
      rule.room = 1;
      rule.least = 1;
      rule.range = detail::Bytes32::size - 2;
      rule.placeMask = rule.textMask = all;
      break;
    case Write::floatPair:
    case Write::floats:
      rule.form = Form::floats;
      rule.least = static_cast<std::uint8_t>(row.count * 4);
      rule.placeMask = all;
      break;
    case Write::none:
    case Write::timecode:
    case Write::fourCC:
    case Write::guid:
    case Write::data:
    case Write::integerArray:
    case Write::integerEach:
    case Write::textEach:
    case Write::nestedEach:
    case Write::nested:
    case Write::controlPoint:
    case Write::tagGroup:
    case Write::regGroup: break;
  }
  return rule;
}

}  // namespace

namespace detail {

static_assert(rows.size() < noRow);

constexpr std::array<std::uint8_t, tagSlotCount> rowOfSlot = [] {
  std::array<std::uint8_t, tagSlotCount> table{};
  table.fill(noRow);
  for (std::size_t i = 0; i < rows.size(); ++i)
    table[slotOfTag(rows[i].tag)] = static_cast<std::uint8_t>(i);
  return table;
}();

static_assert(slotOfTag(Tag{0xFFFFFFFFu}) < tagSlotCount);
static_assert(static_cast<std::size_t>(std::count(rowOfSlot.begin(), rowOfSlot.end(), noRow)) ==
                  tagSlotCount - rows.size(),
              "no two tags in one slot");

constexpr std::array<PlainRule, noRow + 1> plainRules = [] {
  std::array<PlainRule, noRow + 1> table{};
  std::transform(rows.begin(), rows.end(), table.begin(), plainRuleOf);
  return table;
}();

constexpr std::array<PlainWrite, noRow + 1> plainWrites = [] {
  std::array<PlainWrite, noRow + 1> table{};
  std::transform(rows.begin(), rows.end(), table.begin(), plainWriteOf);
  return table;
}();

}  // namespace detail

std::span<const TagRow> tagRows() noexcept { return rows; }

const TagRow* findTagRow(Tag tag) noexcept {
  const std::uint8_t index = detail::likelyRow(tag);
  return index != detail::noRow && rows[index].tag == tag ? &rows[index] : nullptr;
}

const TagRow* findTagRow(std::string_view key) noexcept {
  if (key.size() != 4) return nullptr;
  std::array<std::uint8_t, 4> bytes{};
  std::transform(key.begin(), key.end(), bytes.begin(),
                 [](char c) { return static_cast<std::uint8_t>(c); });
  return findTagRow(tagOf(bytes));
}

std::string readsAs(const TagRow& row) {
  switch (row.read) {
    case Read::none: return "-";
    case Read::text: return "text";
    case Read::int32: return "int32";
    case Read::uint8: return "uint8";
    case Read::uint16: return "uint16";
    case Read::float32: return "float";
    case Read::floats: return std::to_string(row.count) + " floats";
    case Read::integers: return "int32 list";
    case Read::data: return "data";
    case Read::guid: return "GUID";
    case Read::nested: return "nested stream";
    case Read::texts: return "text, repeated";
    case Read::ints: return "int32, repeated";
    case Read::nestedList: return "nested stream, repeated";
    case Read::controlPoint: return "control point, repeated";
    case Read::tagName: return "name in \"TAG \"";
    case Read::tagValue: return "value in \"TAG \"";
    case Read::regName: return "name in \"REG \"";
    case Read::regValue: return "value in \"REG \"";
  }
  return {};  // Not reached: every case is above.
}

std::string writesAs(const TagRow& row) {
  switch (row.write) {
    case Write::none: return "-";
    case Write::timecode: return "c text, no NUL";
    case Write::text: return "c text";
    case Write::float32: return "f 4";
    case Write::integerH: return "H 4";
    case Write::integerL: return "L 4";
    case Write::integerR: return "R 4";
    case Write::word16:
    case Write::byte8: return "B 4";
    case Write::fourCC: return "F 4";
    case Write::guid: return "G 16";
    case Write::data: return "c data";
    case Write::floatPair:
    case Write::floats: return "f " + std::to_string(row.count * 4);
    case Write::integerArray: return "H 4 x count";
    case Write::integerEach: return "H 4 each";
    case Write::textEach: return "c text each";
    case Write::nestedEach: return "nested each";
    case Write::nested: return "nested";
    case Write::controlPoint: return "control point each";
    case Write::tagGroup: return "TAGN and TAGV";
    case Write::regGroup: return "REGN and REGV";
  }
  return {};  // Not reached: every case is above.
}

std::string acceptsAs(const TagRow& row) {
  switch (row.accept) {
    case Accept::unknown: return "-";
    case Accept::any: return "anything";
    case Accept::number: return "number";
    case Accept::array: return "array of " + std::to_string(row.count);
    case Accept::never: return "nothing";
  }
  return {};  // Not reached: every case is above.
}

}  // namespace oxmv
