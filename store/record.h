// One log row with everything that its table keeps.
#ifndef STORE_RECORD_H
#define STORE_RECORD_H

#include <cstdint>
#include <string>

#include "dbutil.h"

namespace quor::store {

// What the library's record has no place for. Databases of former versions lack these columns: then they are empty.
struct Record : _SYSLOG_LOG_DATA_tag {
    std::string pid;    // process id, as the sender gave it
    std::string msgid;  // message id
    std::string sdata;  // structured data
    int64_t rsec = 0;   // Unix seconds of the reception
};

}  // namespace quor::store

#endif
