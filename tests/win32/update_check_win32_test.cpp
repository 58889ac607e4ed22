// The update check end to end under Wine: the real registry holds the server address, nginx (the
// configuration in deploy/, started by a CTest fixture on a loopback port) serves the update files,
// and the real WinINet transfers, disk and message pump do the work. The updates panel is a
// recording fake: the options window itself is not part of this test.
#include <windows.h>

#include "win32/update_server.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <functional>
#include <optional>
#include <sstream>

#include "fakes/fake_updates_frame.h"
#include "platform/win32/file_system_win32.h"
#include "platform/win32/files_win32.h"
#include "platform/win32/http_transfer_win32.h"
#include "platform/win32/shell_win32.h"
#include "platform/win32/registry_win32.h"
#include "settings/registry_routines.h"
#include "settings/settings.h"
#include "ui/options/update_check.h"

namespace vantorel {
namespace {

using testing::ReadFile;
using testing::WriteFile;

class NginxUpdateCheck : public testing::UpdateServerTest {
protected:
    NginxUpdateCheck() : UpdateServerTest("vtupd-") {}
    void Click(ProgramVersion version = {1, 0}, std::function<std::optional<std::size_t>()> reload = nullptr) {
        UpdateCheck check(frame_, inet_, pump_, files_, FD1_, FD2_, FD3_, folder_, version, ServerAddress(registry_));
        check.ConnectEvents();
        check.ReloadDefinitions = std::move(reload);
        check.BtnUpdate_Click();
    }
    // The scriptable server on 127.0.0.1 (tests/servers/http_test_server.py): an update server
    // under /vt/ whose files can be made to misbehave.
    static std::string Scripted() {
        const char* file = std::getenv("VANTOREL_HTTP_PORT_FILE");
        std::string port = file == nullptr ? std::string() : ReadFile(std::string("Z:") + file);
        return "http://127.0.0.1:" + port.substr(0, port.find_first_of("\r\n"));
    }

    win32::Win32MessagePump pump_;
    win32::WinInetTransfer inet_{pump_}, t1_{pump_}, t2_{pump_}, t3_{pump_};
    win32::Win32FileSystem disk_;
    win32::Win32Files files_;
    FileDownloader FD1_{t1_, disk_, pump_}, FD2_{t2_, disk_, pump_}, FD3_{t3_, disk_, pump_};
    testing::FakeUpdatesFrame frame_;
};

using Log = std::vector<std::string>;

TEST_F(NginxUpdateCheck, NewerDefinitionsReplaceSw2DefAndDefver) {
    std::string definitions;
    for (int i = 0; i < 3000; ++i) definitions += std::to_string(-1000000 + i * 7) + "\r\n";
    Serve("defver", "21\n");
    Serve("sw2.def", definitions);
    Serve("mainver", "1.0\n");
    Click();
    EXPECT_EQ(frame_.log, (Log{"disable", "L0:Definitions Updates: Complete", "L1:Program Updates: No Updates",
                               "enable"}));
    EXPECT_EQ(Local("sw2.def"), definitions);
    EXPECT_EQ(Local("defver"), "21\n");
    EXPECT_TRUE(frame_.pbVisible);
    EXPECT_EQ(frame_.box.printed.back(), "100%");
}

TEST_F(NginxUpdateCheck, EqualOrOlderVersionsFetchNothing) {
    Serve("defver", "20");
    Serve("mainver", "1.0");
    Click();
    EXPECT_EQ(frame_.log, (Log{"disable", "L0:Definitions Updates: No Updates", "L1:Program Updates: No Updates",
                               "enable"}));
    EXPECT_FALSE(frame_.pbVisible);

    // 3 against 10: older as numbers, though "3" sorts after "10" as text.
    WriteFile(folder_ + "\\defver", "10\r\n");
    Serve("defver", "3");
    Serve("sw2.def", "should not be fetched");
    frame_.log.clear();
    Click();
    EXPECT_EQ(frame_.L[0], "Definitions Updates: No Updates");
    EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
}

TEST_F(NginxUpdateCheck, ProgramVersionOneTenIsOlderThanOneNine) {
    Serve("defver", "20");
    Serve("mainver", "1.9\r\n");
    std::string setup(200000, '\0');
    for (std::size_t i = 0; i < setup.size(); ++i) setup[i] = static_cast<char>(i * 13);
    Serve("VTSetup.exe", setup);
    Click({1, 10});
    EXPECT_EQ(frame_.L[1], "Program Updates: Complete");
    EXPECT_EQ(Local("VTSetup.exe"), setup);

    // An empty setup program is no update.
    Serve("VTSetup.exe", "");
    ::DeleteFileA((folder_ + "\\VTSetup.exe").c_str());
    frame_.log.clear();
    Click({1, 10});
    EXPECT_EQ(frame_.log[2],
              "msgbox[Updates]:Error downloading program updates The downloaded setup program is empty.");
    EXPECT_EQ(::GetFileAttributesA((folder_ + "\\VTSetup.exe").c_str()), INVALID_FILE_ATTRIBUTES);
}

TEST_F(NginxUpdateCheck, MissingDefinitionsOnTheServerKeepTheInstalledVersion) {
    Serve("defver", "21");
    Serve("mainver", "1.0");
    Click();
    ASSERT_GE(frame_.log.size(), 2u);
    EXPECT_EQ(frame_.log[1], "msgbox[Updates]:Error downloading definition updates The file, \"" +
                                 ServerAddress(registry_) + "/vt/sw2.def\" was not found!");
    EXPECT_EQ(Local("defver"), "20\r\n") << "defver is fetched only after sw2.def";
    EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
    EXPECT_TRUE(frame_.enabled);
}

TEST_F(NginxUpdateCheck, UnreachableServerIsReportedAndTheButtonComesBack) {
    RegistryRoutines reg(registry_);
    reg.hkey(platform::kHkeyLocalMachine);
    reg.KeyRoot("SOFTWARE\\Vantorel\\");
    // Port 9 (discard) is not served on this loopback.
    ASSERT_TRUE(reg.SetRegistryValue("Server", std::string("http://127.0.0.1:9"), platform::kRegSz));
    Click();
    ASSERT_EQ(frame_.log.size(), 3u);
    EXPECT_EQ(frame_.log[1].rfind("msgbox[Updates]:Cannot check for updates", 0), 0u) << frame_.log[1];
    EXPECT_EQ(frame_.log[2], "enable");
    EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
}

TEST_F(NginxUpdateCheck, OnlyADefinitionsListReplacesTheInstalledOneAndTakesEffectAtOnce) {
    // Sizes that read as 0, an error page served as a success, binary bytes: refused before the
    // rename, and "defver" is not fetched, so the next check tries again.
    for (const char* answer :
         {"length,0,0", "length,0.4,0", "length,.5,0", "length,-0.4,0", "status,200", "body,5000"}) {
        SCOPED_TRACE(answer);
        SetServer(Scripted() + "/do/" + answer + "/sw2.def");
        frame_.log.clear();
        Click();
        ASSERT_EQ(frame_.log.size(), 4u);
        EXPECT_EQ(frame_.log[1].rfind("msgbox[Updates]:Error downloading definition updates The downloaded file is "
                                      "not a definitions list",
                                      0),
                  0u)
            << frame_.log[1];
        EXPECT_EQ(frame_.log[3], "enable");
        EXPECT_EQ(Local("sw2.def"), "installed definitions\r\n");
        EXPECT_EQ(Local("defver"), "20\r\n");
        EXPECT_EQ(::GetFileAttributesA((folder_ + "\\sw2.def.part").c_str()), INVALID_FILE_ATTRIBUTES);
    }
    // A list is installed and put in force through the owner at once; the label says so.
    SetServer(Scripted());
    int reloads = 0;
    Click({1, 0}, [&] {
        ++reloads;
        return std::optional<std::size_t>(Local("sw2.def") == "-939524086\r\n33554559\r\n" ? 2 : 0);
    });
    EXPECT_EQ(reloads, 1);
    EXPECT_EQ(frame_.L[0], "Definitions Updates: Complete, 2 definitions in use");
    EXPECT_EQ(Local("defver"), "99\n");
}

TEST_F(NginxUpdateCheck, AServerThatNeverAnswersEndsTheCheckWithAnErrorAfterTheSilenceLimit) {
    SetServer(Scripted() + "/do/noanswer/defver");
    win32::WinInetTransfer quiet(pump_, win32::WinInetTransfer::kDefaultBlockSize, 500);
    UpdateCheck check(frame_, quiet, pump_, files_, FD1_, FD2_, FD3_, folder_, {1, 0}, ServerAddress(registry_));
    check.ConnectEvents();
    DWORD started = ::GetTickCount();
    check.BtnUpdate_Click();
    EXPECT_LT(::GetTickCount() - started, 5000u);
    ASSERT_EQ(frame_.log.size(), 3u);
    EXPECT_EQ(frame_.log[1].rfind("msgbox[Updates]:Cannot check for updates", 0), 0u) << frame_.log[1];
    EXPECT_NE(frame_.log[1].find("timed out"), std::string::npos) << frame_.log[1];
    EXPECT_EQ(frame_.log[2], "enable");
}

}  // namespace
}  // namespace vantorel
