#pragma once

#include <functional>
#include <string>
#include <vector>

/// `text` with \n, \t, \e (escape), \s (a blank, where an editor would take it away), \\ and \xHH
/// as the bytes that they stand for.
std::string unescaped(const std::string& text);

using Row = std::vector<std::string>;

/// Calls `check` with each row of tests/tables/NAME.table: `columns` cells, which " | " separates
/// and which are unescaped. Lines that start with "# " are comments. What fails in `check` is
/// reported with the table, the line and its text; so are a row of another number of cells, and a
/// table without rows.
void forEachRow(const std::string& name, std::size_t columns,
                const std::function<void(const Row&)>& check);
