// SPDX-License-Identifier: Apache-2.0
// Corrects the library's tables where they are no longer true, and fills what they leave out. Only
// the command knows this: the library's answers stay as they are.
#ifndef CLI_COUNTRY_DATA_H
#define CLI_COUNTRY_DATA_H

#include <string>
#include <vector>

#include "Session.h"

namespace cli {

// A row of country-data/errata.tsv.
struct Erratum {
    std::string table;
    std::string key; // as the table is asked: an MCC, an alpha-2 code, a language
    std::string field;
    std::string value; // the table's; empty for none
    std::string today; // empty for none
    std::string source;
    std::string date;
};

/// Where an MCC stands in the library's table of that field ("alpha2", "calling_code" or
/// "service_locale"); one behind the last for none.
std::size_t placeInTable(const std::string& field, const std::string& mcc);

/// The errata of a key, in the order of the file.
std::vector<Erratum> errataOf(const std::string& key);

/// "ITU-T E.164: 359"
std::string wordOf(const Erratum& erratum);

/// "the library answers 539; ITU-T E.164: 359"
std::string sentenceOf(const Erratum& erratum);

Json jsonOf(const std::vector<Erratum>& errata);

/// The alpha-2 code of a calling code with its area digits ("1-876"); empty for none.
std::string alpha2OfAreaCode(const std::string& code);

} // namespace cli

#endif
