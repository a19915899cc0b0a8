// SPDX-License-Identifier: Apache-2.0
// The checked-in rows of a table.
#ifndef CORESYSTEM_TESTS_TABLES_CSV_H
#define CORESYSTEM_TESTS_TABLES_CSV_H

#include <algorithm>
#include <fstream>
#include <iomanip>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

typedef std::vector<std::string> Row;
typedef std::vector<Row> Rows;

inline Row readCells(const std::string& line)
{
    Row cells;
    std::istringstream in(line);
    while (in.peek() != EOF) {
        std::string cell;
        if (in.peek() == '"') {
            in >> std::quoted(cell, '"', '"');
            in.get();
        } else {
            std::getline(in, cell, ',');
        }
        cells.push_back(cell);
    }
    return cells;
}

// All rows after the heading.
inline Rows readTable(const std::string& name)
{
    std::ifstream file(std::string(CORESYSTEM_TABLES_DIR) + "/" + name + ".csv");
    Rows rows;
    std::string line;
    std::getline(file, line);
    while (std::getline(file, line))
        rows.push_back(readCells(line));
    if (rows.empty())
        throw std::runtime_error("no rows of " + name);
    return rows;
}

inline const Rows MCC_COUNTRIES = readTable("MccCountryTable");
inline const Rows SERVICE_COUNTRIES = readTable("ServiceCountryTable");
inline const Rows CALLING_CODES = readTable("CallingCodeTable");
inline const Rows ALPHA3_COUNTRIES = readTable("Alpha3CountryTable");
inline const Rows MO_SUPPORT_MCCS = readTable("MoSupportMccTable");
inline const Rows LANGUAGE_CODES = readTable("LanguageCodeTable");

// One column, in order.
inline std::vector<std::string> column(const Rows& rows, std::size_t index)
{
    std::vector<std::string> cells;
    for (const Row& row : rows)
        cells.push_back(row.at(index));
    return cells;
}

// Every cell of `wanted` in the rows whose cell of `index` is the key.
inline std::vector<std::string> cellsOf(const Rows& rows, std::size_t index, const std::string& key,
                                        std::size_t wanted)
{
    std::vector<std::string> cells;
    for (const Row& row : rows)
        if (row.at(index) == key)
            cells.push_back(row.at(wanted));
    return cells;
}

#endif
