#ifndef VORN_UTILS_TEMP_FILE_H
#define VORN_UTILS_TEMP_FILE_H

#include <cstdio>
#include <string>

namespace vornwireless {
namespace utils {

// A temporary file beside a file that is about to be replaced: made under the root with mkstemp,
// named by its logical path ("<name>.tmp.XXXXXX" completed) so that platform calls can rename or
// remove it. Closing does not remove it.
class TempFile {
  public:
    explicit TempFile(const std::string& logicalName);
    ~TempFile() { Close(); }
    TempFile(const TempFile&) = delete;
    TempFile& operator=(const TempFile&) = delete;

    bool Created() const { return fd_ >= 0; }
    const std::string& Logical() const { return logical_; }
    // A write stream on the file, or null.
    FILE* Open();
    // Flushes to disk and closes; false when the content may not have reached the file.
    bool Close();

  private:
    std::string logical_;
    int fd_ = -1;
    FILE* stream_ = nullptr;
};

}  // namespace utils
}  // namespace vornwireless

#endif
