// Salvaging a file: the new database is written beside its place and put there when it is whole.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <string>
#include <utility>

#include "base/guarded.h"
#include "platform/salvage/pages.h"
#include "platform/salvage/rowsaver.h"
#include "platform/salvage/sql.h"
#include "quor/quorsalvage.h"

namespace quor::salvage {
namespace {

__attribute__((format(printf, 2, 3))) int fail(QUORSALVAGE& report, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    // NOLINTNEXTLINE(clang-analyzer-valist.Uninitialized): va_start() is above
    (void)vsnprintf(report.error, sizeof report.error, format, arguments);
    va_end(arguments);
    return -1;
}

Database openDatabase(const std::string& path) {
    Database db;
    const int status = sqlite3_open_v2(path.c_str(), Adopt(db), SQLITE_OPEN_READWRITE, nullptr);
    if (status != SQLITE_OK) {
        db.reset();
    }
    return db;
}

// A file that is removed unless it is kept.
class NewFile {
  public:
    NewFile(std::string path, mode_t mode)
        : path_(std::move(path)),
          created_(Descriptor(open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode))) {}
    NewFile(const NewFile&) = delete;
    NewFile& operator=(const NewFile&) = delete;
    ~NewFile() {
        if (created_ && !kept_) {
            unlink(path_.c_str());
        }
    }

    const std::string& path() const { return path_; }
    bool created() const { return created_; }
    void keep() { kept_ = true; }

  private:
    std::string path_;
    bool created_;
    bool kept_ = false;
};

bool run(sqlite3* db, const std::string& sql) {
    return sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr) == SQLITE_OK;
}

// Nothing reads the file before it is whole, so it needs no journal of its own.
bool begin(sqlite3* db, const PageFile& file) {
    constexpr const char* kEncodings[] = {"UTF-8", "UTF-8", "UTF-16le", "UTF-16be"};
    return run(db, "PRAGMA page_size=" + std::to_string(file.pageSize())) &&
           run(db, std::string("PRAGMA encoding='") + kEncodings[file.encoding()] + "'") &&
           run(db, "PRAGMA journal_mode=OFF; PRAGMA synchronous=OFF; BEGIN");
}

bool syncFile(const std::string& path) {
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    return file && fsync(file.get()) == 0;
}

int write(const PageFile& file, RowSaver& rows, const std::string& path, QUORSALVAGE& report) {
    const Database db = openDatabase(path);
    if (db == nullptr) {
        return fail(report, "cannot open %s; look at the rights of its folder", path.c_str());
    }
    if (begin(db.get(), file) && rows.fill(db.get()) && run(db.get(), "COMMIT; PRAGMA journal_mode=WAL")) {
        return 0;
    }
    return rows.gaveUp()
               ? fail(report, "given up; nothing was kept")
               : fail(report, "cannot write %s: %s; look at the space left", path.c_str(), sqlite3_errmsg(db.get()));
}

int salvageFile(const char* damaged, const char* fresh, const char* const* schemas, QUORSALVAGEPROGRESS progress,
                void* context, QUORSALVAGE& report) {
    struct stat status {};
    PageFile file;
    if (stat(damaged, &status) != 0 || !file.open(damaged)) {
        return fail(report, "%s cannot be read, or holds no page of a table; name the damaged database file", damaged);
    }
    const mode_t mode = status.st_mode & 0666U;
    NewFile place(fresh, mode);
    if (!place.created()) {
        return fail(report, "cannot create %s (%s); name a new file in a folder that can be written", fresh,
                    strerror(errno));
    }
    NewFile partial(std::string(fresh) + ".partial", mode | 0600U);
    RowSaver rows(file, progress, context, report);
    if (!partial.created()) {
        return fail(report, "cannot create %s; remove what is left of an earlier try", partial.path().c_str());
    }
    if (!rows.findSchema(schemas)) {
        return fail(report, "no rows of a known table are left in %s; restore it from a backup", damaged);
    }
    if (write(file, rows, partial.path(), report) != 0) {
        return -1;
    }
    if (!syncFile(partial.path()) || rename(partial.path().c_str(), fresh) != 0) {
        return fail(report, "cannot write %s (%s); look at the space left", fresh, strerror(errno));
    }
    partial.keep();
    place.keep();
    return 0;
}

}  // namespace
}  // namespace quor::salvage

int QUORDBSalvage(const char* damaged, const char* fresh, const char* const* schemas, QUORSALVAGEPROGRESS progress,
                  void* context, QUORSALVAGE* report) {
    QUORSALVAGE local = {};
    QUORSALVAGE& out = report != nullptr ? *report : local;
    out = {};
    if (quor::AnyNull(damaged, fresh)) {
        return quor::salvage::fail(out, "two files are needed");
    }
    (void)snprintf(out.error, sizeof out.error, "out of memory");
    const int result =
        quor::Guarded([&] { return quor::salvage::salvageFile(damaged, fresh, schemas, progress, context, out); });
    if (result == 0) {
        out.error[0] = '\0';
    }
    return result;
}
