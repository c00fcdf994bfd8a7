#include <gtest/gtest.h>

#include "common/paths.h"
#include "dbhandler.h"
#include "support/services.h"
#include "support/sqlite_file.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace {

using quor::test::FakeServices;
using quor::test::TakeSystemLogTexts;
using Strings = std::vector<std::string>;
namespace fs = std::filesystem;

class WorkingDb : public testing::Test {
  protected:
    WorkingDb() {
        fs::create_directories(fs::path(marker_).parent_path());
        fs::remove(marker_);
        FakeServices() = {};
        TakeSystemLogTexts();
    }
    ~WorkingDb() override { fs::remove(marker_); }

    void enablePackage() const { std::ofstream(marker_).put('\n'); }

    const std::string marker_ = quor::paths::kPackageEnabled;
    const quor::test::TempFolder folder_;
};

}  // namespace

TEST_F(WorkingDb, HangsUpTheSyslogNgThatIsInCharge) {
    EXPECT_EQ(SyslogngHupSignalSend(), 0);
    enablePackage();
    EXPECT_EQ(SyslogngHupSignalSend(), 0);
    FakeServices().fail = true;
    EXPECT_EQ(SyslogngHupSignalSend(), -1);
    fs::remove(marker_);
    EXPECT_EQ(SyslogngHupSignalSend(), -1);
    EXPECT_EQ(FakeServices().reloaded,
              Strings({"service syslog-ng", "job pkg-Orvane-syslog", "job pkg-Orvane-syslog", "service syslog-ng"}));
    EXPECT_EQ(TakeSystemLogTexts(),
              Strings({"Fail to send HUP signal to pkg-Orvane-syslog", "Fail to send HUP signal to syslog-ng"}));
}

TEST_F(WorkingDb, IsRemovedAboveItsLimitInWholeKibibytes) {
    struct Case {
        uintmax_t bytes;
        int limitKB;
        bool kept;
    };
    for (const Case& c : {Case{3 * 1024ULL + 1023, 3, true}, Case{4 * 1024ULL, 3, false}, Case{0, 0, true},
                          Case{0, -1, false}, Case{5ULL << 40, 2147483647, false}}) {
        SCOPED_TRACE(testing::Message() << c.bytes << " bytes, limit " << c.limitKB);
        FakeServices() = {};
        const std::string path = folder_.write("log.db", "");
        folder_.write("log.db-wal", "");
        fs::resize_file(path, c.bytes);
        EXPECT_EQ(SyslogngWorkingDbCheck(path, c.limitKB), 0);
        EXPECT_EQ(fs::exists(path), c.kept);
        EXPECT_EQ(FakeServices().reloaded.size(), c.kept ? 0U : 1U);
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
    quor::test::SqliteFile(path).run("CREATE TABLE logs(x)");
    EXPECT_EQ(SyslogngWorkingDbSetJouWal(path), 0);
    EXPECT_EQ(quor::test::SqliteFile(path).query("PRAGMA journal_mode"), Strings({"wal"}));
    EXPECT_EQ(SyslogngWorkingDbSetJouWal(folder_.path("a b")), 0) << "the shell ran";
    EXPECT_EQ(TakeSystemLogTexts(), Strings());
}
