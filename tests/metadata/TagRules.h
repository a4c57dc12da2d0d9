// The tags of every rule of reading and writing. Written down a second time on purpose: a test that
// took them from the library's own table would agree with every slip in it.

#pragma once

#include <string_view>

namespace oxmv::test {

// Reading.

inline constexpr std::string_view readAsText[] = {
    "ANKE", "ANKF", "ANKG", "ANKN", "ASPI", "ATC1", "ATC2", "ATC3", "ATC4", "ATC5", "AUDI",
    "CAML", "CMDL", "DATE", "DFFM", "DFMT", "DFNT", "DISK", "DPNG", "DPXF", "DSCP", "DSCR",
    "DTAG", "FIRM", "INKD", "INKE", "INKF", "INKG", "INKN", "KNDU", "KNEN", "KNST", "LABR",
    "LCNS", "LKEX", "LOGC", "LOOK", "NAME", "PULI", "PULO", "REEA", "REEL", "SCES", "SDAT",
    "SDUR", "SEND", "SOUN", "SPIO", "STIM", "TAPE", "TC24", "TC25", "TC30", "TC3N", "TC4A",
    "TC5P", "TC60", "TIMA", "TIMC", "TIME", "TIMF", "TIMS", "TRNS", "UNCP", "VFXF", "VFXR"};

inline constexpr std::string_view readAsInt32[] = {
    "ACDL", "AFFI", "ATZM", "BMTX", "CACT", "CADN", "CALI", "CCRV", "CHFP", "CHNL", "CLSF", "CLSR",
    "CLSY", "CMIX", "CMVL", "CPUM", "CQUL", "CSWP", "CV67", "DCRV", "DEMO", "DJST", "DPLX", "DTDR",
    "DTFI", "DTFO", "DTIN", "ECRV", "FORC", "HIST", "IGNR", "LCRC", "LYUV", "MRKG", "NUMC", "OVER",
    "PCRV", "PF3D", "PIXR", "PRCS", "PRNT", "SPIP", "SUBT", "TOOL", "UFRM", "VCHN", "VTSP", "WVFM"};

inline constexpr std::string_view readAsUint8[] = {"BFMT", "CAMR", "PROJ", "TIMB", "TIMD"};

inline constexpr std::string_view readAsUint16[] = {"GAIN", "KNED", "MDFr", "SCEN",
                                                    "SHOT", "SHUT", "TAKE"};

inline constexpr std::string_view readAsFloat[] = {
    "ASCS", "BLSH", "CTRS", "DFSZ", "DSWD", "DXPS", "DYPS", "DZOM", "EXPS", "HOFF", "HPNT", "HSAT",
    "KYST", "MSKL", "MSKR", "OFFC", "OFFD", "OFFH", "OFFR", "OFFW", "OFFX", "OFFY", "ROFF", "SATU",
    "SMCR", "SMSG", "SMVD", "SPLT", "TILT", "VGNE", "VGNG", "VGNS", "VOFF", "ZOOM"};

inline constexpr std::string_view readAs2Floats[] = {"DASF", "DOSF", "DPNS", "DPOS", "DTSF"};

inline constexpr std::string_view readAs3Floats[] = {"GAMT", "RGBG", "RGBO"};

inline constexpr std::string_view readAs4Floats[] = {"DBCL", "DFCL", "DSCL", "WBAL"};

inline constexpr std::string_view readAs8Floats[] = {"MASK"};

inline constexpr std::string_view readAs9Floats[] = {"ASCM"};

inline constexpr std::string_view readAs12Floats[] = {"COLM"};

inline constexpr std::string_view readAsIntegers[] = {"BADP", "GPST", "SNID"};

inline constexpr std::string_view readAsData[] = {"DPXI", "DPXM", "DPXO", "DPXT",
                                                  "DPXU", "FREE", "NOPP"};

inline constexpr std::string_view readAsNested[] = {"COL1", "COL2"};

inline constexpr std::string_view readAsTexts[] = {"CMId", "DRPt", "DRTr", "KWRd",
                                                   "LOCn", "PRDl", "PROd", "SHTy"};

inline constexpr std::string_view readAsInts[] = {"SCPg"};

inline constexpr std::string_view readAsNestedList[] = {"DSPm"};

inline constexpr std::string_view readAsControlPoint[] = {"CTLp"};

inline constexpr std::string_view readAsTagName[] = {"TAGN"};

inline constexpr std::string_view readAsTagValue[] = {"TAGV"};

inline constexpr std::string_view readAsRegName[] = {"REGN"};

inline constexpr std::string_view readAsRegValue[] = {"REGV"};

// GUID alone is read as data that is also the clip's identity.
inline constexpr std::string_view readAsGuid[] = {"GUID"};

// Known, and never read.
inline constexpr std::string_view neverRead[] = {"GHTL", "GHTR", "CTFO", "AFMT",
                                                 "MKGD", "TAG ", "REG "};

// Writing.

inline constexpr std::string_view writtenAsText[] = {
    "TC30", "TC60", "ATC1", "ATC2", "ATC3", "TC24", "ATC4", "TC25", "ATC5", "TC4A", "REEA",
    "TIMA", "LOGC", "INKD", "SEND", "ANKE", "INKE", "NAME", "TIME", "TAPE", "DATE", "ANKF",
    "INKF", "TIMF", "VFXF", "DPXF", "ANKG", "INKG", "DPNG", "AUDI", "PULI", "ASPI", "LOOK",
    "DISK", "CMDL", "REEL", "CAML", "DFFM", "STIM", "FIRM", "TC3N", "KNEN", "ANKN", "INKN",
    "SOUN", "SPIO", "PULO", "TC5P", "UNCP", "DSCP", "LABR", "DSCR", "SDUR", "VFXR", "SCES",
    "TIMS", "LCNS", "TRNS", "SDAT", "DFMT", "DFNT", "KNST", "KNDU", "LKEX"};

inline constexpr std::string_view writtenAsFloat[] = {
    "OFFC", "OFFD", "SMVD", "DSWD", "VGNE", "HOFF", "ROFF", "VOFF", "VGNG", "SMSG", "OFFH", "BLSH",
    "MSKL", "ZOOM", "DZOM", "SMCR", "OFFR", "MSKR", "ASCS", "VGNS", "DXPS", "EXPS", "DYPS", "CTRS",
    "HSAT", "TILT", "SPLT", "HPNT", "KYST", "SATU", "OFFW", "OFFX", "OFFY", "DFSZ"};

inline constexpr std::string_view writtenAsIntegerH[] = {
    "CV67", "LCRC", "FORC", "PF3D", "CLSF", "CALI", "ACDL", "TOOL", "GHTL", "CQUL",
    "CMVL", "ATZM", "CADN", "VCHN", "CHFP", "CSWP", "OVER", "CLSR", "GHTR", "CACT",
    "PRNT", "DJST", "CCRV", "DCRV", "ECRV", "PCRV", "LYUV", "CMIX", "CLSY"};

inline constexpr std::string_view writtenAsIntegerL[] = {"NUMC", "MRKG", "AFFI", "CHNL", "WVFM",
                                                         "CPUM", "DEMO", "SPIP", "VTSP", "IGNR",
                                                         "SUBT", "HIST", "DPLX", "BMTX"};

inline constexpr std::string_view writtenAsWord16[] = {"KNED", "TAKE", "SCEN", "GAIN",
                                                       "SHOT", "SHUT", "MDFr"};

inline constexpr std::string_view writtenAsByte8[] = {"TIMB", "TIMD", "PROJ", "CAMR", "BFMT"};

inline constexpr std::string_view writtenAsIntegerR[] = {"PIXR"};

inline constexpr std::string_view writtenAsFourCC[] = {"DTAG"};

inline constexpr std::string_view writtenAsGuid[] = {"GUID"};

inline constexpr std::string_view writtenAsData[] = {"FREE", "DPXI", "DPXM", "DPXO",
                                                     "NOPP", "DPXT", "DPXU"};

inline constexpr std::string_view writtenAsFloatPair[] = {"DASF", "DOSF", "DTSF", "DPNS", "DPOS"};

inline constexpr std::string_view writtenAs3Floats[] = {"RGBG", "RGBO", "GAMT"};

inline constexpr std::string_view writtenAs4Floats[] = {"WBAL", "DBCL", "DFCL", "DSCL"};

inline constexpr std::string_view writtenAs8Floats[] = {"MASK"};

inline constexpr std::string_view writtenAs9Floats[] = {"ASCM"};

inline constexpr std::string_view writtenAs12Floats[] = {"COLM"};

inline constexpr std::string_view writtenAsIntegerArray[] = {"SNID", "BADP", "GPST"};

inline constexpr std::string_view writtenAsIntegerEach[] = {"SCPg"};

inline constexpr std::string_view writtenAsTextEach[] = {"CMId", "PROd", "KWRd", "PRDl",
                                                         "LOCn", "DRTr", "DRPt", "SHTy"};

inline constexpr std::string_view writtenAsNestedEach[] = {"DSPm"};

inline constexpr std::string_view writtenAsGroup[] = {"TAG ", "REG "};

inline constexpr std::string_view neverWritten[] = {"CTFO", "AFMT"};

inline constexpr std::string_view writtenDeferred[] = {"COL1", "COL2", "DTIN", "DTDR",
                                                       "DTFI", "DTFO", "CTLp"};

}  // namespace oxmv::test
