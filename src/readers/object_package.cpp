// The object package (FormatId 36): serialised objects described by three
// tables whose counts and offsets stand in the header (names at 12 and 16,
// exports at 20 and 24, imports at 28 and 32; the version at 4).
//
// - A name is zero-terminated, after 1 byte from version 64 and 3 more from
//   version 128, and is followed by 4 bytes of flags.
// - An export is class, super, package, object name, flags, serial size and
//   serial offset; an import is class package, class name, package and object
//   name. From version 128 every value is 32 bits; before, the ones that
//   are not a package or flags are compact integers, and the serial offset
//   is there only when the size is above 0.
// - A class reference of 0 is the first name, c > 0 export c - 1, c < 0
//   import -c - 1; a class is named by its object's name.
//
// Every export is one entry, "NNNNNN_object.class", over its serialised
// bytes; for "Music", "Sound" and "TextBuffer" the entry is the file the
// object wraps, found behind a short object header.
//
// The tables are read through windows of a generous size per record, cut at
// the end of the file, so that a table at the very end still reads; a value
// that lies beyond the window refuses the package. Names are kept to their
// first 63 characters, which keeps every entry name short.

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr size_t kNameKept = 63;

// Values of a table, read in order.
struct Cursor {
  std::vector<uint8_t> bytes;
  size_t at = 0;

  int32_t compact() {
    size_t used;
    const int32_t v = DecodeSignedVarInt(bytes, at, used);
    at += used;
    return v;
  }
  int32_t word() {
    const auto v = static_cast<int32_t>(ByteView(bytes).u32le(at));
    at += 4;
    return v;
  }
};

// Up to `perRecord` bytes for each of `count` records at the offset that the
// header word at `offsetAt` gives, cut at the end of the file.
Cursor Table(const ReaderContext& c, uint32_t count, uint32_t offsetAt, uint32_t perRecord) {
  const uint32_t offset = c.header.u32le(offsetAt);
  if (offset > c.fileSize) throw BadData("table past the end");
  return {
      ReadBlock(c, offset, std::min<uint64_t>(uint64_t{count} * perRecord, c.fileSize - offset))};
}

struct Export {
  int32_t classRef, name;
  uint32_t size, offset;
};

struct Package {
  uint16_t version;
  std::vector<std::string> names;
  std::vector<Export> exports;
  std::vector<int32_t> importNames;

  const std::string& name(int64_t index) const {
    if (index < 0 || static_cast<uint64_t>(index) >= names.size())
      throw BadData("name index outside the table");
    return names[static_cast<size_t>(index)];
  }
  const std::string& className(int32_t ref) const {
    if (ref == 0) return name(0);
    const int64_t i = ref > 0 ? int64_t{ref} - 1 : -int64_t{ref} - 1;
    if (ref > 0 && static_cast<uint64_t>(i) < exports.size())
      return name(exports[static_cast<size_t>(i)].name);
    if (ref < 0 && static_cast<uint64_t>(i) < importNames.size())
      return name(importNames[static_cast<size_t>(i)]);
    throw BadData("class reference outside the tables");
  }
};

Package ReadTables(const ReaderContext& c) {
  Package p{c.header.u16le(4), {}, {}, {}};
  const bool wide = p.version >= 128;
  const auto value = [wide](Cursor& t, bool compact) {
    return wide || !compact ? t.word() : t.compact();
  };

  const uint32_t nameCount = c.header.u32le(12);
  Cursor names = Table(c, nameCount, 16, 68);
  for (uint32_t i = 0; i < nameCount; ++i) {
    names.at += (p.version >= 64 ? 1 : 0) + (wide ? 3 : 0);
    const std::string_view n = ByteView(names.bytes).cstr(names.at, 260);
    names.at += n.size() + 1;
    names.word();  // the flags
    p.names.emplace_back(n.substr(0, kNameKept));
  }

  const uint32_t exportCount = c.header.u32le(20);
  Cursor exports = Table(c, exportCount, 24, 33);
  for (uint32_t i = 0; i < exportCount; ++i) {
    Export& e = p.exports.emplace_back();
    e.classRef = value(exports, true);
    value(exports, true);   // super
    value(exports, false);  // package
    e.name = value(exports, true);
    value(exports, false);  // flags
    const int32_t size = value(exports, true);
    e.size = static_cast<uint32_t>(size);
    e.offset = static_cast<uint32_t>(wide || size > 0 ? value(exports, true) : 0);
  }

  const uint32_t importCount = c.header.u32le(28);
  Cursor imports = Table(c, importCount, 32, 33);
  for (uint32_t i = 0; i < importCount; ++i) {
    value(imports, true);   // class package
    value(imports, true);   // class name
    value(imports, false);  // package
    p.importNames.push_back(value(imports, true));
  }
  return p;
}

struct Wrapped {
  std::string type;  // what the class name gives way to
  uint64_t skip;     // object header bytes before the file
  uint32_t size;
};

// The file inside a "Music", "Sound" or "TextBuffer" object, from the head of
// its serialised bytes.
Wrapped Unwrap(const Package& p, std::string_view cls, ByteView head, uint32_t serialSize) {
  size_t used;
  if (EqualNoCase(cls, "Music")) {
    const size_t k = p.version > 61 ? 6 : 2;
    const auto size = static_cast<uint32_t>(DecodeSignedVarInt(head, k, used));
    return {p.name(0), k + used, size};
  }
  if (EqualNoCase(cls, "TextBuffer")) {
    const auto size = static_cast<uint32_t>(DecodeSignedVarInt(head, 9, used));
    return {"txt", 9 + used, size == 0 ? 0 : size - 1};
  }
  const std::string& format = p.name(DecodeSignedVarInt(head, 1, used));
  uint64_t q = 1 + used;
  if (p.version >= 128) {
    q += 18 + uint64_t{head.u32le(q + 6)};
  } else {
    q += (p.version >= 63 ? 4 : 0) + (p.version >= 119 ? 4 : 0);
    const int32_t first = DecodeSignedVarInt(head, q, used);
    q += used;
    if (first == 0) {
      DecodeSignedVarInt(head, q, used);
      q += used;
    }
  }
  if (q > serialSize) throw BadData("sound header larger than its object");
  return {format, q, static_cast<uint32_t>(serialSize - q)};
}

}  // namespace

void ObjectPackageReader(ReaderContext& c, unsigned) {
  const Package p = ReadTables(c);
  for (size_t i = 0; i < p.exports.size(); ++i) {
    const Export& e = p.exports[i];
    std::string cls = p.className(e.classRef);
    uint64_t offset = e.offset;
    uint32_t size = e.size;
    if (EqualNoCase(cls, "Music") || EqualNoCase(cls, "Sound") || EqualNoCase(cls, "TextBuffer")) {
      if (e.offset > c.fileSize) throw BadData("object past the end");
      const std::vector<uint8_t> head =
          ReadBlock(c, e.offset, std::min<uint64_t>(32, c.fileSize - e.offset));
      Wrapped w = Unwrap(p, cls, head, e.size);
      cls = std::move(w.type);
      offset += w.skip;
      size = w.size;
    }
    char index[24];
    std::snprintf(index, sizeof index, "%06zu_", i);
    AddEntry(c, index + p.name(e.name) + "." + cls, DerivedOffset(offset), size, size);
  }
}

}  // namespace cairn
