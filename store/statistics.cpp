#include "store/statistics.h"

#include <algorithm>
#include <ctime>
#include <numeric>

#include "store/ask.h"
#include "store/failure.h"

namespace quor::store {
namespace {

constexpr int64_t kZoneUnit = 900;  // clocks of all zones differ by multiples of it
constexpr int64_t kMostStretches = 10000;

std::string within(const TimeSpan& span) {
    return " FROM eps WHERE stamp BETWEEN " + std::to_string(span.first) + " AND " + std::to_string(span.last);
}

// Seconds since the last multiple of `step` on local clocks.
int64_t pastMark(int64_t seconds, int64_t step) {
    const auto clock = static_cast<time_t>(seconds);
    const tm* local = localtime(&clock);
    const int64_t shown = seconds + (local == nullptr ? 0 : int64_t{local->tm_gmtoff});
    return ((shown % step) + step) % step;
}

std::string dateAndTime(const std::string& date, const std::string& time) {
    return date.empty() || time.empty() ? date + time : date + " " + time;
}

// A stretch that was begun before, the next one after empty ones, or the first.
Stretch& stretchAt(std::vector<Stretch>& stretches, int64_t begin, int64_t step) {
    while (!stretches.empty() && stretches.back().begin + step <= begin) {
        if (static_cast<int64_t>(stretches.size()) == kMostStretches) {
            throw Failure("--every: that would be more than " + std::to_string(kMostStretches) +
                          " lines; give a longer time");
        }
        stretches.push_back({stretches.back().begin + step});
    }
    if (stretches.empty()) {
        stretches.push_back({begin});
    }
    return stretches.back();
}

}  // namespace

std::vector<DeviceCount> BusiestDevices(const std::string& db, const TimeSpan& span, uint64_t limit) {
    const std::string sql =
        "SELECT device, SUM(eps) AS logs" + within(span) + " GROUP BY device ORDER BY logs DESC, device";
    const _SYSLOG_SQL_LIMIT_tag window{limit, 0};
    const Result result = Execute(Connect(db), db, sql, &window);
    std::vector<DeviceCount> devices;
    for (Row row(result.get()); row.next();) {
        devices.push_back({row["device"], ToUint64(row["logs"])});
    }
    return devices;
}

int64_t OldestSample(const std::string& db) {
    return ToInt64(Ask(db, "SELECT ifnull(MIN(stamp), 0) AS stamp FROM eps", "stamp").front().c_str());
}

std::vector<Stretch> Stretches(const std::string& db, const TimeSpan& span, int64_t step) {
    const std::string unit = std::to_string(std::gcd(step, kZoneUnit));
    const Result result = Execute(Connect(db), db,
                                  "SELECT MIN(stamp) AS earliest, SUM(eps) AS logs" + within(span) +
                                      " GROUP BY stamp / " + unit + " ORDER BY 1");
    std::vector<Stretch> stretches;
    int64_t first = span.first;
    for (Row row(result.get()); row.next();) {
        const int64_t stamp = ToInt64(row["earliest"]);
        first = stretches.empty() ? std::max(first, stamp) : first;
        stretchAt(stretches, stamp - pastMark(stamp, step), step).logs += ToUint64(row["logs"]);
    }
    for (Stretch& stretch : stretches) {
        stretch.seconds = std::min(stretch.begin + step, span.last + 1) - std::max(stretch.begin, first);
    }
    return stretches;
}

// One walk through the index of hosts, and two rows for each.
std::vector<DeviceSeen> DevicesSeen(const std::string& db) {
    const Result result =
        Execute(Connect(db), db,
                "SELECT seen.host AS host, seen.rows AS rows, old.ldate AS olddate, old.ltime AS oldtime, new.ldate AS "
                "newdate, "
                "new.ltime AS newtime FROM (SELECT host, COUNT(*) AS rows, MIN(id) AS first, MAX(id) AS last FROM logs "
                "GROUP BY "
                "host) AS seen JOIN logs AS old ON old.id = seen.first JOIN logs AS new ON new.id = seen.last ORDER BY "
                "seen.last DESC");
    std::vector<DeviceSeen> devices;
    for (Row row(result.get()); row.next();) {
        devices.push_back({row["host"], ToUint64(row["rows"]), dateAndTime(row["olddate"], row["oldtime"]),
                           dateAndTime(row["newdate"], row["newtime"])});
    }
    return devices;
}

}  // namespace quor::store
