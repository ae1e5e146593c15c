/// The border between the plug-in's exceptions and the status codes of its table.
#ifndef SAMBA_PLUGIN_GUARDED_H
#define SAMBA_PLUGIN_GUARDED_H

#include <exception>
#include <new>

#include "common/status.h"

namespace sambaprovider {

/// Runs `body` and gives its Failure's status, or kSuccess. Nothing else leaves it.
template <typename Body>
uint32_t Guarded(const Body& body) noexcept {
  try {
    body();
    return kSuccess;
  } catch (const Failure& failure) {
    return failure.Code();
  } catch (const std::bad_alloc&) {
    return kNotEnoughMemory;
  } catch (const std::exception&) {
    return kInternalError;
  }
}

}  // namespace sambaprovider

#endif  // SAMBA_PLUGIN_GUARDED_H
