// The keyword tables. Order matters: a word matches the first keyword that it begins, so the tables keep their rows,
// duplicates included, in the order that scripts have come to rely on. Any thread.
#pragma once

#include <climits>

struct KeywordTable {
    const char* keyword;  // null in the closing row
    int value;
};

// Also the value of the closing row.
inline constexpr int kNotFound = -128;
inline constexpr KeywordTable kEndOfKeywords = {nullptr, kNotFound};

// XA flags; a bitmask.
inline constexpr KeywordTable XaFlagKeywords[] = {
    {"tmnoflags", 0}, {"tmregister", 1}, {"tmnomigrate", 2}, {"tmuseasync", 4}, {"tmasync", INT_MIN},
    {"tmonephase", 0x40000000}, {"tmfail", 0x20000000}, {"tmnowait", 0x10000000}, {"tmresume", 0x8000000},
    {"tmsuccess", 0x4000000}, {"tmsuspend", 0x2000000}, {"tmstartrscan", 0x1000000}, {"tmendrscan", 0x800000},
    {"tmmultiple", 0x400000}, {"tmjoin", 0x200000}, {"tmmigrate", 0x100000},
    kEndOfKeywords};

// XA return codes, upper case. They also name a code in the log: the first row of its value.
inline constexpr KeywordTable XaReturnCodeKeywords[] = {
    {"XA_OK", 0}, {"XA_RBBASE", 100}, {"XA_RBROLLBACK", 100}, {"XA_RBCOMMFAIL", 101}, {"XA_RBDEADLOCK", 102},
    {"XA_RBINTEGRITY", 103}, {"XA_RBOTHER", 104}, {"XA_RBPROTO", 105}, {"XA_RBTIMEOUT", 106}, {"XA_RBTRANSIENT", 107},
    {"XA_RBEND", 107}, {"XA_NOMIGRATE", 9}, {"XA_HEURHAZ", 8}, {"XA_HEURCOM", 7}, {"XA_HEURRB", 6}, {"XA_HEURMIX", 5},
    {"XA_RETRY", 4}, {"XA_RDONLY", 3}, {"XAER_ASYNC", -2}, {"XAER_RMERR", -3}, {"XAER_NOTA", -4}, {"XAER_INVAL", -5},
    {"XAER_PROTO", -6}, {"XAER_RMFAIL", -7}, {"XAER_DUPID", -8}, {"XAER_OUTSIDE", -9}, {"UNKNOWN", -128},
    kEndOfKeywords};

// Piecewise operations.
inline constexpr KeywordTable PieceKeywords[] = {
    {"oci_one_piece", 0}, {"oci_next_piece", 2}, {"oci_last_piece", 3}, {"oci_first_piece", 1},
    kEndOfKeywords};

// OCIFileOpen: standard files.
inline constexpr KeywordTable FileStdKeywords[] = {
    {"oci_file_stdin", 2}, {"oci_file_stdout", 3}, {"oci_file_stderr", 4},
    kEndOfKeywords};

// OCIFileSeek: origins.
inline constexpr KeywordTable FileSeekKeywords[] = {
    {"oci_file_seek_beginning", 1}, {"oci_file_seek_current", 2}, {"oci_file_seek_end", 3},
    kEndOfKeywords};

// OCIFileSeek: directions.
inline constexpr KeywordTable FileDirectionKeywords[] = {
    {"oci_file_forward", 1}, {"oci_file_backward", 2},
    kEndOfKeywords};

// OCIFileOpen: create flags.
inline constexpr KeywordTable FileCreateKeywords[] = {
    {"oci_file_truncate", 4}, {"oci_file_exist", 0}, {"oci_file_excl", 2}, {"oci_file_create", 1},
    {"oci_file_append", 8},
    kEndOfKeywords};

// OCIFileOpen: access modes.
inline constexpr KeywordTable FileOpenModeKeywords[] = {
    {"oci_file_read_only", 1}, {"oci_file_read_write", 3}, {"oci_file_write_only", 2},
    kEndOfKeywords};

// OCIStmtFetch, OCIStmtFetch2: orientations.
inline constexpr KeywordTable FetchOrientationKeywords[] = {
    {"oci_fetch_next", 2}, {"oci_fetch_current", 1}, {"oci_fetch_first", 4}, {"oci_fetch_last", 8},
    {"oci_fetch_prior", 16}, {"oci_fetch_absolute", 32}, {"oci_fetch_relative", 64}, {"oci_default", 0},
    kEndOfKeywords};

// OCIStmtExecute: modes.
inline constexpr KeywordTable ExecuteModeKeywords[] = {
    {"oci_stmt_scrollable_readonly", 8}, {"oci_parse_only", 0x100}, {"oci_describe_only", 0x10},
    {"oci_exact_fetch", 2}, {"oci_commit_on_success", 0x20}, {"oci_batch_errors", 0x80}, {"oci_default", 0},
    kEndOfKeywords};

// OCIDescribeAny: object types.
inline constexpr KeywordTable DescribeTypeKeywords[] = {
    {"oci_ptype_table", 1}, {"oci_ptype_view", 2}, {"oci_ptype_database", 18}, {"oci_ptype_type", 6},
    {"oci_ptype_proc", 3}, {"oci_ptype_syn", 7}, {"oci_ptype_seq", 8}, {"oci_ptype_schema", 17}, {"oci_ptype_pkg", 5},
    kEndOfKeywords};

// OCIStmtPrepare, OCIStmtPrepare2: modes.
inline constexpr KeywordTable Prepare2ModeKeywords[] = {
    {"oci_default", 0}, {"oci_prep2_cache_searchonly", 16}, {"oci_utf16", 16384},
    kEndOfKeywords};

// UpdateBuffer: fields.
inline constexpr KeywordTable BufferFieldKeywords[] = {
    {"ctype", 1}, {"pinfo", 2}, {"cbinfo", 3}, {"pnullind", 4}, {"pcbvalue", 5}, {"prcode", 6},
    kEndOfKeywords};

// External data types.
inline constexpr KeywordTable SqltKeywords[] = {
    {"sqlt_str", 5}, {"sqlt_afc", 96}, {"sqlt_vnu", 6}, {"sqlt_chr", 1}, {"sqlt_time", 185}, {"sqlt_time_tz", 186},
    {"sqlt_num", 2}, {"sqlt_lng", 8}, {"sqlt_lvc", 94}, {"sqlt_vcs", 9}, {"sqlt_avc", 97}, {"sqlt_int", 3},
    {"sqlt_uin", 68}, {"sqlt_pdn", 7}, {"sqlt_bfloat", 21}, {"sqlt_bdouble", 22}, {"sqlt_flt", 4}, {"sqlt_bin", 23},
    {"sqlt_lbi", 24}, {"sqlt_rid", 11}, {"sqlt_vbi", 15}, {"sqlt_lvb", 95}, {"sqlt_vst", 155}, {"sqlt_odt", 156},
    {"sqlt_dat", 12}, {"sqlt_date", 184}, {"sqlt_timestamp", 187}, {"sqlt_timestamp_tz", 188},
    {"sqlt_timestamp_ltz", 232}, {"sqlt_blob", 113}, {"sqlt_clob", 112}, {"sqlt_rdd", 104}, {"sqlt_rset", 116},
    {"sqlt_cur", 102},
    kEndOfKeywords};

// OCITransStart: flags; a bitmask.
inline constexpr KeywordTable TransStartKeywords[] = {
    {"oci_trans_new", 1}, {"oci_trans_tight", 0x20000}, {"oci_trans_loose", 0x10000}, {"oci_trans_resume", 4},
    {"oci_trans_readonly", 0x100}, {"oci_trans_serializable", 0x400}, {"oci_trans_separable", 0x200000},
    {"oci_default", 0},
    kEndOfKeywords};

// Truth values.
inline constexpr KeywordTable BooleanKeywords[] = {
    {"true", 1}, {"false", 0}, {"1", 1}, {"0", 0},
    kEndOfKeywords};

// Temporary LOB types.
inline constexpr KeywordTable TempLobKeywords[] = {
    {"oci_temp_clob", 2}, {"oci_temp_blob", 1}, {"oci_temp_nclob", 3},
    kEndOfKeywords};

// Character set ids.
inline constexpr KeywordTable CharsetIdKeywords[] = {
    {"oci_ucs2id", 1000}, {"oci_utf16id", 1000}, {"oci_default", 0},
    kEndOfKeywords};

// OCITransCommit: flags; a bitmask.
inline constexpr KeywordTable TransCommitKeywords[] = {
    {"oci_default", 0}, {"oci_trans_twophase", 0x1000000}, {"oci_trans_writeimmed", 2}, {"oci_trans_writebatch", 1},
    {"oci_trans_writewait", 4}, {"oci_trans_writenowait", 8},
    kEndOfKeywords};

// Character set forms.
inline constexpr KeywordTable CharsetFormKeywords[] = {
    {"oci_default", 0}, {"sqlcs_implicit", 1}, {"sqlcs_nchar", 2},
    kEndOfKeywords};

// OCISessionRelease: modes.
inline constexpr KeywordTable SessionReleaseKeywords[] = {
    {"oci_default", 0}, {"oci_sessrls_dropsess", 1}, {"oci_sessrls_retag", 2},
    kEndOfKeywords};

// OCISessionGet: modes; a bitmask.
inline constexpr KeywordTable SessionGetKeywords[] = {
    {"oci_default", 0}, {"oci_sessget_cpool", 0x200}, {"oci_sessget_spool", 1}, {"oci_sessget_credproxy", 8},
    {"oci_sessget_credext", 0x10}, {"oci_sessget_purity_new", 0x40}, {"oci_sessget_purity_self", 0x80},
    {"oci_sessget_spool_matchany", 0x20}, {"oci_sessget_stmtcache", 4},
    kEndOfKeywords};

// OCISessionBegin: modes.
inline constexpr KeywordTable SessionBeginKeywords[] = {
    {"oci_default", 0}, {"oci_migrate", 1}, {"oci_sysdba", 2}, {"oci_sysoper", 4}, {"oci_prelim_auth", 8},
    kEndOfKeywords};

// OCISessionPoolCreate: modes. "stmtchache" is spelled so.
inline constexpr KeywordTable SessionPoolKeywords[] = {
    {"oci_default", 0}, {"oci_spc_reinitialize", 1}, {"oci_spc_stmtchache", 4}, {"oci_spc_homogeneous", 2},
    kEndOfKeywords};

// OCILogon2: modes.
inline constexpr KeywordTable Logon2ModeKeywords[] = {
    {"oci_default", 0}, {"oci_logon2_cpool", 0x200}, {"oci_logon2_spool", 1}, {"oci_logon2_stmtcache", 4},
    {"oci_logon2_proxy", 8},
    kEndOfKeywords};

// OCILobOpen: modes.
inline constexpr KeywordTable LobOpenModeKeywords[] = {
    {"oci_lob_readonly", 1}, {"oci_file_readonly", 1}, {"oci_lob_readwrite", 2},
    kEndOfKeywords};

// setlocale: categories, numbered as scripts know them; the C library has its own numbers.
inline constexpr KeywordTable LocaleCategoryKeywords[] = {
    {"lc_all", 0}, {"lc_collate", 1}, {"lc_ctype", 2}, {"lc_monetary", 3}, {"lc_numeric", 4}, {"lc_time", 5},
    kEndOfKeywords};

// Environment modes; a bitmask. Also the modes of session end, server detach, ping and password change.
inline constexpr KeywordTable EnvModeKeywords[] = {
    {"oci_default", 0}, {"oci_threaded", 1}, {"oci_object", 2}, {"oci_utf16", 0x4000},
    kEndOfKeywords};

// OCIStmtPrepare, OCIStmtPrepare2: syntax.
inline constexpr KeywordTable SyntaxKeywords[] = {
    {"oci_ntv_syntax", 1},
    kEndOfKeywords};

// OCIStmtRelease: modes.
inline constexpr KeywordTable ReleaseModeKeywords[] = {
    {"oci_default", 0}, {"oci_strls_cache_delete", 0x10},
    kEndOfKeywords};

// OCIStmtFetch, OCIStmtFetch2: modes.
inline constexpr KeywordTable FetchModeKeywords[] = {
    {"oci_default", 0},
    kEndOfKeywords};

// OCIBindByName, OCIBindByPos: modes.
inline constexpr KeywordTable BindModeKeywords[] = {
    {"oci_default", 0}, {"oci_data_at_exec", 2},
    kEndOfKeywords};

// OCIDefineByPos: modes.
inline constexpr KeywordTable DefineModeKeywords[] = {
    {"oci_default", 0}, {"oci_dynamic_fetch", 2},
    kEndOfKeywords};

// OCIServerAttach: modes.
inline constexpr KeywordTable ServerAttachKeywords[] = {
    {"oci_default", 0}, {"oci_cpool", 0x200},
    kEndOfKeywords};

// OCISessionBegin: credentials.
inline constexpr KeywordTable CredentialKeywords[] = {
    {"oci_cred_rdbms", 1}, {"oci_cred_ext", 2},
    kEndOfKeywords};

// OCINumberFromInt, OCINumberToInt: sign.
inline constexpr KeywordTable NumberSignKeywords[] = {
    {"oci_number_unsigned", 0}, {"oci_number_signed", 2},
    kEndOfKeywords};

// Handle types: the common ones, every descriptor type, the other handle types.
inline constexpr KeywordTable HandleTypeKeywords[] = {
    {"oci_htype_error", 2}, {"oci_htype_svcctx", 3}, {"oci_htype_session", 9}, {"oci_htype_server", 8},
    {"oci_htype_stmt", 4}, {"oci_htype_describe", 7}, {"oci_dtype_param", 53}, {"oci_dtype_lob", 50},
    {"oci_htype_env", 1}, {"oci_htype_bind", 5}, {"oci_htype_define", 6}, {"oci_dtype_lob", 50},
    {"oci_dtype_date", 65}, {"oci_dtype_datetime", 62}, {"oci_dtype_file", 56}, {"oci_dtype_param", 53},
    {"oci_dtype_rset", 52}, {"oci_dtype_aqagent", 60}, {"oci_dtype_aqdeq_options", 58},
    {"oci_dtype_aqenq_options", 57}, {"oci_dtype_aqlis_msg_properties", 76}, {"oci_dtype_aqlis_options", 75},
    {"oci_dtype_aqmsg_properties", 59}, {"oci_dtype_aqnfy_descriptor", 64}, {"oci_dtype_chdes", 77},
    {"oci_dtype_complexobjectcomp", 55}, {"oci_dtype_cqdes", 80}, {"oci_dtype_first", 50},
    {"oci_dtype_interval_ds", 63}, {"oci_dtype_interval_ym", 62}, {"oci_dtype_last", 81},
    {"oci_dtype_lob_region", 81}, {"oci_dtype_locator", 61}, {"oci_dtype_reserved_1", 74},
    {"oci_dtype_row_chdes", 79}, {"oci_dtype_rowid", 54}, {"oci_dtype_signature", 73}, {"oci_dtype_snap", 51},
    {"oci_dtype_srvdn", 72}, {"oci_dtype_table_chdes", 78}, {"oci_dtype_time", 66}, {"oci_dtype_time_tz", 67},
    {"oci_dtype_timestamp", 68}, {"oci_dtype_timestamp_ltz", 70}, {"oci_dtype_timestamp_tz", 69},
    {"oci_dtype_ucb", 71}, {"oci_htype_admin", 28}, {"oci_htype_authinfo", 9}, {"oci_htype_complexobject", 11},
    {"oci_htype_cpool", 26}, {"oci_htype_dirpath_column_array", 15}, {"oci_htype_dirpath_ctx", 14},
    {"oci_htype_dirpath_fn_col_array", 19}, {"oci_htype_dirpath_fn_ctx", 18}, {"oci_htype_dirpath_stream", 16},
    {"oci_htype_event", 29}, {"oci_htype_first", 1}, {"oci_htype_last", 29}, {"oci_htype_proc", 17},
    {"oci_htype_security", 12}, {"oci_htype_spool", 27}, {"oci_htype_subscription", 13}, {"oci_htype_trans", 10},
    {"oci_htype_xadfield", 22}, {"oci_htype_xadgranule", 23}, {"oci_htype_xadio", 25}, {"oci_htype_xadrecord", 24},
    {"oci_htype_xadsession", 20}, {"oci_htype_xadtable", 21},
    kEndOfKeywords};

// Descriptor types: the common ones first and again in their alphabetical place, then handle types.
// "oci_dtype_datetime" is the driver's own word and stands for 62.
inline constexpr KeywordTable DescriptorTypeKeywords[] = {
    {"oci_dtype_lob", 50}, {"oci_dtype_date", 65}, {"oci_dtype_datetime", 62}, {"oci_dtype_file", 56},
    {"oci_dtype_param", 53}, {"oci_dtype_rset", 52}, {"oci_dtype_aqagent", 60}, {"oci_dtype_aqdeq_options", 58},
    {"oci_dtype_aqenq_options", 57}, {"oci_dtype_aqlis_msg_properties", 76}, {"oci_dtype_datetime", 62},
    {"oci_dtype_aqlis_options", 75}, {"oci_dtype_aqmsg_properties", 59}, {"oci_dtype_aqnfy_descriptor", 64},
    {"oci_dtype_chdes", 77}, {"oci_dtype_complexobjectcomp", 55}, {"oci_dtype_cqdes", 80}, {"oci_dtype_file", 56},
    {"oci_dtype_first", 50}, {"oci_dtype_interval_ds", 63}, {"oci_dtype_interval_ym", 62}, {"oci_dtype_last", 81},
    {"oci_dtype_lob", 50}, {"oci_dtype_lob_region", 81}, {"oci_dtype_locator", 61}, {"oci_dtype_param", 53},
    {"oci_dtype_reserved_1", 74}, {"oci_dtype_row_chdes", 79}, {"oci_dtype_rowid", 54}, {"oci_dtype_rset", 52},
    {"oci_dtype_signature", 73}, {"oci_dtype_snap", 51}, {"oci_dtype_srvdn", 72}, {"oci_dtype_table_chdes", 78},
    {"oci_dtype_time", 66}, {"oci_dtype_time_tz", 67}, {"oci_dtype_timestamp", 68}, {"oci_dtype_timestamp_ltz", 70},
    {"oci_dtype_timestamp_tz", 69}, {"oci_dtype_ucb", 71}, {"oci_htype_admin", 28}, {"oci_htype_authinfo", 9},
    {"oci_htype_complexobject", 11}, {"oci_htype_cpool", 26}, {"oci_htype_dirpath_column_array", 15},
    {"oci_htype_dirpath_ctx", 14}, {"oci_htype_dirpath_fn_col_array", 19}, {"oci_htype_dirpath_fn_ctx", 18},
    {"oci_htype_dirpath_stream", 16}, {"oci_htype_event", 29}, {"oci_htype_first", 1}, {"oci_htype_last", 29},
    {"oci_htype_proc", 17}, {"oci_htype_security", 12}, {"oci_htype_spool", 27}, {"oci_htype_subscription", 13},
    {"oci_htype_trans", 10}, {"oci_htype_xadfield", 22}, {"oci_htype_xadgranule", 23}, {"oci_htype_xadio", 25},
    {"oci_htype_xadrecord", 24}, {"oci_htype_xadsession", 20}, {"oci_htype_xadtable", 21},
    kEndOfKeywords};
