// Lists of names as people give them.
#ifndef STORE_NAMES_H
#define STORE_NAMES_H

#include <list>
#include <string>
#include <vector>

namespace quor::store {

// Each text is a name, or several separated by commas; "\," is a comma of a name.
using Names = std::vector<std::string>;

// All names of the lists; none when there is no list, and when the only name is "any". With `whole` a text of several
// names is one, too: devices send names with commas. Failure, which names `option`, for an empty name and for "any"
// among others.
std::list<std::string> NamesOf(const Names& lists, const std::string& option, bool whole);

// The same for severities, as the database names them: "err+" is err and what is worse, and other programs' names and
// the numbers are understood. Failure for an unknown one.
std::list<std::string> LevelsOf(const Names& lists, const std::string& option);

// Those that are not among `levels`.
std::list<std::string> OtherLevels(const std::list<std::string>& levels);

// All lists as one text for people.
std::string InWords(const Names& lists);

}  // namespace quor::store

#endif
