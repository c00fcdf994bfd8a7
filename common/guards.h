// Owners of the platform's C handles: adopt a handle on the line after the call that made it.
//
//     quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path));
//     quor::Result result;
//     if (QUORDBExecute(connection.get(), sql, quor::Adopt(result)) < 0) return -1;
#ifndef COMMON_GUARDS_H
#define COMMON_GUARDS_H

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <utility>

#include "quor/quorcore.h"
#include "quor/quordb.h"

namespace quor {

template <auto Release>
struct Releaser {
    template <typename T>
    void operator()(T* handle) const {
        (void)Release(handle);  // nothing can be done about a failed release
    }
};

using Connection = std::unique_ptr<DBConnect_tag, Releaser<QUORDBClose>>;
using Result = std::unique_ptr<DBResult_tag, Releaser<QUORDBFreeResult>>;
using StringTable = std::unique_ptr<QLIBSZHASH, Releaser<QLIBCSzHashFree>>;
using StringList = std::unique_ptr<QLIBSZLIST, Releaser<QLIBCSzListFree>>;
using PlatformText = std::unique_ptr<char, Releaser<QLIBCStrPut>>;
using File = std::unique_ptr<FILE, Releaser<fclose>>;
using CText = std::unique_ptr<char, Releaser<free>>;

// An open file descriptor, or none.
class Descriptor {
  public:
    explicit Descriptor(int number = -1) : number_(number) {}
    Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Descriptor& operator=(Descriptor&& other) noexcept {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Descriptor() {
        if (*this) {
            (void)close(number_);  // what matters was written before, and checked
        }
    }
    explicit operator bool() const { return number_ >= 0; }
    int get() const { return number_; }

  private:
    int number_;
};

// Lends a guard to a call that takes a pointer to the handle; the guard owns whatever the call leaves there. A call
// that only fills the handle in drops what it held: reset() the guard before it.
template <typename Guard>
class Adopt {
  public:
    explicit Adopt(Guard& guard) : guard_(guard), handle_(guard.release()) {}
    Adopt(const Adopt&) = delete;
    Adopt& operator=(const Adopt&) = delete;
    ~Adopt() { guard_.reset(handle_); }
    operator typename Guard::pointer *() { return &handle_; }  // NOLINT(google-explicit-constructor): used in calls

  private:
    Guard& guard_;
    typename Guard::pointer handle_;
};

}  // namespace quor

#endif
