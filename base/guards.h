// Owners of what C interfaces hand out: adopt a handle on the line after the call that made it.
//
//     quor::File file(fopen(path, "re"));
//     quor::Guard<sqlite3_stmt, sqlite3_finalize> statement(raw);
#ifndef BASE_GUARDS_H
#define BASE_GUARDS_H

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <utility>

namespace quor {

template <auto Release>
struct Releaser {
    template <typename T>
    void operator()(T* handle) const {
        (void)Release(handle);  // nothing can be done about a failed release
    }
};

template <typename T, auto Release>
using Guard = std::unique_ptr<T, Releaser<Release>>;

using File = Guard<FILE, fclose>;
using CText = Guard<char, free>;

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
template <typename Owner>
class Adopt {
  public:
    explicit Adopt(Owner& owner) : owner_(owner), handle_(owner.release()) {}
    Adopt(const Adopt&) = delete;
    Adopt& operator=(const Adopt&) = delete;
    ~Adopt() { owner_.reset(handle_); }
    operator typename Owner::pointer *() { return &handle_; }  // NOLINT(google-explicit-constructor): used in calls

  private:
    Owner& owner_;
    typename Owner::pointer handle_;
};

}  // namespace quor

#endif
