// The update server of the Wine tests: nginx (started by a CTest fixture with the configuration in
// deploy/) serving VANTOREL_NGINX_DIR/www/vt on a loopback port, a program folder in the temp folder
// holding an installed sw2.def and a "defver" of 20, and the "Server" setting pointing at nginx.
// Everything a test adds is removed again after it.
#pragma once

#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>

#include "platform/win32/registry_win32.h"
#include "settings/registry_routines.h"

namespace vantorel::testing {

inline std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::stringstream content;
    content << in.rdbuf();
    return content.str();
}

inline void WriteFile(const std::string& path, const std::string& content) {
    std::ofstream(path, std::ios::binary) << content;
}

class UpdateServerTest : public ::testing::Test {
protected:
    explicit UpdateServerTest(const char* folderPrefix) : folderPrefix_(folderPrefix) {}

    void SetUp() override {
        const char* dir = std::getenv("VANTOREL_NGINX_DIR");
        ASSERT_NE(dir, nullptr) << "VANTOREL_NGINX_DIR is not set";
        port_ = ReadFile(std::string("Z:") + dir + "/server.port");
        while (!port_.empty() && (port_.back() == '\n' || port_.back() == '\r')) port_.pop_back();
        ASSERT_FALSE(port_.empty()) << "nginx is not running";
        www_ = std::string("Z:") + dir + "/www/vt/";
        for (const char* name : {"defver", "sw2.def", "mainver", "VTSetup.exe"}) ::DeleteFileA((www_ + name).c_str());
        // The address goes through the setting, as the program reads it.
        SetServer("http://127.0.0.1:" + port_ + "/");

        char temp[MAX_PATH];
        ::GetTempPathA(MAX_PATH, temp);
        folder_ = std::string(temp) + folderPrefix_ + std::to_string(::GetCurrentProcessId());
        ::CreateDirectoryA(folder_.c_str(), nullptr);
        WriteFile(folder_ + "\\defver", "20\r\n");
        WriteFile(folder_ + "\\sw2.def", "installed definitions\r\n");
    }

    void TearDown() override {
        for (const char* name : {"\\defver", "\\sw2.def", "\\VTSetup.exe"}) ::DeleteFileA((folder_ + name).c_str());
        EXPECT_TRUE(::RemoveDirectoryA(folder_.c_str())) << "something was left behind in " << folder_;
        RegistryRoutines reg(registry_);
        reg.hkey(platform::kHkeyLocalMachine);
        reg.KeyRoot("SOFTWARE\\Vantorel\\");
        reg.DeleteValue("Server");
    }

    void SetServer(const std::string& address) {
        RegistryRoutines reg(registry_);
        reg.hkey(platform::kHkeyLocalMachine);
        reg.KeyRoot("SOFTWARE\\Vantorel\\");
        reg.CreateKey();
        ASSERT_TRUE(reg.SetRegistryValue("Server", address, platform::kRegSz));
    }
    void Serve(const std::string& name, const std::string& content) { WriteFile(www_ + name, content); }
    std::string Local(const std::string& name) { return ReadFile(folder_ + "\\" + name); }

    win32::Win32Registry registry_;
    std::string port_, www_, folder_;

private:
    const char* folderPrefix_;
};

}  // namespace vantorel::testing
