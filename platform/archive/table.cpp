#include "platform/archive/table.h"

#include <sys/types.h>

#include <cstring>
#include <new>

namespace quor::archive {
namespace {

// ---- the columns, from the words between the brackets of CREATE VIRTUAL TABLE

std::string unquoted(const std::string& word) {
    std::string name;
    for (size_t i = 1; i + 1 < word.size(); ++i) {
        name += word[i];
        i += word[i] == '"' ? 1 : 0;
    }
    return name;
}

// Behind the quoted name that a definition begins with.
size_t endOfName(const std::string& definition) {
    size_t at = definition.find('"', 1);
    while (at != std::string::npos && at + 1 < definition.size() && definition[at + 1] == '"') {
        at = definition.find('"', at + 2);
    }
    return at == std::string::npos ? definition.size() : at + 1;
}

bool contains(const std::string& type, const char* word) {
    return sqlite3_strlike((std::string("%") + word + "%").c_str(), type.c_str(), 0) == 0;
}

bool comparesAsText(const std::string& type) {
    return !contains(type, "INT") && (contains(type, "CHAR") || contains(type, "CLOB") || contains(type, "TEXT"));
}

// `sql` becomes what SQLite is to know of the table.
Shape readShape(int count, const char* const* words, std::string& sql) {
    constexpr const char kKey[] = " PRIMARY KEY";
    Shape shape;
    for (int i = 3; i < count; ++i) {
        std::string definition = words[i];
        const size_t name = endOfName(definition);
        const size_t key = definition.rfind(kKey);
        if (key != std::string::npos && key >= name && key + strlen(kKey) == definition.size()) {
            shape.id = shape.columns.size();
            definition.resize(key);
        }
        sql += (shape.columns.empty() ? "" : ", ") + definition;
        shape.columns.push_back({unquoted(definition.substr(0, name)), comparesAsText(definition.substr(name))});
    }
    return shape;
}

std::vector<std::string> namesOf(const Shape& shape) {
    std::vector<std::string> names;
    for (const Shape::Column& column : shape.columns) {
        names.push_back(column.name);
    }
    return names;
}

// ---- what SQLite calls

constexpr char kLeftOut = 0;  // its address tells a connection that goes on behind damaged blocks

Table& tableOf(sqlite3_vtab* table) {
    return *static_cast<Table*>(table);
}
Cursor& cursorOf(sqlite3_vtab_cursor* cursor) {
    return *static_cast<Cursor*>(cursor);
}

void setMessage(char** message, const char* text) {
    sqlite3_free(*message);
    *message = sqlite3_mprintf("%s", text);
}

// No exception gets into SQLite.
template <typename Body>
int guarded(char** message, const Body& body) {
    try {
        body();
        return SQLITE_OK;
    } catch (const std::bad_alloc&) {
        return SQLITE_NOMEM;
    } catch (const Refused& refusal) {
        setMessage(message, refusal.what());
        return refusal.status();
    } catch (const Damaged& damage) {
        setMessage(message, damage.what());
        return SQLITE_IOERR_DATA;  // what is called corrupt is moved out of the way, as if it were being written
    } catch (const std::exception& problem) {
        setMessage(message, problem.what());
        return SQLITE_ERROR;
    }
}

template <typename Body>
int guarded(sqlite3_vtab* table, const Body& body) {
    return guarded(&table->zErrMsg, body);
}

int xConnect(sqlite3* db, void* damage, int count, const char* const* words, sqlite3_vtab** table, char** error) {
    return guarded(error, [&] {
        std::string columns;
        Shape shape = readShape(count, words, columns);
        Require(db, sqlite3_declare_vtab(db, ("CREATE TABLE x(" + columns + ")").c_str()));
        Require(db, sqlite3_vtab_config(db, SQLITE_VTAB_INNOCUOUS));  // it reads tables of its own, and nothing else
        *table = new Table(db, words[1], std::move(shape), damage == &kLeftOut ? Damage::IsLeftOut : Damage::Fails);
    });
}

// Another function than xConnect, or the table could be used without having been created.
int xCreate(sqlite3* db, void* context, int count, const char* const* words, sqlite3_vtab** table, char** error) {
    return xConnect(db, context, count, words, table, error);
}

int xDisconnect(sqlite3_vtab* table) {
    delete &tableOf(table);
    return SQLITE_OK;
}

int xBestIndex(sqlite3_vtab* table, sqlite3_index_info* info) {
    int status = SQLITE_OK;
    const int failure = guarded(table, [&] {
        status = Plan(tableOf(table).shape, info, [table](size_t column) { return tableOf(table).listing(column); });
    });
    return failure != SQLITE_OK ? failure : status;
}

int xOpen(sqlite3_vtab* table, sqlite3_vtab_cursor** cursor) {
    return guarded(table, [&] { *cursor = new Cursor(tableOf(table)); });
}

int xClose(sqlite3_vtab_cursor* cursor) {
    delete &cursorOf(cursor);
    return SQLITE_OK;
}

int xFilter(sqlite3_vtab_cursor* cursor, int number, const char* plan, int /*count*/, sqlite3_value** values) {
    return guarded(cursor->pVtab, [&] {
        Table& table = tableOf(cursor->pVtab);
        table.remover.flush();  // what is deleted is gone
        if ((number & kValuesOnly) != 0) {
            cursorOf(cursor).askForValues(static_cast<size_t>(strtoul(plan, nullptr, 10)), number);
        } else {
            cursorOf(cursor).ask(Ask(table.shape, number, plan, values));
        }
    });
}

int xNext(sqlite3_vtab_cursor* cursor) {
    return guarded(cursor->pVtab, [&] { cursorOf(cursor).next(); });
}

int xEof(sqlite3_vtab_cursor* cursor) {
    return cursorOf(cursor).ended() ? 1 : 0;
}

int xColumn(sqlite3_vtab_cursor* cursor, sqlite3_context* context, int column) {
    return guarded(cursor->pVtab, [&] { cursorOf(cursor).column(context, static_cast<size_t>(column)); });
}

int xRowid(sqlite3_vtab_cursor* cursor, sqlite3_int64* id) {
    return guarded(cursor->pVtab, [&] { *id = cursorOf(cursor).id(); });
}

int xUpdate(sqlite3_vtab* table, int count, sqlite3_value** values, sqlite3_int64* /*id*/) {
    if (count != 1) {
        setMessage(&table->zErrMsg, "rows of an archive can be deleted, but not added or changed");
        return SQLITE_READONLY;
    }
    return guarded(table, [&] { tableOf(table).remover.remove(sqlite3_value_int64(values[0])); });
}

int xBegin(sqlite3_vtab* /*table*/) {
    return SQLITE_OK;
}
int flush(sqlite3_vtab* table) {
    return guarded(table, [&] { tableOf(table).remover.flush(); });
}
int forget(sqlite3_vtab* table) {
    tableOf(table).remover.forget();
    return SQLITE_OK;
}
int xSavepoint(sqlite3_vtab* table, int /*number*/) {
    return flush(table);
}
int xRelease(sqlite3_vtab* /*table*/, int /*number*/) {
    return SQLITE_OK;
}
int xRollbackTo(sqlite3_vtab* table, int /*number*/) {
    return forget(table);
}

// The tables behind the one named "logs".
int xShadowName(const char* name) {
    constexpr const char* kNames[] = {"blocks", "data", "blooms", "values", "columns", "archive", "schema"};
    for (const char* each : kNames) {
        if (sqlite3_stricmp(name, each) == 0) {
            return 1;
        }
    }
    return 0;
}

constexpr sqlite3_module makeModule() {
    sqlite3_module module{};
    module.iVersion = 3;
    module.xCreate = xCreate;
    module.xConnect = xConnect;
    module.xBestIndex = xBestIndex;
    module.xDisconnect = xDisconnect;
    module.xDestroy = xDisconnect;
    module.xOpen = xOpen;
    module.xClose = xClose;
    module.xFilter = xFilter;
    module.xNext = xNext;
    module.xEof = xEof;
    module.xColumn = xColumn;
    module.xRowid = xRowid;
    module.xUpdate = xUpdate;
    module.xBegin = xBegin;
    module.xSync = flush;
    module.xCommit = forget;
    module.xRollback = forget;
    module.xSavepoint = xSavepoint;
    module.xRelease = xRelease;
    module.xRollbackTo = xRollbackTo;
    module.xShadowName = xShadowName;
    return module;
}

constexpr sqlite3_module kMethods = makeModule();

}  // namespace

Table::Table(sqlite3* db, const std::string& schema, Shape columns, Damage found)
    : sqlite3_vtab(), storage(db, schema), shape(std::move(columns)), remover(storage, namesOf(shape)), damage(found) {}

Listing Table::listing(size_t column) const {
    const Statement query = Prepared(storage.db(), "SELECT listing FROM " + storage.table("logs_columns") +
                                                       " WHERE number = " + std::to_string(column));
    const int listing = NextRow(storage.db(), query) ? sqlite3_column_int(query.get(), 0) : 0;
    return listing == 0 ? Listing::No : listing == 1 ? Listing::Yes : Listing::Sorted;
}

int Register(sqlite3* db, Damage damage) {
    void* mark = damage == Damage::IsLeftOut ? const_cast<char*>(&kLeftOut) : nullptr;
    return sqlite3_create_module_v2(db, kModule, &kMethods, mark, nullptr);
}

// Read through the open file: to open and close it once more would drop this process's locks on it.
bool IsArchive(sqlite3* db) {
    constexpr sqlite3_int64 kPlace = 68;
    sqlite3_file* file = nullptr;
    if (sqlite3_file_control(db, "main", SQLITE_FCNTL_FILE_POINTER, &file) != SQLITE_OK || file == nullptr ||
        file->pMethods == nullptr) {
        return false;
    }
    uint8_t bytes[4];
    return file->pMethods->xRead(file, bytes, sizeof bytes, kPlace) == SQLITE_OK &&
           (uint32_t{bytes[0]} << 24U | uint32_t{bytes[1]} << 16U | uint32_t{bytes[2]} << 8U | bytes[3]) ==
               uint32_t{kApplicationId};
}

}  // namespace quor::archive
