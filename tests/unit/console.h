#pragma once

#include <iostream>
#include <sstream>
#include <string>

/// Stands in for the terminal while it lives: what is written to standard output and standard error
/// is kept, and standard input is `input`. One at a time, on the thread of the test.
class Console {
 public:
  explicit Console(const std::string& input = "")
      : in(input),
        realIn(std::cin.rdbuf(in.rdbuf())),
        realOut(std::cout.rdbuf(out.rdbuf())),
        realErr(std::cerr.rdbuf(err.rdbuf())) {
    std::cin.clear();
  }
  Console(const Console&) = delete;
  Console& operator=(const Console&) = delete;
  ~Console() {
    std::cin.rdbuf(realIn);
    std::cout.rdbuf(realOut);
    std::cerr.rdbuf(realErr);
  }

  [[nodiscard]] std::string output() const { return out.str(); }
  [[nodiscard]] std::string errors() const { return err.str(); }

 private:
  std::istringstream in;
  std::ostringstream out;
  std::ostringstream err;
  std::streambuf* realIn;
  std::streambuf* realOut;
  std::streambuf* realErr;
};
