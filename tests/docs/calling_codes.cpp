// SPDX-License-Identifier: Apache-2.0
// Prints libphonenumber's calling code of each region ("BG 359"), and the region of each area of
// calling code 1 ("JM 1-876").
#include <cstdint>
#include <iostream>
#include <set>
#include <string>

#include <phonenumbers/phonenumberutil.h>

using i18n::phonenumbers::PhoneNumber;
using i18n::phonenumbers::PhoneNumberUtil;

int main()
{
    const PhoneNumberUtil* const util = PhoneNumberUtil::GetInstance();
    std::set<std::string> regions;
    util->GetSupportedRegions(&regions);
    for (const std::string& region : regions)
        std::cout << region << ' ' << util->GetCountryCodeForRegion(region) << '\n';
    for (std::uint64_t area = 200; area < 1000; ++area) {
        PhoneNumber number;
        number.set_country_code(1);
        number.set_national_number(area * 10000000 + 2345678);
        std::string region;
        util->GetRegionCodeForNumber(number, &region);
        if (region != "ZZ" && region != "001")
            std::cout << region << " 1-" << area << '\n';
    }
}
