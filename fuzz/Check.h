// What every fuzz target does about a property that does not hold: it says which one, and ends as a crash does.
#pragma once

#include <cstdio>
#include <cstdlib>
#include <string>

namespace fuzz {

inline void check(bool holds, const std::string &what) {
  if (holds) return;
  std::fprintf(stderr, "This does not hold: %s\n", what.c_str());
  std::abort();
}

/// Both texts around the first place where they differ.
inline void checkSame(const std::string &got, const std::string &wanted, const std::string &what) {
  if (got == wanted) return;
  std::size_t at = 0;
  while (at < got.size() && at < wanted.size() && got[at] == wanted[at]) ++at;
  const std::size_t from = at < 60 ? 0 : at - 60;
  check(false, what + ": differs at byte " + std::to_string(at) + "\n--- got\n" + got.substr(from, 160) +
                   "\n--- wanted\n" + wanted.substr(from, 160));
}

}  // namespace fuzz
