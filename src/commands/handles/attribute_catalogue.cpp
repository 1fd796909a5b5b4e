// The catalogue of attributes, and the decoding of their words.
#include "commands/handles/attribute_catalogue.h"

#include <algorithm>
#include <array>
#include <iterator>

#include "core/keywords.h"
#include "oci.h"

namespace {

using Shape = AttributeShape;

constexpr uint8_t env = OCI_HTYPE_ENV, error = OCI_HTYPE_ERROR, svcctx = OCI_HTYPE_SVCCTX, stmt = OCI_HTYPE_STMT,
                  bind = OCI_HTYPE_BIND, define = OCI_HTYPE_DEFINE, describe = OCI_HTYPE_DESCRIBE,
                  server = OCI_HTYPE_SERVER, session = OCI_HTYPE_SESSION, trans = OCI_HTYPE_TRANS,
                  cpool = OCI_HTYPE_CPOOL, spool = OCI_HTYPE_SPOOL, lob = OCI_DTYPE_LOB, param = OCI_DTYPE_PARAM;

// A shape that the published interface leaves to the way of describing is the wider of its two: the area that values
// are read into starts as zeros.
constexpr AttributeRow kCatalogue[] = {
    {"oci_attr_server", OCI_ATTR_SERVER, Shape::server, {svcctx}},
    {"oci_attr_session", OCI_ATTR_SESSION, Shape::session, {svcctx}},
    {"oci_attr_trans", OCI_ATTR_TRANS, Shape::trans, {svcctx}},
    {"oci_attr_env", OCI_ATTR_ENV, Shape::environment,
     {svcctx, server, stmt, session, env, error, bind, define, describe, trans, cpool, spool, lob}},
    {"oci_attr_username", OCI_ATTR_USERNAME, Shape::text, {session}},
    {"oci_attr_password", OCI_ATTR_PASSWORD, Shape::text, {session}},
    {"oci_attr_fncode", OCI_ATTR_FNCODE, Shape::ub4, {env, error}},
    {"oci_attr_object", OCI_ATTR_OBJECT, Shape::sb4, {env}},
    {"oci_attr_nonblocking_mode", OCI_ATTR_NONBLOCKING_MODE, Shape::ub1, {svcctx, server}},
    {"oci_attr_sqlcode", OCI_ATTR_SQLCODE, Shape::sb4, {error}},
    {"oci_attr_row_count", OCI_ATTR_ROW_COUNT, Shape::ub4, {stmt}},
    {"oci_attr_sqlfncode", OCI_ATTR_SQLFNCODE, Shape::ub2, {stmt}},
    {"oci_attr_prefetch_rows", OCI_ATTR_PREFETCH_ROWS, Shape::ub4, {stmt}},
    {"oci_attr_nested_prefetch_rows", OCI_ATTR_NESTED_PREFETCH_ROWS, Shape::ub4, {stmt}},
    {"oci_attr_prefetch_memory", OCI_ATTR_PREFETCH_MEMORY, Shape::ub4, {stmt}},
    {"oci_attr_nested_prefetch_memory", OCI_ATTR_NESTED_PREFETCH_MEMORY, Shape::ub4, {stmt}},
    {"oci_attr_char_count", OCI_ATTR_CHAR_COUNT, Shape::ub4, {bind, define}},
    {"oci_attr_pdscl", OCI_ATTR_PDSCL, Shape::sb2, {bind, define}},
    {"oci_attr_fsprecision", OCI_ATTR_FSPRECISION, Shape::ub1, {bind, define, param}},
    {"oci_attr_pdprc", OCI_ATTR_PDPRC, Shape::ub2, {bind, define}},
    {"oci_attr_lfprecision", OCI_ATTR_LFPRECISION, Shape::ub1, {bind, define, param}},
    {"oci_attr_param", OCI_ATTR_PARAM, Shape::param, {describe}},
    {"oci_attr_param_count", OCI_ATTR_PARAM_COUNT, Shape::ub4, {stmt, describe}},
    {"oci_attr_rowid", OCI_ATTR_ROWID, Shape::rowid, {stmt}},
    {"oci_attr_stmt_type", OCI_ATTR_STMT_TYPE, Shape::ub2, {stmt}},
    {"oci_attr_internal_name", OCI_ATTR_INTERNAL_NAME, Shape::text, {server}},
    {"oci_attr_external_name", OCI_ATTR_EXTERNAL_NAME, Shape::text, {server}},
    {"oci_attr_xid", OCI_ATTR_XID, Shape::xid, {trans}},
    {"oci_attr_trans_lock", OCI_ATTR_TRANS_LOCK, Shape::ub4, {trans}},
    {"oci_attr_trans_name", OCI_ATTR_TRANS_NAME, Shape::text, {trans}},
    {"oci_attr_heapalloc", OCI_ATTR_HEAPALLOC, Shape::ub4, {env}},
    {"oci_attr_charset_id", OCI_ATTR_CHARSET_ID, Shape::ub2, {env, bind, define, param}},
    {"oci_attr_charset_form", OCI_ATTR_CHARSET_FORM, Shape::ub1, {bind, define, param}},
    {"oci_attr_max", OCI_ATTR_MAX, Shape::number, {param}},
    {"oci_attr_maxdata_size", OCI_ATTR_MAXDATA_SIZE, Shape::sb4, {bind}},
    {"oci_attr_cache", OCI_ATTR_CACHE, Shape::number, {param}},
    {"oci_attr_cache_opt_size", OCI_ATTR_CACHE_OPT_SIZE, Shape::ub4, {env}},
    {"oci_attr_cache_max_size", OCI_ATTR_CACHE_MAX_SIZE, Shape::ub4, {env}},
    {"oci_attr_pinoption", OCI_ATTR_PINOPTION, Shape::ub2, {env}},
    {"oci_attr_alloc_duration", OCI_ATTR_ALLOC_DURATION, Shape::ub2, {env}},
    {"oci_attr_pin_duration", OCI_ATTR_PIN_DURATION, Shape::ub2, {env}},
    {"oci_attr_rows_returned", OCI_ATTR_ROWS_RETURNED, Shape::ub4, {bind}},
    {"oci_attr_focbk", OCI_ATTR_FOCBK, Shape::pointer, {server}},
    {"oci_attr_in_v8_mode", OCI_ATTR_IN_V8_MODE, Shape::ub1, {svcctx, server}},
    {"oci_attr_lobempty", OCI_ATTR_LOBEMPTY, Shape::ub4, {lob}},
    {"oci_attr_num_dml_errors", OCI_ATTR_NUM_DML_ERRORS, Shape::ub4, {stmt}},
    {"oci_attr_dml_row_offset", OCI_ATTR_DML_ROW_OFFSET, Shape::ub4, {error}},
    {"oci_attr_shared_heapalloc", OCI_ATTR_SHARED_HEAPALLOC, Shape::ub4, {env}},
    {"oci_attr_server_group", OCI_ATTR_SERVER_GROUP, Shape::text, {server}},
    {"oci_attr_migsession", OCI_ATTR_MIGSESSION, Shape::session, {session}},
    {"oci_attr_proxy_credentials", OCI_ATTR_PROXY_CREDENTIALS, Shape::session, {session}},
    {"oci_attr_initial_client_roles", OCI_ATTR_INITIAL_CLIENT_ROLES, Shape::texts, {session}},
    {"oci_attr_parse_error_offset", OCI_ATTR_PARSE_ERROR_OFFSET, Shape::ub2, {stmt}},
    {"oci_attr_trans_timeout", OCI_ATTR_TRANS_TIMEOUT, Shape::ub4, {trans}},
    {"oci_attr_server_status", OCI_ATTR_SERVER_STATUS, Shape::ub4, {server}},
    {"oci_attr_statement", OCI_ATTR_STATEMENT, Shape::text, {stmt}},
    {"oci_attr_maxchar_size", OCI_ATTR_MAXCHAR_SIZE, Shape::sb4, {bind, define}},
    {"oci_attr_current_position", OCI_ATTR_CURRENT_POSITION, Shape::ub4, {stmt}},
    {"oci_attr_stmtcachesize", OCI_ATTR_STMTCACHESIZE, Shape::ub4, {svcctx}},
    {"oci_attr_conn_nowait", OCI_ATTR_CONN_NOWAIT, Shape::ub1, {cpool}},
    {"oci_attr_conn_busy_count", OCI_ATTR_CONN_BUSY_COUNT, Shape::ub4, {cpool}},
    {"oci_attr_conn_open_count", OCI_ATTR_CONN_OPEN_COUNT, Shape::ub4, {cpool}},
    {"oci_attr_conn_timeout", OCI_ATTR_CONN_TIMEOUT, Shape::ub4, {cpool}},
    {"oci_attr_stmt_state", OCI_ATTR_STMT_STATE, Shape::ub4, {stmt}},
    {"oci_attr_conn_min", OCI_ATTR_CONN_MIN, Shape::ub4, {cpool}},
    {"oci_attr_conn_max", OCI_ATTR_CONN_MAX, Shape::ub4, {cpool}},
    {"oci_attr_conn_incr", OCI_ATTR_CONN_INCR, Shape::ub4, {cpool}},
    {"oci_attr_num_open_stmts", OCI_ATTR_NUM_OPEN_STMTS, Shape::ub4, {session}},
    {"oci_attr_bind_count", OCI_ATTR_BIND_COUNT, Shape::ub4, {stmt}},
    {"oci_attr_handle_position", OCI_ATTR_HANDLE_POSITION, Shape::ub4, {bind, define}},
    {"oci_attr_server_busy", OCI_ATTR_SERVER_BUSY, Shape::ub1, {server}},
    {"oci_attr_rows_fetched", OCI_ATTR_ROWS_FETCHED, Shape::ub4, {stmt}},
    {"oci_attr_spool_stmtcachesize", OCI_ATTR_SPOOL_STMTCACHESIZE, Shape::ub4, {spool}},
    {"oci_attr_env_utf16", OCI_ATTR_ENV_UTF16, Shape::ub1, {env}},
    {"oci_attr_ncharset_id", OCI_ATTR_NCHARSET_ID, Shape::ub2, {env, param}},
    {"oci_attr_client_identifier", OCI_ATTR_CLIENT_IDENTIFIER, Shape::text, {session}},
    {"oci_attr_current_schema", OCI_ATTR_CURRENT_SCHEMA, Shape::text, {session}},
    {"oci_attr_spool_timeout", OCI_ATTR_SPOOL_TIMEOUT, Shape::ub4, {spool}},
    {"oci_attr_spool_getmode", OCI_ATTR_SPOOL_GETMODE, Shape::ub1, {spool}},
    {"oci_attr_spool_busy_count", OCI_ATTR_SPOOL_BUSY_COUNT, Shape::ub4, {spool}},
    {"oci_attr_spool_open_count", OCI_ATTR_SPOOL_OPEN_COUNT, Shape::ub4, {spool}},
    {"oci_attr_spool_min", OCI_ATTR_SPOOL_MIN, Shape::ub4, {spool}},
    {"oci_attr_spool_max", OCI_ATTR_SPOOL_MAX, Shape::ub4, {spool}},
    {"oci_attr_spool_incr", OCI_ATTR_SPOOL_INCR, Shape::ub4, {spool}},
    {"oci_attr_module", OCI_ATTR_MODULE, Shape::text, {session}},
    {"oci_attr_action", OCI_ATTR_ACTION, Shape::text, {session}},
    {"oci_attr_client_info", OCI_ATTR_CLIENT_INFO, Shape::text, {session}},
    {"oci_attr_data_size", OCI_ATTR_DATA_SIZE, Shape::ub2, {param}},
    {"oci_attr_data_type", OCI_ATTR_DATA_TYPE, Shape::ub2, {param}},
    {"oci_attr_disp_size", OCI_ATTR_DISP_SIZE, Shape::ub4, {param}},
    {"oci_attr_name", OCI_ATTR_NAME, Shape::text, {param}},
    {"oci_attr_precision", OCI_ATTR_PRECISION, Shape::sb2, {param}},
    {"oci_attr_scale", OCI_ATTR_SCALE, Shape::sb1, {param}},
    {"oci_attr_is_null", OCI_ATTR_IS_NULL, Shape::ub1, {param}},
    {"oci_attr_type_name", OCI_ATTR_TYPE_NAME, Shape::text, {param}},
    {"oci_attr_schema_name", OCI_ATTR_SCHEMA_NAME, Shape::text, {param}},
    {"oci_attr_sub_name", OCI_ATTR_SUB_NAME, Shape::text, {param}},
    {"oci_attr_position", OCI_ATTR_POSITION, Shape::ub2, {param}},
    {"oci_attr_num_cols", OCI_ATTR_NUM_COLS, Shape::ub2, {param}},
    {"oci_attr_list_columns", OCI_ATTR_LIST_COLUMNS, Shape::param, {param}},
    {"oci_attr_rdba", OCI_ATTR_RDBA, Shape::ub4, {param}},
    {"oci_attr_clustered", OCI_ATTR_CLUSTERED, Shape::ub1, {param}},
    {"oci_attr_partitioned", OCI_ATTR_PARTITIONED, Shape::ub1, {param}},
    {"oci_attr_index_only", OCI_ATTR_INDEX_ONLY, Shape::ub1, {param}},
    {"oci_attr_list_arguments", OCI_ATTR_LIST_ARGUMENTS, Shape::param, {param}},
    {"oci_attr_list_subprograms", OCI_ATTR_LIST_SUBPROGRAMS, Shape::param, {param}},
    {"oci_attr_ref_tdo", OCI_ATTR_REF_TDO, Shape::pointer, {param}},
    {"oci_attr_link", OCI_ATTR_LINK, Shape::text, {param}},
    {"oci_attr_min", OCI_ATTR_MIN, Shape::number, {param}},
    {"oci_attr_incr", OCI_ATTR_INCR, Shape::number, {param}},
    {"oci_attr_order", OCI_ATTR_ORDER, Shape::ub1, {param}},
    {"oci_attr_hw_mark", OCI_ATTR_HW_MARK, Shape::number, {param}},
    {"oci_attr_timestamp", OCI_ATTR_TIMESTAMP, Shape::date, {param}},
    {"oci_attr_num_params", OCI_ATTR_NUM_PARAMS, Shape::ub2, {param}},
    {"oci_attr_objid", OCI_ATTR_OBJID, Shape::ub4, {param}},
    {"oci_attr_ptype", OCI_ATTR_PTYPE, Shape::ub1, {param}},
    {"oci_attr_overload_id", OCI_ATTR_OVERLOAD_ID, Shape::ub2, {param}},
    {"oci_attr_tablespace", OCI_ATTR_TABLESPACE, Shape::sb4, {param}},
    {"oci_attr_ltype", OCI_ATTR_LTYPE, Shape::ub2, {param}},
    {"oci_attr_is_temporary", OCI_ATTR_IS_TEMPORARY, Shape::ub1, {param}},
    {"oci_attr_is_typed", OCI_ATTR_IS_TYPED, Shape::ub1, {param}},
    {"oci_attr_duration", OCI_ATTR_DURATION, Shape::ub2, {param}},
    {"oci_attr_is_invoker_rights", OCI_ATTR_IS_INVOKER_RIGHTS, Shape::ub1, {param}},
    {"oci_attr_obj_name", OCI_ATTR_OBJ_NAME, Shape::text, {param}},
    {"oci_attr_obj_schema", OCI_ATTR_OBJ_SCHEMA, Shape::text, {param}},
    {"oci_attr_obj_id", OCI_ATTR_OBJ_ID, Shape::ub4, {param}},
    {"oci_attr_level", OCI_ATTR_LEVEL, Shape::ub2, {param}},
    {"oci_attr_has_default", OCI_ATTR_HAS_DEFAULT, Shape::ub1, {param}},
    {"oci_attr_iomode", OCI_ATTR_IOMODE, Shape::sb4, {param}},
    {"oci_attr_radix", OCI_ATTR_RADIX, Shape::ub1, {param}},
    {"oci_attr_typecode", OCI_ATTR_TYPECODE, Shape::ub2, {param}},
    {"oci_attr_version", OCI_ATTR_VERSION, Shape::text, {param}},
    {"oci_attr_desc_public", OCI_ATTR_DESC_PUBLIC, Shape::sb4, {describe}},
    {"oci_attr_list_objects", OCI_ATTR_LIST_OBJECTS, Shape::param, {param}},
    {"oci_attr_list_schemas", OCI_ATTR_LIST_SCHEMAS, Shape::param, {param}},
    {"oci_attr_max_proc_len", OCI_ATTR_MAX_PROC_LEN, Shape::ub4, {param}},
    {"oci_attr_max_column_len", OCI_ATTR_MAX_COLUMN_LEN, Shape::ub4, {param}},
    {"oci_attr_cursor_commit_behavior", OCI_ATTR_CURSOR_COMMIT_BEHAVIOR, Shape::ub1, {param}},
    {"oci_attr_max_catalog_namelen", OCI_ATTR_MAX_CATALOG_NAMELEN, Shape::ub1, {param}},
    {"oci_attr_catalog_location", OCI_ATTR_CATALOG_LOCATION, Shape::ub1, {param}},
    {"oci_attr_savepoint_support", OCI_ATTR_SAVEPOINT_SUPPORT, Shape::ub1, {param}},
    {"oci_attr_nowait_support", OCI_ATTR_NOWAIT_SUPPORT, Shape::ub1, {param}},
    {"oci_attr_autocommit_ddl", OCI_ATTR_AUTOCOMMIT_DDL, Shape::ub1, {param}},
    {"oci_attr_locking_mode", OCI_ATTR_LOCKING_MODE, Shape::ub1, {param}},
    {"oci_attr_char_used", OCI_ATTR_CHAR_USED, Shape::ub1, {param}},
    {"oci_attr_char_size", OCI_ATTR_CHAR_SIZE, Shape::ub2, {param}},
};

// The same as keywords whose values are places in the catalogue.
constexpr auto kKeywords = [] {
    std::array<KeywordTable, std::size(kCatalogue) + 1> table{};
    for (size_t place = 0; place < std::size(kCatalogue); ++place)
        table[place] = {kCatalogue[place].keyword, static_cast<int>(place)};
    table.back() = kEndOfKeywords;
    return table;
}();

bool IsOf(const AttributeRow& row, int handle_type) {
    return std::ranges::find(row.types, handle_type) != std::end(row.types);
}

Attribute AttributeOfNumber(uint32_t number, int handle_type) {
    for (const AttributeRow& row : kCatalogue)
        if (row.number == number && IsOf(row, handle_type)) return {number, row.shape};
    return {number, Shape::ub8};
}

}  // namespace

std::span<const AttributeRow> AttributeCatalogue() {
    return kCatalogue;
}

Attribute DecodeAttribute(const char* word, int handle_type) {
    const int place = DecodeKeyword(word, kKeywords.data());
    if (place == kNotFound) return AttributeOfNumber(static_cast<uint32_t>(DecodeNumber(word)), handle_type);
    const AttributeRow& row = kCatalogue[place];
    return IsOf(row, handle_type) ? Attribute{row.number, row.shape} : AttributeOfNumber(row.number, handle_type);
}
