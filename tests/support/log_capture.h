#ifndef VORN_TEST_LOG_CAPTURE_H
#define VORN_TEST_LOG_CAPTURE_H

#include <mutex>
#include <string>
#include <vector>

namespace vorn {
namespace test {

// Takes over the process-wide log sink while it lives and keeps every line.
class LogCapture {
  public:
    LogCapture();
    ~LogCapture();
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;

    std::vector<std::string> Lines() const;
    // Lines containing text, in order.
    std::vector<std::string> Matching(const std::string& text) const;
    bool Contains(const std::string& text) const { return !Matching(text).empty(); }
    void Clear();

  private:
    mutable std::mutex mutex_;
    std::vector<std::string> lines_;
};

}  // namespace test
}  // namespace vorn

#endif
