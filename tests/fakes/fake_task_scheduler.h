// A Task Scheduler that keeps its tasks in a map; a failure can be scripted for the next calls.
#pragma once

#include <map>
#include <string>

#include "platform/task_scheduler.h"

namespace vantorel::testing {

class FakeTaskScheduler final : public platform::TaskScheduler {
public:
    platform::TaskFailure RegisterLogonTask(const std::string& name, const std::string& command) override {
        if (!failure.Failed()) tasks[name] = command;
        return failure;
    }
    platform::TaskFailure DeleteTask(const std::string& name) override {
        if (!failure.Failed()) tasks.erase(name);
        return failure;
    }

    std::map<std::string, std::string> tasks;  // name -> command line
    platform::TaskFailure failure;             // answered by every call while set
};

}  // namespace vantorel::testing
