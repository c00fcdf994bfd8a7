#include "tools/quorlog/shellpath.h"

#include "store/failure.h"

namespace quor::cli {

void RequirePlainPath(const std::string& path, Quoting quoting) {
    constexpr const char kPlain[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789/._+-";
    if (quoting == Quoting::None && path.find_first_not_of(kPlain) != std::string::npos) {
        throw store::Failure("the path " + path + " cannot be used; give one of letters, digits and /._+- only");
    }
    if (path.find_first_of("\"$`\\!\n") != std::string::npos) {
        throw store::Failure("the path " + path + " cannot be used; give one without quotes, $, `, \\, ! and newlines");
    }
}

}  // namespace quor::cli
