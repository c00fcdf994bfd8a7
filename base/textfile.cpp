#include "base/textfile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <filesystem>

#include "base/files.h"
#include "base/guards.h"

namespace quor {
namespace {

namespace fs = std::filesystem;

// A file beside the one it is to replace; gone again unless it replaced it.
class Draft {
  public:
    explicit Draft(const std::string& target) : path_(target + ".XXXXXX"), file_(mkostemp(path_.data(), O_CLOEXEC)) {}
    Draft(const Draft&) = delete;
    Draft& operator=(const Draft&) = delete;
    ~Draft() {
        if (file_ && !moved_) {
            unlink(path_.c_str());
        }
    }

    bool write(const std::string& text) const { return file_ && WriteAll(file_.get(), text); }

    bool takeOwnerAndMode(const std::string& original) const {
        struct stat old {};
        if (stat(original.c_str(), &old) != 0) {
            return errno == ENOENT && fchmod(file_.get(), 0644) == 0;
        }
        return fchown(file_.get(), old.st_uid, old.st_gid) == 0 && fchmod(file_.get(), old.st_mode & 07777) == 0;
    }

    bool replace(const std::string& target) {
        moved_ = fsync(file_.get()) == 0 && rename(path_.c_str(), target.c_str()) == 0;
        return moved_;
    }

  private:
    std::string path_;
    Descriptor file_;
    bool moved_ = false;
};

// The file that a chain of symbolic links leads to, existing or not.
fs::path followLinks(fs::path path) {
    constexpr int kMaxLinks = 40;
    for (int links = 0; links < kMaxLinks; ++links) {
        std::error_code notLink;
        const fs::path target = fs::read_symlink(path, notLink);
        if (notLink) {
            break;
        }
        path = path.parent_path() / target;
    }
    return path;
}

void syncFolder(const fs::path& folder) {
    const Descriptor opened(open(folder.empty() ? "." : folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    (void)fsync(opened.get());  // some file systems cannot; the file itself is on the disk
}

}  // namespace

ReadOutcome ReadTextFile(const std::string& path, size_t limit, std::string& text) {
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    if (!file) {
        return errno == ENOENT ? ReadOutcome::Missing : ReadOutcome::Failed;
    }
    struct stat found {};
    if (fstat(file.get(), &found) != 0 || !S_ISREG(found.st_mode) || found.st_size > static_cast<off_t>(limit)) {
        return ReadOutcome::Failed;
    }
    std::string content(static_cast<size_t>(found.st_size), '\0');
    const bool whole = ReadAt(file, 0, content.data(), content.size()) == content.size();
    if (!whole || content.find('\0') != std::string::npos) {
        return ReadOutcome::Failed;
    }
    text.swap(content);
    return ReadOutcome::Done;
}

bool ReplaceTextFile(const std::string& path, const std::string& text) {
    const fs::path target = followLinks(path);
    Draft draft(target.string());
    if (!draft.write(text) || !draft.takeOwnerAndMode(target.string()) || !draft.replace(target.string())) {
        return false;
    }
    syncFolder(target.parent_path());
    return true;
}

}  // namespace quor
