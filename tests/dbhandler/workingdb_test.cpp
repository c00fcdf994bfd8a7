#include "dbhandler.h"
#include "support/services.h"
#include "support/testing.h"

using namespace quor::test;
namespace fs = std::filesystem;

namespace {

class WorkingDb : public testing::Test {
  protected:
    WorkingDb() {
        WriteFile(marker_, "");
        FakeServices() = {};
        TakeSystemLogTexts();
    }
    ~WorkingDb() override { fs::remove(marker_); }

    const std::string marker_ = quor::paths::kPackageEnabled;
    const TempFolder folder_;
};

TEST_F(WorkingDb, HangsUpTheSyslogNgThatIsInCharge) {
    EXPECT_EQ(SyslogngHupSignalSend(), 0);
    FakeServices().fail = true;
    EXPECT_EQ(SyslogngHupSignalSend(), -1);
    fs::remove(marker_);
    EXPECT_EQ(SyslogngHupSignalSend(), -1);
    FakeServices().fail = false;
    EXPECT_EQ(SyslogngHupSignalSend(), 0);
    EXPECT_EQ(FakeServices().reloaded,
              Strings({"job pkg-Orvane-syslog", "job pkg-Orvane-syslog", "service syslog-ng", "service syslog-ng"}));
    EXPECT_EQ(TakeSystemLogTexts(),
              Strings({"Fail to send HUP signal to pkg-Orvane-syslog", "Fail to send HUP signal to syslog-ng"}));
}

TEST_F(WorkingDb, IsRemovedAboveItsLimitInWholeKibibytes) {
    using Case = std::tuple<uintmax_t, int, bool>;
    for (const auto& [bytes, limitKB, kept] :
         {Case{3 * 1024ULL + 1023, 3, true}, Case{4 * 1024ULL, 3, false}, Case{0, 0, true}, Case{0, -1, false},
          Case{5ULL << 40, 2147483647, false}}) {
        SCOPED_TRACE(testing::Message() << bytes << " bytes, limit " << limitKB);
        FakeServices() = {};
        const std::string path = folder_.write("log.db", "");
        folder_.write("log.db-wal", "");
        fs::resize_file(path, bytes);
        EXPECT_EQ(SyslogngWorkingDbCheck(path, limitKB), 0);
        EXPECT_EQ(fs::exists(path), kept);
        EXPECT_EQ(FakeServices().reloaded.size(), kept ? 0U : 1U);
        EXPECT_TRUE(fs::exists(path + "-wal"));
    }
}

TEST_F(WorkingDb, MustBeARegularFile) {
    EXPECT_EQ(SyslogngWorkingDbCheck(folder_.path("none"), 0), -1);
    EXPECT_EQ(TakeSystemLogTexts(), Strings());
    EXPECT_EQ(SyslogngWorkingDbCheck(folder_.path(), 0), -1);
    EXPECT_EQ(TakeSystemLogTexts(), Strings({"Working database is not regular file"}));
}

TEST_F(WorkingDb, IsSwitchedToWriteAheadJournaling) {
    const std::string path = folder_.path("log.db");
    SqliteFile(path).run("CREATE TABLE logs(x)");
    EXPECT_EQ(SyslogngWorkingDbSetJouWal(path), 0);
    EXPECT_EQ(SqliteFile(path).query("PRAGMA journal_mode"), Strings({"wal"}));
    EXPECT_EQ(SyslogngWorkingDbSetJouWal(folder_.path("a b")), 0) << "the shell ran";
    EXPECT_EQ(TakeSystemLogTexts(), Strings());
}

}  // namespace
