#include <json/reader.h>
#include <json/value.h>
#include <syslog.h>

#include <string>

#include "common.h"

namespace {

// Cuts the text after every "}"; closing braces at the start of a piece are dropped.
std::list<std::string> splitObjects(const std::string& input) {
    std::list<std::string> pieces;
    size_t first = input.find_first_not_of('}');
    while (first != std::string::npos) {
        const size_t end = input.find('}', first);
        if (end == std::string::npos) {
            pieces.push_back(input.substr(first));
            break;
        }
        pieces.push_back(input.substr(first, end + 1 - first));
        first = input.find_first_not_of('}', end + 1);
    }
    return pieces;
}

// The caller of CmdParse is promised this reader's error texts.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wdeprecated-declarations"
bool parseObject(const std::string& piece, Json::Value& value) {
    Json::Reader reader;
    std::string reason;
    try {
        if (reader.parse(piece, value)) {
            return true;
        }
        reason = reader.getFormattedErrorMessages();
    } catch (const Json::Exception& refused) {
        reason = refused.what();  // a text that is nested too deeply is not reported but thrown
    }
    syslog(LOG_ERR, "Error: parsing error, reason = %s\n", reason.c_str());
    return false;
}
#pragma GCC diagnostic pop

}  // namespace

CmdParser::CmdParser() = default;

CmdParser::~CmdParser() = default;

int CmdParser::CmdParse(std::string& input, std::vector<Json::Value>& values) {
    for (const std::string& piece : splitObjects(input)) {
        Json::Value value;
        if (!parseObject(piece, value)) {
            return 0;
        }
        values.push_back(std::move(value));
    }
    return 1;
}
