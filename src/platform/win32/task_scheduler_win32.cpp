#include "platform/win32/task_scheduler_win32.h"

#include <windows.h>
#include <taskschd.h>

#include <string>

#include "platform/win32/system_message.h"

namespace vantorel::win32 {

namespace {

// Owns one COM interface pointer.
template <typename T>
class Com {
public:
    Com() = default;
    Com(const Com&) = delete;
    Com& operator=(const Com&) = delete;
    ~Com() {
        if (p_ != nullptr) p_->Release();
    }
    T** put() { return &p_; }
    void** putVoid() { return reinterpret_cast<void**>(&p_); }
    T* get() const { return p_; }
    T* operator->() const { return p_; }

private:
    T* p_ = nullptr;
};

// Owns one BSTR.
class Bstr {
public:
    explicit Bstr(const std::wstring& text) : b_(::SysAllocString(text.c_str())) {}
    Bstr() = default;
    Bstr(const Bstr&) = delete;
    Bstr& operator=(const Bstr&) = delete;
    ~Bstr() { ::SysFreeString(b_); }
    BSTR* put() { return &b_; }
    operator BSTR() const { return b_; }
    std::wstring Text() const { return b_ != nullptr ? std::wstring(b_) : std::wstring(); }

private:
    BSTR b_ = nullptr;
};

// A VARIANT that is empty or holds a text.
class Variant {
public:
    Variant() { ::VariantInit(&v_); }
    explicit Variant(const std::wstring& text) : Variant() {
        v_.vt = VT_BSTR;
        v_.bstrVal = ::SysAllocString(text.c_str());
    }
    Variant(const Variant&) = delete;
    Variant& operator=(const Variant&) = delete;
    ~Variant() { ::VariantClear(&v_); }
    operator VARIANT() const { return v_; }

private:
    VARIANT v_;
};

// COM on this thread for one operation. A thread that already runs COM in another apartment model keeps it
// (RPC_E_CHANGED_MODE); the scheduler's objects work from either.
class ComScope {
public:
    ComScope() : hr_(::CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)) {}
    ComScope(const ComScope&) = delete;
    ComScope& operator=(const ComScope&) = delete;
    ~ComScope() {
        if (SUCCEEDED(hr_)) ::CoUninitialize();
    }

private:
    HRESULT hr_;
};

std::wstring Wide(const std::string& text) {
    if (text.empty()) return std::wstring();
    int length = ::MultiByteToWideChar(CP_ACP, 0, text.data(), static_cast<int>(text.size()), nullptr, 0);
    std::wstring wide(static_cast<std::size_t>(length), L'\0');
    ::MultiByteToWideChar(CP_ACP, 0, text.data(), static_cast<int>(text.size()), wide.data(), length);
    return wide;
}

// `text` with the characters XML reserves written as entities.
std::wstring XmlEscaped(const std::wstring& text) {
    std::wstring escaped;
    for (wchar_t c : text) {
        switch (c) {
            case L'&': escaped += L"&amp;"; break;
            case L'<': escaped += L"&lt;"; break;
            case L'>': escaped += L"&gt;"; break;
            case L'"': escaped += L"&quot;"; break;
            case L'\'': escaped += L"&apos;"; break;
            default: escaped += c;
        }
    }
    return escaped;
}

// Records the first failing call; true while every call so far succeeded.
class Calls {
public:
    bool operator()(HRESULT hr, const char* call) {
        if (FAILED(hr) && !failure_.Failed())
            failure_ = {call, static_cast<std::int32_t>(hr), SystemMessage(static_cast<DWORD>(hr))};
        return !failure_.Failed();
    }
    const platform::TaskFailure& failure() const { return failure_; }

private:
    platform::TaskFailure failure_;
};

// Connects to the local scheduler and opens its root folder.
bool OpenRootFolder(Calls& ok, Com<ITaskService>& service, Com<ITaskFolder>& folder) {
    return ok(::CoCreateInstance(CLSID_TaskScheduler, nullptr, CLSCTX_INPROC_SERVER, IID_ITaskService,
                                 service.putVoid()),
              "CoCreateInstance(TaskScheduler)") &&
           ok(service->Connect(Variant(), Variant(), Variant(), Variant()), "ITaskService::Connect") &&
           ok(service->GetFolder(Bstr(L"\\"), folder.put()), "ITaskService::GetFolder");
}

// The running process's account, DOMAIN\user (the token's user, looked up by its SID).
HRESULT CurrentAccount(std::wstring& account) {
    HANDLE token = nullptr;
    if (!::OpenProcessToken(::GetCurrentProcess(), TOKEN_QUERY, &token)) return HRESULT_FROM_WIN32(::GetLastError());
    alignas(TOKEN_USER) unsigned char buffer[sizeof(TOKEN_USER) + SECURITY_MAX_SID_SIZE];
    DWORD size = 0;
    BOOL got = ::GetTokenInformation(token, TokenUser, buffer, sizeof buffer, &size);
    DWORD error = ::GetLastError();
    ::CloseHandle(token);
    if (!got) return HRESULT_FROM_WIN32(error);
    wchar_t name[256], domain[256];
    DWORD nameLength = 256, domainLength = 256;
    SID_NAME_USE use;
    if (!::LookupAccountSidW(nullptr, reinterpret_cast<TOKEN_USER*>(buffer)->User.Sid, name, &nameLength, domain,
                             &domainLength, &use))
        return HRESULT_FROM_WIN32(::GetLastError());
    account = domainLength == 0 ? std::wstring(name) : std::wstring(domain) + L"\\" + name;
    return S_OK;
}

}  // namespace

platform::TaskFailure Win32TaskScheduler::RegisterLogonTask(const std::string& name, const std::string& command) {
    ComScope com;
    Calls ok;
    Com<ITaskService> service;
    Com<ITaskFolder> folder;
    if (!OpenRootFolder(ok, service, folder)) return ok.failure();

    // The account of the user who checked the box, as DOMAIN\user.
    std::wstring account;
    if (!ok(CurrentAccount(account), "LookupAccountSidW")) return ok.failure();

    // One definition, registered whole: started by this user's next logon (no start boundary), run with the highest
    // privileges under the user's interactive logon, never stopped for time or battery, one instance at a time.
    const std::wstring user = XmlEscaped(account);
    std::wstring xml =
        L"<?xml version=\"1.0\"?><Task version=\"1.2\" "
        L"xmlns=\"http://schemas.microsoft.com/windows/2004/02/mit/task\">";
    xml += L"<Triggers><LogonTrigger><Enabled>true</Enabled><UserId>" + user + L"</UserId></LogonTrigger></Triggers>";
    xml += L"<Principals><Principal id=\"Author\"><UserId>" + user +
           L"</UserId><LogonType>InteractiveToken</LogonType>"
           L"<RunLevel>HighestAvailable</RunLevel></Principal></Principals>";
    xml +=
        L"<Settings><MultipleInstancesPolicy>IgnoreNew</MultipleInstancesPolicy>"
        L"<DisallowStartIfOnBatteries>false</DisallowStartIfOnBatteries>"
        L"<StopIfGoingOnBatteries>false</StopIfGoingOnBatteries>"
        L"<ExecutionTimeLimit>PT0S</ExecutionTimeLimit><Enabled>true</Enabled></Settings>";
    xml += L"<Actions Context=\"Author\"><Exec><Command>" + XmlEscaped(Wide(command)) + L"</Command></Exec></Actions>";
    xml += L"</Task>";
    Com<IRegisteredTask> registered;
    ok(folder->RegisterTask(Bstr(Wide(name)), Bstr(xml), TASK_CREATE_OR_UPDATE, Variant(account), Variant(),
                            TASK_LOGON_INTERACTIVE_TOKEN, Variant(L""), registered.put()),
       "ITaskFolder::RegisterTask");
    return ok.failure();
}

platform::TaskFailure Win32TaskScheduler::DeleteTask(const std::string& name) {
    ComScope com;
    Calls ok;
    Com<ITaskService> service;
    Com<ITaskFolder> folder;
    if (!OpenRootFolder(ok, service, folder)) return ok.failure();
    HRESULT hr = folder->DeleteTask(Bstr(Wide(name)), 0);
    if (hr == HRESULT_FROM_WIN32(ERROR_FILE_NOT_FOUND) || hr == HRESULT_FROM_WIN32(ERROR_PATH_NOT_FOUND))
        hr = S_OK;  // nothing to remove: the box unchecks cleanly
    ok(hr, "ITaskFolder::DeleteTask");
    return ok.failure();
}

}  // namespace vantorel::win32
