#include "platform/salvage/rowsaver.h"

#include <algorithm>
#include <cstdio>
#include <iterator>
#include <string>
#include <utility>

#include "platform/salvage/cells.h"
#include "platform/salvage/sql.h"

namespace quor::salvage {
namespace {

constexpr uint64_t kPagesPerReport = 256;
constexpr uint32_t kSampledPages = 256;

// The order of columns that syslog-ng is set up with has changed; files of both are around.
constexpr char kFormerLogs[] =
    "CREATE TABLE logs (id INTEGER PRIMARY KEY AUTOINCREMENT, host TEXT, ip TEXT, fac TEXT, prio TEXT,"
    " llevel TEXT GENERATED ALWAYS AS (prio) VIRTUAL, tag TEXT, utcsec INTEGER, tzoffset TEXT, ldate TEXT, ltime TEXT,"
    " prog TEXT, msg TEXT)";

bool isOfSqlite(const Definition& definition) {
    return definition.name.rfind("sqlite_", 0) == 0;
}

}  // namespace

RowSaver::RowSaver(const PageFile& file, QUORSALVAGEPROGRESS progress, void* context, QUORSALVAGE& report)
    : file_(file), progress_(progress), context_(context), report_(report), used_(size_t{file.count()} + 1),
      reader_(file, used_) {
    report_.pages = file.count();
}

bool RowSaver::tick() {
    return ++done_ % kPagesPerReport != 0 || tell(std::min<uint64_t>(done_, report_.pages));
}

bool RowSaver::tell(uint64_t done) {
    gaveUp_ = progress_ != nullptr && progress_(done, report_.pages, context_) != 0;
    return !gaveUp_;
}

// Every page below a root, in the order of the rows.
bool RowSaver::walk(uint32_t root, const Taker& take) {
    std::vector<uint32_t> next = {root};
    while (!next.empty()) {
        const uint32_t number = next.back();
        next.pop_back();
        if (!visit(number, next, take)) {
            return false;
        }
    }
    return true;
}

bool RowSaver::readUnused(uint32_t number, Bytes& page) const {
    return number <= file_.count() && !used_[number] && file_.read(number, page);
}

bool RowSaver::visit(uint32_t number, std::vector<uint32_t>& next, const Taker& take) {
    Bytes page;
    if (!readUnused(number, page)) {
        ++report_.badPages;
        return true;
    }
    const TreePage tree(page, number, file_.usable());
    if (!tree.isLeaf() && !tree.isInterior()) {
        ++report_.badPages;
        return true;
    }
    used_[number] = true;
    if (tree.isLeaf()) {
        return tick() && readLeaf(page, tree, take);
    }
    const std::vector<uint32_t> children = tree.children();
    next.insert(next.end(), children.rbegin(), children.rend());
    return tick();
}

// Only leaf pages have rows.
bool RowSaver::readLeaf(const Bytes& page, const TreePage& leaf, const Taker& take) {
    Row row;
    for (uint32_t i = 0; leaf.isLeaf() && i < leaf.cells(); ++i) {
        if (!reader_.read(page, leaf.cell(i), row)) {
            ++report_.badRows;
        } else if (!take(row)) {
            return false;
        }
    }
    return true;
}

// The definitions in the file itself: type, name, table, root page, SQL. One that is damaged keeps its root.
bool RowSaver::readSchema() {
    if (file_.encoding() != 1) {
        return false;
    }
    walk(1, [this](const Row& row) {
        const auto text = [&row](size_t i) {
            return std::string(reinterpret_cast<const char*>(row.values[i].bytes), row.values[i].size);
        };
        if (row.values.size() == 5 && row.values[4].kind == Value::Kind::Text) {
            schema_.push_back({text(0), text(1), static_cast<uint32_t>(row.values[3].integer), text(4)});
        }
        return true;
    });
    return dropUnusable();
}

// False when no table is left.
bool RowSaver::dropUnusable() {
    bool usable = false;
    const Database scratch = OpenScratch();
    for (Definition& definition : schema_) {
        const bool table = definition.type == "table" && !isOfSqlite(definition);
        if (table && CanUse(scratch.get(), definition)) {
            usable = true;
        } else if (table) {
            definition.sql.clear();
        }
    }
    return usable;
}

// How many rows of some pages fit a table of the schema.
size_t RowSaver::sample(const Schema& schema) {
    const Database db = OpenScratch();
    std::vector<Table> tables;
    (void)CreateTables(db.get(), schema, tables);  // a table that cannot be created fits nothing
    size_t fitting = 0;
    const Taker count = [&tables, &fitting](const Row& row) {
        const auto fits = [&row](const Table& table) { return table.fits(row); };
        fitting += std::any_of(tables.begin(), tables.end(), fits) ? 1 : 0;
        return true;
    };
    Bytes page;
    for (uint32_t number = 2; number <= file_.count(); number += 1 + file_.count() / kSampledPages) {
        if (file_.read(number, page)) {
            readLeaf(page, TreePage(page, number, file_.usable()), count);
        }
    }
    used_.assign(used_.size(), false);
    report_.badRows = 0;
    return fitting;
}

bool RowSaver::findSchema(const char* const* schemas) {
    report_.schemaRead = readSchema() ? 1 : 0;
    if (report_.schemaRead != 0) {
        return true;
    }
    schema_.clear();
    size_t best = 0;
    const auto consider = [this, &best](Schema schema) {
        const size_t fitting = sample(schema);
        if (fitting > best) {
            best = fitting;
            schema_ = std::move(schema);
        }
    };
    for (; schemas != nullptr && *schemas != nullptr; ++schemas) {
        consider(SchemaOfFile(*schemas));
    }
    consider(SchemaOfText(kFormerLogs));
    report_.badPages = 1;  // the first page
    return best > 0;
}

bool RowSaver::save(Table& table, const Row& row, bool& added) {
    if (row.values.size() > table.columns()) {
        ++report_.badRows;
        return true;
    }
    const bool written = table.insert(row, file_.encoding(), added) == SQLITE_DONE;
    report_.duplicates += written && !added ? 1 : 0;
    return written;
}

// SQLite's own tables are walked too, so that their pages are accounted for. The rows of one that could not be created
// may fit another.
bool RowSaver::saveTree(const Definition& definition) {
    if (definition.type != "table" || definition.root == 0) {
        return true;
    }
    const auto table = std::find_if(tables_.begin(), tables_.end(),
                                    [&definition](const Table& each) { return each.name() == definition.name; });
    return walk(definition.root, [&](const Row& row) {
        bool added = false;
        return table != tables_.end() ? save(*table, row, added) : isOfSqlite(definition) || saveStray(row);
    });
}

// Pages on the free list hold deleted rows. A trunk page that makes no sense ends the list.
void RowSaver::markFree() {
    Bytes trunk;
    for (uint32_t number = file_.firstFree(); number != 0 && number <= file_.count() && !used_[number];) {
        const uint32_t leaves = file_.read(number, trunk) ? Big32(trunk.data() + 4) : UINT32_MAX;
        if (leaves > file_.usable() / 4 - 2) {
            return;
        }
        used_[number] = true;
        for (uint32_t i = 0; i < leaves; ++i) {
            const uint32_t leaf = Big32(trunk.data() + 8 + size_t{4} * i);
            if (leaf <= file_.count()) {
                used_[leaf] = true;
            }
        }
        number = Big32(trunk.data());
    }
}

bool RowSaver::saveStray(const Row& row) {
    const auto table =
        std::find_if(tables_.begin(), tables_.end(), [&row](const Table& each) { return each.fits(row); });
    if (table == tables_.end()) {
        ++report_.unknownRows;
        return true;
    }
    bool added = false;
    const bool written = save(*table, row, added);
    report_.strayRows += added ? 1 : 0;
    return written;
}

// Whole trees hold every row there is, so strays matter only where one is broken.
bool RowSaver::saveStrays() {
    if (report_.badPages == 0) {
        return true;
    }
    markFree();
    Bytes page;
    const Taker save = [this](const Row& row) { return saveStray(row); };
    for (uint32_t number = 2; number <= file_.count(); ++number) {
        if (!tick()) {
            return false;
        }
        if (readUnused(number, page) && !readLeaf(page, TreePage(page, number, file_.usable()), save)) {
            return false;
        }
    }
    return true;
}

bool RowSaver::fill(sqlite3* db) {
    if (!CreateTables(db, schema_, tables_)) {
        return false;
    }
    const auto saved = [this](const Definition& definition) { return saveTree(definition); };
    if (!std::all_of(schema_.begin(), schema_.end(), saved) || !saveStrays()) {
        return false;
    }
    for (const Table& table : tables_) {
        if (report_.tableCount < static_cast<int>(std::size(report_.tables))) {
            QUORSALVAGETABLE& entry = report_.tables[report_.tableCount++];
            (void)snprintf(entry.name, sizeof entry.name, "%s", table.name().c_str());
            entry.rows = table.rows();
        }
    }
    tables_.clear();  // their statements are open on the database
    return CreateIndexes(db, schema_) && tell(report_.pages);
}

}  // namespace quor::salvage
