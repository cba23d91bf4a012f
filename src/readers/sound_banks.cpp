// Enciphered sound banks (FormatIds 65 and 66): no directory, only items from
// offset 0, each 8068 bytes of head and its sound data. The head's length
// field at 8000 is enciphered with the position key: the word at file
// position q is XORed with key word q mod 16. In banks of 66 a length that
// deciphers to 0xCDCDCDCD stands aside for a second one at 8008. The next item
// follows the sound data; the walk ends at the end of the file. Items are
// listed as Ogg streams named after the bank (its name less the last
// character) and their index, and keep Flag 1 so that extraction deciphers
// them.
//
// A few banks of 65, known by name and size, also get a folder of catalogue
// tracks. A track stores nothing of its own: extraction joins three of the
// bank's items (CompositeParts), so the track is listed with their sizes
// added up, and Flag = track index + 2.

#include <algorithm>
#include <array>
#include <cstdio>
#include <string>

#include "core/extract.h"
#include "readers/readers.h"
#include "util/names.h"

namespace cairn {
namespace {

constexpr uint32_t kItemHead = 8068;

struct BankLayout {
  bool secondLength;  // a length of 0xCDCDCDCD gives way to the one at 8008
  bool catalogue;     // the station banks may hold catalogue tracks
};

// Rows in the order of the registry's `row` column.
constexpr std::array<BankLayout, 2> kBankLayouts = {{
    {false, true},  // 65
    {true, false},  // 66
}};

struct Station {
  std::string_view bankName;
  uint32_t fileSize;
  std::string_view folder;
  uint32_t firstTrack, lastTrack;
};

// The banks that carry catalogue tracks, and the tracks of each. The tracks
// are numbered within their folder.
constexpr std::array<Station, 10> kStations = {{
    {"ds.", 96057329, "Bounce FM\\", 0, 16},
    {"nj.", 68702632, "CSR\\", 17, 29},
    {"cr.", 90482863, "K-DST\\", 30, 46},
    {"re.", 84261583, "K-Jah West\\", 47, 62},
    {"co.", 72004665, "K-Rose\\", 63, 77},
    {"rg.", 92691528, "Master Sounds\\", 78, 95},
    {"ch.", 63115815, "Play Back\\", 96, 107},
    {"mh.", 88229863, "Radio Los Santos\\", 108, 123},
    {"mr.", 82195988, "Radio X\\", 124, 138},
    {"hc.", 82748246, "SF-UR\\", 139, 154},
}};

uint32_t DecipheredWord(const ReaderContext& c, uint64_t position) {
  return ByteView(ReadBlock(c, position, 4)).u32le(0) ^ kPositionKeyTable[position % 16];
}

// A track's size is what extraction writes: its three parts, each a plain
// item of the bank. A track with a part outside the items lists 0 and fails
// to extract.
uint32_t TrackSize(const ReaderContext& c, size_t items, uint8_t flag) {
  uint64_t size = 0;
  for (int part : CompositeParts(flag)) {
    if (part < 0 || static_cast<size_t>(part) >= items) return 0;
    size += c.entries[static_cast<size_t>(part)].PackedSize;
  }
  return static_cast<uint32_t>(std::min<uint64_t>(size, UINT32_MAX));
}

void AddCatalogueTracks(ReaderContext& c) {
  const size_t items = c.entries.size();
  for (const Station& s : kStations) {
    if (!EqualNoCase(c.archiveFileName, s.bankName) || c.fileSize != s.fileSize) continue;
    for (uint32_t track = s.firstTrack; track <= s.lastTrack; ++track) {
      char title[16];
      std::snprintf(title, sizeof title, "Track %02u.ogg", track - s.firstTrack + 1);
      const auto flag = static_cast<uint8_t>(track + 2);
      const uint32_t size = TrackSize(c, items, flag);
      AddEntry(c, std::string(s.folder) + title, 0, size, size, flag);
    }
  }
}

}  // namespace

void SoundBankReader(ReaderContext& c, unsigned row) {
  const BankLayout& l = kBankLayouts.at(row);
  const std::string_view name = c.archiveFileName.substr(0, c.archiveFileName.size() - 1);
  uint32_t index = 0;
  // Every item moves the walk on by its head at least; positions are 64-bit,
  // so a length near 4 GiB ends the walk instead of wrapping back.
  for (uint64_t q = 0; c.fileSize > 8000 && q < c.fileSize; ++index) {
    uint32_t length = DecipheredWord(c, q + 8000);
    if (l.secondLength && length == 0xCDCDCDCD) length = DecipheredWord(c, q + 8008);
    AddEntry(c, NumberedName(name, index) + ".ogg", DerivedOffset(q + kItemHead), length, length,
             1);
    q += kItemHead + uint64_t{length};
  }
  if (l.catalogue) AddCatalogueTracks(c);
}

}  // namespace cairn
