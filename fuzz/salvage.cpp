// Any bytes as a damaged database, with and without a write-ahead log: whatever is saved is a sound database.
#include "quor/quorsalvage.h"

#include <sqlite3.h>
#include <unistd.h>

#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

int firstText(void* text, int /*count*/, char** values, char** /*names*/) {
    *static_cast<std::string*>(text) = values[0];
    return 0;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    const std::string damaged = quor::fuzz::ScratchPath("damaged.db");
    const std::string saved = quor::fuzz::ScratchPath("saved.db");
    static const std::string schema = [] {
        const std::string path = quor::fuzz::ScratchPath("schema.sql");
        quor::fuzz::WriteFile(path, "CREATE TABLE log (id INTEGER PRIMARY KEY, level INTEGER, event TEXT);");
        return path;
    }();
    const char* const schemas[] = {schema.c_str(), nullptr};
    const size_t logSize = size > 0 && bytes[0] % 4 == 1 ? size / 4 : 0;
    const std::string all(reinterpret_cast<const char*>(bytes), size);
    quor::fuzz::WriteFile(damaged, all.substr(0, size - logSize));
    quor::fuzz::WriteFile(damaged + "-wal", all.substr(size - logSize));

    QUORSALVAGE report;
    const int status = QUORDBSalvage(damaged.c_str(), saved.c_str(), schemas, nullptr, nullptr, &report);
    Require((status == 0) == (report.error[0] == '\0'), "a failure has its reason");
    Require((access(saved.c_str(), F_OK) == 0) == (status == 0), "a failure leaves no file");
    if (status == 0) {
        sqlite3* db = nullptr;
        std::string sound;
        sqlite3_open(saved.c_str(), &db);
        sqlite3_exec(db, "PRAGMA quick_check", firstText, &sound, nullptr);
        sqlite3_close(db);
        Require(sound == "ok", "what is saved is sound");
        unlink(saved.c_str());
    }
    return 0;
}
