#pragma once

#include <iostream>
#include <sstream>
#include <string>

/// Stands in for the terminal while it lives: what is written to standard output and standard error
/// is kept, and standard input is `input`. One at a time, on the thread of the test.
class Console {
 public:
  explicit Console(const std::string& input = "") : in(input) { swapBuffers(); }
  Console(const Console&) = delete;
  Console& operator=(const Console&) = delete;
  ~Console() { swapBuffers(); }

  [[nodiscard]] std::string output() const { return out.str(); }
  [[nodiscard]] std::string errors() const { return err.str(); }

 private:
  static void swapBuffers(std::ios& left, std::ios& right) {
    left.rdbuf(right.rdbuf(left.rdbuf()));
  }

  void swapBuffers() {
    swapBuffers(std::cin, in);
    swapBuffers(std::cout, out);
    swapBuffers(std::cerr, err);
  }

  std::istringstream in;
  std::ostringstream out;
  std::ostringstream err;
};
