// Reads of stored bytes for the methods that build their file in memory. A
// range is checked against the archive's size before anything is allocated
// for it, so no buffer is ever sized by a field the archive cannot back.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "core/extract.h"

namespace cairn {

// Throws BadData unless [position, position + length) lies inside the archive.
void NeedStored(const ExtractionFrame& f, uint64_t position, uint64_t length);

// The `length` bytes at `position`, after NeedStored.
std::vector<uint8_t> ReadStored(const ExtractionFrame& f, uint64_t position, uint64_t length);

// Fills `into` from `position`, after NeedStored.
void ReadStoredInto(const ExtractionFrame& f, std::span<uint8_t> into, uint64_t position);

}  // namespace cairn
