// zstd with its working memory kept from one use to the next.
#ifndef PLATFORM_ARCHIVE_COMPRESSION_H
#define PLATFORM_ARCHIVE_COMPRESSION_H

#include <zstd.h>

#include <string>
#include <string_view>

#include "base/guards.h"

namespace quor::archive {

class Compressor {
  public:
    Compressor();
    // Appends the compressed form; its size.
    size_t append(std::string& out, std::string_view bytes);

  private:
    Guard<ZSTD_CCtx, ZSTD_freeCCtx> context_;
};

class Decompressor {
  public:
    Decompressor();
    // Exactly `size` bytes; Damaged when there are more or fewer.
    std::string expand(std::string_view compressed, size_t size);

  private:
    Guard<ZSTD_DCtx, ZSTD_freeDCtx> context_;
};

}  // namespace quor::archive

#endif
