#include "buffered_input.h"

#include <cstring>
#include <limits>
#include <locale>
#include <streambuf>

namespace SystemConfiguration {
namespace {

// Makes the protected members nameable by which a stream's own operations reach its buffer.
struct GetArea : std::streambuf {
  using std::streambuf::egptr;
  using std::streambuf::gbump;
  using std::streambuf::gptr;
};

// Longer lines, which no count of the buffer's could express, are left to the stream.
constexpr std::size_t longestLine = std::numeric_limits<int>::max();

bool IsOrdinary(const std::istream& stream) {
  const std::locale& classic = std::locale::classic();
  return stream.width() == 0 && (stream.flags() & std::ios_base::skipws) != 0 && stream.tie() == nullptr &&
         stream.getloc() == classic && std::locale() == classic;
}

}  // namespace

BufferedInput::BufferedInput(std::istream& stream)
    : stream_(stream), buffer_(IsOrdinary(stream) ? stream.rdbuf() : nullptr) {}

std::string_view BufferedInput::Line() const {
  if (buffer_ == nullptr || !stream_.good()) return {};
  const char* const begin = (buffer_->*&GetArea::gptr)();
  const auto size = static_cast<std::size_t>((buffer_->*&GetArea::egptr)() - begin);
  const void* const lineEnd = size == 0 ? nullptr : std::memchr(begin, '\n', size);
  if (lineEnd == nullptr) return {};
  const auto length = static_cast<std::size_t>(static_cast<const char*>(lineEnd) - begin) + 1;
  return length <= longestLine ? std::string_view(begin, length) : std::string_view();
}

void BufferedInput::Consume(std::string_view line) {
  (buffer_->*&GetArea::gbump)(static_cast<int>(line.size()));
}

}  // namespace SystemConfiguration
