// Reads XML property lists, piece by piece through expat. Entity declarations are refused and nothing outside
// the document is ever read. What is wrong with it raises PropertyListError.
#pragma once

#include "platform/ByteSource.h"
#include "platform/Value.h"

namespace platform {

// `source` is read from start to end. A UID is the dictionary {"CF$UID": number}, as XML has it.
Value readXMLPropertyList(ByteSource& source);

}  // namespace platform
