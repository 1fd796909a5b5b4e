// The ground a scenario stands on, its steps on statements, and what it is judged by.
#include "faults/world.h"

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <memory>

namespace faults {
namespace {

void Must(sword code, const char* what) {
    if (code != OCI_SUCCESS) ADD_FAILURE() << what << " answers " << code << " undisturbed";
}

}  // namespace

World::World(Ground ground, ub4 wanted) : mode(wanted), ground_(ground) {
    ++made_;
    if (ground_ != Ground::nothing) OpenEnvironment();
    if (ground_ == Ground::session) OpenSession();
}

World::~World() {
    if (svc) Must(OCILogoff(svc, quiet_err_), "OCILogoff");
    if (env) Must(OCIHandleFree(env, OCI_HTYPE_ENV), "OCIHandleFree of the environment");
    if (!folder_.empty()) std::filesystem::remove_all(folder_);
}

void World::OpenEnvironment() {
    Must(OCIEnvCreate(&env, mode, nullptr, ApplicationMemory::Allocate, nullptr, ApplicationMemory::Release, 0,
                      nullptr), "OCIEnvCreate");
    Must(OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&err), OCI_HTYPE_ERROR, 0, nullptr), "OCIHandleAlloc");
    Must(OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&quiet_err_), OCI_HTYPE_ERROR, 0, nullptr), "OCIHandleAlloc");
}

void World::OpenSession() {
    server_ = ServerOfTheTest();
    const std::string database = Encoded(Database());
    Must(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, Text(database), Size(database)), "OCILogon");
    Must(OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&quiet_), OCI_HTYPE_STMT, 0, nullptr), "OCIHandleAlloc");
}

std::string World::Database() const { return server_ ? server_->Url() : ":memory:"; }

// ---- Steps

void World::Prepare(std::string_view sql) {
    STEP(OCIStmtPrepare, stmt, err, Text(sql), Size(sql), OCI_NTV_SYNTAX, OCI_DEFAULT);
}

OCIBind* World::Bind(ub4 position, const Area& area, ub4 mode, ub4 most, ub4* current) {
    OCIBind* bind = nullptr;
    STEP(OCIBindByPos, stmt, &bind, err, position, area.value, area.size, area.type, area.indicators, area.lengths,
         area.codes, most, current, mode);
    return bind;
}

OCIBind* World::BindName(std::string_view name, const Area& area, ub4 most, ub4* current) {
    OCIBind* bind = nullptr;
    STEP(OCIBindByName, stmt, &bind, err, Text(name), static_cast<sb4>(name.size()), area.value, area.size, area.type,
         area.indicators, area.lengths, area.codes, most, current, OCI_DEFAULT);
    return bind;
}

OCIDefine* World::Define(ub4 position, const Area& area, ub4 mode) {
    OCIDefine* define = nullptr;
    STEP(OCIDefineByPos, stmt, &define, err, position, area.value, area.size, area.type, area.indicators, area.lengths,
         area.codes, mode);
    return define;
}

sword World::Execute(ub4 iterations, ub4 mode) {
    return STEP(OCIStmtExecute, svc, stmt, err, iterations, 0, nullptr, nullptr, mode);
}

sword World::Fetch(ub4 rows, ub2 orientation, sb4 offset) {
    return STEP(OCIStmtFetch2, stmt, err, rows, orientation, offset, OCI_DEFAULT);
}

void World::Piece(const dvoid* data, ub4& length, ub1 piece) {
    dvoid* handle = nullptr;
    ub4 type = 0, iteration = 0, index = 0;
    ub1 direction = 0, asked = 0;
    STEP(OCIStmtGetPieceInfo, stmt, err, &handle, &type, &direction, &iteration, &index, &asked);
    if (piece == kAsAsked) piece = asked;
    STEP(OCIStmtSetPieceInfo, handle, type, err, data, &length, piece, nullptr, nullptr);
}

void World::Run(std::string_view sql) {
    Prepare(sql);
    Execute();
}

// ---- Undisturbed

// A text of ASCII in the form of the environment.
std::string World::Encoded(std::string_view text) const {
    if (!(mode & OCI_UTF16)) return std::string(text);
    std::string units;
    for (const char c : text) units.append({c, '\0'});
    return units;
}

sb4 World::Number(dvoid* handle, ub4 type, std::string* text) {
    sb4 number = 0;
    OraText words[1025] = "";
    if (OCIErrorGet(handle, 1, nullptr, &number, words, sizeof words, type) != OCI_SUCCESS) return 0;
    if (text) *text = reinterpret_cast<char*>(words);
    return number;
}

void World::CheckFailure(std::string_view name, Told told, sb4 also) {
    const std::string what = std::string(name) + ", without " + Seen().first;
    const sb4 own = err ? Number(err, OCI_HTYPE_ERROR) : 0;
    const bool is_memory = Seen().failed > 0;
    EXPECT_TRUE(is_memory || also != kOutOfMemory) << name << " fails of itself: " << own;
    if (told == Told::code) return;
    std::string text;
    const sb4 number =
        told == Told::error_handle ? Number(err, OCI_HTYPE_ERROR, &text) : Number(env, OCI_HTYPE_ENV, &text);
    EXPECT_TRUE(number == kOutOfMemory ? is_memory : number == also) << number << ": " << what;
    rolled_back_ = text.find(kRolledBack) != std::string::npos;
}

void World::Sql(std::string_view sql) {
    const std::string text = Encoded(sql);
    Must(OCIStmtPrepare(quiet_, quiet_err_, Text(text), Size(text), OCI_NTV_SYNTAX, OCI_DEFAULT), "OCIStmtPrepare");
    const sword code = OCIStmtExecute(svc, quiet_, quiet_err_, 1, 0, nullptr, nullptr, OCI_DEFAULT);
    EXPECT_EQ(code, OCI_SUCCESS) << sql << ": " << Number(quiet_err_, OCI_HTYPE_ERROR);
}

std::string World::One(std::string_view sql) {
    char text[4001] = "";
    OCIDefine* define = nullptr;
    Must(OCIStmtPrepare(quiet_, quiet_err_, Text(sql), Size(sql), OCI_NTV_SYNTAX, OCI_DEFAULT), "OCIStmtPrepare");
    sb2 indicator = 0;
    Must(OCIDefineByPos(quiet_, &define, quiet_err_, 1, text, sizeof text, SQLT_STR, &indicator, nullptr, nullptr,
                        OCI_DEFAULT), "OCIDefineByPos");
    const sword code = OCIStmtExecute(svc, quiet_, quiet_err_, 1, 0, nullptr, nullptr, OCI_DEFAULT);
    return code == OCI_SUCCESS ? text : "!" + std::to_string(Number(quiet_err_, OCI_HTYPE_ERROR));
}

void World::CheckKept() {
    if (!kept_query_.empty()) {
        EXPECT_EQ(One(kept_query_), rolled_back_ ? kept_rolled_back_ : kept_) << kept_query_;
    }
}

void World::Begin() {
    if (ground_ != Ground::session) return;
    dvoid* handle = nullptr;
    Must(OCIHandleAlloc(env, &handle, OCI_HTYPE_STMT, 0, nullptr), "OCIHandleAlloc");
    stmt = static_cast<OCIStmt*>(handle);
    AtEnd([handle] { return OCIHandleFree(handle, OCI_HTYPE_STMT); });
}

void World::Reset() {
    for (; !ends_.empty(); ends_.pop_back()) Must(ends_.back()(), "an end");
    if (ground_ == Ground::session) Sql("rollback");
    kept_query_.clear();
    rolled_back_ = false;
    seen.clear();
}

const std::string& World::Folder() {
    if (folder_.empty()) {
        std::string name = access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp";    // in memory, where syncing is quick
        name += "/kelp-faults-XXXXXX";
        folder_ = mkdtemp(name.data());
    }
    return folder_;
}

OCIString*& NewString(World& w) {
    OCIString*& string = w.Kept<OCIString*>();
    w.AtEnd([&w, &string] { return string ? OCIStringResize(w.env, w.err, 0, &string) : OCI_SUCCESS; });
    return string;
}

}  // namespace faults
