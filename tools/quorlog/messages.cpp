#include "tools/quorlog/messages.h"

#include <unistd.h>

#include <iostream>

#include "store/failure.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/output.h"

namespace quor::cli {

void WriteLine(const std::string& line) {
    Output out(STDOUT_FILENO);
    out.buffer() = Visible(line) + '\n';
    out.flush();
}

void Complain(const std::string& text) {
    std::cerr << "quorlog: " << Visible(text) << '\n';
}

int ReportNothing(const std::string& why) {
    Complain("nothing found: " + why);
    return kNothing;
}

bool Confirm(const std::string& question) {
    std::cerr << Visible(question) << " [y/N] " << std::flush;
    std::string answer;
    if (!std::getline(std::cin, answer)) {
        std::cerr << '\n';
        throw store::Failure("no answer on standard input; give --yes to go ahead without one");
    }
    return answer == "y" || answer == "yes";
}

}  // namespace quor::cli
