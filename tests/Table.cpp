#include "tests/Table.h"

#include <gtest/gtest.h>

#include <sstream>

#include "tests/Program.h"

std::string unescaped(const std::string& text) {
  std::string plain;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '\\') {
      plain += text[i];
    } else if (const char code = text.at(++i); code == 'x') {
      plain += static_cast<char>(std::stoi(text.substr(i + 1, 2), nullptr, 16));
      i += 2;
    } else {
      constexpr std::string_view kCodes = "ents";
      const auto found = kCodes.find(code);
      plain += found == std::string_view::npos ? code : "\033\n\t "[found];
    }
  }
  return plain;
}

void forEachRow(const std::string& name, std::size_t columns,
                const std::function<void(const Row&)>& check) {
  const std::string path = ZUBTOOL_SOURCES "/tests/tables/" + name + ".table";
  std::istringstream stream(readFile(path));
  std::string line;
  int rows = 0;
  for (int number = 1; std::getline(stream, line); ++number) {
    if (line.starts_with("# ")) continue;
    const testing::ScopedTrace trace(path.c_str(), number, line);
    Row row;
    for (std::size_t start = 0; start <= line.size();) {
      const auto end = std::min(line.find(" | ", start), line.size());
      row.push_back(unescaped(line.substr(start, end - start)));
      start = end == line.size() ? end + 1 : end + 3;
    }
    EXPECT_EQ(row.size(), columns) << "cells";
    if (row.size() == columns) check(row);
    ++rows;
  }
  EXPECT_GT(rows, 0) << path;
}
