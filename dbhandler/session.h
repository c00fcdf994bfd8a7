// A database for the length of one call.
#ifndef DBHANDLER_SESSION_H
#define DBHANDLER_SESSION_H

#include <string>

#include "common.h"
#include "dbhandler.h"

namespace quor {

class DbSession {
  public:
    DbSession(const std::string& path, const char* schema) : handler_(path, schema) {}
    DbSession(const DbSession&) = delete;
    DbSession& operator=(const DbSession&) = delete;
    ~DbSession() { (void)handler_.DBDiscon(); }

    // Creates a missing database. Reports a failure.
    bool connect() {
        if (handler_.DBCon() < 0) {
            Debuger::MSG(0, "Fail to connect db");
            return false;
        }
        return true;
    }

    DBHandler& handler() { return handler_; }
    DBHandler* operator->() { return &handler_; }

  private:
    DBHandler handler_;
};

}  // namespace quor

#endif
