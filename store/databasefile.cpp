#include "store/databasefile.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>

#include "store/denial.h"
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
    struct stat status {};
    const bool readable = stat(absolute.c_str(), &status) == 0 && access(absolute.c_str(), R_OK) == 0;
    if (!readable && errno == EACCES) {
        throw Failure(WhyDenied(absolute), Cause::Denied);
    }
    if (!readable && errno != ENOENT && errno != ENOTDIR) {
        throw Failure(absolute + ": " + strerror(errno), Cause::Other);
    }
    if (!readable) {
        throw Failure("no database " + absolute + "; " + advice, Cause::Missing);
    }
    if (!S_ISREG(status.st_mode)) {
        throw Failure(absolute + " is not a file; give the path of a database", Cause::Missing);
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
