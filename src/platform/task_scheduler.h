// Start with Windows for a program that runs with administrator rights: Windows does not start an elevated program
// listed under the Run key, so the program registers a task that the Task Scheduler starts at the user's logon with the
// highest privileges (no UAC prompt).
#pragma once

#include <cstdint>
#include <string>

namespace vantorel::platform {

// The outcome of a scheduler operation: empty `call` on success; otherwise the call that failed, its HRESULT and the
// system's text for it.
struct TaskFailure {
    std::string call;
    std::int32_t hresult = 0;
    std::string text;
    bool Failed() const { return !call.empty(); }
};

class TaskScheduler {
public:
    TaskScheduler() = default;
    TaskScheduler(const TaskScheduler&) = delete;
    TaskScheduler& operator=(const TaskScheduler&) = delete;
    virtual ~TaskScheduler() = default;

    // Creates (or replaces) the task `name` in the scheduler's root folder: started by the current user's next logon,
    // for that user, with the highest privileges, running `command` (a quoted program path), with no execution time
    // limit, allowed to start and kept running on battery.
    virtual TaskFailure RegisterLogonTask(const std::string& name, const std::string& command) = 0;

    // Removes the task `name` from the root folder; a task that does not exist is not a failure.
    virtual TaskFailure DeleteTask(const std::string& name) = 0;
};

}  // namespace vantorel::platform
