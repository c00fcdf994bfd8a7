// The line numbers in messages of the system log. Readers and their filters know each failure by its number, so the
// numbers never change: they are not lines of these sources.
#ifndef COMMON_LOGPLACES_H
#define COMMON_LOGPLACES_H

namespace quor::place {

// "dbhandler"
constexpr int kReloadFailed = 88;
constexpr int kStatementFailed = 125;

// "dbutil"
constexpr int kSelectPath = 464;
constexpr int kCountPath = 573;
constexpr int kDeletePath = 653;
constexpr int kValuesPath = 697;
constexpr int kValuesAttribute = 702;
constexpr int kVersionPath = 853;
constexpr int kNamesPath = 887;
constexpr int kLookupMap = 956;
constexpr int kSamplesPath = 982;
constexpr int kTotalPath = 1051;
constexpr int kDevicePath = 1092;
constexpr int kHistogramPath = 1134;

// "utils"
constexpr int kReadRuleMemory = 81;
constexpr int kReadRule = 85;
constexpr int kWriteRuleMemory = 124;
constexpr int kWriteRule = 139;
constexpr int kMailSettings = 161;
constexpr int kMailSwitch = 166;
constexpr int kSmsSettings = 178;
constexpr int kMobileSwitch = 188;
constexpr int kMsnSwitch = 196;
constexpr int kSkypeSwitch = 204;

// "logger"
constexpr int kClearRecord = 54;

}  // namespace quor::place

#endif
