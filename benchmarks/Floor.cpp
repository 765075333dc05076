// floor FILE REPORT-SIZE TEXT-SIZE: reads the file, copies TEXT-SIZE bytes for each report of REPORT-SIZE bytes, and
// writes them to standard output. Whoever turns the one into the other cannot be faster.
#include <fcntl.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

namespace {

constexpr std::size_t kPiece = std::size_t{256} << 10;

bool writeAll(const char *bytes, std::size_t size) {
  while (size != 0) {
    const ssize_t written = ::write(STDOUT_FILENO, bytes, size);
    if (written < 0) return false;
    bytes += written;
    size -= static_cast<std::size_t>(written);
  }
  return true;
}

}  // namespace

int main(int argc, char **argv) {
  if (argc != 4) {
    std::fputs("usage: floor FILE REPORT-SIZE TEXT-SIZE\n", stderr);
    return 2;
  }
  const int file = ::open(argv[1], O_RDONLY);
  const std::size_t reportSize = std::strtoul(argv[2], nullptr, 10), textSize = std::strtoul(argv[3], nullptr, 10);
  if (file < 0 || reportSize == 0) return 3;

  std::vector<char> input(kPiece), output(kPiece + textSize);
  const std::string text(textSize, 'x');
  std::size_t pending = 0, filled = 0;
  for (ssize_t got; (got = ::read(file, input.data(), input.size())) > 0;) {
    for (pending += static_cast<std::size_t>(got); pending >= reportSize; pending -= reportSize) {
      std::memcpy(output.data() + filled, text.data(), textSize);
      filled += textSize;
      if (filled < kPiece) continue;
      if (!writeAll(output.data(), filled)) return 5;
      filled = 0;
    }
  }
  return writeAll(output.data(), filled) ? 0 : 5;
}
