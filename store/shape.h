// Messages that differ only in their numbers have one shape.
#ifndef STORE_SHAPE_H
#define STORE_SHAPE_H

#include <string>
#include <string_view>

#include "common/handles.h"

namespace quor::store {

// In place of each number, whatever its length: a control code, since "#" may be part of a message.
constexpr char kNumberMark = '\x1a';

std::string ShapeOf(std::string_view text);

// From now on statements of the connection know `shape(text)`.
void AddShape(const Connection& connection);

}  // namespace quor::store

#endif
