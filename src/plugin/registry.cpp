#include "plugin/registry.h"

#include <array>

#include "codecs/methods.h"
#include "media/media.h"
#include "readers/readers.h"

namespace cairn {
namespace {

// Row n describes FormatId n. A format whose reader is null is answered as
// not recognised, so that the host can offer the file to someone else.
constexpr std::array<FormatInfo, kFormatCount> kFormats = {{
    {1, "mhx", "\"MHX XS V1.0\" archive", nullptr, 0, RawCopy},
    {2, "dir", "\"DIR\" archive", nullptr, 0, RawCopy},
    {3, "far", "\"FAR!byAZ\" archive", nullptr, 0, RawCopy},
    {4, "wad2", "\"WAD2\" texture archive", nullptr, 0, RawCopy},  // pending: TGA
    {5, "wad3", "\"WAD3\" texture archive", nullptr, 0, RawCopy},  // pending: TGA
    {6, "iwad", "\"IWAD\", \"PWAD\" lump archives", RecordTableReader, 6, RawCopy},
    {7, "pack-rle", "\"PACK\" compressed file", nullptr, 0, RleMethod},
    {8, "paq", "\"paq\" archive", nullptr, 0, RawCopy},
    {9, "afs", "\"AFS\" archive", nullptr, 0, RawCopy},
    {10, "lod", "\"LOD\" archive", FieldTableReader, 0, Inflate},
    {11, "csid", "\"CSid\" archive", FieldTableReader, 2, RawCopy},
    {12, "magegold", "\"MageGold\" archive", nullptr, 0, RawCopy},
    {13, "archive22", "\"archive  V2.2\" archive", nullptr, 0, RawCopy},
    {14, "stor", "\"StOR\" archive", nullptr, 0, RawCopy},
    {15, "glb2", "\"GLB2.0\" archive", RecordTableReader, 0, RawCopy},
    {16, "big4", "\"BIG4\" archive", nullptr, 0, RawCopy},
    {17, "fastf", "\"FASTF101\" archive", RecordTableReader, 1, RawCopy},
    {18, "dfp1", "\"DFP1\" archive", nullptr, 0, RawCopy},
    {19, "pff2", "\"PFF2\", \"PFF3\" archives", nullptr, 0, RawCopy},
    {20, "pff3", "\"PFF2\", \"PFF3\" archives", nullptr, 0, RawCopy},
    {21, "datos", "\"DATOS\" folder archive", nullptr, 0, RawCopy},
    {22, "sbf0", "\"SBF0\" archive", RecordTableReader, 7, RawCopy},
    {23, "massive", "\"MASSIVE PAKFILE V 4.0\" archive", nullptr, 0, RawCopy},
    {24, "dorba", "\"DorbaMistfel\" group archive", RecordTableReader, 8, RawCopy},
    {25, "tribe", "typed resource archive", nullptr, 0, RawCopy},
    {26, "gscfmt", "\"GSCfmt\" archive", nullptr, 0, RawCopy},
    {27, "vxbg", "\"VXBG\" archive", nullptr, 0, RawCopy},
    {28, "mna", "\"MNA\" archive", nullptr, 0, RawCopy},
    {29, "hak", "\"HAK V1.0\" archive", nullptr, 0, RawCopy},
    {30, "cmpr", "\"CMPR\" archive", nullptr, 0, RawCopy},
    {31, "dwfb", "\"DWFB\" archive", nullptr, 0, RawCopy},
    {32, "f5cd", "\"F5CD\", \"IPF1\" wrappers", SingleEntryReader, 1, RawCopy},
    {33, "ipf1", "\"F5CD\", \"IPF1\" wrappers", SingleEntryReader, 2, RawCopy},
    {34, "pwad", "\"IWAD\", \"PWAD\" lump archives", RecordTableReader, 6, RawCopy},
    {35, "nemo", "\"Nemo Fi\" two-part file", nullptr, 0, RawOrInflate},
    {36, "objpkg", "object package", nullptr, 0, RawCopy},
    {37, "l33t", "\"l33t\" compressed file", nullptr, 0, Inflate},
    {38, "pvol", "\"PVOL\" archive", nullptr, 0, RawCopy},
    {39, "tr4", "\"TR4\" level file", nullptr, 0, RawOrInflate},  // TGA header then inflate for Flag 2 and up
    {40, "1xfg", "\"1XFG\" chunk file", nullptr, 0, RawCopy},  // pending: TGA
    {41, "gaba", "\"GABA\" sound archive", nullptr, 0, RawCopy},  // pending: WAV
    {42, "dir2048", "directory of signature row 42", RecordTableReader, 10, RawCopy},
    {43, "h4campaign", "\"H4CAMPAIGN\" wrapper", SingleEntryReader, 3, RawCopy},
    {44, "h4r", "\"H4R\" archive", nullptr, 0, RawCopy},
    {45, "actrhead", "\"ACTRHEAD\" item file", nullptr, 0, RawCopy},
    {46, "snok", "\"SNOK_DATAFILE_KEEP_OUT!\" archive", nullptr, 0, Inflate},
    {47, "avix", "\"AVIX\" picture file", nullptr, 0, RawCopy},  // pending: TGA
    {48, "nldir", "newline directory", nullptr, 0, RawCopy},
    {49, "palettefiles", "\"PALETTEFILES \" section file", nullptr, 0, RawCopy},
    {50, "jdlz", "\"JDLZ\" compressed file", nullptr, 0, JdlzMethod},
    {51, "bikwrap", "video wrapper of signature row 51", SingleEntryReader, 4, RawCopy},
    {52, "big", "\"BIG\" archive", nullptr, 0, RawCopy},
    {53, "_archive", "\"_ARCHIVE\" archive", nullptr, 0, RawOrInflate},
    {54, "rezmgr", "\"RezMgr\" archive", nullptr, 0, RawCopy},
    {55, "mp3wrap", "sound wrapper of signature row 55", SingleEntryReader, 5, RawCopy},
    {56, "cpal", "\"CPAL savegame 3.3\" wrapper", SingleEntryReader, 6, RawOrInflate},
    {57, "centauri", "resource file of signature row 57", nullptr, 0, RawOrInflate},
    {58, "mudge", "item-stream tree archive", nullptr, 0, RawCopy},
    {59, "awad", "\"AWAD\" archive", nullptr, 0, RawCopy},
    {60, "mjz0", "\"MJZ0\" archive", nullptr, 0, RawCopy},
    {61, "mh3", "\"MH3 V1.0 \" archive", nullptr, 0, RawCopy},
    {62, "ver2", "\"VER2\" archive", nullptr, 0, RawCopy},
    {63, "mqdb", "\"MQDB\" archive", nullptr, 0, RawCopy},
    {64, "ezd", "\"ezd\" archive", nullptr, 0, Inflate},
    {65, "bankcat", "enciphered sound banks", nullptr, 0, RawCopy},
    {66, "bank", "enciphered sound banks", nullptr, 0, RawCopy},
    {67, "mix1", "\"MIX1\" archive", nullptr, 0, RawCopy},
    {68, "thu3", "\"THU3\" archive", nullptr, 0, RawCopy},
    {69, "sdpa", "\"SDPA\" sound archive", nullptr, 0, RawCopy},
    {70, "pack-dir", "\"PACK\" directory archive", nullptr, 0, RawCopy},  // pending: TGA
    {71, "tex1", "\"TEX\" texture lists", nullptr, 0, RawCopy},  // pending: TGA
    {72, "tex2", "\"TEX\" texture lists", nullptr, 0, RawCopy},  // pending: TGA
    {73, "xcr", "\"xcr File 1.00\" archive", FieldTableReader, 6, RawCopy},
    {74, "lp1c", "\"LP1C\" archive", nullptr, 0, RawCopy},
    {75, "isd0", "\"ISD0\" enciphered record list", nullptr, 0, BlockJoin},
    {76, "pklist", "\"PK\" header list", nullptr, 0, Inflate},
    {77, "lgr", "23-byte-header file chain", nullptr, 0, RawCopy},
    {78, "img", "named palette picture", nullptr, 0, RawCopy},  // pending: TGA
    {79, "vtf", "texture with mip chain", nullptr, 0, RawCopy},  // pending: DDS
    {80, "sheets", "unnamed sheet archive with nested recognition", nullptr, 0, RawCopy},
    {81, "imglist-table", "image list behind a located table", nullptr, 0, RawCopy},
    {82, "imglist32", "image list after a 32-byte header", nullptr, 0, RawCopy},
    {83, "imglist96", "image list after a 96-byte header", nullptr, 0, RawCopy},
    {84, "sheet", "embedded sheet (lists nothing)", nullptr, 0, RawCopy},
    {85, "dir40dot", "40-byte-name directory with dotted names", RecordTableReader, 4, RawCopy},
    {86, "dir40", "40-byte-name directory without sizes", RecordTableReader, 5, RawCopy},
    {87, "dir27", "27-byte-record directory with 16-bit count", FieldTableReader, 1, RawCopy},
    {88, "dir83", "8.3-name directory", nullptr, 0, RawCopy},
    {89, "dir80", "80-byte-name directory", RecordTableReader, 2, RawCopy},
    {90, "offname", "offset-and-name directory with derived sizes", nullptr, 0, RawCopy},
    {91, "enddir", "name directory at the end of the file", nullptr, 0, RawCopy},
    {92, "chunks-table", "tagged chunk file with offset table", nullptr, 0, RawCopy},  // pending: TGA
    {93, "endtable", "offset table at the end of the file", nullptr, 0, RawCopy},
    {94, "numtable24", "numbered offset table, header word 24", nullptr, 0, RawCopy},
    {95, "numtable25", "numbered offset table, header word 25", nullptr, 0, RawCopy},
    {96, "zdir", "zero-terminated-name directory", nullptr, 0, RawCopy},
    {97, "bigf", "BIGF directory with relative offsets", FieldTableReader, 5, RawCopy},
    {98, "img-dir", "sector archive with companion directory", nullptr, 0, RawCopy},
    {99, "pal512", "named 512 x 512 palette image", nullptr, 0, RawCopy},  // pending: BMP
    {100, "pal256", "named 512 x 256 palette image", nullptr, 0, RawCopy},  // pending: BMP
    {101, "xormp3", "XOR-scrambled sound file", SingleEntryReader, 0, RawCopy},
    {102, "offsound", "offset-list sound bank", nullptr, 0, RawCopy},  // pending: WAV
    {103, "nametable", "name table at file start", nullptr, 0, RawCopy},
    {104, "dir36", "36-byte-name directory with raw pictures", nullptr, 0, RawCopy},  // pending: BMP
    {105, "dir14", "14-byte-name directory with 16-bit count", RecordTableReader, 9, RawCopy},
    {106, "scrambled", "directory with scrambled names", nullptr, 0, RawOrInflate},
    {107, "inlinedir", "inline name directory with derived offsets", nullptr, 0, RawCopy},
    {108, "rfd", ".rfd archive with a .rfh companion index", nullptr, 0, RawOrInflate},
    {109, "jaz", "compressed JPEG container", nullptr, 0, InflateJpegContainer},
    {110, "hdr40", "offset table to named 40-byte headers", nullptr, 0, RawCopy},
    {111, "tgl", "tagged chunk file, total size at 8", nullptr, 0, RawCopy},  // pending: TGA
    {112, "kps", "tagged chunk file, total size at 8 plus 8", nullptr, 0, RawCopy},
    {113, "rec20", "unnamed 20-byte record list", nullptr, 0, RawCopy},
    {114, "dir80pad", "80-byte-name directory with padded records", RecordTableReader, 3, RawCopy},
    {115, "mult", "palette and image bank", nullptr, 0, RawOrInflate4M},
    {116, "trailnames", "offset table with a trailing name table", nullptr, 0, RawCopy},
    {117, "chain16", "unnamed 16-byte-header chain", nullptr, 0, Inflate},
    {118, "dir136", "136-byte-record directory", FieldTableReader, 3, RawCopy},
    {119, "psv", "space-terminated-name directory with description", nullptr, 0, RawCopy},
    {120, "tex512", "packed 512 x 256 texture", nullptr, 0, RawOrInflate},  // TGA header then inflate for Flag 2 and up
    {121, "pakdir", "archive with an interleaved-name .dir companion index", nullptr, 0, RawOrInflate},
    {122, "dir52", "size-prefixed 52-byte-name directory", FieldTableReader, 4, RawCopy},
    {123, "bundle3", "three-section texture bundle", nullptr, 0, RawCopy},  // pending: DDS
    {124, "bundlepal", "texture bundle with leading block and separate palettes", nullptr, 0, RawCopy},  // pending: DDS
    {125, "qfs", "compressed stream with a 5- or 8-byte header", nullptr, 0, OpcodeLzMethod},
    {126, "bag", "sound bank with .idx companion", nullptr, 0, RawCopy},  // pending: WAV
    {127, "frame", "frame block stream", nullptr, 0, RawOrInflate},
    {128, "sequence12", "sequence block stream with 12-byte header", nullptr, 0, RawOrInflate},
    {129, "sequence", "sequence block stream without header", nullptr, 0, RawOrInflate},
    {130, "rec16", "unnamed 16-byte record directory", nullptr, 0, RawCopy},
    {131, "syj", "JPEG stream with a game extension", nullptr, 0, RawCopy},  // pending: JPEG prefix
    {132, "bigf-be", "big-endian directory", nullptr, 0, RawCopy},
    {133, "bigf-names", "name directory with data after it", nullptr, 0, RawCopy},
    {134, "r555", "headerless 16-bit picture", nullptr, 0, RawCopy},  // pending: TGA
    {135, "r8", "8-bit image sequence, first header at 0", nullptr, 0, RawCopy},  // pending: TGA/BMP
    {136, "r8grid", "8-bit image sequence, headers on an 8-byte grid", nullptr, 0, RawCopy},  // pending: TGA/BMP
    {137, "r16", "16-bit image sequence, first header at 0", nullptr, 0, RawCopy},  // pending: TGA/BMP
    {138, "r16grid", "16-bit image sequence, headers on an 8-byte grid", nullptr, 0, RawCopy},  // pending: TGA/BMP
    {139, "tex565tga", "16-bit picture with 22-byte header, TGA output", nullptr, 0, RawCopy},  // pending: TGA
    {140, "tex565bmp", "16-bit picture with 22-byte header, BMP output", nullptr, 0, RawCopy},  // pending: BMP
    {141, "picw", "16-bit picture with width-only header", nullptr, 0, RawCopy},  // pending: TGA
    {142, "wdz", "archive with compressed trailing directory", nullptr, 0, RawOrInflate},
    {143, "fat", "archive with a .fat companion index", nullptr, 0, RawCopy},
    {144, "bf", "length-prefixed-name directory", nullptr, 0, RawCopy},
    {145, "nipix", "pixel-data object file", nullptr, 0, RawCopy},  // pending: TGA
    {146, "chunkstream", "tagged chunk stream", nullptr, 0, RawCopy},
    {147, "clz", "size-prefixed compressed file", SingleEntryReader, 7, RawOrInflate},
    {148, "wd", "directory with a separate name block", nullptr, 0, RawCopy},
    {149, "rsb", "16-bit picture with 28-byte header", nullptr, 0, RawCopy},  // pending: BMP
    {150, "pck", "nested 48-byte-record folders", nullptr, 0, RawCopy},
    {151, "pal8", "headerless 8-bit palette image", nullptr, 0, RawCopy},  // pending: TGA
    {152, "rgb24", "headerless 24-bit image", nullptr, 0, RawCopy},  // pending: TGA
    {153, "offname0", "offset-and-name directory ending in an empty name", nullptr, 0, RawCopy},
    {154, "psc", "key-scrambled size chain", nullptr, 0, RawCopy},
    {155, "iff", "wrapped IFF file", SingleEntryReader, 8, IlbmPrefix},
    {156, "meg", "name list with indexed records", nullptr, 0, RawCopy},
    {157, "bundlelead", "texture bundle with leading block", nullptr, 0, RawCopy},  // pending: DDS
}};

}  // namespace

const FormatInfo* FindFormat(FormatId id) {
  if (id < 1 || id > kFormatCount) return nullptr;
  return &kFormats[id - 1];
}

std::span<const FormatInfo> AllFormats() { return kFormats; }

}  // namespace cairn
