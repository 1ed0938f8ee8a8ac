#include "tests/Table.h"

#include <sstream>
#include <stdexcept>

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
      plain += code == 'e' ? '\033' : code == 'n' ? '\n' : code == 't' ? '\t' : code;
    }
  }
  return plain;
}

std::vector<std::vector<std::string>> readTable(const std::string& name, std::size_t columns) {
  std::vector<std::vector<std::string>> rows;
  std::istringstream stream(readFile(ZUBTOOL_SOURCES "/tests/tables/" + name + ".table"));
  for (std::string line; std::getline(stream, line);) {
    if (line.starts_with("# ")) continue;
    auto& cells = rows.emplace_back();
    for (std::size_t start = 0; start <= line.size();) {
      const auto end = std::min(line.find(" | ", start), line.size());
      cells.push_back(unescaped(line.substr(start, end - start)));
      start = end == line.size() ? end + 1 : end + 3;
    }
    if (cells.size() != columns) throw std::runtime_error(name + ": " + line);
  }
  if (rows.empty()) throw std::runtime_error("no rows: " + name);
  return rows;
}
