#include "platform/archive/compression.h"

#include <new>

#include "platform/archive/bytes.h"

namespace quor::archive {
namespace {

constexpr int kLevel = 3;

template <typename Context>
void require(const Context& context) {
    if (context == nullptr) {
        throw std::bad_alloc();
    }
}

}  // namespace

Compressor::Compressor() : context_(ZSTD_createCCtx()) {
    require(context_);
}

size_t Compressor::append(std::string& out, std::string_view bytes) {
    const size_t before = out.size();
    out.resize(before + ZSTD_compressBound(bytes.size()));
    const size_t size =
        ZSTD_compressCCtx(context_.get(), out.data() + before, out.size() - before, bytes.data(), bytes.size(), kLevel);
    if (ZSTD_isError(size) != 0) {
        throw std::bad_alloc();  // there is room and the level is right: nothing else can be missing
    }
    out.resize(before + size);
    return size;
}

Decompressor::Decompressor() : context_(ZSTD_createDCtx()) {
    require(context_);
}

std::string Decompressor::expand(std::string_view compressed, size_t size) {
    std::string bytes(size, '\0');
    const size_t expanded =
        ZSTD_decompressDCtx(context_.get(), bytes.data(), size, compressed.data(), compressed.size());
    Demand(expanded == size, "compressed bytes that make no sense");
    return bytes;
}

}  // namespace quor::archive
