// Any text as one line that is safe to show.
#ifndef PLATFORM_NOTIFY_ONELINE_H
#define PLATFORM_NOTIFY_ONELINE_H

#include <cstddef>
#include <string>
#include <string_view>

namespace quor::notify {

// Control characters become blanks, bytes that are not UTF-8 U+FFFD; cut at a character's end to fit `size` bytes.
std::string OneLine(std::string_view text, size_t size);

}  // namespace quor::notify

#endif
