// Nested folders, a compressed directory, an image bank and single pictures
// whose entry is computed from their header.
//
//   folders of 48-byte records (150)  a 32-byte name, 4 spare bytes, a type
//       byte (1 folder, 255 end of the folder, else a file), 3 spare bytes,
//       the size and the offset (a folder's: where its children start). A
//       folder's children follow its record; an empty name ends the folder.
//   compressed trailing directory (142)  the last u32 is the directory's
//       length D with itself; the D - 4 bytes before it are a zlib stream.
//       Inflated: a u16 count at 8, records from 10 of a length byte and a
//       name, a file's name (one with '\' or '.') followed by its Flag,
//       offset, packed and unpacked size.
//   palette and image bank (115)  an image count at 0 and a colour count at
//       4, the colours from 8; images from 16384, each behind a 72-byte head
//       whose first word is its length from 4 on.
//   named palette picture (78)  a picture name at 8, then the TGA pixel-depth
//       byte, a spare byte, a colour count, the colours, the picture size and
//       the pixels.
//   texture with mip chain (79)  width and height at 16, a flags word at 20
//       that gives the pixel format; the largest image ends the file.
//   embedded sheet (84)  lists nothing.
#include <cstdint>
#include <string>
#include <vector>

#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr uint32_t kFolderRecord = 48;
constexpr uint64_t kDirectoryBuffer = 1048576;

uint32_t Fit32(uint64_t v) {
  if (v > UINT32_MAX) throw BadData("size past 4 GiB");
  return static_cast<uint32_t>(v);
}

// The archive's name without its extension, or the whole name when it has none.
std::string BaseName(const ReaderContext& c) {
  const std::string_view base = StripExtension(c.archiveFileName);
  return std::string(base.empty() ? c.archiveFileName : base);
}

struct FolderWalk {
  ReaderContext& c;
  // A walk that succeeds reads at most fileSize / 48 named records (each
  // folder skips what its children took, and the walk must end inside the
  // file) and one empty-named record per folder; more reads than that mean
  // shared or looping folders.
  uint64_t recordsLeft;

  // Adds the files of the folder whose records start at `position` and
  // answers the bytes its records take, children included.
  uint64_t Walk(uint64_t position, const std::string& prefix) {
    for (uint64_t consumed = 0;;) {
      if (recordsLeft-- == 0) throw BadData("more records than the file holds");
      const std::vector<uint8_t> bytes = ReadBlock(c, position, kFolderRecord);
      const ByteView r(bytes);
      if (r.u8(0) == 0) return consumed;
      position += kFolderRecord;
      consumed += kFolderRecord;
      const std::string name = prefix + std::string(r.field(0, 32));
      switch (r.u8(36)) {
        case 1: {
          if (name.size() + 1 > kMaxNameLength) throw BadData("folder path too long");
          const uint64_t children = Walk(r.u32le(44), name + "\\");
          position += children;
          consumed += children;
          break;
        }
        case 255:
          return consumed;
        default:
          AddEntry(c, name, r.u32le(44), r.u32le(40), r.u32le(40));
      }
    }
  }
};

}  // namespace

void NestedFolderReader(ReaderContext& c, unsigned) {
  FolderWalk{c, 2 * (c.fileSize / kFolderRecord) + 2}.Walk(0, {});
}

void CompressedDirectoryReader(ReaderContext& c, unsigned) {
  const uint32_t length = ByteView(ReadBlock(c, c.fileSize - 4, 4)).u32le(0);
  if (length < 4 || length > c.fileSize) throw BadData("directory outside the file");
  if (length - 4 > kDirectoryBuffer) throw BadData("directory too large");
  const std::vector<uint8_t> stream = ReadBlock(c, c.fileSize - length, length - 4);
  std::vector<uint8_t> inflated;
  InflatePieces(stream, kDirectoryBuffer, 65536, [&](ByteView piece) {
    inflated.insert(inflated.end(), piece.data(), piece.data() + piece.size());
  });
  const ByteView d(inflated);
  const uint32_t count = d.u16le(8);
  // Folder records add nothing: file records carry their whole path. The
  // walk ends with the count or with the directory.
  uint32_t added = 0;
  for (uint64_t p = 10; added < count && p < d.size();) {
    const uint32_t size = d.u8(p);
    const ByteView name = d.sub(p + 1, size);
    const std::string_view text(reinterpret_cast<const char*>(name.data()), size);
    const uint64_t after = p + 1 + size;
    if (text.find('\0') != std::string_view::npos) {
      p += 4;  // the record is its length byte and three more
    } else if (text.find_first_of("\\.") != std::string_view::npos) {
      AddEntry(c, text, d.u32le(after + 1), d.u32le(after + 9), d.u32le(after + 5), d.u8(after));
      ++added;
      p = after + 13;
    } else {
      const uint8_t b0 = d.u8(after), b1 = d.u8(after + 1), b2 = d.u8(after + 2);
      p = b0 == 0 || (b0 > 1 && (b1 == 0 || b2 == 0)) ? after + 20 : after;
    }
  }
}

void ImageBankReader(ReaderContext& c, unsigned) {
  const uint64_t count = uint64_t{c.header.u32le(0)} + 1;
  // Every image head after the palette takes at least 8 bytes of the file.
  NeedRoomFor(count - 1, c.fileSize, 8);
  const uint32_t colours = Fit32(uint64_t{4} * c.header.u32le(4));
  AddEntry(c, "_palette_", 8, colours, colours);
  uint64_t p = 16384;
  for (uint32_t i = 0; i + 1 < count; ++i) {
    const std::vector<uint8_t> head = ReadBlock(c, p, 72);
    const std::string name = NumberedName(c.archiveFileName, i);
    if (ByteView(head).u32le(4) == 0) {
      AddEntry(c, name, 0, 0, 0);
      p += 8;
      continue;
    }
    const uint32_t length = ByteView(head).u32le(0);
    if (length < 68) throw BadData("image shorter than its head");
    // A longer image is compressed; its size is known only once inflated.
    const uint32_t packed = length - 68;
    AddEntry(c, name, DerivedOffset(p + 72), packed <= 8 ? packed : 0, packed, packed <= 8 ? 0 : 1);
    p += uint64_t{length} + 4;
  }
}

void NamedPalettePictureReader(ReaderContext& c, unsigned) {
  const std::string_view picture = c.header.cstr(8, 64);
  const uint32_t after = 8 + static_cast<uint32_t>(picture.size()) + 1;
  const uint32_t colours = c.header.u16le(after + 2);
  const uint32_t extra = ByteView(ReadBlock(c, after + 4 + 3 * colours, 4)).u32le(0);
  const uint32_t offset = after + 2, packed = c.fileSize - offset;
  // The TGA file holds a 256-colour palette of 3-byte entries behind its
  // 18-byte header in place of the stored colours.
  const std::string name = std::string(picture) + "." + BaseName(c) + ".tga";
  AddEntry(c, name, offset, Fit32(uint64_t{packed} - 3 * colours + 780), packed, c.header.u8(after),
           extra);
}

void MipTextureReader(ReaderContext& c, unsigned) {
  const uint32_t extra = c.header.u32le(16), flags = c.header.u32le(20);
  uint64_t pixels = uint64_t{extra & 0xFFFF} * (extra >> 16);
  uint8_t flag = 0;
  if ((flags & 0xF0) == 0xC0) {
    flag = 0xD5;
    pixels *= 4;
  }
  uint8_t step = 0;
  if ((flags & 0xFF00) == 0x1000 || (flags & 0xFF00) == 0x2000 || flags == 44) {
    step = 0x33;
  } else if ((flags & 0xFF00) == 0x100 || (flags & 0xFFFF0000) == 0x1000000 || flags < 256) {
    pixels = flag == 0 ? pixels / 2 : pixels / 2 + pixels / 4;
    step = 0x31;
  }
  const std::string name = BaseName(c) + ".dds";
  if (step == 0) {
    AddEntry(c, name, 0, 128, c.fileSize, flag, extra);
    return;
  }
  // The largest image is the last one in the file.
  if (pixels > c.fileSize) throw BadData("texture larger than the file");
  const auto size = static_cast<uint32_t>(pixels);
  AddEntry(c, name, c.fileSize - size, Fit32(uint64_t{size} + 128), size,
           static_cast<uint8_t>(flag + step), extra);
}

void EmbeddedSheetReader(ReaderContext&, unsigned) {}

}  // namespace cairn
