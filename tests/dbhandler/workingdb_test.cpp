#include "dbhandler.h"
#include "support/database.h"
#include "support/services.h"

using namespace quor::test;
namespace fs = std::filesystem;

namespace {

class WorkingDb : public DatabaseTest {
  protected:
    WorkingDb() {
        WriteFile(marker_, "");
        FakeServices() = {};
    }
    ~WorkingDb() override { fs::remove(marker_); }

    const std::string marker_ = quor::paths::kPackageEnabled;
};

TEST_F(WorkingDb, HangsUpTheSyslogNgThatIsInCharge) {
    for (const std::string name : {"pkg-Orvane-syslog", "syslog-ng"}) {
        FakeServices() = {};
        EXPECT_EQ(SyslogngHupSignalSend(), 0);
        FakeServices().fail = true;
        EXPECT_EQ(SyslogngHupSignalSend(), -1);
        const std::string call = (name == "syslog-ng" ? "service " : "job ") + name;
        EXPECT_EQ(FakeServices().reloaded, Strings({call, call}));
        expectLog({"Fail to send HUP signal to " + name});
        fs::remove(marker_);
    }
}

TEST_F(WorkingDb, IsRemovedAboveItsLimitInWholeKibibytes) {
    using Case = std::tuple<uintmax_t, int, bool>;
    for (const auto& [bytes, limitKB, kept] :
         {Case{3 * 1024ULL + 1023, 3, true}, Case{4 * 1024ULL, 3, false}, Case{0, 0, true}, Case{0, -1, false},
          Case{(4ULL << 30U) + 1023, 4194304, true}, Case{5ULL << 40U, 2147483647, false}}) {
        SCOPED_TRACE(testing::Message() << bytes << " bytes, limit " << limitKB);
        FakeServices() = {};
        folder_.write("log.db", "");
        folder_.write("log.db-wal", "");
        fs::resize_file(path_, bytes);
        EXPECT_EQ(SyslogngWorkingDbCheck(path_, limitKB), 0);
        EXPECT_EQ(fs::exists(path_), kept);
        EXPECT_EQ(FakeServices().reloaded.size(), kept ? 0U : 1U);
        EXPECT_TRUE(fs::exists(path_ + "-wal"));
    }
    EXPECT_EQ(SyslogngWorkingDbCheck(folder_.path("none"), 0), -1);
    expectLog({});
    EXPECT_EQ(SyslogngWorkingDbCheck(folder_.path(), 0), -1);
    expectLog({"Working database is not regular file"});
}

}  // namespace
