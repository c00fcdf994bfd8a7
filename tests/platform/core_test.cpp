#include <sys/stat.h>
#include <sys/wait.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <map>

#include "common/handles.h"
#include "quor/quorcore.h"
#include "quor/quorfs.h"
#include "quor/quorservice.h"
#include "tests/support/testing.h"

using namespace quor::test;

constexpr char kLine[] = "%s=\"%s\"\n";

// No process is signalled: the only one that there is no longer is kGone.
constexpr pid_t kGone = 4712;
pid_t hungUp = 0;

// The system's own parameters have reserved names. NOLINTNEXTLINE(readability-inconsistent-declaration-parameter-name)
extern "C" __attribute__((visibility("default"))) int kill(pid_t process, int number) noexcept {
    hungUp = number == SIGHUP && process != kGone ? process : 0;
    return process != kGone ? 0 : -1;
}

namespace {

TEST(Core, KeepsTablesAndFailsOnNull) {
    quor::StringTable table(QLIBCSzHashAlloc(1));
    for (const auto& [key, value] : {std::pair("a", "1"), std::pair("b", "2"), std::pair("a", "3")}) {
        EXPECT_EQ(QLIBCSzHashSetValue(quor::Adopt(table), key, value), 0);
    }
    EXPECT_STREQ(QLIBCSzHashGetValue(table.get(), "a"), "3");
    EXPECT_EQ(QLIBCSzHashGetValue(table.get(), "c"), nullptr);
    EXPECT_STREQ(quor::CText(QLIBCStrGet("%d%s", 7, "x")).get(), "7x");
    EXPECT_TRUE(QLIBCFileExist("/") == 1 && QLIBCFileExist("/nowhere/f") == 0 && QLIBCFileExist(nullptr) == 0);

    QLIBSZHASH* noTable = nullptr;
    QLIBSZLIST* noList = nullptr;
    QLIBSZHASH* some = table.get();
    char out[2] = "";
    EXPECT_TRUE(QLIBCSzHashSetValue(nullptr, "k", "v") < 0 && QLIBCSzHashSetValue(&noTable, "k", "v") < 0);
    EXPECT_TRUE(QLIBCFileEnumSection(nullptr, &noList) < 0 && QLIBCFileEnumSection("/etc/passwd", &noList) < 0);
    EXPECT_TRUE(QLIBCFileGetSection("/etc/passwd", nullptr, &some) < 0 && QLIBCFileGetSection("/", "s", &noTable) < 0);
    EXPECT_TRUE(QLIBCFileSetSection("/nowhere/f", "s", nullptr, some, kLine) < 0);
    EXPECT_TRUE(QLIBCFileGetKeyValue(nullptr, "k", out, 2, 0) < 0 && QLIBCFileGetKeyValue("/", "k", out, 0, 0) < 0);
    EXPECT_TRUE(QLIBCExec(nullptr) < 0 && QLIBServiceReload(nullptr) < 0);
    EXPECT_TRUE(QUORFSMkdirP(nullptr, 0, 0, -1, -1, 0700) < 0 && QUORFSMkdirP("", 0, 0, -1, -1, 0700) < 0);
    EXPECT_TRUE(QLIBCSzHashAlloc(0) == nullptr && QLIBCSzListAlloc(0) == nullptr);
    EXPECT_TRUE(QLIBCSzHashGetValue(nullptr, "k") == nullptr && QLIBCSzHashGetValue(some, nullptr) == nullptr);
    QLIBCSzListFree(nullptr);
}

int shell(const std::string& command) {
    return QLIBCExec("/bin/sh", "-c", command.c_str(), nullptr, nullptr);
}

TEST(Exec, TellsHowTheProgramEndedAndLeavesOtherChildrenToTheirOwner) {
    FILE* const other = popen("exit 5", "re");
    EXPECT_EQ(shell("exit 3"), 3);
    EXPECT_EQ(WEXITSTATUS(pclose(other)), 5);
    EXPECT_EQ(shell("kill -KILL $$"), 128 + SIGKILL);
    EXPECT_EQ(QLIBCExec("/usr/bin/test", "$(id) `x` 'y' *", "=", "$(id) `x` 'y' *", nullptr), 0) << "no shell";
    (void)signal(SIGCHLD, SIG_IGN);
    EXPECT_EQ(shell("exit 3"), 0) << "nobody is told";
    (void)signal(SIGCHLD, SIG_DFL);
}

// Not under emulation, which runs the child of vfork on its own.
TEST(Exec, FailsWhenNothingCouldBeRun) {
    EXPECT_LT(QLIBCExec("/no/such/program", "-c", nullptr), 0);
    EXPECT_LT(QLIBCExec("/etc/passwd", nullptr), 0) << "not executable";
}

TEST(Exec, GivesAProgramNoDescriptorAndNoSignalSetting) {
    const int inherited = dup2(STDERR_FILENO, 57);  // no close-on-exec
    EXPECT_EQ(shell("test /dev/null -ef /proc/self/fd/0 && test /dev/null -ef /proc/self/fd/1"), 0);
    EXPECT_NE(shell("test -e /proc/self/fd/57"), 0);
    close(inherited);
    sigset_t all;
    sigfillset(&all);
    sigprocmask(SIG_BLOCK, &all, nullptr);
    for (const int number : {SIGHUP, SIGINT, SIGPIPE, SIGTERM}) {
        const auto before = signal(number, SIG_IGN);
        EXPECT_EQ(shell("kill -" + std::to_string(number) + " $$; exit 0"), 128 + number);
        (void)signal(number, before);
    }
    sigprocmask(SIG_UNBLOCK, &all, nullptr);
}

TEST(MkdirP, CreatesMissingParentsWithModeAndOwner) {
    const TempFolder folder;
    const mode_t mask = umask(027);
    EXPECT_EQ(QUORFSMkdirP(folder.path("a//b/c/").c_str(), 0, 1, -1, -1, 0777), 0);
    umask(mask);
    EXPECT_EQ(std::filesystem::status(folder.path("a/b")).permissions(), std::filesystem::perms{0750});
    EXPECT_EQ(QUORFSMkdirP(folder.path("a/b/c").c_str(), 0, 1, -1, -1, 0700), 0) << "exists already";
    EXPECT_LT(QUORFSMkdirP(folder.write("file", "").c_str(), 0, 1, -1, -1, 0777), 0) << "is not a folder";
    EXPECT_EQ(QUORFSMkdirP(folder.path("given").c_str(), 0, 1, 4711, -1, 0700) == 0, geteuid() == 0);
    struct stat found {};
    ASSERT_EQ(stat(folder.path("given").c_str(), &found), 0);
    EXPECT_EQ(found.st_uid == 4711, geteuid() == 0);
}

// Who is hung up when the pid file holds this text; the result says whether anybody was.
pid_t hungUpBy(const std::string& service, const std::string& file, const std::string& text) {
    const std::string run = quor::paths::kRunFolder;
    WriteFile(run + "/" + file + ".pid", text);
    hungUp = 0;
    EXPECT_EQ(QLIBServiceReload(service.c_str()), QLIBServicectlJobReload(service.c_str()));
    EXPECT_EQ(QLIBServiceReload(service.c_str()), hungUp != 0 ? 0 : -1);
    std::filesystem::remove_all(run);
    return hungUp;
}

TEST(ServiceReload, HangsUpTheProcessOfThePidFileAndNoOther) {
    EXPECT_EQ(hungUpBy("nested", "nested/nested", "4711\n"), 4711);
    EXPECT_EQ(hungUpBy("aZ09@._:-", "aZ09@._:-", "2"), 2);
    EXPECT_EQ(hungUpBy("flat", "other", "4711"), 0);
    const std::pair<const char*, const char*> refused[] = {
        {"flat", ""},      {"flat", "0"},           {"flat", "1"},        {"flat", "-1"},
        {"flat", "4711x"}, {"flat", "99999999999"}, {"flat", "4712"},     {"-flat", "4711"},
        {".flat", "4711"}, {"fl*t", "4711"},        {"sub/flat", "4711"}, {"", "4711"}};
    for (const auto& [service, text] : refused) {
        EXPECT_EQ(hungUpBy(service, service, text), 0) << service << ": " << text;
    }
}

using Entries = std::map<std::string, std::string>;

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

// Files, and the value of the key k in their section s.
TEST_F(Sections, ReadsWhatPeopleWrite) {
    const std::pair<const char*, const char*> cases[] = {
        {"\xEF\xBB\xBF[s]\r\nk=\"v\"\r\n", "v"},
        {"[s]  # a comment [with] brackets\n\t k  =  v w \t\n", "v w"},
        {"k=outside\n[t]\nk=t\n[s]\n#k=1\n;k=2\nk=v=w # kept\nk=second\n", "v=w # kept"},
        {"[s]\nk=\"a\"b\\\"\n", "a\"b\\"},
        {"[s]\nK=other\nnonsense\n=v\n", "no key"},
        {"[s]\n[s]\nk=of the second\n", "no key"},
        {"[ s ]\n[]\n[S]\nk=v\n", "no section"}};
    for (const auto& [text, expected] : cases) {
        EXPECT_EQ(value(folder_.write("file", text), "s", "k"), expected) << text;
    }
    QLIBSZLIST* list = QLIBCSzListAlloc(4);
    EXPECT_EQ(QLIBCFileEnumSection(folder_.write("file", "[a]").c_str(), &list), 0);
    QLIBCSzListFree(list);
    EXPECT_EQ(names(folder_.write("file", "[b]\n[a]c]\nx=1\n[b]\n[broken\n[]\n [ d]")), Strings({"b", "a]c", " d"}));
}

TEST_F(Sections, FailsOnWhatIsNotATextFile) {
    EXPECT_EQ(names(folder_.path("missing")), Strings{"unreadable"});
    const std::string pipe = folder_.path("pipe");
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    for (const std::string& file : {pipe, folder_.write("binary", std::string("[s]\nk=\"v\"\n\0", 11)),
                                    folder_.write("huge", std::string((1U << 20U) + 1, '\n'))}) {
        EXPECT_EQ(names(file), Strings{"unreadable"}) << file;
        EXPECT_EQ(value(file, "s", "k"), "no section") << file;
        EXPECT_LT(set(file, "s", "s", {{"k", "v"}}), 0) << file;
    }
}

TEST_F(Sections, RefusesWhatWouldNotReadBack) {
    const std::string before = "[s]\nk=\"old\"\n[t]\nk=\"t\"";
    const std::string file = folder_.write("file", before);
    EXPECT_LT(set(file, "s", "s", {{"k", "a\"\n[t]\nk=\"b"}}), 0);
    EXPECT_LT(set(file, "s", "s", {{"k", " v"}}, "%s=%s\n"), 0);
    EXPECT_LT(set(file, "s", "a\nb", {{"k", "v"}}), 0);
    EXPECT_LT(set(file, "s", "t", {{"k", "v"}}), 0) << "another section";
    for (const char* key : {"a\nb", "a=b", "#a", ""}) {
        EXPECT_LT(set(file, "s", "s", {{key, "v"}}), 0) << key;
    }
    for (const char* format : {"%s=\"%n\"\n", "%s=\n", "%s=%s", "%s=%s\n\n", "%s=%s%%\n", "%s%s\n"}) {
        EXPECT_LT(set(file, "s", "s", {{"k", "v"}}, format), 0) << format;
    }
    EXPECT_EQ(ReadFile(file), before);
}

TEST_F(Sections, TouchesNothingElse) {
    const std::string file = folder_.write("file", "# head\r\n\r\n[a]\r\nx = 1\r\n [s] ; why\r\n# note on k\r\n"
                                                   "k=old\r\nk=again\r\ngone=1\r\njunk\r\n[z]\nx=\"1\"");
    ASSERT_EQ(set(file, "s", "new]name", {{"k", "v"}, {"m", "w"}}), 0);
    EXPECT_EQ(ReadFile(file), "# head\r\n\r\n[a]\r\nx = 1\r\n [new]name] ; why\r\n# note on k\r\n"
                              "k=\"v\"\nm=\"w\"\njunk\r\n[z]\nx=\"1\"");
    const std::string odd(" \"=[x]#; \\\"\"\t\xFF%s\r");
    ASSERT_EQ(set(file, "added", "added", {{"k", odd}, {"l", ""}}), 0);
    EXPECT_EQ(value(file, "added", "k") + value(file, "added", "l"), odd);
    EXPECT_EQ(value(file, "z", "x"), "1");
    EXPECT_EQ(names(file), Strings({"a", "new]name", "z", "added"}));
    const std::string last = folder_.write("last", "[s]\nb=\"1\"\nx=\"1\"");
    ASSERT_EQ(set(last, "s", "s", {{"b", "1"}, {"x", "2"}, {"y", "3"}}, "  %s = \"%s\"\n"), 0);
    EXPECT_EQ(ReadFile(last), "[s]\n  b = \"1\"\n  x = \"2\"\n  y = \"3\"\n");
}

TEST_F(Sections, KeepsModeAndLinkAndLeavesNoDraft) {
    const std::string link = folder_.path("link");
    std::filesystem::create_symlink("sub/real", link);
    std::filesystem::create_directory(folder_.path("sub"));
    ASSERT_EQ(set(link, "s", "s", {{"k", "v"}}), 0) << "through a link to a file that is not there yet";
    std::filesystem::permissions(link, std::filesystem::perms{0640});
    ASSERT_EQ(set(link, "s", "s", {{"k", "w"}}), 0);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
    EXPECT_EQ(std::filesystem::status(link).permissions(), std::filesystem::perms{0640});
    EXPECT_EQ(value(link, "s", "k"), "w");
    const std::filesystem::directory_iterator left(folder_.path("sub"));
    EXPECT_EQ(std::distance(begin(left), end(left)), 1) << "a draft was left behind";
}

TEST_F(Sections, KeyValueIsTheFirstInTheFileCutToFit) {
    const std::string file = folder_.write("file", "a=\"yes\"\n[s]\nb=first\n[t]\nb=second\n");
    char out[8] = "";
    EXPECT_EQ(QLIBCFileGetKeyValue(file.c_str(), "b", out, 3, 0), 0);
    EXPECT_STREQ(out, "fi");
    EXPECT_EQ(QLIBCFileGetKeyValue(file.c_str(), "b", out, 1, 0) + static_cast<int>(strlen(out)), 0);
    EXPECT_EQ(QLIBCFileGetKeyValue(file.c_str(), "c", out, 8, 0), -1);
}

}  // namespace
