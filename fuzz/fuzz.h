// What the fuzz targets share.
#ifndef FUZZ_FUZZ_H
#define FUZZ_FUZZ_H

#include <fuzzer/FuzzedDataProvider.h>

#include <string>

namespace quor::fuzz {

// Ends the program, so that the fuzzer keeps the input.
void Require(bool holds, const char* what);

// A file of this process that is gone when it ends.
std::string ScratchPath(const std::string& name);
void WriteFile(const std::string& path, const std::string& bytes);
std::string ReadFile(const std::string& path);

// A text of any bytes, zero bytes included.
std::string AnyText(FuzzedDataProvider& data, size_t longest);

}  // namespace quor::fuzz

#endif
