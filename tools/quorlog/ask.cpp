#include "ask.h"

#include "common/guards.h"
#include "common/numbers.h"
#include "failure.h"
#include "text.h"

namespace quor::cli {
namespace {

std::string adviceFor(const std::string& cause) {
    const auto says = [&](const char* words) { return cause.find(words) != std::string::npos; };
    if (says("no such table") || says("no such column")) {
        return "choose another --table or --db";
    }
    if (says("malformed") || says("not a database")) {
        return "run quorlog db check on it";
    }
    if (says("locked") || says("busy")) {
        return "try again, another program holds it";
    }
    return "see the system log";
}

}  // namespace

std::vector<std::string> Ask(const std::string& db, const std::string& sql, const char* column) {
    const Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, db.c_str()));
    if (connection == nullptr) {
        throw QueryFailure("cannot open " + Visible(db) + "; see that it is a database that you may read");
    }
    Result result;
    if (QUORDBExecute(connection.get(), sql.c_str(), Adopt(result)) < 0) {
        const std::string cause = Visible(QUORDBErrorGet(connection.get()));
        throw QueryFailure(Visible(db) + ": " + cause + "; " + adviceFor(cause));
    }
    std::vector<std::string> texts;
    for (unsigned int row = 0; QUORDBFetchRow(result.get(), &row) >= 0;) {
        texts.emplace_back(OrEmpty(QUORDBFetchField(result.get(), row, column)));
    }
    return texts;
}

void RequireTable(const std::string& db, const std::string& table) {
    (void)Ask(db, "SELECT 1 FROM " + table + " LIMIT 1", "1");
}

}  // namespace quor::cli
