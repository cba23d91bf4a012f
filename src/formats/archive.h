// The open and extraction frames bound to the format table: recognition,
// the directory reader of the format, and the extraction method of each
// entry. The hosts work through these.
#pragma once

#include <string>

#include "core/extract.h"
#include "core/session.h"

namespace cairn {

// Opens `path` into the session: recognition, the directory reader, the
// table. Answers kOk or the host's open result (12, 14, 15, 18); on failure
// the session holds nothing.
int OpenArchiveSession(ArchiveSession& s, const std::string& path);

// Opens `path` as FormatId `format`, skipping recognition (for formats that
// recognition cannot reach, and for tests of one reader).
int OpenArchiveAs(ArchiveSession& s, const std::string& path, FormatId format);

// Recognises the file at `path` without touching any session: the FormatId,
// or 0 when the file is unknown or its format has no reader.
FormatId RecogniseFile(const std::string& path);

// Extracts entry `index` of the open session to `destName`. Answers 0, 12, 16,
// 19 or 21; after anything but 0 no output is left behind. For 19 (the
// output took fewer bytes than given) `writeError`, when given, receives the
// system's code for the reason.
int ExtractEntry(ArchiveSession& s, size_t index, const std::string& destName,
                 int* writeError = nullptr);

}  // namespace cairn
