// Cuts a stream into lines, however it is chunked, in bounded memory.
#ifndef QUORLOGD_LINESPLITTER_H
#define QUORLOGD_LINESPLITTER_H

#include <cstdint>
#include <string>
#include <string_view>

namespace quor {

class LineSplitter {
  public:
    // A longer line is handed out cut to `maxBytes`; the rest of it is dropped as it arrives.
    explicit LineSplitter(size_t maxBytes) : maxBytes_(maxBytes) {}

    // Hands each line that `chunk` completes to `handle(const std::string&)`, without its newline. Empty lines are
    // skipped.
    template <typename Handle>
    void feed(std::string_view chunk, Handle&& handle) {
        for (size_t end = chunk.find('\n'); end != std::string_view::npos; end = chunk.find('\n')) {
            append(chunk.substr(0, end));
            chunk.remove_prefix(end + 1);
            finish(handle);
        }
        append(chunk);
    }

    // Hands out what came after the last newline.
    template <typename Handle>
    void finish(Handle&& handle) {
        if (!line_.empty()) {
            handle(static_cast<const std::string&>(line_));
        }
        line_.clear();
        oversized_ += cut_ ? 1 : 0;
        cut_ = false;
    }

    // Lines that were cut.
    uint64_t oversized() const { return oversized_; }

  private:
    void append(std::string_view piece) {
        cut_ = cut_ || piece.size() > maxBytes_ - line_.size();
        line_.append(piece.substr(0, maxBytes_ - line_.size()));
    }

    size_t maxBytes_;
    std::string line_;
    bool cut_ = false;
    uint64_t oversized_ = 0;
};

}  // namespace quor

#endif
