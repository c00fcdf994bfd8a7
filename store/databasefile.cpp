#include "store/databasefile.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>

#include "store/ask.h"
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

std::string RequireReplaceable(const std::string& path) {
    std::string absolute = AbsolutePath(path);
    std::error_code failed;
    const auto status = std::filesystem::symlink_status(absolute, failed);
    if (std::filesystem::is_symlink(status)) {
        throw Failure(absolute + " is a symbolic link; give the file that it leads to");
    }
    if (std::filesystem::exists(status) && !std::filesystem::is_regular_file(status)) {
        throw Failure(absolute + " is not a file; give the path of a database", Cause::Missing);
    }
    return absolute;
}

uint64_t FreeBytes(const std::string& db) {
    const std::vector<std::string> bytes =
        Ask(db, "SELECT freelist_count * page_size AS bytes FROM pragma_freelist_count, pragma_page_size", "bytes");
    return bytes.empty() ? 0 : ToUint64(bytes.front().c_str());
}

void RequireRoom(const std::string& folder, uint64_t bytes, const std::string& what, const std::string& advice) {
    constexpr uint64_t kMega = uint64_t{1} << 20U;
    struct statvfs volume {};
    if (statvfs(folder.c_str(), &volume) != 0) {
        throw Failure("cannot write to " + folder + ": " + strerror(errno) + "; " + advice);
    }
    const uint64_t left = static_cast<uint64_t>(volume.f_bavail) * volume.f_frsize;
    if (left < bytes) {
        throw Failure(what + " may take " + std::to_string(bytes / kMega + 1) + " MiB, and " + folder + " has only " +
                          std::to_string(left / kMega) + " MiB left; " + advice,
                      Cause::Other);
    }
}

uint64_t WholeSizeOf(const std::string& path) {
    return SizeOf(path) + SizeOf(path + "-wal");
}

FolderLock::FolderLock(const std::string& file) {
    const std::string folder = std::filesystem::path(file).parent_path();
    folder_ = Descriptor(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder_) {
        throw Failure("cannot read " + folder + ": " + strerror(errno) + "; run as a user who may", Cause::Denied);
    }
    if (flock(folder_.get(), LOCK_EX | LOCK_NB) != 0) {
        throw Failure("another quorlog restores, merges or compacts in " + folder + "; try again when it has ended",
                      Cause::Busy);
    }
}

uint64_t SizeOf(const std::string& path) {
    std::error_code missing;
    const uintmax_t size = std::filesystem::file_size(path, missing);
    return missing ? 0 : size;
}

}  // namespace quor::store
