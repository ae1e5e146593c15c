#ifndef PLATFORM_ORVCONFIGSTORE_RECORD_CHECKSUM_H
#define PLATFORM_ORVCONFIGSTORE_RECORD_CHECKSUM_H

#include <cstdint>
#include <string>

#include "orvconfigstore/store_object.h"

namespace OrvConfigStore {

/// A checksum of everything that an object is: namespace, identity, names and values of its fields. It finds
/// damage by chance, not tampering. Stored, so it never changes.
std::int64_t ChecksumOf(const std::string& namespaceName, const StoreObject& object);

}  // namespace OrvConfigStore

#endif
