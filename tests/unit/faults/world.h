// What a scenario works in: an environment, a session, a statement, as far as its row asks for them, and the steps it
// takes. A step arms the allocations, makes one call of the library's, and ends the scenario if the call failed;
// everything else here runs undisturbed.
#pragma once

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "faults/allocations.h"
#include "kelpci.h"
#include "oci.h"
#include "support/postgres_database.h"

namespace faults {

// A step failed: the scenario is over.
struct Stopped {};

// Steps, and what holds when one of them failed; the scenario is over then all the same.
template <class Steps, class Check>
void Attempt(Steps steps, Check check) {
    try {
        steps();
    } catch (const Stopped&) {
        check();
        throw;
    }
}

// Where a failing call says why: in an error handle's record, in the environment's, or in its return code alone.
enum class Told { error_handle, environment, code };

constexpr sb4 kOutOfMemory = 1019;

// What is there before a scenario begins.
enum class Ground { nothing, environment, session };
using enum Ground;

class World {
public:
    World(Ground ground, ub4 mode);
    ~World();
    World(const World&) = delete;
    World& operator=(const World&) = delete;

    // ---- Steps

    // Any call; `name` is for messages. OCI_ERROR must be memory's fault and told so, by 1019 or, where another number
    // is as good or what the call is made for, by `also`; then Stopped is thrown.
    template <class Call>
    sword Step(std::string_view name, Call call, Told told = Told::error_handle, sb4 also = kOutOfMemory) {
        const sword code = Disturbed(call);
        if (code == OCI_ERROR) {
            CheckFailure(name, told, also);
            throw Stopped();
        }
        if (code == OCI_INVALID_HANDLE) ADD_FAILURE() << name << " answers OCI_INVALID_HANDLE";
        return code;
    }
    // A call that needs no memory, such as one that frees: it never fails.
    template <class Call>
    void Surely(std::string_view name, Call call) {
        const sword code = Disturbed(call);
        EXPECT_EQ(code, OCI_SUCCESS) << name;
    }
    // A handle that lives until the scenario is over.
    template <class T>
    T* New(ub4 type) {
        dvoid* handle = nullptr;
        Step("OCIHandleAlloc", [&] { return OCIHandleAlloc(env, &handle, type, 16, nullptr); }, Told::environment);
        AtEnd([handle, type] { return OCIHandleFree(handle, type); });
        return static_cast<T*>(handle);
    }
    template <class T>
    T* NewDescriptor(ub4 type) {
        dvoid* descriptor = nullptr;
        Step("OCIDescriptorAlloc", [&] { return OCIDescriptorAlloc(env, &descriptor, type, 16, nullptr); },
             Told::environment);
        AtEnd([descriptor, type] { return OCIDescriptorFree(descriptor, type); });
        return static_cast<T*>(descriptor);
    }

    struct Area {
        dvoid* value;
        sb4 size;
        ub2 type;
        sb2* indicators = nullptr;
        ub2* lengths = nullptr;
        ub2* codes = nullptr;
    };
    void Prepare(std::string_view sql);
    OCIBind* Bind(ub4 position, const Area& area, ub4 mode = OCI_DEFAULT, ub4 most = 0, ub4* current = nullptr);
    OCIBind* BindName(std::string_view name, const Area& area, ub4 most = 0, ub4* current = nullptr);
    OCIDefine* Define(ub4 position, const Area& area, ub4 mode = OCI_DEFAULT);
    sword Execute(ub4 iterations = 1, ub4 mode = OCI_DEFAULT);
    sword Fetch(ub4 rows = 1, ub2 orientation = OCI_FETCH_NEXT, sb4 offset = 0);
    // Gives a piece that a call has asked for, or a place for it.
    void Piece(const dvoid* data, ub4& length, ub1 piece = kAsAsked);
    // Prepares and executes something that is no query.
    void Run(std::string_view sql);
    template <class T>
    T Attribute(ub4 attribute, const dvoid* handle, ub4 type) {
        T value{};
        Step("OCIAttrGet", [&] { return OCIAttrGet(handle, type, &value, nullptr, attribute, err); });
        return value;
    }
    template <class T>
    T Attribute(ub4 attribute) {
        return Attribute<T>(attribute, stmt, OCI_HTYPE_STMT);
    }

    // ---- Undisturbed

    // What the scenario saw, piece by piece: "a;b;".
    void See(std::string_view what) { seen.append(what).append(";"); }
    void See(long value) { See(std::to_string(value)); }

    void Sql(std::string_view sql);
    // The first value of a query as text, "!" and the number for an error.
    std::string One(std::string_view sql);
    // What ends what a step began, undisturbed: called when the scenario is over, the last given first.
    void AtEnd(std::function<sword()> end) { ends_.push_back(std::move(end)); }
    // A place that outlives all that is given to AtEnd from now on.
    template <class T>
    T& Kept(T value = {}) {
        const auto place = std::make_shared<T>(value);
        AtEnd([place] { return OCI_SUCCESS; });
        return *place;
    }
    // What undoes by SQL what a scenario has committed.
    void CommitAtEnd(std::string_view sql, std::string_view more = "commit") {
        AtEnd([=, this] { return Sql(sql), Sql(more), Sql("commit"), OCI_SUCCESS; });
    }
    // What must be in the database from now on, should a step fail; and what, if the record says that the transaction
    // was rolled back.
    void Keeps(std::string_view query, std::string_view value, std::string_view rolled_back = "0") {
        kept_query_ = query;
        kept_ = value;
        kept_rolled_back_ = rolled_back;
    }
    void CheckKept();
    // Whether the record of the step that failed says so.
    [[nodiscard]] bool RolledBack() const { return rolled_back_; }
    // The number of a handle's first record, 0 without one, and its text.
    static sb4 Number(dvoid* handle, ub4 type, std::string* text = nullptr);
    // Before each run: a statement that has not kept anything from the run before.
    void Begin();
    // Ends what a scenario began, its transaction too.
    void Reset();
    // A folder of its own for files, gone with the world.
    const std::string& Folder();

    // What a record says where the transaction is lost.
    static constexpr const char* kRolledBack = "the transaction was rolled back";
    static constexpr ub1 kAsAsked = 255;
    // How many worlds there have been in this process.
    static int Made() { return made_; }

    static OraText* Text(std::string_view text) {
        return reinterpret_cast<OraText*>(const_cast<char*>(text.data()));
    }
    static ub4 Size(std::string_view text) { return static_cast<ub4>(text.size()); }

    [[nodiscard]] bool OnServer() const { return server_ != nullptr; }
    [[nodiscard]] std::string Database() const;

    const ub4 mode;    // of the environment
    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;
    std::string seen;

private:
    template <class Call>
    static sword Disturbed(Call call) {
        const Armed armed;
        return call();
    }
    void OpenEnvironment();
    void OpenSession();
    void CheckFailure(std::string_view name, Told told, sb4 also);

    static inline int made_ = 0;

    std::string Encoded(std::string_view text) const;

    Ground ground_;
    std::unique_ptr<PostgresDatabase> server_;
    OCIError* quiet_err_ = nullptr;
    OCIStmt* quiet_ = nullptr;
    std::vector<std::function<sword()>> ends_;
    std::string folder_, kept_query_;
    std::string kept_, kept_rolled_back_;
    bool rolled_back_ = false;
};

// A step, also with where it is told and with a number that is as good, or a call that never fails, that goes by the
// name of its function.
#define STEP(function, ...) Step(#function, [&] { return function(__VA_ARGS__); })
#define STEP_TOLD(told, function, ...) Step(#function, [&] { return function(__VA_ARGS__); }, told)
#define STEP_OR(number, function, ...) \
    Step(#function, [&] { return function(__VA_ARGS__); }, Told::error_handle, number)
#define SURELY(function, ...) Surely(#function, [&] { return function(__VA_ARGS__); })

// Has another handle stand where one of the world's stands, such as its statement, while this lives.
template <class T>
class Instead {
public:
    Instead(T& place, T other) : place_(place), before_(std::exchange(place, other)) {}
    ~Instead() { place_ = before_; }
    Instead(const Instead&) = delete;
    Instead& operator=(const Instead&) = delete;

private:
    T& place_;
    T before_;
};

// A string of the package that is gone at the end.
OCIString*& NewString(World& w);

struct Scenario {
    const char* name;
    Ground ground;
    void (*prepare)(World&);    // tables and the like, undisturbed; may be null
    const char* expected;       // what a run without failure has seen
    ub4 mode = OCI_DEFAULT;     // of the environment
    bool first_calls = false;   // runs in new processes, too, where its steps are the first calls of all
    void (*run)(World&) = nullptr;    // its steps; what they show goes to `seen`
};

inline std::vector<Scenario>& AllScenarios() {
    static std::vector<Scenario> all;
    return all;
}
inline bool Add(Scenario scenario, void (*run)(World&)) {
    scenario.run = run;
    AllScenarios().push_back(scenario);
    return true;
}

// Stands before the steps of a scenario; behind its name, what its row has before them.
#define SCENARIO(name, ...)                                                     \
    void name(World& w);                                                        \
    [[maybe_unused]] const bool added_##name = Add({#name, __VA_ARGS__}, name); \
    void name(World& w)

}  // namespace faults
