// SPDX-License-Identifier: Apache-2.0
// Mobile country code (ITU E.212), ISO 3166-1 alpha-2 code in lower case, English country name.
// Row order is behaviour: the first row that matches answers, so rows are never sorted.
// MCC 340 has two rows and "kh" stands at 456 and at 514: both are frozen 35.
#ifndef CORESYSTEM_TABLES_MCC_COUNTRY_TABLE_H
#define CORESYSTEM_TABLES_MCC_COUNTRY_TABLE_H

#include "Column.h"

// clang-format off
#define CORESYSTEM_MCC_COUNTRY_ROWS(ROW) \
    ROW("412", "af", "Afghanistan") \
    ROW("276", "al", "Albania") \
    ROW("603", "dz", "Algeria") \
    ROW("544", "as", "American Samoa (US)") \
    ROW("213", "ad", "Andorra") \
    ROW("631", "ao", "Angola") \
    ROW("365", "ai", "Anguilla") \
    ROW("344", "ag", "Antigua and Barbuda") \
    ROW("722", "ar", "Argentine Republic") \
    ROW("283", "am", "Armenia") \
    ROW("363", "aw", "Aruba (Netherlands)") \
    ROW("505", "au", "Australia") \
    ROW("232", "at", "Austria") \
    ROW("400", "az", "Azerbaijani Republic") \
    ROW("364", "bs", "Bahamas") \
    ROW("426", "bh", "Bahrain") \
    ROW("470", "bd", "Bangladesh") \
    ROW("342", "bb", "Barbados") \
    ROW("257", "by", "Belarus") \
    ROW("206", "be", "Belgium") \
    ROW("702", "bz", "Belize") \
    ROW("616", "bj", "Benin") \
    ROW("350", "bm", "Bermuda (UK)") \
    ROW("402", "bt", "Bhutan") \
    ROW("736", "bo", "Bolivia") \
    ROW("218", "ba", "Bosnia and Herzegovina") \
    ROW("652", "bw", "Botswana") \
    ROW("724", "br", "Brazil") \
    ROW("348", "vg", "British Virgin Islands (UK)") \
    ROW("528", "bn", "Brunei Darussalam") \
    ROW("284", "bg", "Bulgaria") \
    ROW("613", "bf", "Burkina Faso") \
    ROW("642", "bi", "Burundi") \
    ROW("456", "kh", "Cambodia") \
    ROW("624", "cm", "Cameroon") \
    ROW("302", "ca", "Canada") \
    ROW("625", "cv", "Cape Verde") \
    ROW("346", "ky", "Cayman Islands (UK)") \
    ROW("623", "cf", "Central African Republic") \
    ROW("622", "td", "Chad") \
    ROW("730", "cl", "Chile") \
    ROW("460", "cn", "China") \
    ROW("461", "cn", "China") \
    ROW("732", "co", "Colombia") \
    ROW("654", "km", "Comoros") \
    ROW("629", "cg", "Congo (Republic of)") \
    ROW("630", "cd", "Congo (Democratic Republic of)") \
    ROW("548", "ck", "Cook Islands (NZ)") \
    ROW("712", "cr", "Costa Rica") \
    ROW("612", "ci", "Cote d'Ivoire") \
    ROW("219", "hr", "Croatia") \
    ROW("368", "cu", "Cuba") \
    ROW("362", "cw", "Curacao (Netherlands)") \
    ROW("280", "cy", "Cyprus") \
    ROW("230", "cz", "Czech Republic") \
    ROW("238", "dk", "Denmark") \
    ROW("638", "dj", "Djibouti") \
    ROW("366", "dm", "Dominica") \
    ROW("370", "do", "Dominican Republic") \
    ROW("514", "kh", "East Timor") \
    ROW("740", "ec", "Ecuador") \
    ROW("602", "eg", "Egypt") \
    ROW("706", "sv", "El Salvador") \
    ROW("627", "gq", "Equatorial Guinea") \
    ROW("657", "er", "Eritrea") \
    ROW("248", "ee", "Estonia") \
    ROW("636", "et", "Ethiopia") \
    ROW("750", "fk", "Falkland Islands (Malvinas)") \
    ROW("288", "fo", "Faroe Islands (Denmark)") \
    ROW("542", "fj", "Fiji") \
    ROW("244", "fi", "Finland") \
    ROW("208", "fr", "France") \
    ROW("742", "gf", "French Guiana (France)") \
    ROW("547", "pf", "French Polynesia (France)") \
    ROW("628", "ga", "Gabonese Republic") \
    ROW("607", "gm", "Gambia") \
    ROW("282", "ge", "Georgia") \
    ROW("262", "de", "Germany") \
    ROW("620", "gh", "Ghana") \
    ROW("266", "gi", "Gibraltar (UK)") \
    ROW("202", "gr", "Greece") \
    ROW("290", "gl", "Greenland (Denmark)") \
    ROW("352", "gd", "Grenada") \
    ROW("340", "gp", "Guadeloupe (France)") \
    ROW("535", "gu", "Guam (US)") \
    ROW("704", "gt", "Guatemala") \
    ROW("611", "gn", "Guinea") \
    ROW("632", "gw", "Guinea-Bissau") \
    ROW("738", "gy", "Guyana") \
    ROW("372", "ht", "Haiti") \
    ROW("708", "hn", "Honduras") \
    ROW("454", "hk", "Hong Kong (PRC)") \
    ROW("216", "hu", "Hungary") \
    ROW("274", "is", "Iceland") \
    ROW("404", "in", "India") \
    ROW("405", "in", "India") \
    ROW("510", "id", "Indonesia") \
    ROW("432", "ir", "Iran") \
    ROW("418", "iq", "Iraq") \
    ROW("272", "ie", "Ireland") \
    ROW("425", "il", "Israel") \
    ROW("222", "it", "Italy") \
    ROW("338", "jm", "Jamaica") \
    ROW("441", "jp", "Japan") \
    ROW("440", "jp", "Japan") \
    ROW("416", "jo", "Jordan") \
    ROW("401", "kz", "Kazakhstan") \
    ROW("639", "ke", "Kenya") \
    ROW("545", "ki", "Kiribati") \
    ROW("467", "kp", "Korea, North") \
    ROW("450", "kr", "Korea, South") \
    ROW("419", "kw", "Kuwait") \
    ROW("437", "kg", "Kyrgyz Republic") \
    ROW("457", "la", "Laos") \
    ROW("247", "lv", "Latvia") \
    ROW("415", "lb", "Lebanon") \
    ROW("651", "ls", "Lesotho") \
    ROW("618", "lr", "Liberia") \
    ROW("606", "ly", "Libya") \
    ROW("295", "li", "Liechtenstein") \
    ROW("246", "lt", "Lithuania") \
    ROW("270", "lu", "Luxembourg") \
    ROW("455", "mo", "Macau (PRC)") \
    ROW("294", "mk", "Macedonia (Republic of)") \
    ROW("646", "mg", "Madagascar") \
    ROW("650", "mw", "Malawi") \
    ROW("502", "my", "Malaysia") \
    ROW("472", "mv", "Maldives") \
    ROW("610", "ml", "Mali") \
    ROW("278", "mt", "Malta") \
    ROW("551", "mh", "Marshall Islands") \
    ROW("340", "mq", "Martinique (France)") \
    ROW("609", "mr", "Mauritania") \
    ROW("617", "mu", "Mauritius") \
    ROW("334", "mx", "Mexico") \
    ROW("550", "fm", "Micronesia (Federated States of)") \
    ROW("259", "md", "Moldova") \
    ROW("212", "mc", "Monaco") \
    ROW("428", "mn", "Mongolia") \
    ROW("297", "me", "Montenegro (Republic of)") \
    ROW("354", "ms", "Montserrat (UK)") \
    ROW("604", "ma", "Morocco") \
    ROW("643", "mz", "Mozambique") \
    ROW("414", "mm", "Myanmar") \
    ROW("649", "na", "Namibia") \
    ROW("536", "nr", "Nauru") \
    ROW("429", "np", "Nepal") \
    ROW("204", "nl", "Netherlands") \
    ROW("546", "nc", "New Caledonia (France)") \
    ROW("530", "nz", "New Zealand") \
    ROW("710", "ni", "Nicaragua") \
    ROW("614", "ne", "Niger") \
    ROW("621", "ng", "Nigeria") \
    ROW("555", "nu", "Niue") \
    ROW("534", "mp", "Northern Mariana Islands (US)") \
    ROW("242", "no", "Norway") \
    ROW("422", "om", "Oman") \
    ROW("410", "pk", "Pakistan") \
    ROW("552", "pw", "Palau") \
    ROW("423", "ps", "Palestine") \
    ROW("714", "pa", "Panama") \
    ROW("537", "pg", "Papua New Guinea") \
    ROW("744", "py", "Paraguay") \
    ROW("716", "pe", "Peru") \
    ROW("515", "ph", "Philippines") \
    ROW("260", "pl", "Poland") \
    ROW("268", "pt", "Portugal") \
    ROW("330", "pr", "Puerto Rico") \
    ROW("427", "qa", "Qatar") \
    ROW("647", "re", "Reunion (France)") \
    ROW("226", "ro", "Romania") \
    ROW("250", "ru", "Russian Federation") \
    ROW("635", "rw", "Rwandese Republic") \
    ROW("356", "kn", "Saint Kitts and Nevis") \
    ROW("358", "lc", "Saint Lucia") \
    ROW("308", "pm", "Saint Pierre and Miquelon (France)") \
    ROW("360", "vc", "Saint Vincent and the Grenadines") \
    ROW("549", "ws", "Samoa") \
    ROW("292", "sm", "San Marino") \
    ROW("626", "st", "Sao Tome and Principe") \
    ROW("420", "sa", "Saudi Arabia") \
    ROW("608", "sn", "Senegal") \
    ROW("220", "rs", "Serbia (Republic of)") \
    ROW("633", "sc", "Seychelles") \
    ROW("619", "sl", "Sierra Leone") \
    ROW("525", "sg", "Singapore") \
    ROW("231", "sk", "Slovakia") \
    ROW("293", "si", "Slovenia") \
    ROW("540", "sb", "Solomon Islands") \
    ROW("637", "so", "Somalia") \
    ROW("655", "za", "South Africa") \
    ROW("214", "es", "Spain") \
    ROW("413", "lk", "Sri Lanka") \
    ROW("634", "sd", "Sudan") \
    ROW("746", "sr", "Suriname") \
    ROW("653", "sz", "Swaziland") \
    ROW("240", "se", "Sweden") \
    ROW("228", "ch", "Switzerland") \
    ROW("417", "sy", "Syria") \
    ROW("466", "tw", "Taiwan") \
    ROW("436", "tj", "Tajikistan") \
    ROW("640", "tz", "Tanzania") \
    ROW("520", "th", "Thailand") \
    ROW("615", "tg", "Togolese Republic") \
    ROW("539", "to", "Tonga") \
    ROW("374", "tt", "Trinidad and Tobago") \
    ROW("605", "tn", "Tunisia") \
    ROW("286", "tr", "Turkey") \
    ROW("438", "tm", "Turkmenistan") \
    ROW("376", "tc", "Turks and Caicos Islands (UK)") \
    ROW("553", "tv", "Tuvalu") \
    ROW("641", "ug", "Uganda") \
    ROW("255", "ua", "Ukraine") \
    ROW("424", "ae", "United Arab Emirates") \
    ROW("430", "ae", "United Arab Emirates") \
    ROW("431", "ae", "United Arab Emirates") \
    ROW("234", "gb", "United Kingdom") \
    ROW("235", "gb", "United Kingdom") \
    ROW("310", "us", "United States of America") \
    ROW("311", "us", "United States of America") \
    ROW("312", "us", "United States of America") \
    ROW("313", "us", "United States of America") \
    ROW("314", "us", "United States of America") \
    ROW("315", "us", "United States of America") \
    ROW("316", "us", "United States of America") \
    ROW("332", "vi", "United States Virgin Islands (US)") \
    ROW("748", "uy", "Uruguay") \
    ROW("434", "uz", "Uzbekistan") \
    ROW("541", "vu", "Vanuatu") \
    ROW("225", "va", "Vatican City State") \
    ROW("734", "ve", "Venezuela") \
    ROW("452", "vn", "Viet Nam") \
    ROW("543", "wf", "Wallis and Futuna (France)") \
    ROW("421", "ye", "Yemen") \
    ROW("645", "zm", "Zambia") \
    ROW("648", "zw", "Zimbabwe")
// clang-format on

namespace coresystem {

// A template only because the linker keeps one copy of its members, where constants of a namespace
// would be copied into each source file that searches them.
template <typename Unused>
struct __attribute__((visibility("hidden"))) SharedMccCountryTable {
    static constexpr std::size_t ROWS = 0 CORESYSTEM_MCC_COUNTRY_ROWS(CORESYSTEM_COUNT_ROW);
    static_assert(ROWS == 236, "a row was added or lost");

    static constexpr Column<ROWS, 4> MCC = {{CORESYSTEM_MCC_COUNTRY_ROWS(CORESYSTEM_CELL_1_OF_3)}};
    static constexpr Column<ROWS, 4> ALPHA2 = {
        {CORESYSTEM_MCC_COUNTRY_ROWS(CORESYSTEM_CELL_2_OF_3)}};
    static constexpr Column<ROWS, 36> NAME = {
        {CORESYSTEM_MCC_COUNTRY_ROWS(CORESYSTEM_CELL_3_OF_3)}};

    static constexpr Index<ROWS, 4> MCC_INDEX = indexOfAllRows(MCC);
    static constexpr Index<ROWS, 4> ALPHA2_INDEX = indexOfFirstRows(ALPHA2);
};
template <typename Unused>
constexpr std::size_t SharedMccCountryTable<Unused>::ROWS;
template <typename Unused>
constexpr Column<SharedMccCountryTable<Unused>::ROWS, 4> SharedMccCountryTable<Unused>::MCC;
template <typename Unused>
constexpr Column<SharedMccCountryTable<Unused>::ROWS, 4> SharedMccCountryTable<Unused>::ALPHA2;
template <typename Unused>
constexpr Column<SharedMccCountryTable<Unused>::ROWS, 36> SharedMccCountryTable<Unused>::NAME;
template <typename Unused>
constexpr Index<SharedMccCountryTable<Unused>::ROWS, 4> SharedMccCountryTable<Unused>::MCC_INDEX;
template <typename Unused>
constexpr Index<SharedMccCountryTable<Unused>::ROWS, 4> SharedMccCountryTable<Unused>::ALPHA2_INDEX;

typedef SharedMccCountryTable<void> MccCountryTable;

} // namespace coresystem

#endif
