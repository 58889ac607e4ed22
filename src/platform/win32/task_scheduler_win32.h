// The Task Scheduler through its COM interface (ITaskService, taskschd.dll). Each call connects to the local scheduler,
// does its one job and lets go of every interface before it returns.
#pragma once

#include "platform/task_scheduler.h"

namespace vantorel::win32 {

class Win32TaskScheduler final : public platform::TaskScheduler {
public:
    platform::TaskFailure RegisterLogonTask(const std::string& name, const std::string& command) override;
    platform::TaskFailure DeleteTask(const std::string& name) override;
};

}  // namespace vantorel::win32
