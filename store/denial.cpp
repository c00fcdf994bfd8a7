#include "store/denial.h"

#include <grp.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <vector>

namespace quor::store {
namespace {

// The first of the folders that lead to a file which lets nobody like us through, or else the file.
std::string refusing(const std::string& path) {
    for (size_t slash = path.find('/', 1); slash != std::string::npos; slash = path.find('/', slash + 1)) {
        std::string folder = path.substr(0, slash);
        if (access(folder.c_str(), X_OK) != 0) {
            return folder;
        }
    }
    return path;
}

bool isOurGroup(gid_t group) {
    std::vector<gid_t> groups(static_cast<size_t>(std::max(getgroups(0, nullptr), 0)));
    groups.resize(static_cast<size_t>(std::max(getgroups(static_cast<int>(groups.size()), groups.data()), 0)));
    return group == getegid() || std::find(groups.begin(), groups.end(), group) != groups.end();
}

std::string ownName() {
    const passwd* const user = getpwuid(geteuid());
    return user != nullptr ? user->pw_name : std::to_string(geteuid());
}

bool isListed(const group& group, const std::string& name) {
    for (char** member = group.gr_mem; *member != nullptr; ++member) {
        if (name == *member) {
            return true;
        }
    }
    return false;
}

// What would let us in, by the permissions of what refuses.
std::string remedy(const struct stat& status) {
    const mode_t needed = S_ISDIR(status.st_mode) ? S_IXGRP : S_IRGRP;
    const bool forGroup = (status.st_mode & needed) != 0;
    const bool forOthers = (status.st_mode & (needed >> 3U)) != 0;
    const bool mine = status.st_uid == geteuid();
    if (geteuid() == 0 || forOthers || (forGroup && isOurGroup(status.st_gid) && !mine)) {
        return "its permissions let you, so an access control list or a security module does not; see the system log";
    }
    const group* const group = getgrgid(status.st_gid);
    if (!forGroup || status.st_gid == 0 || group == nullptr) {
        return "run as root";
    }
    const std::string name = ownName();
    if (isListed(*group, name)) {
        return std::string("you joined group ") + group->gr_name + " after you logged in; log in again";
    }
    return std::string("it is for group ") + group->gr_name + ": sudo adduser " + name + " " + group->gr_name +
           ", and log in again";
}

}  // namespace

std::string WhyDenied(const std::string& path) {
    const std::string what = refusing(path);
    struct stat status {};
    if (stat(what.c_str(), &status) != 0) {
        return "may not read " + path + "; run as root";
    }
    return "may not read " + path + (what == path ? "" : ", since " + what + " refuses") + "; " + remedy(status);
}

}  // namespace quor::store
