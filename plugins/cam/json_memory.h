/// Memory for RapidJSON.
#ifndef CAM_JSON_MEMORY_H
#define CAM_JSON_MEMORY_H

#include <rapidjson/document.h>
#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

#include <cstdlib>
#include <new>

namespace camproxy {

/// Throws when there is no memory, since RapidJSON does not look whether it got any. The names are
/// RapidJSON's.
class JsonMemory {
 public:
  static const bool kNeedFree = true;

  void* Malloc(std::size_t size) { return size == 0 ? nullptr : OrThrow(std::malloc(size)); }
  void* Realloc(void* memory, std::size_t, std::size_t size) {
    if (size != 0) return OrThrow(std::realloc(memory, size));
    std::free(memory);
    return nullptr;
  }
  static void Free(void* memory) { std::free(memory); }

 private:
  static void* OrThrow(void* memory) {
    if (memory == nullptr) throw std::bad_alloc();
    return memory;
  }
};

using JsonDocument =
    rapidjson::GenericDocument<rapidjson::UTF8<>, rapidjson::MemoryPoolAllocator<JsonMemory>, JsonMemory>;
using JsonText = rapidjson::GenericStringBuffer<rapidjson::UTF8<>, JsonMemory>;
using JsonWriter = rapidjson::Writer<JsonText, rapidjson::UTF8<>, rapidjson::UTF8<>, JsonMemory,
                                     rapidjson::kWriteValidateEncodingFlag>;

}  // namespace camproxy

#endif  // CAM_JSON_MEMORY_H
