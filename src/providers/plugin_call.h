/// The shared shape of a call into a plug-in.
#ifndef PROVIDERS_PLUGIN_CALL_H
#define PROVIDERS_PLUGIN_CALL_H

#include <cstdint>
#include <string>

#include "authentication/plugin/active_directory_client.h"
#include "authentication/provider_exceptions.h"
#include "errors/mapped_exception.h"

namespace quenix::authentication {

/// Throws CallNotImplementedException for an operation that the plug-in lacks.
template <class Slot>
Slot Implemented(Slot slot) {
  if (slot == nullptr) throw CallNotImplementedException();
  return slot;
}

inline void ThrowUnlessSuccess(std::uint32_t status) {
  if (status != 0) ThrowMappedException(status);
}

/// Calls `slot` once and throws the exception of its status.
template <class Slot, class... Arguments>
void Call(Slot slot, Arguments... arguments) {
  ThrowUnlessSuccess(Implemented(slot)(arguments...));
}

/// Releases what a successful call returned: once and whole, also when it is null.
class ReleaseWhole {
 public:
  ReleaseWhole(void* memory, ActiveDirectoryFree release) : memory_(memory), release_(release) {}
  ReleaseWhole(const ReleaseWhole&) = delete;
  ReleaseWhole& operator=(const ReleaseWhole&) = delete;
  ~ReleaseWhole() {
    if (release_ != nullptr) release_(memory_);
  }

 private:
  void* memory_;
  ActiveDirectoryFree release_;
};

/// Releases what a successful call returned, unless it is null.
class ReleaseUnlessNull {
 public:
  ReleaseUnlessNull(void* memory, ActiveDirectoryFree release)
      : whole_(memory, memory == nullptr ? nullptr : release) {}

 private:
  ReleaseWhole whole_;
};

inline std::string TextOrEmpty(const char* text) {
  return text == nullptr ? "" : text;
}

/// Calls an operation that returns one string through its last two parameters.
template <class Slot, class... Arguments>
std::string CallForString(Slot slot, Arguments... arguments) {
  char* text = nullptr;
  ActiveDirectoryFree release = nullptr;
  Call(slot, arguments..., &text, &release);
  const ReleaseWhole releaseText(text, release);
  return TextOrEmpty(text);
}

/// Calls an operation that returns an array through its two parameters, and adds `convert(*element)` of each
/// element to a `List`.
template <class List, class Element, class Slot, class Convert>
List CallForArray(Slot slot, Convert convert) {
  Element** array = nullptr;
  ActiveDirectoryFree release = nullptr;
  Call(slot, &array, &release);
  const ReleaseWhole releaseArray(array, release);
  List list;
  for (Element** element = array; element != nullptr && *element != nullptr; ++element) {
    list.push_back(convert(*element));
  }
  return list;
}

}  // namespace quenix::authentication

#endif  // PROVIDERS_PLUGIN_CALL_H
