#include "tools/quorlog/deeds.h"

#include <pwd.h>
#include <unistd.h>

#include <cstdlib>

#include "store/event.h"

namespace quor::cli {

std::string UserName() {
    const char* const behind = geteuid() == 0 ? getenv("SUDO_USER") : nullptr;
    const passwd* const user = getpwuid(geteuid());
    if (behind != nullptr && *behind != '\0') {
        return behind;
    }
    return user != nullptr ? user->pw_name : std::to_string(geteuid());
}

void RecordDeed(const std::string& deed) {
    store::RecordEvent(UserName(), deed);
}

}  // namespace quor::cli
