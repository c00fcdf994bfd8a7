#include <sys/stat.h>

#include <map>

#include "common/guards.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

using Entries = std::map<std::string, std::string>;

constexpr char kLine[] = "%s=\"%s\"\n";

class Sections : public testing::Test {
  protected:
    // The section names, or "unreadable".
    static Strings names(const std::string& file) {
        quor::StringList list(QLIBCSzListAlloc(1));
        if (QLIBCFileEnumSection(file.c_str(), quor::Adopt(list)) < 0) {
            return {"unreadable"};
        }
        return {list->items, list->items + list->count};
    }

    static std::string value(const std::string& file, const char* section, const char* key) {
        quor::StringTable table(QLIBCSzHashAlloc(8));
        if (QLIBCFileGetSection(file.c_str(), section, quor::Adopt(table)) < 0) {
            return "no section";
        }
        const char* found = QLIBCSzHashGetValue(table.get(), key);
        return found != nullptr ? found : "no key";
    }

    static int set(const std::string& file, const std::string& section, const std::string& newName,
                   const Entries& entries, const char* format = kLine) {
        quor::StringTable table(QLIBCSzHashAlloc(8));
        for (const auto& [key, text] : entries) {
            EXPECT_EQ(QLIBCSzHashSetValue(quor::Adopt(table), key.c_str(), text.c_str()), 0);
        }
        return QLIBCFileSetSection(file.c_str(), section.c_str(), newName.c_str(), table.get(), format);
    }

    const TempFolder folder_;
};

TEST_F(Sections, ReadsWhatPeopleWrite) {
    const std::pair<const char*, const char*> cases[] = {
        // with the value of the key k in the section s
        {"[s]\nk=\"v\"\n", "v"},
        {"\xEF\xBB\xBF[s]\r\nk=\"v\"\r\n", "v"},
        {"[s]\n\t k  =  v w \t\n", "v w"},
        {"[s]  # a comment [with] brackets\nk=v", "v"},
        {"k=outside\n[t]\nk=t\n[s]\n#k=1\n;k=2\nk=v # kept\nk=second\n", "v # kept"},
        {"[s]\nk=\"a\"b\\\"\n", "a\"b\\"},
        {"[s]\nk=\"\n", "\""},
        {"[s]\nk=\n", ""},
        {"[s]\nk=a=b\n", "a=b"},
        {"[s]\nK=other\nnonsense\n=v\n", "no key"},
        {"[s]\n[s]\nk=of the second\n", "no key"},
        {"[s]\n[broken\nk=v\n", "no key"},
        {"[ s ]\n[]\n[S]\nk=v\n", "no section"},
        {"", "no section"},
    };
    for (const auto& [text, expected] : cases) {
        EXPECT_EQ(value(folder_.write("file", text), "s", "k"), expected) << text;
    }
    EXPECT_EQ(names(folder_.write("file", "[b]\n[a]c]\nx=1\n[b]\n[broken\n[]\n [ d]")), Strings({"b", "a]c", " d"}));
}

TEST_F(Sections, FailsOnWhatIsNoTextFile) {
    const std::string pipe = folder_.path("pipe");
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    for (const std::string& file : {folder_.path("missing"), folder_.path(), pipe, std::string("/dev/zero"),
                                    folder_.write("binary", std::string("[s]\nk=\"v\"\n\0", 11)),
                                    folder_.write("huge", std::string((1U << 20U) + 1, '\n'))}) {
        EXPECT_EQ(names(file), Strings{"unreadable"}) << file;
        EXPECT_EQ(value(file, "s", "k"), "no section") << file;
        if (file != folder_.path("missing")) {
            EXPECT_LT(set(file, "s", "s", {{"k", "v"}}), 0) << file;
        }
    }
}

TEST_F(Sections, AnyValueOfOneLineRoundTrips) {
    const std::string file = folder_.path("new");
    for (const std::string& text :
         {std::string(), std::string("\""), std::string("\"\""), std::string(R"(a"b\"c\\)"), std::string("=[x]#;"),
          std::string(" \t v \t "), std::string("caf\xC3\xA9 \xFF\x1B[0m\x01"), std::string("tail\r"),
          std::string("%s%n"), std::string(65536, '"')}) {
        ASSERT_EQ(set(file, "s", "s", {{"k", text}, {"other", "1"}}), 0) << text;
        EXPECT_EQ(value(file, "s", "k"), text);
    }
    EXPECT_EQ(names(file), Strings{"s"});
}

TEST_F(Sections, RefusesWhatWouldNotReadBack) {
    const std::string before = "[s]\nk=\"old\"\n[t]\nk=\"t\"";
    const std::string file = folder_.write("file", before);
    EXPECT_LT(set(file, "s", "s", {{"k", "a\nb"}}), 0);
    EXPECT_LT(set(file, "s", "s", {{"k", "a\"\n[t]\nk=\"b"}}), 0);
    EXPECT_LT(set(file, "s", "s", {{"k", " v"}}, "%s=%s\n"), 0);
    EXPECT_LT(set(file, "s", "s", {{"k", "v"}}, "%s=\"%s\"\n[u]\n"), 0);
    for (const char* name : {"", "a\nb", "a] # b", "t"}) {  // t is another section
        EXPECT_LT(set(file, "s", name, {{"k", "v"}}), 0) << name;
    }
    for (const char* key : {"a\nb", "a=b", " a", "#a", "[a", ""}) {
        EXPECT_LT(set(file, "s", "s", {{key, "v"}}), 0) << key;
    }
    for (const char* format : {"%s=\"%n\"\n", "%s=\"%s%s\"\n", "%s=\"%1$s\"\n", "%%%s=%s\n", "%s=\n", "%s=%s"}) {
        EXPECT_LT(set(file, "s", "s", {{"k", "v"}}, format), 0) << format;
    }
    EXPECT_LT(set(folder_.path("no/such/folder"), "s", "s", {}), 0);
    EXPECT_EQ(ReadFile(file), before);
}

TEST_F(Sections, TouchesNothingElse) {
    const std::string file = folder_.write("file", "# head\r\n\r\n[a]\r\nx = 1\r\n [s] ; why\r\n# note on k\r\n"
                                                   "k=old\r\nk=again\r\ngone=1\r\njunk\r\n[z]\nx=\"1\"");
    ASSERT_EQ(set(file, "s", "new]name", {{"k", "v"}, {"m", "w"}}), 0);
    EXPECT_EQ(ReadFile(file), "# head\r\n\r\n[a]\r\nx = 1\r\n [new]name] ; why\r\n# note on k\r\n"
                              "k=\"v\"\nm=\"w\"\njunk\r\n[z]\nx=\"1\"");
    ASSERT_EQ(set(file, "added", "added", {{"k", "v"}}), 0);
    EXPECT_EQ(value(file, "z", "x"), "1");
    EXPECT_EQ(names(file), Strings({"a", "new]name", "z", "added"}));
}

TEST_F(Sections, KeepsModeAndLinkAndLeavesNoDraft) {
    const std::string link = folder_.path("link");
    ASSERT_EQ(symlink("sub/real", link.c_str()), 0);
    ASSERT_EQ(mkdir(folder_.path("sub").c_str(), 0755), 0);
    ASSERT_EQ(set(link, "s", "s", {{"k", "v"}}), 0) << "through a link to a file that is not there yet";
    ASSERT_EQ(chmod(link.c_str(), 0640), 0);
    ASSERT_EQ(set(link, "s", "s", {{"k", "w"}}), 0);
    struct stat found {};
    ASSERT_EQ(lstat(link.c_str(), &found), 0);
    EXPECT_TRUE(S_ISLNK(found.st_mode));
    ASSERT_EQ(stat(link.c_str(), &found), 0);
    EXPECT_EQ(found.st_mode & 07777, 0640U);
    EXPECT_EQ(value(link, "s", "k"), "w");
    const std::filesystem::directory_iterator left(folder_.path("sub"));
    EXPECT_EQ(std::distance(begin(left), end(left)), 1) << "a draft was left behind";
}

TEST_F(Sections, KeyValueIsTheFirstInTheFileCutToFit) {
    const std::string file = folder_.write("file", "a=\"yes\"\n[s]\nb=first\n[t]\nb=second\n");
    const std::tuple<const char*, int, int, const char*> cases[] = {
        {"a", 16, 0, "yes"}, {"b", 16, 0, "first"}, {"b", 3, 0, "fi"}, {"c", 16, -1, "?"}, {"a", 0, -1, "?"}};
    for (const auto& [key, size, result, text] : cases) {
        char out[16] = "?";
        EXPECT_EQ(QLIBCFileGetKeyValue(file.c_str(), key, out, size, 0), result) << key;
        EXPECT_STREQ(out, text);
    }
}

}  // namespace
