// The directory readers. Each fills the context's entries or throws BadData;
// `row` selects a layout for the readers that serve several formats.
#pragma once

#include "plugin/session.h"

namespace cairn {

void RecordTableReader(ReaderContext& c, unsigned row);
void FieldTableReader(ReaderContext& c, unsigned row);
void SingleEntryReader(ReaderContext& c, unsigned row);

// Chained items and the line directory (chained_items.cpp).
void ChainedItemReader(ReaderContext& c, unsigned row);
void LineDirectoryReader(ReaderContext& c, unsigned row);

// Folder tree, typed tables and keyed records (folder_trees.cpp).
void FolderTreeReader(ReaderContext& c, unsigned row);
void TypedTableReader(ReaderContext& c, unsigned row);
void KeyedRecordReader(ReaderContext& c, unsigned row);

// Directories with a separate name block (name_blocks.cpp).
void NameBlockReader(ReaderContext& c, unsigned row);

}  // namespace cairn
