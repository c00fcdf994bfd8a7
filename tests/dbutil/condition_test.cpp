#include <gtest/gtest.h>

#include "dbutil.h"

namespace {

_SYSLOG_SQL_COND_tag cond(_SYSLOG_DB_ATTRI_tag attr, int op, const std::string& value) {
    return {attr, op, value, {}};
}

std::string rendered(const _SYSLOG_SQL_COND_tag& condition) {
    std::string text = "replaced";
    EXPECT_EQ(SqlCondToStr(condition, text), 0);
    return text;
}

TEST(Condition, EscapesTheValueForItsOperator) {
    using Case = std::tuple<_SYSLOG_DB_ATTRI_tag, int, const char*, const char*>;
    for (const auto& [attr, op, value, text] : {
             Case{SYSLOG_ATTRI_HOST, 0, "ab", "(host = 'ab')"},
             Case{SYSLOG_ATTRI_HOST, 1, "O'Neil", "(host != 'O''Neil')"},
             Case{SYSLOG_ATTRI_HOST, 0, R"(a\%_*?[])", R"((host = 'a\%_*?[]'))"},
             Case{SYSLOG_ATTRI_MSG, 6, "a*b", R"((msg LIKE 'a%b' escape '\'))"},
             Case{SYSLOG_ATTRI_MSG, 7, R"(50%_*?\')", R"((msg NOT LIKE '50\%\_%_\\''' escape '\'))"},
             Case{SYSLOG_ATTRI_MSG, 8, "[x]", "(msg GLOB '[[]x[]]')"},
             Case{SYSLOG_ATTRI_MSG, 9, "*e'r?", "(msg NOT GLOB '*e''r?')"},
             Case{SYSLOG_ATTRI_MSG, 8, "**", "(msg GLOB '**')"},
             Case{SYSLOG_ATTRI_ID, 4, "10", "(id > 10)"},
             Case{SYSLOG_ATTRI_UTCSEC, 6, "1_*", R"((utcsec LIKE 1\_%))"},
             Case{SYSLOG_ATTRI_ISDIR, 2, "1", "(isdir < '1')"},
             Case{SYSLOG_ATTRI_XFERIP, 3, "", "(ip <= '')"},
         }) {
        EXPECT_EQ(rendered(cond(attr, op, value)), text);
    }
    EXPECT_EQ(CondValueEscape(nullptr), "");
}

TEST(Condition, JoinsAlternativesOneLevelDeepAndListsWithAnd) {
    _SYSLOG_SQL_COND_tag head = cond(SYSLOG_ATTRI_HOST, 0, "a");
    head.orList = {cond(SYSLOG_ATTRI_HOST, 0, "b"), cond(SYSLOG_ATTRI_MSG, 6, "c")};
    head.orList.front().orList = {cond(SYSLOG_ATTRI_HOST, 0, "never")};
    EXPECT_EQ(rendered(head), "((host = 'a') OR (host = 'b') OR (msg LIKE 'c' escape '\\'))");
    std::list<_SYSLOG_SQL_COND_tag> conds;
    std::string text = "x ";
    EXPECT_EQ(SqlCondListToStr(conds, text), 0);
    conds = {cond(SYSLOG_ATTRI_HOST, 0, "a"), cond(SYSLOG_ATTRI_FAC, 0, "kern")};
    EXPECT_EQ(SqlCondListToStr(conds, text), 0);
    EXPECT_EQ(text, "x (host = 'a') AND (fac = 'kern')");
}

TEST(Search, TurnsAFormIntoConditions) {
    struct Case {
        std::string hosts, levels, facs, progs, keyword, from, to;
        const char* where;
    };
    for (Case c : {
             Case{"", "", "", "", "", "0", "", ""},
             Case{"any", "any", "any", "any", "any", "", "0", "(msg GLOB 'any')"},
             Case{"a,b,c", "", "", "", "", "", "", "((host = 'a') OR (host = 'b') OR (host = 'c'))"},
             Case{"", "err,crit", "", "", "", "", "", "((llevel = 'err') OR (llevel = 'crit'))"},
             Case{"", "", "kern", "su", "**", "", "", "(fac = 'kern') AND (prog = 'su') AND (msg GLOB '**')"},
             Case{"a, b", "", "", "", "", "", "", "((host = 'a') OR (host = ' b'))"},
             Case{",,", "", "", "", "", "", "", "((host = '') OR (host = '') OR (host = ''))"},
             Case{"", "", "", "", "", "2014/01/02", "2014/01/02", "(ldate = '2014/01/02')"},
             Case{"", "", "", "", "", "2014/01/02", "2014/01/03",
                  "(ldate >= '2014/01/02') AND (ldate <= '2014/01/03')"},
             Case{"", "", "", "", "", "0", "2014/01/03", "(ldate <= '2014/01/03')"},
             Case{"", "", "", "", "", "2014/01/02", "0", "(ldate >= '2014/01/02')"},
         }) {
        std::list<_SYSLOG_SQL_COND_tag> conds;
        LogSearchCondListGen(c.hosts, c.levels, c.facs, c.progs, c.keyword, c.from, c.to, conds);
        std::string where;
        ASSERT_EQ(SqlCondListToStr(conds, where), 0);
        EXPECT_EQ(where, c.where);
    }
    _SYSLOG_SQL_COND_tag kept{SYSLOG_ATTRI_MSG, 8, "kept", {}};
    EXPECT_EQ(OneCondListGen(SYSLOG_ATTRI_HOST, "any", kept) + OneCondListGen(SYSLOG_ATTRI_HOST, "", kept), 0);
    EXPECT_EQ(rendered(kept), "(msg GLOB 'kept')") << "nothing is asked for";
}

}  // namespace
