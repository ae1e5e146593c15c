#ifndef SYSTEMCONFIGURATION_BUFFERED_INPUT_H
#define SYSTEMCONFIGURATION_BUFFERED_INPUT_H

#include <cstddef>
#include <istream>
#include <string_view>

namespace SystemConfiguration {

/// The lines that a stream holds in memory already. Taking a line apart there gives the same words as reading
/// them from the stream one by one, and costs a fraction.
///
/// Only for streams on which the two cannot be told apart: whose reading nobody has set up otherwise, by a
/// width, by flags, by a locale or by a tied stream. All others never have such a line.
class BufferedInput {
 public:
  explicit BufferedInput(std::istream& stream);

  /// The next line with its line end, empty when the stream does not hold all of it or cannot be read. It
  /// stays valid until the stream is used.
  std::string_view Line() const;

  /// Takes a line that Line() gave from the stream.
  void Consume(std::string_view line);

 private:
  std::istream& stream_;
  std::streambuf* buffer_;
};

}  // namespace SystemConfiguration

#endif
