// A file that is written beside its place and put there when it is whole.
#ifndef PLATFORM_ARCHIVE_DRAFT_H
#define PLATFORM_ARCHIVE_DRAFT_H

#include <stdexcept>
#include <string>

#include "base/guards.h"

namespace quor::archive {

// What keeps a file from being made, and what to do.
class Problem : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

// Nothing that is there is written over.
class Draft {
  public:
    // With the rights of the file `like`. Throws Problem.
    Draft(std::string target, const std::string& like);
    Draft(const Draft&) = delete;
    Draft& operator=(const Draft&) = delete;
    ~Draft();

    const std::string& path() const { return path_; }
    // Forces it to the disk and gives it its name.
    void finish();

  private:
    [[noreturn]] void fail(const char* what) const;

    std::string target_;
    std::string path_;
    Descriptor file_;
    bool finished_ = false;
};

}  // namespace quor::archive

#endif
