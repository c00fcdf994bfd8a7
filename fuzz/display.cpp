// Log text as quorlog prints it: nothing raw for a terminal, and JSON and CSV that read back.
#include "tools/quorlog/display.h"

#include <json/json.h>

#include <memory>

#include "base/utf8.h"
#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

std::string parsedJson(const std::string& json) {
    Json::CharReaderBuilder builder;
    Json::CharReaderBuilder::strictMode(&builder.settings_);
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    Json::Value value;
    std::string errors;
    const std::string document = "[" + json + "]";
    Require(reader->parse(document.data(), document.data() + document.size(), &value, &errors), "the JSON is valid");
    return value[0].asString();
}

std::string parsedCsv(std::string cell) {
    if (cell.size() < 2 || cell.front() != '"') {
        Require(cell.find_first_of(",\"\r\n") == std::string::npos, "such a cell is quoted");
        return cell;
    }
    Require(cell.back() == '"', "the quotes are closed");
    std::string text;
    for (size_t i = 1; i + 1 < cell.size(); ++i) {
        text += cell[i];
        if (cell[i] == '"') {
            Require(i + 2 < cell.size() && cell[++i] == '"', "quotes inside are doubled");
        }
    }
    return text;
}

// The text with each invalid byte as \xNN: what the valid forms carry.
std::string validated(const std::string& text) {
    std::string valid;
    for (size_t at = 0; at < text.size();) {
        const quor::Symbol symbol = quor::NextSymbol(text, at);
        Require(symbol.length > 0 && symbol.length <= text.size() - at, "a symbol is inside the text");
        char escaped[5];
        (void)snprintf(escaped, sizeof escaped, "\\x%02x", static_cast<unsigned>(symbol.code) & 0xffU);
        valid += symbol.valid ? text.substr(at, symbol.length) : escaped;
        at += symbol.length;
    }
    return valid;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    const std::string visible = quor::cli::Visible(text);
    for (size_t at = 0; at < visible.size();) {
        const quor::Symbol symbol = quor::NextSymbol(visible, at);
        Require(symbol.valid && !quor::cli::IsHidden(symbol.code), "a terminal gets only what shows");
        at += symbol.length;
    }
    std::string json;
    quor::cli::AppendVisibleJson(json, text);
    Require(parsedJson(json) == validated(text), "JSON reads back");
    std::string cell;
    quor::cli::AppendCsvCell(cell, text, false);
    const std::string plain = parsedCsv(cell);
    Require(plain == text || plain == validated(text), "CSV reads back");
    cell.clear();
    quor::cli::AppendCsvCell(cell, text, true);
    const std::string defused = parsedCsv(cell);
    Require(defused.empty() || std::string("=+-@\t\r\n").find(defused.front()) == std::string::npos,
            "no formula for a spreadsheet");
    Require((defused.front() == '\'' ? defused.substr(1) : defused) == plain, "without the apostrophe it reads back");
    return 0;
}
