// SPDX-License-Identifier: Apache-2.0
// Mobile country code (ITU E.212), locale of the service country (language "_" country).
// Row order is behaviour: the first row that matches answers, so rows are never sorted.
// The locales gr_CY, en_AE and en_KH, and MCC 406 that no other table knows, are frozen 37.
#ifndef CORESYSTEM_TABLES_SERVICE_COUNTRY_TABLE_H
#define CORESYSTEM_TABLES_SERVICE_COUNTRY_TABLE_H

#include "Column.h"

// clang-format off
#define CORESYSTEM_SERVICE_COUNTRY_ROWS(ROW) \
    ROW("234", "en_GB") \
    ROW("235", "en_GB") \
    ROW("208", "fr_FR") \
    ROW("222", "it_IT") \
    ROW("262", "de_DE") \
    ROW("525", "en_SG") \
    ROW("250", "ru_RU") \
    ROW("286", "tr_TR") \
    ROW("214", "es_ES") \
    ROW("204", "nl_NL") \
    ROW("240", "sv_SE") \
    ROW("260", "pl_PL") \
    ROW("454", "zh_HK") \
    ROW("655", "en_ZA") \
    ROW("505", "en_AU") \
    ROW("722", "es_AR") \
    ROW("302", "en_CA") \
    ROW("334", "es_MX") \
    ROW("724", "pt_BR") \
    ROW("460", "zh_CN") \
    ROW("461", "zh_CN") \
    ROW("450", "ko_KR") \
    ROW("268", "pt_PT") \
    ROW("228", "de_CH") \
    ROW("232", "de_AT") \
    ROW("242", "no_NO") \
    ROW("206", "nl_BE") \
    ROW("244", "fi_FI") \
    ROW("238", "da_DK") \
    ROW("466", "zh_TW") \
    ROW("515", "en_PH") \
    ROW("520", "th_TH") \
    ROW("452", "vi_VN") \
    ROW("502", "ms_MY") \
    ROW("510", "id_ID") \
    ROW("730", "es_CL") \
    ROW("255", "uk_UA") \
    ROW("404", "hi_IN") \
    ROW("405", "hi_IN") \
    ROW("406", "hi_IN") \
    ROW("310", "en_US") \
    ROW("311", "en_US") \
    ROW("312", "en_US") \
    ROW("313", "en_US") \
    ROW("314", "en_US") \
    ROW("315", "en_US") \
    ROW("316", "en_US") \
    ROW("440", "ja_JP") \
    ROW("441", "ja_JP") \
    ROW("230", "cs_CZ") \
    ROW("216", "hu_HU") \
    ROW("202", "el_GR") \
    ROW("272", "en_IE") \
    ROW("231", "sk_SK") \
    ROW("246", "lt_LT") \
    ROW("424", "en_AE") \
    ROW("430", "en_AE") \
    ROW("431", "en_AE") \
    ROW("226", "ro_RO") \
    ROW("219", "hr_HR") \
    ROW("284", "bg_BG") \
    ROW("604", "ar_MA") \
    ROW("220", "sr_RS") \
    ROW("432", "fa_IR") \
    ROW("401", "kk_KZ") \
    ROW("293", "sl_SI") \
    ROW("247", "lv_LV") \
    ROW("248", "et_EE") \
    ROW("218", "sr_BA") \
    ROW("294", "mk_MK") \
    ROW("338", "en_JM") \
    ROW("602", "ar_EG") \
    ROW("410", "ur_PK") \
    ROW("417", "ar_SY") \
    ROW("420", "ar_SA") \
    ROW("425", "he_IL") \
    ROW("416", "ar_JO") \
    ROW("639", "sw_KE") \
    ROW("415", "ar_LB") \
    ROW("427", "ar_QA") \
    ROW("419", "ar_KW") \
    ROW("426", "ar_BH") \
    ROW("422", "ar_OM") \
    ROW("421", "ar_YE") \
    ROW("280", "gr_CY") \
    ROW("270", "fr_LU") \
    ROW("297", "sr_ME") \
    ROW("434", "uz_UZ") \
    ROW("257", "be_BY") \
    ROW("259", "ro_MD") \
    ROW("429", "ne_NP") \
    ROW("413", "si_LK") \
    ROW("470", "bn_BD") \
    ROW("603", "ar_DZ") \
    ROW("605", "ar_TN") \
    ROW("606", "ar_LY") \
    ROW("418", "ar_IQ") \
    ROW("649", "en_NA") \
    ROW("617", "en_MU") \
    ROW("652", "en_BW") \
    ROW("612", "fr_CI") \
    ROW("620", "en_GH") \
    ROW("621", "en_NG") \
    ROW("608", "fr_SN") \
    ROW("624", "fr_CM") \
    ROW("455", "zh_MO") \
    ROW("274", "is_IS") \
    ROW("374", "en_TT") \
    ROW("640", "en_TZ") \
    ROW("634", "en_SD") \
    ROW("630", "fr_CD") \
    ROW("400", "az_AZ") \
    ROW("283", "hy_AM") \
    ROW("282", "ka_GE") \
    ROW("643", "pt_MZ") \
    ROW("631", "pt_AO") \
    ROW("629", "fr_CG") \
    ROW("641", "en_UG") \
    ROW("530", "en_NZ") \
    ROW("456", "en_KH") \
    ROW("704", "es_GT") \
    ROW("706", "es_SV") \
    ROW("714", "es_PA") \
    ROW("734", "es_VE") \
    ROW("740", "es_EC") \
    ROW("330", "es_PR") \
    ROW("732", "es_CO") \
    ROW("716", "es_PE") \
    ROW("708", "es_HN") \
    ROW("710", "es_NI") \
    ROW("712", "es_CR") \
    ROW("370", "es_DO") \
    ROW("748", "es_UY") \
    ROW("744", "es_PY")
// clang-format on

namespace coresystem {
namespace ServiceCountryTable {

constexpr std::size_t ROWS = 0 CORESYSTEM_SERVICE_COUNTRY_ROWS(CORESYSTEM_COUNT_ROW);
static_assert(ROWS == 134, "a row was added or lost");

constexpr Column<ROWS, 4> MCC = {{CORESYSTEM_SERVICE_COUNTRY_ROWS(CORESYSTEM_CELL_1_OF_2)}};
constexpr Column<ROWS, 8> LOCALE = {{CORESYSTEM_SERVICE_COUNTRY_ROWS(CORESYSTEM_CELL_2_OF_2)}};

constexpr Index<ROWS, 4> MCC_INDEX = indexOfFirstRows(MCC);
constexpr Index<ROWS, 8> LOCALE_INDEX = indexOfFirstRows(LOCALE);

} // namespace ServiceCountryTable
} // namespace coresystem

#endif
