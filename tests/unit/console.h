#pragma once

#include <iostream>
#include <sstream>
#include <streambuf>
#include <string>

/// Stands in for the terminal while it lives: what is written to standard output is kept, and
/// standard input is `input`. One at a time, on the thread of the test.
class Console {
 public:
  explicit Console(const std::string& input = "") : in(input) {}
  Console(const Console&) = delete;
  Console& operator=(const Console&) = delete;
  ~Console() {
    std::cin.rdbuf(formerIn);
    std::cout.rdbuf(formerOut);
  }

  /// What was written, with a mark where a line was begun before the one above it was flushed.
  [[nodiscard]] std::string output() const { return out.flushed + out.str(); }

 private:
  struct FlushedLines : std::stringbuf {
    int sync() override {
      const auto lineBreak = str().find('\n');
      flushed += str() + (lineBreak < str().size() - 1 ? "<not flushed>" : "");
      str("");
      return 0;
    }

    std::string flushed;
  };

  std::stringbuf in;
  FlushedLines out;
  std::streambuf* formerIn = std::cin.rdbuf(&in);
  std::streambuf* formerOut = std::cout.rdbuf(&out);
};
