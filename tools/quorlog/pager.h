// The program that shows long output a screen at a time.
#ifndef QUORLOG_PAGER_H
#define QUORLOG_PAGER_H

#include <sys/types.h>

#include <string>
#include <vector>

#include "base/guards.h"

namespace quor::cli {

// The words of $QUORLOG_PAGER, else of $PAGER, else less. None when that is empty, cat or not installed.
std::vector<std::string> FindPager();

// A pager that runs and reads what is written to input().
class Pager {
  public:
    // Failure when no process can be made.
    explicit Pager(const std::vector<std::string>& command);
    Pager(const Pager&) = delete;
    Pager& operator=(const Pager&) = delete;
    // Ends its input and waits until the person leaves it.
    ~Pager();

    int input() const { return input_.get(); }

  private:
    Descriptor input_;
    pid_t process_ = -1;
};

}  // namespace quor::cli

#endif
