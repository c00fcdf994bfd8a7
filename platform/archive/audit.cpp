#include "platform/archive/audit.h"

#include "platform/archive/block.h"
#include "platform/archive/rowsum.h"

namespace quor::archive {
namespace {

constexpr uint64_t kRowsPerReport = 65536;

void auditBlock(Block& block, size_t columns, RowSum& sum) {
    std::vector<const Column*> all;
    for (size_t i = 0; i < columns; ++i) {
        all.push_back(&block.column(i));
    }
    if (block.head().hasBloom()) {
        (void)block.bloom();
    }
    for (size_t row = 0; row < block.rows(); ++row) {
        sum.begin(block.id(row));
        for (const Column* column : all) {
            sum.add(column->at(row));
        }
        sum.end();
    }
}

// The row number stands for its own column, which a block does not keep.
uint64_t rowsOfHead(const std::string& head, size_t columns) {
    try {
        return ReadBlockHead(head, columns).rows;
    } catch (const Damaged&) {
        return 0;
    }
}

}  // namespace

void AuditArchive(const Storage& storage, const Definition& columns, const Progress& progress, QUORARCHIVE& report) {
    sqlite3* const db = storage.db();
    PartReader parts(storage);
    RowSum sum;
    const Statement heads = Prepared(db, "SELECT id, head FROM " + storage.table("logs_blocks") + " ORDER BY id");
    while (NextRow(db, heads)) {
        ++report.blocks;
        const std::string head = TextOf(heads, 1);
        try {
            Block block(parts, sqlite3_column_int64(heads.get(), 0), head, columns.size());
            RowSum within = sum;
            auditBlock(block, columns.size(), within);
            sum = within;
            report.firstId = report.rows == 0 ? block.head().first : report.firstId;
            report.lastId = block.head().last;
            report.rows += block.rows();
        } catch (const Damaged&) {
            ++report.damagedBlocks;
            report.damagedRows += rowsOfHead(head, columns.size());
        }
        progress(report.rows);
    }
    report.checksum = sum.value();
}

Tally TallyTable(sqlite3* db, const std::string& schema, const Definition& columns, const Progress& progress) {
    const Statement rows = Prepared(db, EveryRow(columns, schema));
    Tally tally;
    RowSum sum;
    while (NextRow(db, rows)) {
        sum.begin(sqlite3_column_int64(rows.get(), 0));
        for (size_t i = 0; i < columns.size(); ++i) {
            sum.add(columns[i].id ? Cell() : CellOf(sqlite3_column_value(rows.get(), static_cast<int>(i) + 1)));
        }
        sum.end();
        if (++tally.rows % kRowsPerReport == 0) {
            progress(tally.rows);
        }
    }
    tally.sum = sum.value();
    return tally;
}

uint64_t Remembered(const Storage& storage, const std::string& name) {
    const Statement query =
        Prepared(storage.db(), "SELECT value FROM " + storage.table("logs_archive") + " WHERE name = '" + name + "'");
    return NextRow(storage.db(), query) ? static_cast<uint64_t>(sqlite3_column_int64(query.get(), 0)) : 0;
}

void Remember(const Storage& storage, const std::string& name, uint64_t number) {
    Run(storage.db(), "INSERT OR REPLACE INTO " + storage.table("logs_archive") + " VALUES ('" + name + "', " +
                          std::to_string(static_cast<int64_t>(number)) + ")");
}

}  // namespace quor::archive
