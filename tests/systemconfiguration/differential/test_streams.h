/// Stream buffers that misbehave on demand and tell what was done with them.
#ifndef DIFFERENTIAL_TEST_STREAMS_H
#define DIFFERENTIAL_TEST_STREAMS_H

#include <cstddef>
#include <ios>
#include <locale>
#include <stdexcept>
#include <streambuf>
#include <string>

#include "systemconfiguration/differential/input_case.h"

namespace differential {

/// What the buffers below throw.
class BufferFault : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

/// Gives the input's text in chunks, without a way back, and may throw on the way.
class SourceBuffer : public std::streambuf {
 public:
  explicit SourceBuffer(const InputCase& input);

  /// How many characters were taken.
  std::size_t Consumed() const;

 protected:
  int_type underflow() override;

 private:
  const InputCase& input_;
  std::string text_;
  std::size_t filled_ = 0;
};

/// Keeps what is written and where it was flushed, and may run full.
class SinkBuffer : public std::streambuf {
 public:
  explicit SinkBuffer(const InputCase& input) : input_(input) {}

  /// Everything written, with a "<flush>" wherever the stream was flushed.
  const std::string& Log() const { return log_; }

 protected:
  int_type overflow(int_type character) override;
  int sync() override;

 private:
  const InputCase& input_;
  std::string log_;
  std::size_t written_ = 0;
};

/// Only the comma and the line end are white space in it.
std::locale CommaLocale();

/// Gives a stream the input's width, flags, locale, state and exception mask.
void SetUp(std::ios& stream, const InputCase& input);

}  // namespace differential

#endif  // DIFFERENTIAL_TEST_STREAMS_H
