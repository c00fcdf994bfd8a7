#include <gtest/gtest.h>
#include <sys/stat.h>

#include "quor/quorfs.h"
#include "support/temp_folder.h"

namespace {

TEST(MkdirP, CreatesMissingParentsWithTheMode) {
    const quor::test::TempFolder folder;
    const mode_t mask = umask(027);
    EXPECT_EQ(QUORFSMkdirP(folder.path("a//b/c/").c_str(), 0, 1, -1, -1, 0777), 0);
    umask(mask);
    struct stat found {};
    ASSERT_EQ(stat(folder.path("a/b").c_str(), &found), 0);
    EXPECT_EQ(found.st_mode & 07777, 0750U);
    EXPECT_EQ(QUORFSMkdirP(folder.path("a/b/c").c_str(), 0, 1, -1, -1, 0700), 0) << "exists already";
}

TEST(MkdirP, FailsWhereAFolderCannotBe) {
    const quor::test::TempFolder folder;
    const std::string file = folder.write("file", "");
    for (const std::string& path : {std::string(), file, file + "/below", std::string("/proc/none")}) {
        EXPECT_LT(QUORFSMkdirP(path.c_str(), 0, 1, -1, -1, 0777), 0) << path;
    }
    EXPECT_LT(QUORFSMkdirP(nullptr, 0, 1, -1, -1, 0777), 0);
}

}  // namespace
