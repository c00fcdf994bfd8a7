// Runs the program in a folder of its own.
#ifndef TESTS_QUORLOG_PROGRAM_H
#define TESTS_QUORLOG_PROGRAM_H

#include <stdlib.h>
#include <sys/wait.h>

#include <string>

#include "support/temp_folder.h"

namespace quor::test {

struct Outcome {
    int status;
    std::string out;
    std::string err;
};

class Program {
  public:
    // `arguments` as a shell reads them.
    Outcome run(const std::string& arguments, const std::string& input = "") const {
        folder_.write("in", input);
        const int status =
            system(("cd " + folder_.path() + " && { exec " QUORLOG " " + arguments + "; } <in >out 2>err").c_str());
        return {WEXITSTATUS(status), ReadFile(folder_.path("out")), ReadFile(folder_.path("err"))};
    }

    const TempFolder& folder() const { return folder_; }

  private:
    TempFolder folder_;
};

}  // namespace quor::test

#endif
