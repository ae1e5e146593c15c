#include "attempt_record.h"

#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <optional>

namespace velmorctl {

namespace {

using nlohmann::json;

std::uint64_t SizeOf(const std::string& path) {
  std::error_code error;
  std::uintmax_t size = std::filesystem::file_size(path, error);
  return error ? 0 : size;
}

template <class Value>
Value Member(const json& record, const char* name, Value otherwise) {
  try {
    return record.value(name, otherwise);
  } catch (const json::exception&) {
    return otherwise;
  }
}

std::optional<AttemptRecord::Line> Parse(const std::string& text) {
  json record = json::parse(text, nullptr, false);
  if (!record.is_object() || Member<std::int64_t>(record, "process", 0) != getpid()) {
    return std::nullopt;
  }
  return AttemptRecord::Line{
      Member<std::string>(record, "step", ""), Member<std::string>(record, "event", ""),
      Member<std::int64_t>(record, "status", 0), Member<std::string>(record, "text", "")};
}

}  // namespace

AttemptRecord::AttemptRecord(const std::string& provider)
    : path_("/var/lib/quenix/" + provider + "/attempts.log"), position_(SizeOf(path_)) {}

std::vector<AttemptRecord::Line> AttemptRecord::TakeNew() {
  std::vector<Line> lines;
  if (SizeOf(path_) < position_) {
    position_ = 0;  // The provider has begun a new file.
  }
  std::ifstream stream(path_, std::ios::binary);
  stream.seekg(static_cast<std::streamoff>(position_));
  for (std::string text; std::getline(stream, text) && !stream.eof();) {
    position_ += text.size() + 1;
    if (std::optional<Line> line = Parse(text)) {
      lines.push_back(std::move(*line));
    }
  }
  return lines;
}

}  // namespace velmorctl
