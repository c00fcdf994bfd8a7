// JSON commands: a success gives one value for each piece.
#include <json/json.h>

#include <algorithm>

#include "common.h"
#include "fuzz/fuzz.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::string input(reinterpret_cast<const char*>(data), size);
    const std::string given = input;
    const auto ends = static_cast<size_t>(std::count(input.begin(), input.end(), '}'));
    std::vector<Json::Value> values(1);
    CmdParser parser;
    const int result = parser.CmdParse(input, values);
    quor::fuzz::Require(result == 0 || result == 1, "the result is yes or no");
    quor::fuzz::Require(!values.empty() && values.size() <= ends + 2, "at most one value for each piece");
    quor::fuzz::Require(input == given, "the input stays");
    return 0;
}
