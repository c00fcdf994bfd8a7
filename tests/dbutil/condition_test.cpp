#include <gtest/gtest.h>

#include "dbutil.h"

namespace {

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

_SYSLOG_SQL_COND_tag cond(_SYSLOG_DB_ATTRI_tag attr, int op, const std::string& value, Conditions orList = {}) {
    return {attr, op, value, std::move(orList)};
}

// What is added to a text that is there already.
std::string rendered(Conditions conditions) {
    std::string text = "x ";
    EXPECT_EQ(SqlCondListToStr(conditions, text), 0);
    return text.substr(2);
}

TEST(Condition, EscapesTheValueForItsOperator) {
    using Case = std::tuple<_SYSLOG_DB_ATTRI_tag, int, const char*, const char*>;
    for (const auto& [attr, op, value, text] : {
             Case{SYSLOG_ATTRI_HOST, 1, "O'Neil", "(host != 'O''Neil')"},
             Case{SYSLOG_ATTRI_HOST, 0, R"(a\%_*?[])", R"((host = 'a\%_*?[]'))"},
             Case{SYSLOG_ATTRI_MSG, 6, "a*b", R"((msg LIKE 'a%b' escape '\'))"},
             Case{SYSLOG_ATTRI_MSG, 7, R"(50%_*?\')", R"((msg NOT LIKE '50\%\_%_\\''' escape '\'))"},
             Case{SYSLOG_ATTRI_MSG, 8, "[x]", "(msg GLOB '[[]x[]]')"},
             Case{SYSLOG_ATTRI_MSG, 9, "*e'r?", "(msg NOT GLOB '*e''r?')"},
             Case{SYSLOG_ATTRI_ID, 4, "10", "(id > 10)"},
             Case{SYSLOG_ATTRI_UTCSEC, 6, "1_*", R"((utcsec LIKE 1\_%))"},
             Case{SYSLOG_ATTRI_ISDIR, 2, "1", "(isdir < '1')"},
             Case{SYSLOG_ATTRI_XFERIP, 3, "", "(ip <= '')"},
         }) {
        EXPECT_EQ(rendered({cond(attr, op, value)}), text);
    }
    EXPECT_EQ(CondValueEscape(nullptr), "");
}

TEST(Condition, JoinsAlternativesOneLevelDeepAndListsWithAnd) {
    const Conditions never{cond(SYSLOG_ATTRI_HOST, 0, "never")};
    const Conditions others{cond(SYSLOG_ATTRI_HOST, 0, "b", never), cond(SYSLOG_ATTRI_MSG, 6, "c")};
    EXPECT_EQ(rendered({cond(SYSLOG_ATTRI_HOST, 0, "a", others), cond(SYSLOG_ATTRI_FAC, 0, "kern")}),
              "((host = 'a') OR (host = 'b') OR (msg LIKE 'c' escape '\\')) AND (fac = 'kern')");
    std::string replaced = "replaced";
    EXPECT_EQ(SqlCondToStr(cond(SYSLOG_ATTRI_FAC, 0, "kern"), replaced), 0);
    EXPECT_EQ(replaced, "(fac = 'kern')");
}

TEST(Search, TurnsAFormIntoConditions) {
    struct Case {
        std::string hosts, levels, facs, progs, keyword, from, to;
        const char* where;
    };
    for (Case c : {
             Case{"", "", "", "", "", "0", "", ""},
             Case{"any", "any", "any", "any", "any", "", "0", "(msg GLOB 'any')"},
             Case{"a, b", "err,crit", "", "", "", "", "",
                  "((host = 'a') OR (host = ' b')) AND ((llevel = 'err') OR (llevel = 'crit'))"},
             Case{",,", "", "kern", "su", "**", "", "",
                  "((host = '') OR (host = '') OR (host = '')) AND (fac = 'kern') AND (prog = 'su') AND (msg GLOB "
                  "'**')"},
             Case{"", "", "", "", "", "2014/01/02", "2014/01/02", "(ldate = '2014/01/02')"},
             Case{"", "", "", "", "", "2014/01/02", "2014/01/03",
                  "(ldate >= '2014/01/02') AND (ldate <= '2014/01/03')"},
             Case{"", "", "", "", "", "0", "2014/01/03", "(ldate <= '2014/01/03')"},
             Case{"", "", "", "", "", "2014/01/02", "0", "(ldate >= '2014/01/02')"},
         }) {
        Conditions conds;
        LogSearchCondListGen(c.hosts, c.levels, c.facs, c.progs, c.keyword, c.from, c.to, conds);
        EXPECT_EQ(rendered(conds), c.where);
    }
    _SYSLOG_SQL_COND_tag kept = cond(SYSLOG_ATTRI_MSG, 8, "kept");
    EXPECT_EQ(OneCondListGen(SYSLOG_ATTRI_HOST, "any", kept) + OneCondListGen(SYSLOG_ATTRI_HOST, "", kept), 0);
    EXPECT_EQ(rendered({kept}), "(msg GLOB 'kept')") << "nothing is asked for";
}

}  // namespace
