#include "output.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <functional>

#include "failure.h"

using namespace quor::cli;

namespace {

const Columns kColumns = {{"id", Kind::Number}, {"host"}, {"prio", Kind::Level}, {"msg"}};

// What `write` sends through a pipe.
std::string captured(const std::function<void(Output&)>& write) {
    int ends[2];
    EXPECT_EQ(pipe(ends), 0);
    Output out(ends[1]);
    write(out);
    close(ends[1]);
    std::string text(60000, '\0');
    text.resize(static_cast<size_t>(std::max<ssize_t>(0, read(ends[0], text.data(), text.size()))));
    close(ends[0]);
    return text;
}

std::string written(const Style& style, const std::vector<Cells>& rows) {
    return captured([&](Output& out) {
        const auto sink = MakeSink(style, kColumns, out);
        for (const Cells& cells : rows) {
            sink->row(cells);
        }
        sink->finish();
    });
}

Style styled(Format format, bool terminal = false) {
    Style style;
    style.format = format;
    style.terminal = terminal;
    style.color = terminal;
    return style;
}

const std::vector<Cells> kRows = {{"7", "web", "err", "a\"b"}, {"12", "\xE6\x97\xA5", "info", "-x,\033[m"}};

TEST(Output, EveryFormHoldsEveryRow) {
    EXPECT_EQ(written(styled(Format::Ndjson), kRows),
              "{\"id\":7,\"host\":\"web\",\"prio\":\"err\",\"msg\":\"a\\\"b\"}\n"
              "{\"id\":12,\"host\":\"\xE6\x97\xA5\",\"prio\":\"info\",\"msg\":\"-x,\\u001b[m\"}\n");
    EXPECT_EQ(written(styled(Format::Json), {kRows[0], kRows[0]}),
              "[{\"id\":7,\"host\":\"web\",\"prio\":\"err\",\"msg\":\"a\\\"b\"},\n"
              "{\"id\":7,\"host\":\"web\",\"prio\":\"err\",\"msg\":\"a\\\"b\"}]\n");
    EXPECT_EQ(written(styled(Format::Csv), kRows),
              "id,host,prio,msg\r\n7,web,err,\"a\"\"b\"\r\n12,\xE6\x97\xA5,info,\"-x,\033[m\"\r\n");
    EXPECT_EQ(written(styled(Format::Table), kRows), "ID  HOST  PRIO  MSG\n"
                                                     " 7  web   err   a\"b\n"
                                                     "12  \xE6\x97\xA5    info  -x,\\x1b[m\n");
}

TEST(Output, WithoutRowsIsStillWhole) {
    EXPECT_EQ(written(styled(Format::Ndjson), {}), "");
    EXPECT_EQ(written(styled(Format::Json), {}), "[]\n");
    EXPECT_EQ(written(styled(Format::Csv), {}), "id,host,prio,msg\r\n");
    EXPECT_EQ(written(styled(Format::Table), {}), "");
}

TEST(Output, ATerminalSeesColoursOfOursOnly) {
    EXPECT_EQ(written(styled(Format::Table, true), kRows), "ID  HOST  PRIO  MSG\n"
                                                           " 7  web   \033[31merr\033[0m   a\"b\n"
                                                           "12  \xE6\x97\xA5    info  -x,\\x1b[m\n");
    EXPECT_EQ(written(styled(Format::Csv, true), {kRows[1]}),
              "id,host,prio,msg\r\n12,\xE6\x97\xA5,info,\"-x,\\x1b[m\"\r\n");
}

TEST(Output, ALongTableStreamsInTheWidthsOfItsFirstRows) {
    const std::string longHost(60, 'h');
    std::vector<Cells> rows(300, Cells{"1", "web", "err", "m"});
    rows.push_back({"123", longHost, "err", "m"});
    const std::string table = written(styled(Format::Table), rows);
    EXPECT_EQ(table.substr(0, 40), "ID  HOST  PRIO  MSG\n 1  web   err   m\n 1");
    EXPECT_EQ(table.substr(table.rfind('\n', table.size() - 2) + 1), "123  " + longHost + "  err   m\n");
}

TEST(Output, ARecordStandsBelowEachOtherOrInOneRow) {
    const std::vector<Value> values = {{"path", "/a\n"}, {"rows", "3", Kind::Number}};
    const auto record = [&](Format format) {
        return captured([&](Output& out) { WriteRecord(styled(format), values, out); });
    };
    EXPECT_EQ(record(Format::Json), "[{\"path\":\"/a\\n\",\"rows\":3}]\n");
    EXPECT_EQ(record(Format::Table), "path  /a\\n\nrows  3\n");
}

TEST(Output, AFullDiskIsNoticed) {
    const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
    Output out(full);
    const auto sink = MakeSink(styled(Format::Ndjson), kColumns, out);
    const std::string message(100, 'm');
    EXPECT_THROW(
        {
            for (int i = 0; i < 1000; ++i) {
                sink->row({"1", "h", "err", message});
            }
        },
        Failure);
    close(full);
}

}  // namespace
