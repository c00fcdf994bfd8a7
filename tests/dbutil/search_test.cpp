#include <gtest/gtest.h>

#include "dbutil.h"

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
}

TEST(Search, LeavesTheConditionAloneWhenNothingIsAskedFor) {
    _SYSLOG_SQL_COND_tag cond{SYSLOG_ATTRI_MSG, 8, "kept", {}};
    EXPECT_EQ(OneCondListGen(SYSLOG_ATTRI_HOST, "any", cond), 0);
    EXPECT_EQ(OneCondListGen(SYSLOG_ATTRI_HOST, "", cond), 0);
    EXPECT_EQ(cond.value, "kept");
    EXPECT_EQ(cond.attr, SYSLOG_ATTRI_MSG);
}
