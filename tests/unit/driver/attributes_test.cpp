// The catalogue of attributes against rows written down by hand, and what words and numbers stand for.
#include <gtest/gtest.h>

#include <map>
#include <sstream>
#include <string>

#include "commands/handles/attribute_catalogue.h"
#include "oci.h"

namespace {

// Keyword, number, shape, and the handles that have it, as the interface is published.
constexpr char kPublished[] = R"(
oci_attr_server 6 server svcctx   oci_attr_session 7 session svcctx   oci_attr_trans 8 trans svcctx
oci_attr_env 5 environment svcctx+server+stmt+session   oci_attr_username 22 text session
oci_attr_password 23 text session   oci_attr_fncode 1 ub4 env+error   oci_attr_object 2 sb4 env
oci_attr_nonblocking_mode 3 ub1 server   oci_attr_sqlcode 4 sb4 error   oci_attr_row_count 9 ub4 stmt
oci_attr_sqlfncode 10 ub2 stmt   oci_attr_prefetch_rows 11 ub4 stmt   oci_attr_nested_prefetch_rows 12 ub4 stmt
oci_attr_prefetch_memory 13 ub4 stmt   oci_attr_nested_prefetch_memory 14 ub4 stmt
oci_attr_char_count 15 ub4 bind+define   oci_attr_pdscl 16 sb2 bind+define
oci_attr_fsprecision 16 ub1 bind+define+param   oci_attr_pdprc 17 ub2 bind+define
oci_attr_lfprecision 17 ub1 bind+define+param   oci_attr_param_count 18 ub4 stmt+describe   oci_attr_rowid 19 rowid stmt
oci_attr_stmt_type 24 ub2 stmt   oci_attr_internal_name 25 text server   oci_attr_external_name 26 text server
oci_attr_xid 27 xid trans   oci_attr_trans_lock 28 ub4 trans   oci_attr_trans_name 29 text trans
oci_attr_heapalloc 30 ub4 env   oci_attr_charset_id 31 ub2 env+bind+define+param
oci_attr_charset_form 32 ub1 bind+define+param   oci_attr_maxdata_size 33 sb4 bind   oci_attr_cache_opt_size 34 ub4 env
oci_attr_cache_max_size 35 ub4 env   oci_attr_pinoption 36 ub2 env   oci_attr_alloc_duration 37 ub2 env
oci_attr_pin_duration 38 ub2 env   oci_attr_rows_returned 42 ub4 bind   oci_attr_focbk 43 pointer server
oci_attr_in_v8_mode 44 ub1 svcctx+server   oci_attr_lobempty 45 ub4 lob   oci_attr_num_dml_errors 73 ub4 stmt
oci_attr_dml_row_offset 74 ub4 error   oci_attr_shared_heapalloc 84 ub4 env   oci_attr_server_group 85 text server
oci_attr_migsession 86 session session   oci_attr_proxy_credentials 99 session session
oci_attr_initial_client_roles 100 texts session   oci_attr_parse_error_offset 129 ub2 stmt
oci_attr_trans_timeout 142 ub4 trans   oci_attr_server_status 143 ub4 server   oci_attr_statement 144 text stmt
oci_attr_maxchar_size 163 sb4 bind+define   oci_attr_current_position 164 ub4 stmt
oci_attr_stmtcachesize 176 ub4 svcctx   oci_attr_conn_nowait 178 ub1 cpool   oci_attr_conn_busy_count 179 ub4 cpool
oci_attr_conn_open_count 180 ub4 cpool   oci_attr_conn_timeout 181 ub4 cpool   oci_attr_stmt_state 182 ub4 stmt
oci_attr_conn_min 183 ub4 cpool   oci_attr_conn_max 184 ub4 cpool   oci_attr_conn_incr 185 ub4 cpool
oci_attr_num_open_stmts 188 ub4 session   oci_attr_bind_count 190 ub4 stmt
oci_attr_handle_position 191 ub4 bind+define   oci_attr_server_busy 193 ub1 server   oci_attr_rows_fetched 197 ub4 stmt
oci_attr_spool_stmtcachesize 208 ub4 spool   oci_attr_env_utf16 209 ub1 env   oci_attr_ncharset_id 262 ub2 env+param
oci_attr_client_identifier 278 text session   oci_attr_current_schema 224 text session
oci_attr_spool_timeout 308 ub4 spool   oci_attr_spool_getmode 309 ub1 spool   oci_attr_spool_busy_count 310 ub4 spool
oci_attr_spool_open_count 311 ub4 spool   oci_attr_spool_min 312 ub4 spool   oci_attr_spool_max 313 ub4 spool
oci_attr_spool_incr 314 ub4 spool   oci_attr_module 366 text session   oci_attr_action 367 text session
oci_attr_client_info 368 text session   oci_attr_data_size 1 ub2 param   oci_attr_data_type 2 ub2 param
oci_attr_disp_size 3 ub4 param   oci_attr_name 4 text param   oci_attr_precision 5 sb2 param
oci_attr_scale 6 sb1 param   oci_attr_is_null 7 ub1 param   oci_attr_type_name 8 text param
oci_attr_schema_name 9 text param   oci_attr_sub_name 10 text param   oci_attr_position 11 ub2 param
oci_attr_num_cols 102 ub2 param   oci_attr_list_columns 103 param param   oci_attr_rdba 104 ub4 param
oci_attr_clustered 105 ub1 param   oci_attr_partitioned 106 ub1 param   oci_attr_index_only 107 ub1 param
oci_attr_list_arguments 108 param param   oci_attr_list_subprograms 109 param param   oci_attr_ref_tdo 110 pointer param
oci_attr_link 111 text param   oci_attr_min 112 number param   oci_attr_max 113 number param
oci_attr_incr 114 number param   oci_attr_cache 115 number param   oci_attr_order 116 ub1 param
oci_attr_hw_mark 117 number param   oci_attr_timestamp 119 date param   oci_attr_num_params 121 ub2 param
oci_attr_objid 122 ub4 param   oci_attr_ptype 123 ub1 param   oci_attr_param 124 param describe
oci_attr_overload_id 125 ub2 param   oci_attr_tablespace 126 sb4 param   oci_attr_ltype 128 ub2 param
oci_attr_is_temporary 130 ub1 param   oci_attr_is_typed 131 ub1 param   oci_attr_duration 132 ub2 param
oci_attr_is_invoker_rights 133 ub1 param   oci_attr_obj_name 134 text param   oci_attr_obj_schema 135 text param
oci_attr_obj_id 136 ub4 param   oci_attr_level 211 ub2 param   oci_attr_has_default 212 ub1 param
oci_attr_iomode 213 sb4 param   oci_attr_radix 214 ub1 param   oci_attr_typecode 216 ub2 param
oci_attr_version 218 text param   oci_attr_desc_public 250 sb4 describe   oci_attr_list_objects 261 param param
oci_attr_list_schemas 263 param param   oci_attr_max_proc_len 264 ub4 param   oci_attr_max_column_len 265 ub4 param
oci_attr_cursor_commit_behavior 266 ub1 param   oci_attr_max_catalog_namelen 267 ub1 param
oci_attr_catalog_location 268 ub1 param   oci_attr_savepoint_support 269 ub1 param
oci_attr_nowait_support 270 ub1 param   oci_attr_autocommit_ddl 271 ub1 param   oci_attr_locking_mode 272 ub1 param
oci_attr_char_used 285 ub1 param   oci_attr_char_size 286 ub2 param
)";

const std::map<std::string, AttributeShape> kShapes = {
    {"ub1", AttributeShape::ub1}, {"ub2", AttributeShape::ub2}, {"ub4", AttributeShape::ub4},
    {"sb1", AttributeShape::sb1}, {"sb2", AttributeShape::sb2}, {"sb4", AttributeShape::sb4},
    {"text", AttributeShape::text}, {"texts", AttributeShape::texts}, {"server", AttributeShape::server},
    {"session", AttributeShape::session}, {"trans", AttributeShape::trans},
    {"environment", AttributeShape::environment}, {"param", AttributeShape::param},
    {"rowid", AttributeShape::rowid}, {"xid", AttributeShape::xid}, {"date", AttributeShape::date},
    {"number", AttributeShape::number}, {"pointer", AttributeShape::pointer}};
const std::map<std::string, int> kTypes = {
    {"env", 1}, {"error", 2}, {"svcctx", 3}, {"stmt", 4}, {"bind", 5}, {"define", 6}, {"describe", 7}, {"server", 8},
    {"session", 9}, {"trans", 10}, {"cpool", 26}, {"spool", 27}, {"lob", 50}, {"param", 53}};

struct Published { std::string keyword, shape, types; uint32_t number; };

std::vector<Published> PublishedRows() {
    std::vector<Published> rows;
    std::istringstream lines(kPublished);
    Published row;
    while (lines >> row.keyword >> row.number >> row.shape >> row.types) rows.push_back(row);
    return rows;
}

TEST(Attributes, EachKeywordFindsItsOwnNumberAndShape) {
    const std::vector<Published> rows = PublishedRows();
    ASSERT_EQ(rows.size(), 146u);
    EXPECT_EQ(AttributeCatalogue().size(), 146u);
    EXPECT_STREQ(AttributeCatalogue().front().keyword, "oci_attr_server");
    for (const Published& row : rows) {
        const int type = kTypes.at(row.types.substr(0, row.types.find('+')));
        const Attribute found = DecodeAttribute(row.keyword.c_str(), type);
        EXPECT_EQ(found.number, row.number) << row.keyword;
        EXPECT_EQ(found.shape, kShapes.at(row.shape)) << row.keyword;
    }
}

// Two numbers of binds and defines mean packed decimals and datetimes alike: the former come first.
TEST(Attributes, EachNumberStandsForTheRowOfTheHandle) {
    std::map<std::pair<uint32_t, std::string>, std::string> shapes;
    for (const Published& row : PublishedRows()) {
        std::istringstream types(row.types);
        for (std::string type; std::getline(types, type, '+');) shapes.try_emplace({row.number, type}, row.shape);
    }
    for (const auto& [key, shape] : shapes) {
        const auto& [number, type] = key;
        EXPECT_EQ(DecodeAttribute(std::to_string(number).c_str(), kTypes.at(type)).shape, kShapes.at(shape))
            << number << " of " << type;
    }
}

TEST(Attributes, WordsMayBeShortenedAndNumbersNeedNotBeKnown) {
    const struct { const char* word; int type; uint32_t number; AttributeShape shape; } cases[] = {
        {"o", OCI_HTYPE_SVCCTX, 6, AttributeShape::server},
        {"OCI_ATTR_PARAM", OCI_HTYPE_DESCRIBE, 124, AttributeShape::param},
        {"oci_attr_param_", OCI_HTYPE_STMT, 18, AttributeShape::ub4},
        {"oci_attr_is_t", OCI_DTYPE_PARAM, 130, AttributeShape::ub1},
        {"oci_attr_name", OCI_HTYPE_ERROR, 4, AttributeShape::sb4},
        {"oci_attr_version", OCI_HTYPE_STMT, 218, AttributeShape::ub8},
        {"100", OCI_HTYPE_SESSION, 100, AttributeShape::texts},  {"308", OCI_HTYPE_SPOOL, 308, AttributeShape::ub4},
        {"308", OCI_HTYPE_SERVER, 308, AttributeShape::ub8},     {"9", OCI_HTYPE_STMT, 9, AttributeShape::ub4},
        {"9", OCI_DTYPE_PARAM, 9, AttributeShape::text},         {"x", OCI_HTYPE_STMT, 0, AttributeShape::ub8},
        {"-1", OCI_HTYPE_STMT, 0xFFFFFFFF, AttributeShape::ub8},
    };
    for (const auto& c : cases) {
        const Attribute found = DecodeAttribute(c.word, c.type);
        EXPECT_EQ(found.number, c.number) << c.word;
        EXPECT_EQ(found.shape, c.shape) << c.word << " of " << c.type;
    }
}

}  // namespace
