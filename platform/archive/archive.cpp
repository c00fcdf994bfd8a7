// Making, unmaking and checking archives.
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <new>

#include "base/guarded.h"
#include "platform/archive/archivewriter.h"
#include "platform/archive/audit.h"
#include "platform/archive/copying.h"
#include "platform/archive/draft.h"
#include "platform/archive/table.h"
#include "platform/db/connection.h"
#include "quor/quorarchive.h"

namespace quor::archive {
namespace {

using Handle = Guard<DBConnect_tag, QUORDBClose>;

// A file that the wrapper opens, archive or not.
class File {
  public:
    explicit File(const std::string& path) : handle_(QUORDBConnect(nullptr, nullptr, nullptr, path.c_str())) {
        if (handle_ == nullptr) {
            throw Problem("cannot open " + path + "; make sure that it is there and that you may read it");
        }
        Require(db(), Register(db(), Damage::IsLeftOut));
    }
    sqlite3* db() const { return handle_->db.get(); }

    void attach(const std::string& path, const char* schema) const {
        const Statement statement = Prepared(db(), std::string("ATTACH ?1 AS ") + schema);
        const std::string name = PlainName(path.c_str());
        sqlite3_bind_text64(statement.get(), 1, name.data(), name.size(), SQLITE_STATIC, SQLITE_UTF8);
        (void)NextRow(db(), statement);
    }

  private:
    Handle handle_;
};

// Tells the caller what is done, who may give up.
class Teller {
  public:
    Teller(QUORARCHIVEPROGRESS progress, void* context) : progress_(progress), context_(context) {}
    void expect(uint64_t rows) { rows_ = rows; }
    void operator()(uint64_t done) const {
        if (progress_ != nullptr && progress_(std::min(done, rows_), rows_, context_) != 0) {
            throw Problem("given up; nothing was kept");
        }
    }

  private:
    QUORARCHIVEPROGRESS progress_;
    void* context_;
    uint64_t rows_ = 0;
};

uint64_t sizeOf(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) == 0 ? static_cast<uint64_t>(status.st_size) : 0;
}

bool isArchive(const std::string& path) {
    const Handle handle(QUORDBConnect(nullptr, nullptr, nullptr, path.c_str()));
    return handle != nullptr && IsArchive(handle->db.get());
}

void requireArchive(const std::string& path) {
    if (!isArchive(path)) {
        throw Problem(path + " is not an archive, or cannot be read; name a file that quorlog archive has written");
    }
}

void requirePlain(sqlite3* db, const std::string& path, const char* schema) {
    if (ReadDefinition(db, schema).empty()) {
        throw Problem(path + " has no table logs; name a log database");
    }
    if (isArchive(path)) {
        throw Problem(path + " is an archive already; name a plain log database");
    }
}

// How many rows there may be, without counting them.
uint64_t roughRows(sqlite3* db, const std::string& schema) {
    const Statement query = Prepared(db, "SELECT max(rowid) - min(rowid) + 1 FROM " + schema + ".logs");
    return NextRow(db, query) ? static_cast<uint64_t>(sqlite3_column_int64(query.get(), 0)) : 0;
}

// Nothing reads the file before it is whole, so it needs no journal.
void prepareFile(sqlite3* db) {
    Run(db, "PRAGMA journal_mode = OFF; PRAGMA synchronous = OFF; PRAGMA encoding = 'UTF-8'");
}

void fillDates(const Storage& storage, QUORARCHIVE& report) {
    const Statement query =
        Prepared(storage.db(), "SELECT min(value), max(value) FROM " + storage.table("logs_values") +
                                   " WHERE name = 'ldate' AND typeof(value) = 'text'");
    if (NextRow(storage.db(), query)) {
        (void)snprintf(report.firstDate, sizeof report.firstDate, "%s", TextOf(query, 0).c_str());
        (void)snprintf(report.lastDate, sizeof report.lastDate, "%s", TextOf(query, 1).c_str());
    }
}

void audit(const File& file, const Teller& tell, QUORARCHIVE& report) {
    const Storage storage(file.db(), "main");
    const Statement pages = Prepared(file.db(), "PRAGMA quick_check(1)");
    if (!NextRow(file.db(), pages) || TextOf(pages, 0) != "ok") {
        throw Problem("its pages are damaged (" + TextOf(pages, 0) + "); restore the archive from a copy");
    }
    AuditArchive(storage, ReadDefinition(file.db(), "main"), tell, report);
    fillDates(storage, report);
    if (report.damagedBlocks != 0) {
        throw Problem(std::to_string(report.damagedBlocks) + " of " + std::to_string(report.blocks) +
                      " blocks are damaged; restore the archive from a copy, or save the other rows with quorlog "
                      "archive extract");
    }
    if (report.rows != Remembered(storage, "rows") || report.checksum != Remembered(storage, "checksum")) {
        throw Problem("the rows are not those that were written; restore the archive from a copy");
    }
}

Tally fill(const std::string& source, const std::string& draft, Teller& tell) {
    const File file(draft);
    prepareFile(file.db());
    Run(file.db(), "PRAGMA page_size = 4096; PRAGMA application_id = " + std::to_string(kApplicationId) +
                       "; PRAGMA user_version = " + std::to_string(kVersion));
    file.attach(source, "source");
    Run(file.db(), "BEGIN");
    requirePlain(file.db(), source, "source");
    tell.expect(roughRows(file.db(), "source"));
    ArchiveWriter writer(file.db(), ReadDefinition(file.db(), "source"));
    const Tally tally = writer.write(tell);
    Run(file.db(), "COMMIT");
    return tally;
}

void write(const std::string& source, const std::string& archive, Teller tell, QUORARCHIVE& report) {
    Draft draft(archive, source);
    const Tally written = fill(source, draft.path(), tell);
    {
        const File file(draft.path());
        audit(file, Teller(nullptr, nullptr), report);
    }
    if (report.rows != written.rows || report.checksum != written.sum) {
        throw Problem("what was written to " + archive + " is not what was read; check the disk and the memory");
    }
    draft.finish();
    report.bytes = sizeOf(archive);
}

void extract(const std::string& archive, const std::string& fresh, QUORARCHIVE& report) {
    requireArchive(archive);
    Draft draft(fresh, archive);
    {
        const File file(draft.path());
        sqlite3* const db = file.db();
        file.attach(archive, "source");
        const Storage source(db, "source");
        const Definition columns = ReadDefinition(db, "source");
        prepareFile(db);
        Run(db, "PRAGMA page_size = " + std::to_string(Remembered(source, "page_size")) + "; BEGIN");
        AuditArchive(
            source, columns, [](uint64_t) {}, report);
        report.damagedRows = std::max<uint64_t>(Remembered(source, "rows"), report.rows) - report.rows;
        CopyTables(db);
        CreateTable(db);
        const std::string names = WrittenNames(ReadDefinition(db, "main"));
        Run(db, "INSERT INTO main.logs (rowid" + names + ") SELECT rowid" + names + " FROM source.logs ORDER BY rowid");
        FinishTable(db);
        Run(db, "COMMIT; DETACH source; PRAGMA journal_mode = WAL");
    }
    draft.finish();
    report.bytes = sizeOf(fresh);
}

void info(const std::string& archive, QUORARCHIVE& report) {
    requireArchive(archive);
    const File file(archive);
    const Storage storage(file.db(), "main");
    const Statement query =
        Prepared(file.db(), "SELECT count(*), (SELECT min(id) FROM logs), (SELECT max(id) FROM logs)"
                            " FROM logs_blocks");
    (void)NextRow(file.db(), query);
    report.rows = Remembered(storage, "rows");
    report.checksum = Remembered(storage, "checksum");
    report.blocks = static_cast<unsigned long long>(sqlite3_column_int64(query.get(), 0));
    report.firstId = sqlite3_column_int64(query.get(), 1);
    report.lastId = sqlite3_column_int64(query.get(), 2);
    report.bytes = sizeOf(archive);
    fillDates(storage, report);
}

void check(const std::string& archive, const char* source, Teller tell, QUORARCHIVE& report) {
    requireArchive(archive);
    const File file(archive);
    const Storage storage(file.db(), "main");
    tell.expect(Remembered(storage, "rows"));
    report.bytes = sizeOf(archive);
    audit(file, tell, report);
    if (source == nullptr) {
        return;
    }
    file.attach(source, "source");
    requirePlain(file.db(), source, "source");
    const Tally tally = TallyTable(file.db(), "source", ReadDefinition(file.db(), "source"), tell);
    if (tally.rows != report.rows || tally.sum != report.checksum) {
        throw Problem("the " + std::to_string(report.rows) + " rows of the archive are not the " +
                      std::to_string(tally.rows) + " of " + source);
    }
}

// Turns whatever goes wrong into the report's text.
template <typename Body>
int reported(QUORARCHIVE* report, const Body& body) {
    QUORARCHIVE local = {};
    QUORARCHIVE& out = report != nullptr ? *report : local;
    out = {};
    try {
        body(out);
        return 0;
    } catch (const Refused& refusal) {
        const bool damaged = refusal.status() == SQLITE_CORRUPT || refusal.status() == SQLITE_NOTADB;
        (void)snprintf(out.error, sizeof out.error, "%s; %s", refusal.what(),
                       damaged ? "restore the archive from a copy"
                               : "look at the space left and the rights of both files");
    } catch (const std::bad_alloc&) {
        (void)snprintf(out.error, sizeof out.error, "out of memory");
    } catch (const std::exception& problem) {
        (void)snprintf(out.error, sizeof out.error, "%s", problem.what());
    }
    return -1;
}

void requireNames(bool given) {
    if (!given) {
        throw Problem("a file is missing");
    }
}

}  // namespace
}  // namespace quor::archive

using quor::archive::Teller;

int QUORArchiveWrite(const char* source, const char* archive, QUORARCHIVEPROGRESS progress, void* context,
                     QUORARCHIVE* report) {
    return quor::archive::reported(report, [&](QUORARCHIVE& out) {
        quor::archive::requireNames(!quor::AnyNull(source, archive));
        quor::archive::write(source, archive, Teller(progress, context), out);
    });
}

int QUORArchiveExtract(const char* archive, const char* fresh, QUORARCHIVE* report) {
    return quor::archive::reported(report, [&](QUORARCHIVE& out) {
        quor::archive::requireNames(!quor::AnyNull(archive, fresh));
        quor::archive::extract(archive, fresh, out);
    });
}

int QUORArchiveInfo(const char* archive, QUORARCHIVE* report) {
    return quor::archive::reported(report, [&](QUORARCHIVE& out) {
        quor::archive::requireNames(!quor::AnyNull(archive));
        quor::archive::info(archive, out);
    });
}

int QUORArchiveCheck(const char* archive, const char* source, QUORARCHIVEPROGRESS progress, void* context,
                     QUORARCHIVE* report) {
    return quor::archive::reported(report, [&](QUORARCHIVE& out) {
        quor::archive::requireNames(!quor::AnyNull(archive));
        quor::archive::check(archive, source, Teller(progress, context), out);
    });
}

int QUORArchiveIs(const char* path) {
    return quor::Guarded(0, [path] { return path != nullptr && quor::archive::isArchive(path) ? 1 : 0; });
}
