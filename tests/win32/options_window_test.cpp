// The options window on the real registry and Wine's Task Scheduler: its load step on an empty
// registry, its boxes writing the settings Windows and Internet Explorer read, and the modal loop
// ending on "&Close"; once with queued BM_CLICKs, once with the real pointer (SendInput, hit-tested
// by the system, pressed and released on the control). Wine's scheduler refuses a logon trigger
// (ITriggerCollection::Create answers E_NOTIMPL), so checking "Boot when Windows boots" shows the
// refusal; unchecking removes a task "Vantorel" that the test registered as XML. Then the window at
// other DPIs and on the keyboard. Runs on the virtual display; the values and the task it touches
// are removed afterwards.
#include <windows.h>
#include <taskschd.h>

#include <gtest/gtest.h>

#include <vector>

#include "app/options_window.h"
#include "platform/win32/registry_win32.h"
#include "settings/settings.h"
#include "win32/ui_input.h"

namespace vantorel::win32 {
namespace {

using platform::kHkeyCurrentUser;
using platform::kHkeyLocalMachine;

// Registers the task "Vantorel" from `xml` when given, or removes it; answers whether it exists then.
bool Task(const wchar_t* xml, bool remove = false) {
    HRESULT com = ::CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
    ITaskService* service = nullptr;
    ITaskFolder* folder = nullptr;
    IRegisteredTask* task = nullptr;
    VARIANT none;
    ::VariantInit(&none);
    BSTR root = ::SysAllocString(L"\\"), name = ::SysAllocString(L"Vantorel"), text = ::SysAllocString(xml);
    if (SUCCEEDED(::CoCreateInstance(CLSID_TaskScheduler, nullptr, CLSCTX_INPROC_SERVER, IID_ITaskService,
                                     reinterpret_cast<void**>(&service))) &&
        SUCCEEDED(service->Connect(none, none, none, none)) && SUCCEEDED(service->GetFolder(root, &folder))) {
        if (remove) folder->DeleteTask(name, 0);
        else if (xml != nullptr &&
                 SUCCEEDED(folder->RegisterTask(name, text, TASK_CREATE_OR_UPDATE, none, none, TASK_LOGON_NONE, none,
                                                &task)))
            task->Release();
        task = nullptr;
        folder->GetTask(name, &task);
    }
    bool exists = task != nullptr;
    for (IUnknown* object : {static_cast<IUnknown*>(task), static_cast<IUnknown*>(folder),
                             static_cast<IUnknown*>(service)})
        if (object != nullptr) object->Release();
    for (BSTR b : {root, name, text}) ::SysFreeString(b);
    if (SUCCEEDED(com)) ::CoUninitialize();
    return exists;
}
constexpr const wchar_t* kTaskXml =
    L"<?xml version=\"1.0\"?><Task version=\"1.2\" xmlns=\"http://schemas.microsoft.com/windows/2004/02/mit/task\">"
    L"<Settings/><Actions><Exec><Command>x.exe</Command></Exec></Actions></Task>";

class OptionsWindowTest : public ::testing::Test {
protected:
    void SetUp() override { Clean(); }
    void TearDown() override { Clean(); }

    Variant Read(std::int32_t root, const std::string& key, const std::string& name) {
        RegistryRoutines reg(registry_);
        reg.hkey(root);
        reg.KeyRoot(key);
        return reg.GetRegistryValue(name);
    }
    void Remove(std::int32_t root, const std::string& key, const std::string& name) {
        RegistryRoutines reg(registry_);
        reg.hkey(root);
        reg.KeyRoot(key);
        reg.DeleteValue(name);
    }
    void Clean() {
        Remove(kHkeyLocalMachine, kSettingsKey, "Start");
        Remove(kHkeyLocalMachine, kSettingsKey, "Tray");
        Remove(kHkeyLocalMachine, std::string(kRunKey) + "\\", "Vantorel");
        Remove(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger");
        Task(nullptr, true);
    }

    Win32Registry registry_;
};

TEST_F(OptionsWindowTest, BoxesShowWhatIsInEffectAndStoreTheirState) {
    const std::string exe = AutostartPath();
    EXPECT_NE(exe.find("options_window_tests.exe"), std::string::npos) << exe;

    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    char caption[64];
    ::GetWindowTextA(window.hwnd(), caption, sizeof caption);
    EXPECT_STREQ(caption, "Options");
    EXPECT_TRUE(window.controls().F[0]->Visible());
    EXPECT_FALSE(window.controls().F[1]->Visible());
    EXPECT_FALSE(window.box(0).Value());
    EXPECT_FALSE(window.box(1).Value());
    EXPECT_TRUE(window.box(2).Value());
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kSettingsKey, "Start"))) << "loading writes nothing";
    EXPECT_TRUE(IsEmpty(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger")));

    // The user toggles the other two boxes, then closes the window; the clicks are queued and
    // handled by the modal loop.
    ::PostMessageA(window.box(1).hwnd(), BM_CLICK, 0, 0);
    ::PostMessageA(window.box(2).hwnd(), BM_CLICK, 0, 0);
    ::PostMessageA(window.closeButton().hwnd(), BM_CLICK, 0, 0);
    window.ShowModal();
    EXPECT_EQ(window.hwnd(), nullptr) << "closed";
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Tray"), Variant(std::string("1")));
    EXPECT_EQ(Read(kHkeyCurrentUser, kInternetExplorerMainKey, "Disable Script Debugger"),
              Variant(std::string("no")));

    OptionsWindow again(nullptr, 1, registry_, exe);
    ::GetWindowTextA(again.hwnd(), caption, sizeof caption);
    EXPECT_STREQ(caption, "Updates");
    EXPECT_TRUE(again.controls().F[1]->Visible());
    EXPECT_FALSE(again.controls().F[0]->Visible());
    EXPECT_TRUE(again.box(1).Value());
    EXPECT_FALSE(again.box(2).Value());
    ::PostMessageA(again.hwnd(), WM_CLOSE, 0, 0);
    again.ShowModal();
}

TEST_F(OptionsWindowTest, PointerClicksOnBootWhenWindowsBootsMeetWinesTaskScheduler) {
    const std::string exe = AutostartPath();
    OptionsWindow window(nullptr, 0, registry_, exe);
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    ASSERT_FALSE(window.box(0).Value()) << "an empty registry: the program does not start with Windows";

    // Checking: the scheduler refuses the logon task; the message box says why over a box that is
    // unchecked again, with nothing stored.
    std::string message;
    bool boxWhileShown = true;
    Ticker user(30, [&] {
        if (!::IsWindowVisible(window.hwnd())) return false;
        if (HWND box = ::FindWindowA("#32770", "Options")) {
            char text[512] = {};
            ::GetDlgItemTextA(box, 0xFFFF, text, sizeof text);
            message = text;
            boxWhileShown = window.box(0).Value();
            ::PostMessageA(box, WM_COMMAND, IDOK, 0);
            ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);
            return true;
        }
        if (message.empty()) PointerClick(window.box(0).hwnd());
        return false;
    });
    window.ShowModal();
    EXPECT_NE(message.find("cannot be set to start when Windows boots"), std::string::npos) << message;
    EXPECT_NE(message.find("ITriggerCollection::Create failed with HRESULT 0x80004001"), std::string::npos) << message;
    EXPECT_FALSE(boxWhileShown);
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kRunKey, "Vantorel")));
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kSettingsKey, "Start")));
    EXPECT_FALSE(Task(nullptr)) << "no task registered";

    // Unchecking a box that a stored task backs removes the task, the Run value and the flag.
    ASSERT_TRUE(Task(kTaskXml));
    RegistryRoutines reg(registry_);
    reg.hkey(kHkeyLocalMachine);
    reg.KeyRoot(kSettingsKey);
    reg.SetRegistryValue("Start", std::string("1"), platform::kRegSz);
    reg.KeyRoot(kRunKey);
    reg.SetRegistryValue("Vantorel", "\"" + exe + "\"", platform::kRegSz);
    OptionsWindow again(nullptr, 0, registry_, exe);
    ASSERT_TRUE(again.box(0).Value());
    Ticker uncheck(30, [&] {
        if (!::IsWindowVisible(again.hwnd())) return false;
        if (again.box(0).Value()) {
            PointerClick(again.box(0).hwnd());
            return false;
        }
        PointerClick(again.closeButton().hwnd());
        return true;
    });
    again.ShowModal();
    EXPECT_EQ(again.hwnd(), nullptr) << "the pointer click on \"&Close\" closed the window";
    EXPECT_FALSE(Task(nullptr)) << "unchecking removes the task";
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kRunKey, "Vantorel"))) << "unchecking removes the Run value";
    EXPECT_EQ(Read(kHkeyLocalMachine, kSettingsKey, "Start"), Variant(std::string("0")));
    EXPECT_TRUE(IsEmpty(Read(kHkeyLocalMachine, kSettingsKey, "Tray"))) << "the other boxes wrote nothing";
}

RECT ChildRect(HWND child, HWND relativeTo) {
    RECT r;
    ::GetWindowRect(child, &r);
    ::MapWindowPoints(nullptr, relativeTo, reinterpret_cast<POINT*>(&r), 2);
    return r;
}

TEST_F(OptionsWindowTest, FollowsTheMonitorsDpiWithEveryTextWholeAndTheKeyboard) {
    OptionsWindow window(nullptr, 0, registry_, AutostartPath());
    ASSERT_NE(window.hwnd(), nullptr) << "no display?";
    HWND hwnd = window.hwnd();
    ::ShowWindow(hwnd, SW_SHOWNA);
    window.label(0).SetCaption("Definitions Updates: defver has been corrupted");  // the longest status
    for (UINT dpi : {144u, 192u, 120u, 96u}) {
        const int d = static_cast<int>(dpi);
        RECT suggested = SendDpiChange(hwnd, dpi, {6615, 3135}), now, client;
        ::GetWindowRect(hwnd, &now);
        EXPECT_TRUE(::EqualRect(&now, &suggested)) << dpi << ": the suggested rectangle taken";
        ::GetClientRect(hwnd, &client);
        EXPECT_EQ(client.right, ::MulDiv(6615, d, 1440)) << dpi;
        EXPECT_EQ(ChildRect(window.closeButton().hwnd(), hwnd).left, ::MulDiv(4440, d, 1440)) << dpi;
        RECT box = ChildRect(window.box(2).hwnd(), hwnd), pb;
        EXPECT_EQ(box.right - box.left, ::MulDiv(5900, d, 1440)) << dpi;
        EXPECT_EQ(FontHeight(window.box(0).hwnd()), -::MulDiv(825, d, 7200)) << dpi;
        ::GetWindowRect(window.pbWindow(), &pb);
        EXPECT_EQ(pb.right - pb.left, ::MulDiv(5895, d, 1440)) << dpi << ": pb";
        EXPECT_EQ(TextsCut(hwnd, dpi), "") << dpi << ": options";
        window.controls().F[0]->SetVisible(false);
        window.controls().F[1]->SetVisible(true);
        EXPECT_EQ(TextsCut(hwnd, dpi), "") << dpi << ": updates";
        window.controls().F[1]->SetVisible(false);
        window.controls().F[0]->SetVisible(true);
    }

    // The keyboard: the first box has the focus, Tab walks the boxes to "&Close" and round, Esc closes.
    std::vector<HWND> focus;
    Ticker keys(60, [&] {
        if (!::IsWindowVisible(hwnd)) return false;
        focus.push_back(::GetFocus());
        if (focus.size() > 5) ::PostMessageA(hwnd, WM_CLOSE, 0, 0);  // Esc did not close it
        else Key(focus.size() < 5 ? VK_TAB : VK_ESCAPE);
        return focus.size() > 5;
    });
    ::ShowWindow(hwnd, SW_HIDE);
    window.ShowModal();
    EXPECT_EQ(focus, (std::vector<HWND>{window.box(0).hwnd(), window.box(1).hwnd(), window.box(2).hwnd(),
                                        window.closeButton().hwnd(), window.box(0).hwnd()}))
        << "a sixth entry: Esc did not close the window";
}

TEST_F(OptionsWindowTest, AccessKeysReachEveryShownButton) {
    // The options frame: Alt+C is "&Close" alone (the update button is on the hidden frame).
    OptionsWindow options(nullptr, 0, registry_, AutostartPath());
    int updates = 0;
    options.updateButton().Click = [&] { ++updates; };
    int presses = 0;
    Ticker close(60, [&] {
        if (!::IsWindowVisible(options.hwnd())) return false;
        if (++presses > 20) ::PostMessageA(options.hwnd(), WM_CLOSE, 0, 0);  // never closed: give up
        else Key('C', true);
        return presses > 20;
    });
    options.ShowModal();
    EXPECT_LE(presses, 20) << "Alt+C pressed \"&Close\"";
    EXPECT_EQ(updates, 0);

    // The updates frame: "&Check for Updates" and "&Close" share C; each Alt+C moves to the next of
    // them, Enter presses the one with the focus.
    OptionsWindow window(nullptr, 1, registry_, AutostartPath());
    window.updateButton().Click = [&] { ++updates; };
    std::vector<HWND> focus;
    Ticker keys(60, [&] {
        if (!::IsWindowVisible(window.hwnd())) return false;
        focus.push_back(::GetFocus());
        if (focus.size() > 4) ::PostMessageA(window.hwnd(), WM_CLOSE, 0, 0);  // Enter did not close it
        else Key(focus.size() < 4 ? 'C' : VK_RETURN, focus.size() < 4);
        return focus.size() > 4;
    });
    window.ShowModal();
    EXPECT_EQ(focus, (std::vector<HWND>{window.updateButton().hwnd(), window.closeButton().hwnd(),
                                        window.updateButton().hwnd(), window.closeButton().hwnd()}))
        << "a fifth entry: Enter did not press \"&Close\"";
    EXPECT_EQ(updates, 0) << "a shared access key presses nothing";
}

}  // namespace
}  // namespace vantorel::win32
