#include "readers/readers.h"

namespace cairn {
void RecordTableReader(ReaderContext&, unsigned) { throw BadData("not yet"); }
void FieldTableReader(ReaderContext&, unsigned) { throw BadData("not yet"); }
void SingleEntryReader(ReaderContext&, unsigned) { throw BadData("not yet"); }
}  // namespace cairn
