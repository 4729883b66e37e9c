#pragma once

#include <iostream>
#include <sstream>
#include <streambuf>
#include <string>

/// Keeps what is written, and marks each line that was not flushed before anything followed it.
class FlushedLines : public std::streambuf {
 public:
  [[nodiscard]] std::string written() const { return text + mark; }

 protected:
  int_type overflow(int_type character) override {
    text += mark;
    text += traits_type::to_char_type(character);
    mark = text.back() == '\n' ? "<not flushed>" : "";
    return character;
  }

  int sync() override {
    mark = "";
    return 0;
  }

 private:
  std::string text;
  const char* mark = "";
};

/// Stands in for the terminal while it lives: what is written to standard output and standard error
/// is kept, and standard input is `input`. One at a time, on the thread of the test.
class Console {
 public:
  explicit Console(const std::string& input = "") : in(input) {}
  Console(const Console&) = delete;
  Console& operator=(const Console&) = delete;
  ~Console() {
    std::cin.rdbuf(formerIn);
    std::cout.rdbuf(formerOut);
    std::cerr.rdbuf(formerErr);
  }

  [[nodiscard]] std::string output() const { return out.written(); }
  [[nodiscard]] std::string errors() const { return err.written(); }

 private:
  std::stringbuf in;
  FlushedLines out;
  FlushedLines err;
  std::streambuf* formerIn = std::cin.rdbuf(&in);
  std::streambuf* formerOut = std::cout.rdbuf(&out);
  std::streambuf* formerErr = std::cerr.rdbuf(&err);
};
