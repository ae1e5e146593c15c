/// An output stream that replaces its file at once and whole.
#ifndef CONFIG_ATOMIC_FILE_STREAM_H
#define CONFIG_ATOMIC_FILE_STREAM_H

#include <fstream>
#include <string>

namespace quenix::authentication {

/// Writes a temporary file beside its target and renames it over the target on Commit(). A reader sees the
/// old file or the new one. For one thread; without Commit() the target stays as it was and the temporary
/// file, the target's name and six random characters, stays beside it.
class AtomicFileStream : public std::basic_ofstream<char> {
 public:
  /// Opens as open() does.
  AtomicFileStream(const char* path, std::ios_base::openmode mode);
  AtomicFileStream(const AtomicFileStream&) = delete;
  AtomicFileStream& operator=(const AtomicFileStream&) = delete;
  ~AtomicFileStream() override;

  /// Creates the temporary file, readable by its owner only, and opens the stream on it. Throws IOError when
  /// it cannot be created; when it cannot be opened, the stream is in a failed state.
  void open(const char* path, std::ios_base::openmode mode);

  /// Closes the stream, brings the data to the disk and replaces the target. An existing target's permission
  /// bits are carried over, its owner is not. Does not look at the stream's state: the caller does, before it
  /// commits.
  ///
  /// Throws IOError when the data cannot be brought to the disk or the file not be renamed, with the target
  /// as it was; FilePermissionError when the target was replaced but its permissions could not be carried
  /// over.
  void Commit();

 private:
  std::string temporaryPath_;
  std::string targetPath_;
};

}  // namespace quenix::authentication

#endif  // CONFIG_ATOMIC_FILE_STREAM_H
