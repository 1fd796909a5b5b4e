// Keyword tables against rows written down by hand, and the two ways of decoding a word.
#include <climits>
#include <sstream>

#include "core/keywords.h"
#include "support/printed.h"

namespace {

size_t CountRows(const KeywordTable* table) {
    size_t count = 0;
    while (table[count].keyword != nullptr) ++count;
    return count;
}

// Some rows of each table in its order, not necessarily neighbours, and how many there are.
TEST(Keywords, TablesHoldTheirRowsInOrder) {
    const struct { const KeywordTable* table; const char* name; size_t rows; const char* some; } cases[] = {
        {XaFlagKeywords, "XaFlag", 16, "tmnoflags 0 tmuseasync 4 tmasync -2147483648 tmonephase 1073741824 "
         "tmjoin 2097152 tmmigrate 1048576"},
        {XaReturnCodeKeywords, "XaReturnCode", 27, "XA_OK 0 XA_RBBASE 100 XA_RBROLLBACK 100 XA_RBTRANSIENT 107 "
         "XA_RBEND 107 XAER_OUTSIDE -9 UNKNOWN -128"},
        {PieceKeywords, "Piece", 4, "oci_one_piece 0 oci_next_piece 2 oci_last_piece 3 oci_first_piece 1"},
        {FileStdKeywords, "FileStd", 3, "oci_file_stdin 2 oci_file_stdout 3 oci_file_stderr 4"},
        {FileSeekKeywords, "FileSeek", 3, "oci_file_seek_beginning 1 oci_file_seek_current 2 oci_file_seek_end 3"},
        {FileCreateKeywords, "FileCreate", 5, "oci_file_truncate 4 oci_file_exist 0 oci_file_excl 2 oci_file_create 1 "
         "oci_file_append 8"},
        {FileOpenModeKeywords, "FileOpenMode", 3, "oci_file_read_only 1 oci_file_read_write 3 oci_file_write_only 2"},
        {FetchOrientationKeywords, "FetchOrientation", 8, "oci_fetch_next 2 oci_fetch_current 1 oci_fetch_first 4 "
         "oci_fetch_last 8 oci_fetch_prior 16 oci_fetch_absolute 32 oci_fetch_relative 64 oci_default 0"},
        {ExecuteModeKeywords, "ExecuteMode", 7, "oci_stmt_scrollable_readonly 8 oci_parse_only 256 "
         "oci_describe_only 16 oci_exact_fetch 2 oci_commit_on_success 32 oci_batch_errors 128 oci_default 0"},
        {DescribeTypeKeywords, "DescribeType", 9, "oci_ptype_table 1 oci_ptype_database 18 oci_ptype_schema 17 "
         "oci_ptype_pkg 5"},
        {Prepare2ModeKeywords, "Prepare2Mode", 3, "oci_default 0 oci_prep2_cache_searchonly 16 oci_utf16 16384"},
        {BufferFieldKeywords, "BufferField", 6, "ctype 1 pinfo 2 cbinfo 3 pnullind 4 pcbvalue 5 prcode 6"},
        {SqltKeywords, "Sqlt", 34, "sqlt_str 5 sqlt_afc 96 sqlt_vnu 6 sqlt_time 185 sqlt_time_tz 186 sqlt_lvb 95 "
         "sqlt_date 184 sqlt_timestamp_ltz 232 sqlt_cur 102"},
        {TransStartKeywords, "TransStart", 8, "oci_trans_new 1 oci_trans_tight 131072 oci_trans_loose 65536 "
         "oci_trans_resume 4 oci_trans_separable 2097152 oci_default 0"},
        {BooleanKeywords, "Boolean", 4, "true 1 false 0 1 1 0 0"},
        {TempLobKeywords, "TempLob", 3, "oci_temp_clob 2 oci_temp_blob 1 oci_temp_nclob 3"},
        {CharsetIdKeywords, "CharsetId", 3, "oci_ucs2id 1000 oci_utf16id 1000 oci_default 0"},
        {TransCommitKeywords, "TransCommit", 6, "oci_default 0 oci_trans_twophase 16777216 oci_trans_writeimmed 2 "
         "oci_trans_writebatch 1 oci_trans_writewait 4 oci_trans_writenowait 8"},
        {CharsetFormKeywords, "CharsetForm", 3, "oci_default 0 sqlcs_implicit 1 sqlcs_nchar 2"},
        {SessionReleaseKeywords, "SessionRelease", 3, "oci_default 0 oci_sessrls_dropsess 1 oci_sessrls_retag 2"},
        {SessionGetKeywords, "SessionGet", 9, "oci_default 0 oci_sessget_cpool 512 oci_sessget_purity_self 128 "
         "oci_sessget_spool_matchany 32 oci_sessget_stmtcache 4"},
        {SessionBeginKeywords, "SessionBegin", 5, "oci_default 0 oci_migrate 1 oci_prelim_auth 8"},
        {SessionPoolKeywords, "SessionPool", 4, "oci_default 0 oci_spc_reinitialize 1 oci_spc_stmtchache 4 "
         "oci_spc_homogeneous 2"},
        {Logon2ModeKeywords, "Logon2Mode", 5, "oci_default 0 oci_logon2_cpool 512 oci_logon2_proxy 8"},
        {LobOpenModeKeywords, "LobOpenMode", 3, "oci_lob_readonly 1 oci_file_readonly 1 oci_lob_readwrite 2"},
        {LocaleCategoryKeywords, "LocaleCategory", 6, "lc_all 0 lc_monetary 3 lc_time 5"},
        {EnvModeKeywords, "EnvMode", 4, "oci_default 0 oci_threaded 1 oci_object 2 oci_utf16 16384"},
        {HandleTypeKeywords, "HandleType", 69, "oci_htype_error 2 oci_htype_svcctx 3 oci_htype_session 9 "
         "oci_htype_server 8 oci_htype_stmt 4 oci_htype_describe 7 oci_dtype_param 53 oci_dtype_lob 50 oci_htype_env 1 "
         "oci_htype_bind 5 oci_htype_define 6 oci_dtype_date 65 oci_dtype_datetime 62 oci_dtype_rset 52 "
         "oci_dtype_ucb 71 oci_htype_admin 28 oci_htype_cpool 26 oci_htype_trans 10 oci_htype_xadtable 21"},
        {DescriptorTypeKeywords, "DescriptorType", 63, "oci_dtype_lob 50 oci_dtype_date 65 oci_dtype_datetime 62 "
         "oci_dtype_file 56 oci_dtype_param 53 oci_dtype_rset 52 oci_dtype_aqagent 60 oci_dtype_datetime 62 "
         "oci_dtype_interval_ds 63 oci_dtype_interval_ym 62 oci_dtype_lob 50 oci_dtype_rowid 54 oci_dtype_ucb 71 "
         "oci_htype_admin 28 oci_htype_spool 27 oci_htype_xadtable 21"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(CountRows(c.table), c.rows) << c.name;
        EXPECT_EQ(c.table[c.rows].value, -128) << c.name;
        const KeywordTable* row = c.table;
        std::istringstream some(c.some);
        std::string keyword;
        for (int value = 0; some >> keyword >> value; ++row) {
            while (row->keyword != nullptr && row->keyword != keyword) ++row;
            ASSERT_NE(row->keyword, nullptr) << c.name << ": " << keyword;
            EXPECT_EQ(row->value, value) << c.name << ": " << keyword;
        }
        EXPECT_TRUE(some.eof()) << c.name;
    }
}

TEST(Keywords, FirstKeywordThatTheWordBegins) {
    const struct { const char* word; const KeywordTable* table; int value; } cases[] = {
        {"sqlt_t", SqltKeywords, 185}, {"SQLT_TIME_TZ", SqltKeywords, 186}, {"sqlt_timestamp", SqltKeywords, 187},
        {"sqlt_timex", SqltKeywords, -128}, {"oci_d", FetchOrientationKeywords, 0},
        {"OCI_DEFAULT", FetchOrientationKeywords, 0}, {"oci_fetch_n", FetchOrientationKeywords, 2},
        {"t", BooleanKeywords, 1}, {"1", BooleanKeywords, 1}, {"2", BooleanKeywords, -128},
        {"tmasync", XaFlagKeywords, INT_MIN}, {"oci_dtype_r", HandleTypeKeywords, 52},
        {"oci_dtype_i", DescriptorTypeKeywords, 63}, {" oci_default", FetchOrientationKeywords, -128}};
    for (const auto& c : cases) EXPECT_EQ(DecodeKeyword(c.word, c.table), c.value) << c.word;
    EXPECT_EQ(DecodeKeyword(std::string(9999, 'o').c_str(), EnvModeKeywords), -128);
}

// What a decoding gives and prints.
struct Decoded { int value; std::string printed; };
template <class Function> Decoded Decode(Function decode, const std::string& word, const KeywordTable* table) {
    Decoded decoded;
    decoded.printed = Printed([&] { decoded.value = decode(word.c_str(), table); });
    return decoded;
}

const std::string kEmptyWord = "DecodeKeyword(): Null length token.\n";
std::string Unrecognized(const std::string& piece) {
    return "Warning : Unrecognized Token in bitmask : " + piece + "\n";
}

TEST(Keywords, BitmaskIsTheOrOfItsWords) {
    const std::string long_piece = "oci_threaded" + std::string(200, 'x');
    const struct { std::string word; int value; std::string printed; } cases[] = {
        {"oci_threaded|oci_object", 3, ""}, {"OCI_UTF16|oci_t", 16385, ""}, {" oci_threaded | oci_object ", 3, ""},
        {"\toci_thr\teaded|\t oci_object\t", 3, ""}, {"oci_threaded|Bogus", 1, Unrecognized("Bogus")},
        {"oci_threaded|", 1, kEmptyWord}, {"", 0, kEmptyWord}, {"|", 0, kEmptyWord + kEmptyWord},
        {"7", 0, Unrecognized("7")}, {long_piece, 0, Unrecognized(long_piece.substr(0, 128))}};
    for (const auto& c : cases) {
        const Decoded decoded = Decode(DecodeBitmask, c.word, EnvModeKeywords);
        EXPECT_EQ(decoded.value, c.value) << c.word;
        EXPECT_EQ(decoded.printed, c.printed) << c.word;
    }
}

TEST(Keywords, AWordThatMatchesNothingIsANumber) {
    Decoded decoded = Decode(DecodeBitmaskOrNumber, "16384", EnvModeKeywords);
    EXPECT_EQ(decoded.value, 16384);
    EXPECT_EQ(decoded.printed, Unrecognized("16384"));
    decoded = Decode(DecodeBitmaskOrNumber, "7|oci_default", EnvModeKeywords);
    EXPECT_EQ(decoded.value, 0) << "one word matched, so the number does not count";
    decoded = Decode(DecodeKeywordOrNumber, "-12abc", FetchModeKeywords);
    EXPECT_EQ(decoded.value, -12);
    EXPECT_EQ(decoded.printed, "");
    EXPECT_EQ(Decode(DecodeKeyword, "", FetchModeKeywords).printed, kEmptyWord);
}

TEST(Keywords, NumbersEndAtTheFirstOtherCharacter) {
    const struct { const char* word; int value; } cases[] = {
        {"12", 12}, {" -7x", -7}, {"+3", 3}, {"abc", 0}, {"", 0}, {"4294967295", -1}, {"0x10", 0}};
    for (const auto& c : cases) EXPECT_EQ(DecodeNumber(c.word), c.value) << c.word;
}

}  // namespace
