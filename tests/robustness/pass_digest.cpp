// Prints the digest lines of a message file (message_digest.h).
//
// Usage: pass_digest MESSAGE_FILE
#include <cstdio>
#include <fstream>
#include <sstream>

#include "tests/robustness/message_digest.h"

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: %s MESSAGE_FILE\n", argv[0]);
    return 2;
  }
  std::ifstream in(argv[1], std::ios::binary);
  if (!in) {
    std::fprintf(stderr, "cannot read %s\n", argv[1]);
    return 1;
  }
  std::ostringstream text;
  text << in.rdbuf();
  const int status =
      rnsap::testing::DigestMessageText(text.str(), [](const char* line) { std::puts(line); });
  if (status != 0) std::fprintf(stderr, "no messages digested from %s\n", argv[1]);
  return status;
}
