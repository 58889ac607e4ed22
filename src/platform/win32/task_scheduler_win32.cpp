#include "platform/win32/task_scheduler_win32.h"

#include <windows.h>
#include <taskschd.h>

#include <string>

#include "platform/win32/system_message.h"

namespace vantorel::win32 {

namespace {

// The logon trigger's own interface, which mingw-w64's taskschd.h does not declare.
struct ILogonTrigger : public ITrigger {
    virtual HRESULT STDMETHODCALLTYPE get_Delay(BSTR* delay) = 0;
    virtual HRESULT STDMETHODCALLTYPE put_Delay(BSTR delay) = 0;
    virtual HRESULT STDMETHODCALLTYPE get_UserId(BSTR* user) = 0;
    virtual HRESULT STDMETHODCALLTYPE put_UserId(BSTR user) = 0;
};
constexpr IID kIidLogonTrigger = {0x72dade38, 0xfae4, 0x4b3e, {0xba, 0xf4, 0x5d, 0x00, 0x9a, 0xf0, 0x2b, 0x1c}};

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
    Com<ITaskDefinition> task;
    if (!OpenRootFolder(ok, service, folder) || !ok(service->NewTask(0, task.put()), "ITaskService::NewTask"))
        return ok.failure();

    // The account of the user who checked the box, as DOMAIN\user.
    std::wstring account;
    if (!ok(CurrentAccount(account), "LookupAccountSidW")) return ok.failure();

    Com<ITriggerCollection> triggers;
    Com<ITrigger> trigger;
    Com<ILogonTrigger> logon;
    Com<IPrincipal> principal;
    Com<ITaskSettings> settings;
    Com<IActionCollection> actions;
    Com<IAction> action;
    Com<IExecAction> exec;
    Com<IRegisteredTask> registered;
    ok(task->get_Triggers(triggers.put()), "ITaskDefinition::get_Triggers") &&
        ok(triggers->Create(TASK_TRIGGER_LOGON, trigger.put()), "ITriggerCollection::Create") &&
        ok(trigger->QueryInterface(kIidLogonTrigger, logon.putVoid()), "ITrigger::QueryInterface(ILogonTrigger)") &&
        ok(logon->put_UserId(Bstr(account)), "ILogonTrigger::put_UserId") &&
        ok(task->get_Principal(principal.put()), "ITaskDefinition::get_Principal") &&
        ok(principal->put_LogonType(TASK_LOGON_INTERACTIVE_TOKEN), "IPrincipal::put_LogonType") &&
        ok(principal->put_RunLevel(TASK_RUNLEVEL_HIGHEST), "IPrincipal::put_RunLevel") &&
        ok(task->get_Settings(settings.put()), "ITaskDefinition::get_Settings") &&
        ok(settings->put_ExecutionTimeLimit(Bstr(L"PT0S")), "ITaskSettings::put_ExecutionTimeLimit") &&
        ok(settings->put_DisallowStartIfOnBatteries(VARIANT_FALSE), "ITaskSettings::put_DisallowStartIfOnBatteries") &&
        ok(settings->put_StopIfGoingOnBatteries(VARIANT_FALSE), "ITaskSettings::put_StopIfGoingOnBatteries") &&
        ok(task->get_Actions(actions.put()), "ITaskDefinition::get_Actions") &&
        ok(actions->Create(TASK_ACTION_EXEC, action.put()), "IActionCollection::Create") &&
        ok(action->QueryInterface(IID_IExecAction, exec.putVoid()), "IAction::QueryInterface(IExecAction)") &&
        ok(exec->put_Path(Bstr(Wide(command))), "IExecAction::put_Path") &&
        ok(folder->RegisterTaskDefinition(Bstr(Wide(name)), task.get(), TASK_CREATE_OR_UPDATE, Variant(account),
                                          Variant(), TASK_LOGON_INTERACTIVE_TOKEN, Variant(L""), registered.put()),
           "ITaskFolder::RegisterTaskDefinition");
    return ok.failure();
}

platform::TaskFailure Win32TaskScheduler::DeleteTask(const std::string& name) {
    ComScope com;
    Calls ok;
    Com<ITaskService> service;
    Com<ITaskFolder> folder;
    if (!OpenRootFolder(ok, service, folder)) return ok.failure();
    HRESULT hr = folder->DeleteTask(Bstr(Wide(name)), 0);
    if (hr == HRESULT_FROM_WIN32(ERROR_FILE_NOT_FOUND)) hr = S_OK;  // nothing to remove
    ok(hr, "ITaskFolder::DeleteTask");
    return ok.failure();
}

}  // namespace vantorel::win32
