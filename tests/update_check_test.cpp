// The update check's decisions against a pretend web server, an in-memory program folder and a
// recording updates panel: versions compared as numbers, a failed or missing version, the program's
// own download errors, and a close in the middle. The real window against nginx is proved in
// tests/win32/options_updates_win32_test.cpp.
#include "ui/options/update_check.h"

#include <gtest/gtest.h>

#include "fakes/fake_file_system.h"
#include "fakes/fake_http_transfer.h"
#include "fakes/fake_message_pump.h"
#include "fakes/fake_updates_frame.h"
#include "fakes/fake_registry.h"
#include "settings/registry_routines.h"
#include "settings/server_address.h"

namespace vantorel {
namespace {

using testing::FakeFileSystem;
using testing::FakeHttpTransfer;
using testing::FakePump;
using testing::FakeWebServer;
using testing::FakeUpdatesFrame;

const std::string kServer = "http://updates.test";
const std::string kFolder = "C:\\Vantorel";

struct Rig {
    FakeWebServer server;
    FakeHttpTransfer inet, t1, t2, t3;
    FakeFileSystem disk;
    FakePump pump;
    FileDownloader FD1{t1, disk, pump}, FD2{t2, disk, pump}, FD3{t3, disk, pump};
    FakeUpdatesFrame frame;
    ProgramVersion version{1, 0};

    Rig() {
        for (FakeHttpTransfer* t : {&inet, &t1, &t2, &t3}) t->server = &server;
        disk.files[kFolder + "\\defver"] = "20\r\n";
        disk.files[kFolder + "\\sw2.def"] = "old definitions";
        server.PutFile(kServer + "/vt/defver", "20");
        server.PutFile(kServer + "/vt/mainver", "1.0");
    }
    void Click() {
        UpdateCheck check(frame, inet, pump, disk, FD1, FD2, FD3, kFolder, version, kServer);
        check.ConnectEvents();
        check.BtnUpdate_Click();
    }
    std::string File(const std::string& name) { return disk.files[kFolder + "\\" + name]; }
};

using Log = std::vector<std::string>;

TEST(UpdateCheck, VersionsCompareAsNumbers) {
    // Server 3 against local 10 is older, whatever the texts say when compared as texts.
    Rig older;
    older.disk.files[kFolder + "\\defver"] = "10";
    older.server.PutFile(kServer + "/vt/defver", "3");
    older.Click();
    EXPECT_EQ(older.frame.L[0], "Definitions Updates: No Updates");

    // Program 1.10 reads as 1.1, below a server's 1.9: the setup program is fetched.
    Rig program;
    program.version = {1, 10};
    program.server.PutFile(kServer + "/vt/mainver", "1.9");
    program.server.PutFile(kServer + "/vt/VTSetup.exe", std::string(5000, 'x'));
    program.Click();
    EXPECT_EQ(program.File("VTSetup.exe"), std::string(5000, 'x'));
    EXPECT_EQ(program.frame.L[1], "Program Updates: Complete");
    EXPECT_TRUE(program.frame.pbVisible);

    // A version request answered with an error page reads as version 0.
    Rig errorPage;
    errorPage.server.responses.erase(kServer + "/vt/defver");
    errorPage.Click();
    EXPECT_EQ(errorPage.frame.L[0], "Definitions Updates: No Updates");
}

TEST(UpdateCheck, FailedDefinitionsDownloadKeepsTheInstalledVersionSoTheNextCheckRetries) {
    Rig rig;
    rig.server.PutFile(kServer + "/vt/defver", "21");  // but no sw2.def on the server
    rig.Click();
    EXPECT_EQ(rig.frame.log,
              (Log{"disable",
                   "msgbox[Updates]:Error downloading definition updates The file, \"" + kServer +
                       "/vt/sw2.def\" was not found!",
                   "L1:Program Updates: No Updates", "enable"}));
    EXPECT_EQ(rig.server.requests, (Log{kServer + "/vt/defver", kServer + "/vt/sw2.def", kServer + "/vt/mainver"}))
        << "defver is not fetched after a failed sw2.def";
    EXPECT_EQ(rig.File("defver"), "20\r\n");
    EXPECT_EQ(rig.File("sw2.def"), "old definitions");

    // The server is mended; the next check fetches both.
    rig.server.PutFile(kServer + "/vt/sw2.def", "new definitions");
    rig.Click();
    EXPECT_EQ(rig.File("sw2.def"), "new definitions");
    EXPECT_EQ(rig.File("defver"), "21");
}

TEST(UpdateCheck, MissingOrEmptyLocalVersionCountsAsZero) {
    for (const char* state : {"missing", "empty"}) {
        SCOPED_TRACE(state);
        Rig rig;
        if (std::string(state) == "missing")
            rig.disk.files.erase(kFolder + "\\defver");
        else
            rig.disk.files[kFolder + "\\defver"] = "";
        rig.server.PutFile(kServer + "/vt/defver", "1");
        rig.server.PutFile(kServer + "/vt/sw2.def", "defs");
        rig.Click();
        EXPECT_EQ(rig.frame.log[1], "L0:Definitions Updates: defver has been corrupted");
        EXPECT_EQ(rig.frame.L[0], "Definitions Updates: Complete");
        EXPECT_EQ(rig.File("defver"), "1");
    }
    // A file that exists but cannot be read: version 0 without the message.
    Rig locked;
    locked.disk.unreadable.insert(kFolder + "\\defver");
    locked.server.PutFile(kServer + "/vt/defver", "1");
    locked.server.PutFile(kServer + "/vt/sw2.def", "defs");
    locked.Click();
    EXPECT_EQ(locked.frame.log[1], "L0:Definitions Updates: Complete");
}

TEST(UpdateCheck, ProgramDownloadErrorsHaveTheirOwnMessage) {
    Rig rig;
    rig.server.PutFile(kServer + "/vt/mainver", "2");
    rig.server.responses[kServer + "/vt/VTSetup.exe"] = {"HTTP/1.1 401 Unauthorized\r\n\r\n", ""};
    rig.Click();
    EXPECT_EQ(rig.frame.log[2], "msgbox[Updates]:Error downloading program updates Authorization failed!");
    EXPECT_EQ(rig.frame.L[1], "Program Updates:") << "the caption keeps its text after a failure";
    EXPECT_EQ(rig.disk.files.count(kFolder + "\\VTSetup.exe"), 0u);
}

// The window closes while a download runs: the check stops there and touches the window no more
// (no caption, no message box, no button), nothing further is fetched and the installed files stay.
TEST(UpdateCheck, ClosingTheWindowStopsTheCheckWithoutTouchingTheWindow) {
    for (const std::string stage : {"sw2.def", "VTSetup.exe"}) {
        Rig rig;
        rig.server.PutFile(kServer + "/vt/defver", stage == "sw2.def" ? "21" : "20");
        rig.server.PutFile(kServer + "/vt/sw2.def", std::string(5000, 'd'));
        rig.server.PutFile(kServer + "/vt/mainver", "2");
        rig.server.PutFile(kServer + "/vt/VTSetup.exe", std::string(5000, 's'));
        UpdateCheck check(rig.frame, rig.inet, rig.pump, rig.disk, rig.FD1, rig.FD2, rig.FD3, kFolder, rig.version,
                          kServer);
        check.ConnectEvents();
        std::size_t painted = 0;
        rig.pump.onPump = [&] {
            // The second chunk of the download has been painted: the user closes the window.
            if (rig.frame.box.printed.size() == 2 && painted == 0) {
                painted = rig.frame.box.printed.size();
                check.Cancel();
            }
        };
        check.BtnUpdate_Click();
        EXPECT_EQ(painted, 2u) << stage;
        EXPECT_EQ(rig.frame.box.printed.size(), painted) << stage << ": nothing painted after the close";
        EXPECT_EQ(rig.frame.log, (stage == "sw2.def" ? Log{"disable"} : Log{"disable", "L0:Definitions Updates: No Updates"}))
            << stage << ": the button stays as it was and no message box appears";
        const std::string last = rig.server.requests.back();
        EXPECT_EQ(last, kServer + "/vt/" + stage) << "nothing fetched after the close";
        EXPECT_EQ(rig.File("sw2.def"), "old definitions");
        EXPECT_EQ(rig.File("defver"), "20\r\n");
        EXPECT_EQ(rig.disk.files.count(kFolder + "\\VTSetup.exe"), 0u);
        EXPECT_EQ(rig.disk.files.count(kFolder + "\\" + stage + ".part"), 0u) << "the partial file is removed";
    }
}

TEST(ServerAddress, IsASettingWithABuiltInDefault) {
    testing::FakeRegistry registry;
    EXPECT_EQ(ServerAddress(registry), kDefaultServerAddress);
    RegistryRoutines reg(registry);
    reg.hkey(platform::kHkeyLocalMachine);
    reg.KeyRoot("SOFTWARE\\Vantorel\\");
    reg.CreateKey();
    ASSERT_TRUE(reg.SetRegistryValue("Server", std::string("http://127.0.0.1:8080/"), platform::kRegSz));
    EXPECT_EQ(ServerAddress(registry), "http://127.0.0.1:8080");
    ASSERT_TRUE(reg.SetRegistryValue("Server", std::string(""), platform::kRegSz));
    EXPECT_EQ(ServerAddress(registry), kDefaultServerAddress);
}

}  // namespace
}  // namespace vantorel
