// vantorel.exe: start-up. For now the program loads the definitions from its folder and reports
// how many keys it read and how long that took, in a message box and on standard output.
#include <windows.h>

#include <chrono>
#include <cstdio>
#include <string>

#include "guard/read_definitions.h"
#include "platform/win32/files_win32.h"

namespace {

constexpr const char* kWebAddress = "http://www.vantorel.com/";

void WriteStdout(const std::string& text) {
    HANDLE out = ::GetStdHandle(STD_OUTPUT_HANDLE);
    if (out == nullptr || out == INVALID_HANDLE_VALUE) return;
    DWORD written = 0;
    ::WriteFile(out, text.data(), static_cast<DWORD>(text.size()), &written, nullptr);
}

}  // namespace

int WINAPI WinMain(HINSTANCE, HINSTANCE, LPSTR, int) {
    using namespace vantorel;
    win32::Win32Files files;
    std::string path = DefinitionsPath(win32::ProgramFolder());

    auto onMissing = [] {
        std::string text = std::string("Reading definitions, installation corrupted re-install at ") + kWebAddress;
        WriteStdout("Definitions Error: " + text + "\n");
        ::MessageBoxA(nullptr, text.c_str(), "Definitions Error", MB_OK | MB_ICONSTOP);
    };
    auto started = std::chrono::steady_clock::now();
    bool loaded = LoadDefinitions(path, files, onMissing, Definitions);
    double ms = std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - started).count();

    char report[512];
    if (loaded) {
        std::snprintf(report, sizeof report, "Read %zu definitions from %s in %.1f ms.", Definitions.size(),
                      path.c_str(), ms);
    } else {
        std::snprintf(report, sizeof report, "No definitions could be read from %s; the guard has nothing to block.",
                      path.c_str());
    }
    WriteStdout(std::string(report) + "\n");
    ::MessageBoxA(nullptr, report, "Vantorel", MB_OK | (loaded ? MB_ICONINFORMATION : MB_ICONWARNING));
    return loaded ? 0 : 1;
}
