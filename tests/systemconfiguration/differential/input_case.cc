#include "systemconfiguration/differential/input_case.h"

#include <ostream>

#include "systemconfiguration/differential/observation.h"

namespace differential {
namespace {

constexpr std::size_t setUpBytes = 5;

std::ios_base::iostate StateOf(unsigned bits) {
  std::ios_base::iostate state = std::ios_base::goodbit;
  if ((bits & 1U) != 0) state |= std::ios_base::eofbit;
  if ((bits & 2U) != 0) state |= std::ios_base::failbit;
  if ((bits & 4U) != 0) state |= std::ios_base::badbit;
  return state;
}

}  // namespace

InputCase FromBytes(const std::uint8_t* bytes, std::size_t size) {
  InputCase input;
  if (size < setUpBytes) return input;
  const auto setUp = [&](std::size_t index) { return (bytes[index] - unsigned{'0'}) & 0xffU; };
  input.text.assign(bytes + setUpBytes, bytes + size);
  input.width = setUp(0) & 7U;
  input.skipWhiteSpace = (setUp(0) & 8U) == 0;
  input.commaSeparates = (setUp(0) & 16U) != 0;
  input.state = StateOf(setUp(0) >> 5U);
  input.exceptions = StateOf(setUp(1));
  input.throwWhenFull = (setUp(1) & 16U) != 0;
  input.chunk = setUp(2);
  if (setUp(3) != 0) input.fault = (setUp(3) - 1) * input.text.size() / 255;
  if (setUp(4) != 0) input.capacity = (setUp(4) - 1) * 2U;
  return input;
}

std::ostream& operator<<(std::ostream& stream, const InputCase& input) {
  return stream << "width " << input.width << ", skipws " << input.skipWhiteSpace << ", comma "
                << input.commaSeparates << ", state " << input.state << ", exceptions " << input.exceptions
                << ", chunk " << input.chunk << ", fault " << input.fault << ", capacity " << input.capacity
                << ", throws " << input.throwWhenFull << "\ntext: " << Escaped(input.text) << "\n";
}

}  // namespace differential
