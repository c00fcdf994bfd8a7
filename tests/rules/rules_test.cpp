// The file of the rules, and how logs meet them.
#include "rules/matches.h"
#include "rules/rulefile.h"
#include "store/failure.h"
#include "tests/support/testing.h"

using namespace quor::rules;
using namespace quor::test;

namespace {

constexpr char kVersion[] = "version=\"1\"\n";

std::string failureOf(const std::string& text) {
    try {
        (void)ParseRules(text, "FILE");
    } catch (const quor::store::Failure& failure) {
        return failure.what();
    }
    return "";
}

Rule parsed(const std::string& lines) {
    return ParseRules(kVersion + std::string("[x]\n") + lines, "FILE").at(0);
}

}  // namespace

TEST(RuleFile, KeepsEverythingThroughChanges) {
    const TempFolder folder;
    const std::string path = folder.write(
        "rules.conf", std::string(kVersion) + "# first\n[a]\nkind=\"silent\"\nafter=\"auto\"\nenabled=\"no\"\n# last");
    Rule rule = parsed("kind=match\nhost=\"w*,n?s\"\nkeyword=\"say \"it\" \xFF = ;\"\nlevel=WARN\nignore-case=yes\n"
                       "count=10\nwithin=300s\ninterval=2h");
    rule.name = "b c";
    SaveRule(path, "b c", rule);
    EXPECT_EQ(
        Describe(LoadRules(path).at(1)),
        "host w*,n?s; level warning+; keyword say \"it\" \xFF = ;; ignore-case yes; count 10; within 5m; interval "
        "2h");
    Rule first = LoadRules(path).at(0);
    first.name = "z";
    SaveRule(path, "a", first);
    EXPECT_EQ(LoadRules(path).at(0).name + Describe(LoadRules(path).at(0)), "zafter auto");
    EXPECT_FALSE(LoadRules(path).at(0).enabled);
    RemoveRule(path, "b c");
    EXPECT_EQ(ReadFile(path),
              std::string(kVersion) + "# first\n[z]\nkind=\"silent\"\nafter=\"auto\"\nenabled=\"no\"\n# last\n");
    EXPECT_TRUE(LoadRules(folder.path("none")).empty());
}

TEST(RuleFile, RefusesWhatItDoesNotUnderstandAndNamesTheLine) {
    const std::pair<std::string, std::string> kCases[] = {
        {"[a]\n", "line 1: version=\"1\" does not stand"},
        {"version=\"2\"\n", "line 1: version 2 is not known"},
        {"host=\"a\"\n", "line 1: 'host' belongs to no rule"},
        {"version=\"1\"\nrubbish\n", "line 2: neither a comment"},
        {"version=\"1\"\n[a\nkind=match\n", "line 2: the name '' cannot be used"},
        {"version=\"1\"\n[a]\nkind=match\nhost=\"x\"\n[a]\n", "line 5: a second rule 'a'"},
        {"version=\"1\"\n[a]\nkind=sing\n", "line 3: no such kind"},
        {"version=\"1\"\n[a]\nhost=x\nkind=match\n", "line 4: the kind has to be the first"},
        {"version=\"1\"\n[a]\nkind=silent\nprogram=\"x\"\n", "line 4: a rule of this kind has no 'program'"},
        {"version=\"1\"\n[a]\nkind=silent\nafter=\"1m\"\nafter=\"2m\"", "line 5: a second 'after'"},
        {"version=\"1\"\n[a]\nkind=silent\nafter=\"59s\"\n", "line 4: after: out of range; give 1m to 60d"},
        {"version=\"1\"\n[a]\nkind=silent\n", "line 3: rule 'a' does not say after what time"},
        {"version=\"1\"\n[a]\nkind=match\n", "line 3: rule 'a' has nothing to look for"},
        {"version=\"1\"\n[a]\nkind=match\nhost=\"x,,y\"\n", "line 4: host: empty name"},
        {"version=\"1\"\n[a]\nkind=match\nhost=x\ncount=3\n", "line 5: rule 'a' needs both"},
        {"version=\"1\"\n[a]\nkind=match\nhost=x\ncount=-3\n", "line 5: count: not a number"},
        {"version=\"1\"\n[a]\nkind=match\nlevel=loud\n", "line 4: level: no such level"},
        {"version=\"1\"\n[a]\nkind=match\nhost=x\nenabled=1\n", "line 5: enabled is neither"},
    };
    for (const auto& [text, message] : kCases) {
        EXPECT_NE(failureOf(text).find(message), std::string::npos) << text << failureOf(text);
    }
    std::string many = kVersion;
    for (int i = 0; i <= 200; ++i) {
        many += "[" + std::to_string(i) + "]\nkind=newdevice\n";
    }
    EXPECT_NE(failureOf(many).find("more than 200 rules"), std::string::npos);
    const TempFolder folder;
    const std::string path = folder.write("rules.conf", "rubbish");
    EXPECT_THROW(SaveRule(path, "a", parsed("kind=newdevice")), quor::store::Failure);
    EXPECT_EQ(ReadFile(path), "rubbish");
}

TEST(Names, AreComparedAsASearchDoes) {
    for (const auto& [pattern, text, wanted] : std::initializer_list<std::tuple<const char*, const char*, bool>>{
             {"a*c", "abcbc", true},
             {"a*c", "abcb", false},
             {"?", "\xC3\xA9", true},
             {"?", "\xC3", true},
             {"a?", "a", false},
             {"*", "", true},
             {"[a]", "[a]", true},
             {"[a]", "a", false},
             {"**b**", "abc", true},
         }) {
        EXPECT_EQ(MatchesGlob(pattern, text), wanted) << pattern << " " << text;
    }
    EXPECT_FALSE(MatchesGlob("*a*a*a*a*a*a*a*a*b", std::string(200000, 'a'))) << "and soon";
}

TEST(Matcher, NeedsEverythingThatIsGiven) {
    quor::store::Record record;
    record.host = "web1";
    record.prog = "sshd";
    record.fac = "auth";
    record.prio = SYSLOG_PRIORITY_ERR;
    record.msg = "Failed password for ROOT";
    record.sdata = "[x y=\"z\"]";
    const auto meets = [&record](const std::string& lines) {
        return Matcher(parsed("kind=match\n" + lines)).matches(Subject(record));
    };
    for (const char* lines : {"host=web*", "host=\"nas,web1\"", "program=sshd\nfacility=auth\nlevel=err", "level=info",
                              R"(keyword="y="z"")", "keyword=\"for root\"\nignore-case=yes", "glob=\"Failed*ROOT\"",
                              "not-host=\"web2,nas*\"", "keyword=Failed\nnot-keyword=root"}) {
        EXPECT_TRUE(meets(lines)) << lines;
    }
    for (const char* lines :
         {"host=web", "host=web*\nnot-host=\"?eb1\"", "level=crit", "program=sshd\nfacility=kern", "not-facility=auth",
          "keyword=\"for root\"", "glob=\"Failed\"", "level=err\nnot-keyword=root\nignore-case=yes"}) {
        EXPECT_FALSE(meets(lines)) << lines;
    }
}

TEST(Windows, FireWhenSecondsDifferByLessThanTheSpan) {
    Windows windows(3, 300, 1000);
    EXPECT_FALSE(windows.add("a", 1000));
    EXPECT_FALSE(windows.add("a", 1100));
    EXPECT_FALSE(windows.add("a", 1300)) << "300 s after the first";
    EXPECT_FALSE(windows.add("b", 1300));
    EXPECT_TRUE(windows.add("a", 1399)) << "299 s after the second";
    EXPECT_FALSE(windows.add("a", 1399)) << "anew";
    EXPECT_FALSE(windows.add("a", 1390)) << "late";
    EXPECT_TRUE(windows.add("a", 1399));
    EXPECT_FALSE(windows.add("a", 1399));
    EXPECT_FALSE(windows.add("a", 1399));
    EXPECT_FALSE(windows.add("a", 900)) << "the clock was set back";
    EXPECT_FALSE(windows.add("a", 901));
    EXPECT_TRUE(windows.add("a", 902));
}

TEST(Windows, AreBoundedAndKeepThoseHeardLately) {
    Windows windows(3, 300, 100);
    (void)windows.add("quiet", 1000);
    (void)windows.add("quiet", 1001);
    (void)windows.add("busy", 1000);
    for (int i = 1; i <= 10000; ++i) {
        (void)windows.add("x" + std::to_string(i), 1002);
        EXPECT_LE(windows.seconds(), 100U);
        if (i % 50 == 0) {
            EXPECT_EQ(windows.add("busy", 1002), i % 150 == 100) << i;
        }
    }
    EXPECT_FALSE(windows.add("quiet", 1003)) << "it gave way";
}
