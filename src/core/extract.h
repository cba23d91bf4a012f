// The extraction frame: one entry written to one output file by the method of
// its format, ending in finish (0), error exit (12) or abort (21).
#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "core/session.h"
#include "util/bytes.h"

namespace cairn {

// Thrown when the progress callback asks to stop.
struct Aborted {};

// Thrown when the output takes fewer bytes than it was given: the disk is
// full, a quota or size limit was met, the device failed. `error` is the
// system's code for it (os::LastError).
struct WriteFailed {
  int error;
};

struct ExtractionFrame {
  ArchiveSession& session;
  const ArchiveEntry& entry;
  os::Handle archive;
  os::Handle output;  // created empty, positioned at 0
  const std::string& destName;
  // The figure of the final progress report: the entry's PackedSize, unless
  // the method copies only part of the stored bytes.
  uint32_t reportedSize = entry.PackedSize;

  // Tells the host that `bytes` more are done; throws Aborted on a 0 answer.
  void Report(uint32_t bytes) const;
  // Writes at the output's current position; throws WriteFailed on a short
  // write.
  void Write(ByteView bytes) const;
  void WriteAt(ByteView bytes, uint32_t position) const;
};

// Whether `path` names the archive of the session or a file read beside it,
// by whatever spelling or link: such a destination is refused before it is
// opened for writing.
bool IsArchiveFile(const ArchiveSession& s, const std::string& path);

using MethodFn = void (*)(ExtractionFrame&);

// Copies `size` stored bytes from `offset` to the output in chunks of at most
// 1 MiB, reporting each chunk. FormatIds 26, 58, 101, 65 and 66 transform the
// chunks on the way (see RawCopy).
void CopyStored(ExtractionFrame& f, uint32_t offset, uint32_t size);

// The default method: the entry's stored bytes, with the per-format
// transforms, composite entries and ZIP header repairs.
void RawCopy(ExtractionFrame& f);

// The entries a catalogue track of the station bank (FormatId 65, Flag 2 and
// up) is joined from, in order; -1 for a Flag that names no track.
std::array<int, 3> CompositeParts(uint8_t flag);

// The 16 key words of the two sound-bank formats, applied by file position
// modulo 16.
extern const uint32_t kPositionKeyTable[16];

}  // namespace cairn
