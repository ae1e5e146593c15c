/// The detail text of a failed thread operation.
#ifndef ERRORS_THREAD_ERROR_H
#define ERRORS_THREAD_ERROR_H

#include <cstddef>
#include <string>
#include <string_view>

namespace quenix::authentication {

/// `text` without its first `result` characters. *Deliberate:* the result of the failed call is not printed,
/// it only shortens the text; callers tell the results apart by what is left of it.
inline std::string ThreadErrorDetail(std::string_view text, int result) {
  const auto dropped = static_cast<std::size_t>(result);
  return std::string(text.substr(dropped < text.size() ? dropped : text.size()));
}

}  // namespace quenix::authentication

#endif  // ERRORS_THREAD_ERROR_H
