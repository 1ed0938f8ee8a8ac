#pragma once

#include <string>
#include <vector>

/// `text` with \n, \t, \e (escape), \\ and \xHH as the bytes that they stand for.
std::string unescaped(const std::string& text);

/// The rows of tests/tables/NAME.table, each of `columns` cells, which " | " parts and which are
/// unescaped. Lines that start with "# " are comments. Throws for any other number of cells, and
/// for a table without rows.
std::vector<std::vector<std::string>> readTable(const std::string& name, std::size_t columns);
