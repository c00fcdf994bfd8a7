#include "database.h"

#include <unistd.h>

#include <filesystem>
#include <iostream>

#include "failure.h"
#include "text.h"

namespace quor::cli {

std::string AbsolutePath(const std::string& path) {
    std::error_code failed;
    std::string absolute = std::filesystem::absolute(path, failed).string();
    if (path.empty() || failed) {
        throw Failure("cannot make the path '" + Visible(path) + "' absolute; give one that begins with /");
    }
    return absolute;
}

std::string RequireDatabase(const std::string& path, const std::string& advice) {
    std::string absolute = AbsolutePath(path);
    std::error_code failed;
    const auto status = std::filesystem::status(absolute, failed);
    if (!std::filesystem::exists(status)) {
        throw Failure("no database " + Visible(absolute) + "; " + advice);
    }
    if (!std::filesystem::is_regular_file(status)) {
        throw Failure(Visible(absolute) + " is not a file; give the path of a database");
    }
    if (access(absolute.c_str(), R_OK) != 0) {
        throw Failure("may not read " + Visible(absolute) + "; run as a user who may");
    }
    return absolute;
}

std::string RequireLogDatabase(const std::string& path) {
    return RequireDatabase(path, "start syslog-ng, give another --db, or run quorlog db create");
}

bool Confirm(const std::string& question) {
    std::cerr << question << " [y/N] " << std::flush;
    std::string answer;
    if (!std::getline(std::cin, answer)) {
        std::cerr << '\n';
        throw Failure("no answer on standard input; give --yes to do it without a question");
    }
    return answer == "y" || answer == "yes";
}

}  // namespace quor::cli
