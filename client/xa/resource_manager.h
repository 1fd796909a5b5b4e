// Resource managers: what xa_open opened under a number, until xa_close closes it. Each has an environment, a service
// context that is logged on, and the branch that its thread of control works in, on the context's link.
//
// A thread of control is a thread where the info string says Threads=true, else the process. A manager is found by its
// number or its name among those of the calling thread, then among those of the process.
//
// Threads: the calls of one manager take turns by the session's lock; the list has a lock of its own.
#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "sessions/service_context.h"
#include "xa/answer.h"
#include "xa/info.h"

namespace xa {

class ResourceManager {
public:
    ResourceManager(int rmid, Info info);
    ~ResourceManager();
    ResourceManager(const ResourceManager&) = delete;
    ResourceManager& operator=(const ResourceManager&) = delete;

    // Logs on. Answers why it cannot.
    Answer LogOn();
    Status LogOff();

    [[nodiscard]] Environment* GetEnvironment() const;    // null when the application has freed it
    [[nodiscard]] ServiceContext* GetService() const;
    [[nodiscard]] const Info& GetInfo() const { return info_; }
    [[nodiscard]] bool IsOf(int rmid, std::uint64_t thread) const { return rmid_ == rmid && thread_ == thread; }
    [[nodiscard]] bool IsNamed(std::string_view name, std::uint64_t thread) const {
        return info_.name == name && thread_ == thread;
    }

    // The scan of xa_recover; under the session's lock.
    struct Scan {
        bool open = false;
        std::vector<engine::Xid> found;
        std::size_t next = 0;
    };
    Scan scan;

private:
    const int rmid_;
    const Info info_;
    const std::uint64_t thread_;    // 0: the process
    Kept<Environment> environment_;
    Kept<ServiceContext> service_;
};
using ManagerPointer = std::shared_ptr<ResourceManager>;

// Null when there is none. Of a name, null too when several have it.
ManagerPointer FindManager(int rmid);
ManagerPointer FindManager(std::string_view name);

Answer Open(int rmid, const char* info, xa_long flags);
Answer Close(int rmid, xa_long flags);

}  // namespace xa
