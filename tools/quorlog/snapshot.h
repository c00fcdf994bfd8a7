// A copy of a database as it is at one moment, made while others write to it.
#ifndef QUORLOG_SNAPSHOT_H
#define QUORLOG_SNAPSHOT_H

#include <string>

namespace quor::cli {

// A file of its own beside the target, which goes away unless it becomes what it should.
class Draft {
  public:
    explicit Draft(std::string target);
    Draft(const Draft&) = delete;
    Draft& operator=(const Draft&) = delete;
    ~Draft();

    const std::string& path() const { return path_; }
    // It is on the disk, and takes the place of the target.
    void finish() const;

  private:
    std::string target_;
    std::string path_;
};

// Those of the target that a program left which was killed. Nobody else may be making one.
void RemoveDrafts(const std::string& target);

// Copies the database into the draft, without the space that deleted rows left. A signal ends that, and nothing else.
// The exit status, and what failed on standard error.
int CopyDatabase(const std::string& db, const std::string& draft);

// After an exchange that syslog-ng may not have noticed. The exit status.
int ReportIncomplete(const std::string& aside);

}  // namespace quor::cli

#endif
