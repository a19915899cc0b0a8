// SPDX-License-Identifier: Apache-2.0
// ISO 639-2 code in lower case, ISO 639-1 code in upper case.
// Languages that are missing (DE, FR, ZH, ...) and the pairs ine/IE and mol/MO: frozen 34.
#ifndef CORESYSTEM_TABLES_LANGUAGE_CODE_TABLE_H
#define CORESYSTEM_TABLES_LANGUAGE_CODE_TABLE_H

#include "Column.h"

// clang-format off
#define CORESYSTEM_LANGUAGE_CODE_ROWS(ROW) \
    ROW("lug", "LG") \
    ROW("glg", "GL") \
    ROW("gla", "GD") \
    ROW("grn", "GN") \
    ROW("guj", "GU") \
    ROW("kal", "KL") \
    ROW("nav", "NV") \
    ROW("nau", "NA") \
    ROW("nep", "NE") \
    ROW("nor", "NO") \
    ROW("nno", "NN") \
    ROW("nob", "NB") \
    ROW("nya", "NY") \
    ROW("dan", "DA") \
    ROW("ltz", "LB") \
    ROW("lim", "LI") \
    ROW("div", "DV") \
    ROW("lao", "LO") \
    ROW("lav", "LV") \
    ROW("lat", "LA") \
    ROW("rus", "RU") \
    ROW("roh", "RM") \
    ROW("lub", "LU") \
    ROW("run", "RN") \
    ROW("kin", "RW") \
    ROW("lit", "LT") \
    ROW("lin", "LN") \
    ROW("mlg", "MG") \
    ROW("mar", "MR") \
    ROW("mah", "MH") \
    ROW("mal", "ML") \
    ROW("glv", "GV") \
    ROW("mol", "MO") \
    ROW("mlt", "MT") \
    ROW("mon", "MN") \
    ROW("bak", "BA") \
    ROW("bam", "BM") \
    ROW("vie", "VI") \
    ROW("ven", "VE") \
    ROW("bel", "BE") \
    ROW("ben", "BN") \
    ROW("bos", "BS") \
    ROW("vol", "VO") \
    ROW("bul", "BG") \
    ROW("bre", "BR") \
    ROW("bis", "BI") \
    ROW("bih", "BH") \
    ROW("srd", "SC") \
    ROW("smo", "SM") \
    ROW("sme", "SE") \
    ROW("san", "SA") \
    ROW("sag", "SG") \
    ROW("som", "SO") \
    ROW("sot", "ST") \
    ROW("sna", "SN") \
    ROW("sun", "SU") \
    ROW("ssw", "SS") \
    ROW("swa", "SW") \
    ROW("swe", "SV") \
    ROW("spa", "ES") \
    ROW("chu", "CU") \
    ROW("slv", "SL") \
    ROW("snd", "SD") \
    ROW("sin", "SI") \
    ROW("iii", "II") \
    ROW("arg", "AN") \
    ROW("ara", "AR") \
    ROW("ava", "AV") \
    ROW("ave", "AE") \
    ROW("asm", "AS") \
    ROW("aym", "AY") \
    ROW("hat", "HT") \
    ROW("gle", "GA") \
    ROW("aze", "AZ") \
    ROW("aka", "AK") \
    ROW("aar", "AA") \
    ROW("afr", "AF") \
    ROW("amh", "AM") \
    ROW("abk", "AB") \
    ROW("est", "ET") \
    ROW("epo", "EO") \
    ROW("ewe", "EE") \
    ROW("eng", "EN") \
    ROW("orm", "OM") \
    ROW("ori", "OR") \
    ROW("oss", "OS") \
    ROW("oji", "OJ") \
    ROW("oci", "OC") \
    ROW("wln", "WA") \
    ROW("yor", "YO") \
    ROW("urd", "UR") \
    ROW("uzb", "UZ") \
    ROW("ukr", "UK") \
    ROW("wol", "WO") \
    ROW("uig", "UG") \
    ROW("nbl", "NR") \
    ROW("nde", "ND") \
    ROW("ndo", "NG") \
    ROW("ibo", "IG") \
    ROW("iku", "IU") \
    ROW("ipk", "IK") \
    ROW("ido", "IO") \
    ROW("yid", "YI") \
    ROW("ita", "IT") \
    ROW("ind", "ID") \
    ROW("ina", "IA") \
    ROW("ine", "IE") \
    ROW("jpn", "JA") \
    ROW("cha", "CH") \
    ROW("che", "CE") \
    ROW("tso", "TS") \
    ROW("chv", "CV") \
    ROW("tsn", "TN") \
    ROW("kau", "KR") \
    ROW("kas", "KS") \
    ROW("kaz", "KK") \
    ROW("cat", "CA") \
    ROW("kan", "KN") \
    ROW("que", "QU") \
    ROW("cos", "CO") \
    ROW("kom", "KV") \
    ROW("xho", "XH") \
    ROW("cor", "KW") \
    ROW("kon", "KG") \
    ROW("kua", "KJ") \
    ROW("kur", "KU") \
    ROW("cre", "CR") \
    ROW("khm", "KM") \
    ROW("kir", "KY") \
    ROW("kik", "KI") \
    ROW("tgl", "TL") \
    ROW("tam", "TA") \
    ROW("tha", "TH") \
    ROW("tgk", "TG") \
    ROW("tat", "TT") \
    ROW("tah", "TY") \
    ROW("tur", "TR") \
    ROW("tel", "TE") \
    ROW("ton", "TO") \
    ROW("tuk", "TK") \
    ROW("twi", "TW") \
    ROW("tir", "TI") \
    ROW("pus", "PS") \
    ROW("pli", "PI") \
    ROW("pan", "PA") \
    ROW("fao", "FO") \
    ROW("por", "PT") \
    ROW("pol", "PL") \
    ROW("ful", "FF") \
    ROW("fry", "FY") \
    ROW("fij", "FJ") \
    ROW("fin", "FI") \
    ROW("hau", "HA") \
    ROW("kor", "KO") \
    ROW("hun", "HU") \
    ROW("her", "HZ") \
    ROW("hmo", "HO") \
    ROW("heb", "HE") \
    ROW("hin", "HI")
// clang-format on

namespace coresystem {
namespace LanguageCodeTable {

constexpr std::size_t ROWS = 0 CORESYSTEM_LANGUAGE_CODE_ROWS(CORESYSTEM_COUNT_ROW);
static_assert(ROWS == 159, "a row was added or lost");

constexpr Column<ROWS, 4> ISO639_2 = {{CORESYSTEM_LANGUAGE_CODE_ROWS(CORESYSTEM_CELL_1_OF_2)}};
constexpr Column<ROWS, 4> UPPER_CASE = {{CORESYSTEM_LANGUAGE_CODE_ROWS(CORESYSTEM_CELL_2_OF_2)}};

constexpr Index<ROWS, 4> UPPER_CASE_INDEX = indexOfFirstRows(UPPER_CASE);

} // namespace LanguageCodeTable
} // namespace coresystem

#endif
