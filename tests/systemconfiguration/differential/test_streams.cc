#include "systemconfiguration/differential/test_streams.h"

#include <algorithm>
#include <vector>

namespace differential {
namespace {

class CommaClassification : public std::ctype<char> {
 public:
  CommaClassification() : std::ctype<char>(Table()) {}

 private:
  static const mask* Table() {
    static const std::vector<mask> table = [] {
      std::vector<mask> classes(classic_table(), classic_table() + table_size);
      for (mask& characterClass : classes) characterClass &= static_cast<mask>(~space);
      classes[','] |= space;
      classes['\n'] |= space;
      return classes;
    }();
    return table.data();
  }
};

}  // namespace

SourceBuffer::SourceBuffer(const InputCase& input) : input_(input), text_(input.text) {
  setg(text_.data(), text_.data(), text_.data());
  const bool isFilledAtOnce = input.chunk == 0 && input.fault == std::string::npos;
  if (isFilledAtOnce) underflow();
}

std::size_t SourceBuffer::Consumed() const {
  return static_cast<std::size_t>(gptr() - text_.data());
}

SourceBuffer::int_type SourceBuffer::underflow() {
  if (gptr() < egptr()) return traits_type::to_int_type(*gptr());
  if (filled_ >= input_.fault) throw BufferFault("the source is broken");
  const std::size_t limit = std::min(input_.fault, text_.size());
  const std::size_t chunk = input_.chunk == 0 ? text_.size() : input_.chunk;
  const std::size_t end = std::min(limit, filled_ + chunk);
  if (end == filled_) return traits_type::eof();
  setg(text_.data() + filled_, text_.data() + filled_, text_.data() + end);
  filled_ = end;
  return traits_type::to_int_type(*gptr());
}

SinkBuffer::int_type SinkBuffer::overflow(int_type character) {
  if (traits_type::eq_int_type(character, traits_type::eof())) return traits_type::not_eof(character);
  if (written_ >= input_.capacity) {
    if (input_.throwWhenFull) throw BufferFault("the sink is full");
    return traits_type::eof();
  }
  ++written_;
  log_.push_back(traits_type::to_char_type(character));
  return character;
}

int SinkBuffer::sync() {
  log_ += "<flush>";
  return 0;
}

std::locale CommaLocale() {
  return std::locale(std::locale::classic(), new CommaClassification);  // owned by the locale
}

void SetUp(std::ios& stream, const InputCase& input) {
  static const std::locale commaLocale = CommaLocale();
  if (input.commaSeparates) stream.imbue(commaLocale);
  stream.width(input.width);
  stream.setf(input.skipWhiteSpace ? std::ios_base::skipws : std::ios_base::fmtflags{},
              std::ios_base::skipws);
  stream.clear(input.state);
  try {
    stream.exceptions(input.exceptions);
  } catch (const std::ios_base::failure&) {
    // The mask is set all the same; a stream may well be in a state that it would have thrown for.
  }
}

}  // namespace differential
