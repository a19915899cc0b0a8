// SPDX-License-Identifier: Apache-2.0
// Mobile country code (ITU E.212), ISO 3166-1 alpha-2 code in lower case, English country name.
// Copies of MccCountryTable rows; only the first column is read.
#ifndef CORESYSTEM_TABLES_MO_SUPPORT_MCC_TABLE_H
#define CORESYSTEM_TABLES_MO_SUPPORT_MCC_TABLE_H

#include "Column.h"

// clang-format off
#define CORESYSTEM_MO_SUPPORT_MCC_ROWS(ROW) \
    ROW("505", "au", "Australia") \
    ROW("232", "at", "Austria") \
    ROW("206", "be", "Belgium") \
    ROW("724", "br", "Brazil") \
    ROW("302", "ca", "Canada") \
    ROW("460", "cn", "China") \
    ROW("461", "cn", "China") \
    ROW("712", "cr", "Costa Rica") \
    ROW("230", "cz", "Czech Republic") \
    ROW("238", "dk", "Denmark") \
    ROW("248", "ee", "Estonia") \
    ROW("244", "fi", "Finland") \
    ROW("208", "fr", "France") \
    ROW("262", "de", "Germany") \
    ROW("454", "hk", "Hong Kong (PRC)") \
    ROW("216", "hu", "Hungary") \
    ROW("404", "in", "India") \
    ROW("405", "in", "India") \
    ROW("510", "id", "Indonesia") \
    ROW("272", "ie", "Ireland") \
    ROW("425", "il", "Israel") \
    ROW("222", "it", "Italy") \
    ROW("450", "kr", "Korea, South") \
    ROW("246", "lt", "Lithuania") \
    ROW("502", "my", "Malaysia") \
    ROW("334", "mx", "Mexico") \
    ROW("204", "nl", "Netherlands") \
    ROW("242", "no", "Norway") \
    ROW("410", "pk", "Pakistan") \
    ROW("515", "ph", "Philippines") \
    ROW("260", "pl", "Poland") \
    ROW("330", "pr", "Puerto Rico") \
    ROW("226", "ro", "Romania") \
    ROW("250", "ru", "Russian Federation") \
    ROW("231", "sk", "Slovakia") \
    ROW("655", "za", "South Africa") \
    ROW("214", "es", "Spain") \
    ROW("240", "se", "Sweden") \
    ROW("228", "ch", "Switzerland") \
    ROW("234", "gb", "United Kingdom") \
    ROW("235", "gb", "United Kingdom") \
    ROW("310", "us", "United States of America") \
    ROW("311", "us", "United States of America") \
    ROW("312", "us", "United States of America") \
    ROW("313", "us", "United States of America") \
    ROW("314", "us", "United States of America") \
    ROW("315", "us", "United States of America") \
    ROW("316", "us", "United States of America")
// clang-format on

namespace coresystem {
namespace MoSupportMccTable {

constexpr std::size_t ROWS = 0 CORESYSTEM_MO_SUPPORT_MCC_ROWS(CORESYSTEM_COUNT_ROW);
static_assert(ROWS == 48, "a row was added or lost");

constexpr Column<ROWS, 4> MCC = {{CORESYSTEM_MO_SUPPORT_MCC_ROWS(CORESYSTEM_CELL_1_OF_3)}};

} // namespace MoSupportMccTable
} // namespace coresystem

#endif
