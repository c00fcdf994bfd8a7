#include "store/databasefile.h"

#include <unistd.h>

#include <filesystem>

#include "store/failure.h"

namespace quor::store {

std::string AbsolutePath(const std::string& path) {
    std::error_code failed;
    std::string absolute = std::filesystem::absolute(path, failed).string();
    if (path.empty() || failed) {
        throw Failure("cannot make the path '" + path + "' absolute; give one that begins with /");
    }
    return absolute;
}

std::string RequireDatabase(const std::string& path, const std::string& advice) {
    std::string absolute = AbsolutePath(path);
    std::error_code failed;
    const auto status = std::filesystem::status(absolute, failed);
    if (!std::filesystem::exists(status)) {
        throw Failure("no database " + absolute + "; " + advice, Cause::Missing);
    }
    if (!std::filesystem::is_regular_file(status)) {
        throw Failure(absolute + " is not a file; give the path of a database", Cause::Missing);
    }
    if (access(absolute.c_str(), R_OK) != 0) {
        throw Failure("may not read " + absolute + "; run as a user who may", Cause::Denied);
    }
    return absolute;
}

std::string RequireLogDatabase(const std::string& path) {
    return RequireDatabase(path, "start syslog-ng, give another --db, or run quorlog db create");
}

void RemoveCompanions(const std::string& path) {
    for (const char* companion : {"-wal", "-shm"}) {
        (void)unlink((path + companion).c_str());
    }
}

uint64_t SizeOf(const std::string& path) {
    std::error_code missing;
    const uintmax_t size = std::filesystem::file_size(path, missing);
    return missing ? 0 : size;
}

}  // namespace quor::store
