// SPDX-License-Identifier: Apache-2.0
#include "CountryData.h"

#include <algorithm>
#include <sstream>
#include <string_view>

#include "CountryDataFiles.h"

namespace {

// The lines of a file below its head, in cells.
std::vector<std::vector<std::string>> rowsOf(const char* file)
{
    std::vector<std::vector<std::string>> rows;
    std::istringstream lines(file);
    std::string line;
    std::getline(lines, line);
    while (std::getline(lines, line)) {
        rows.emplace_back();
        std::istringstream cells(line + '\t'); // an empty last cell counts too
        for (std::string cell; std::getline(cells, cell, '\t');)
            rows.back().push_back(cell);
    }
    return rows;
}

std::string orNone(const std::string& text)
{
    return text.empty() ? "none" : text;
}

} // namespace

std::size_t cli::placeInTable(const std::string& field, const std::string& mcc)
{
    const std::string_view order = field == "calling_code" ? CALLING_CODE_ORDER
                                   : field == "alpha2"     ? MCC_COUNTRY_ORDER
                                                           : SERVICE_COUNTRY_ORDER;
    return std::min(order.find(mcc), order.size()); // every MCC has three digits
}

std::vector<cli::Erratum> cli::errataOf(const std::string& key)
{
    std::vector<Erratum> found;
    for (const auto& row : rowsOf(ERRATA))
        if (row[1] == key)
            found.push_back({row[0], row[1], row[2], row[3], row[4], row[5], row[6]});
    return found;
}

std::string cli::wordOf(const Erratum& erratum)
{
    return erratum.source + ": " + orNone(erratum.today);
}

std::string cli::sentenceOf(const Erratum& erratum)
{
    return "the library answers " + orNone(erratum.value) + "; " + wordOf(erratum);
}

cli::Json cli::jsonOf(const std::vector<Erratum>& errata)
{
    const auto orNull = [](const std::string& text) { return text.empty() ? Json() : Json(text); };
    Json json = Json::array();
    for (const Erratum& each : errata)
        json.push_back({{"field", each.field},
                        {"library", orNull(each.value)},
                        {"today", orNull(each.today)},
                        {"source", each.source},
                        {"date", each.date}});
    return json;
}

std::string cli::alpha2OfAreaCode(const std::string& code)
{
    for (const auto& row : rowsOf(AREA_CODES))
        if (row[0] == code)
            return row[1];
    return "";
}
