#include "platform/win32/controls_win32.h"

#include "platform/win32/gdi_objects.h"

#include <algorithm>
#include <string>
#include <vector>

namespace vantorel::win32 {

namespace {

constexpr const char* kFrameClass = "VantorelFrame";

// Window properties on each control lead WM_COMMAND back to its wrapper.
enum class Kind : LONG_PTR { kButton = 1, kCheckBox = 2 };

const char* const kWrapperProp = "VantorelWrapper";
const char* const kKindPropName = "VantorelKind";

HWND CreateControl(HWND parent, const char* className, DWORD style, const std::string& caption, const TwipsRect& rect,
                   UINT dpi, HFONT font) {
    RECT r = ToPixels(rect, dpi);
    HWND hwnd = ::CreateWindowExA(0, className, caption.c_str(), WS_CHILD | WS_VISIBLE | style, r.left, r.top,
                                  r.right - r.left, r.bottom - r.top, parent, nullptr,
                                  reinterpret_cast<HINSTANCE>(::GetWindowLongPtrA(parent, GWLP_HINSTANCE)), nullptr);
    if (hwnd != nullptr && font != nullptr) ::SendMessageA(hwnd, WM_SETFONT, reinterpret_cast<WPARAM>(font), FALSE);
    return hwnd;
}

void Tag(HWND hwnd, void* wrapper, Kind kind) {
    if (hwnd == nullptr) return;
    ::SetPropA(hwnd, kWrapperProp, wrapper);
    ::SetPropA(hwnd, kKindPropName, reinterpret_cast<HANDLE>(static_cast<LONG_PTR>(kind)));
}

void Untag(HWND hwnd) {
    if (hwnd == nullptr) return;
    ::RemovePropA(hwnd, kWrapperProp);
    ::RemovePropA(hwnd, kKindPropName);
}

std::string TextOf(HWND hwnd) {
    int length = ::GetWindowTextLengthA(hwnd);
    std::string text(static_cast<std::size_t>(length) + 1, '\0');
    int copied = ::GetWindowTextA(hwnd, text.data(), length + 1);
    text.resize(static_cast<std::size_t>(copied > 0 ? copied : 0));
    return text;
}

// A character of the system code page in lower case.
char LowerChar(char c) {
    ::CharLowerBuffA(&c, 1);
    return c;
}

LRESULT CALLBACK FrameProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
    switch (message) {
        case WM_COMMAND:
            if (RouteCommand(wParam, lParam)) return 0;
            break;
        case WM_SETTEXT: {
            LRESULT result = ::DefWindowProcA(hwnd, message, wParam, lParam);
            ::InvalidateRect(hwnd, nullptr, TRUE);
            return result;
        }
        case WM_PAINT: {
            PaintGuard paint(hwnd);
            HDC dc = paint.dc();
            SelectGuard font(dc, reinterpret_cast<HFONT>(::SendMessageA(hwnd, WM_GETFONT, 0, 0)));
            TEXTMETRICA metrics{};
            ::GetTextMetricsA(dc, &metrics);
            RECT client;
            ::GetClientRect(hwnd, &client);
            RECT edge = client;
            edge.top += metrics.tmHeight / 2;
            ::DrawEdge(dc, &edge, EDGE_ETCHED, BF_RECT);
            std::string caption = TextOf(hwnd);
            if (!caption.empty()) {
                RECT text{metrics.tmAveCharWidth, 0, client.right - metrics.tmAveCharWidth, metrics.tmHeight};
                ::SetBkColor(dc, ::GetSysColor(COLOR_BTNFACE));
                ::SetTextColor(dc, ::GetSysColor(COLOR_WINDOWTEXT));
                ::SetBkMode(dc, OPAQUE);
                SIZE size{};
                ::GetTextExtentPoint32A(dc, caption.c_str(), static_cast<int>(caption.size()), &size);
                text.left += 2;
                text.right = text.left + size.cx + 4;
                ::DrawTextA(dc, (" " + caption + " ").c_str(), -1, &text, DT_SINGLELINE | DT_LEFT | DT_NOPREFIX);
            }
            return 0;
        }
        case WM_SETFONT: ::SetPropA(hwnd, "VantorelFont", reinterpret_cast<HANDLE>(wParam)); return 0;
        case WM_GETFONT: return reinterpret_cast<LRESULT>(::GetPropA(hwnd, "VantorelFont"));
        case WM_NCDESTROY: ::RemovePropA(hwnd, "VantorelFont"); break;
        case WM_CTLCOLORSTATIC:
        case WM_CTLCOLORBTN:
            // Labels and check boxes on a frame take the parent window's colours.
            return ::SendMessageA(::GetParent(hwnd), message, wParam, lParam);
        default: break;
    }
    return ::DefWindowProcA(hwnd, message, wParam, lParam);
}

}  // namespace

void RegisterWindowClass(HINSTANCE instance, const char* name, WNDPROC proc) {
    WNDCLASSA existing{};
    if (::GetClassInfoA(instance, name, &existing)) return;
    WNDCLASSA wc{};
    wc.lpfnWndProc = proc;
    wc.hInstance = instance;
    wc.hCursor = ::LoadCursorA(nullptr, reinterpret_cast<LPCSTR>(IDC_ARROW));
    wc.hbrBackground = reinterpret_cast<HBRUSH>(COLOR_BTNFACE + 1);
    wc.lpszClassName = name;
    ::RegisterClassA(&wc);
}

UINT DpiOfWindow(HWND hwnd) {
    using GetDpiForWindowFunction = UINT(WINAPI*)(HWND);
    if (HMODULE user32 = ::GetModuleHandleA("user32.dll")) {
        auto get = reinterpret_cast<GetDpiForWindowFunction>(
            reinterpret_cast<void*>(::GetProcAddress(user32, "GetDpiForWindow")));
        if (get != nullptr) {
            UINT dpi = get(hwnd);
            if (dpi != 0) return dpi;
        }
    }
    return static_cast<UINT>(ScreenDpi());
}

int TwipsToPixels(int twips, UINT dpi) { return ::MulDiv(twips, static_cast<int>(dpi), 1440); }

RECT ToPixels(const TwipsRect& rect, UINT dpi) {
    int left = TwipsToPixels(rect.left, dpi);
    int top = TwipsToPixels(rect.top, dpi);
    return RECT{left, top, left + TwipsToPixels(rect.width, dpi), top + TwipsToPixels(rect.height, dpi)};
}

HFONT CreateDesignFont(UINT dpi) {
    // 8.25 pt: the height in pixels rounded as the system rounds point sizes.
    int height = -::MulDiv(825, static_cast<int>(dpi), 7200);
    return ::CreateFontA(height, 0, 0, 0, FW_NORMAL, FALSE, FALSE, FALSE, DEFAULT_CHARSET, OUT_DEFAULT_PRECIS,
                         CLIP_DEFAULT_PRECIS, DEFAULT_QUALITY, DEFAULT_PITCH | FF_SWISS, "Verdana");
}

void PlaceControl(HWND control, const TwipsRect& rect, UINT dpi, HFONT font) {
    RECT r = ToPixels(rect, dpi);
    ::SetWindowPos(control, nullptr, r.left, r.top, r.right - r.left, r.bottom - r.top, SWP_NOZORDER | SWP_NOACTIVATE);
    ::SendMessageA(control, WM_SETFONT, reinterpret_cast<WPARAM>(font), TRUE);
    ::InvalidateRect(control, nullptr, TRUE);
}

bool HandleAccessKey(HWND top, char key) {
    struct Search {
        char key;
        std::vector<HWND> found;
    } search{LowerChar(key), {}};
    ::EnumChildWindows(
        top,
        [](HWND control, LPARAM data) -> BOOL {
            auto& s = *reinterpret_cast<Search*>(data);
            char cls[16] = {};
            ::GetClassNameA(control, cls, sizeof cls);
            const LONG_PTR type = ::GetWindowLongPtrA(control, GWL_STYLE) & BS_TYPEMASK;
            if (lstrcmpiA(cls, "Button") != 0 || (type != BS_PUSHBUTTON && type != BS_DEFPUSHBUTTON) ||
                !::IsWindowVisible(control) || !::IsWindowEnabled(control))
                return TRUE;
            std::string text = TextOf(control);
            for (std::size_t i = 0; i + 1 < text.size(); ++i) {
                if (text[i] != '&') continue;
                if (text[i + 1] == '&') {
                    ++i;
                    continue;
                }
                if (LowerChar(text[i + 1]) == s.key) s.found.push_back(control);
                break;
            }
            return TRUE;
        },
        reinterpret_cast<LPARAM>(&search));
    if (search.found.empty()) return false;
    if (search.found.size() == 1) {
        ::SetFocus(search.found[0]);
        ::SendMessageA(search.found[0], BM_CLICK, 0, 0);
        return true;
    }
    auto at = std::find(search.found.begin(), search.found.end(), ::GetFocus());
    ::SetFocus(at == search.found.end() || at + 1 == search.found.end() ? search.found[0] : *(at + 1));
    return true;
}

bool RouteCommand(WPARAM wParam, LPARAM lParam) {
    HWND control = reinterpret_cast<HWND>(lParam);
    if (control == nullptr || HIWORD(wParam) != BN_CLICKED) return false;
    void* wrapper = ::GetPropA(control, kWrapperProp);
    if (wrapper == nullptr) return false;
    auto kind = static_cast<Kind>(reinterpret_cast<LONG_PTR>(::GetPropA(control, kKindPropName)));
    if (kind == Kind::kButton) static_cast<Win32Button*>(wrapper)->Clicked();
    else if (kind == Kind::kCheckBox) static_cast<Win32CheckBox*>(wrapper)->Clicked();
    else return false;
    return true;
}

Win32Button::Win32Button(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font)
    : hwnd_(CreateControl(parent, "BUTTON", WS_TABSTOP | BS_PUSHBUTTON, caption, rect, dpi, font)), rect_(rect) {
    Tag(hwnd_, this, Kind::kButton);
}
Win32Button::~Win32Button() { Untag(hwnd_); }
void Win32Button::SetCaption(const std::string& caption) { ::SetWindowTextA(hwnd_, caption.c_str()); }
std::string Win32Button::Caption() const { return TextOf(hwnd_); }
void Win32Button::SetEnabled(bool enabled) { ::EnableWindow(hwnd_, enabled ? TRUE : FALSE); }
bool Win32Button::Enabled() const { return ::IsWindowEnabled(hwnd_) != FALSE; }

Win32Label::Win32Label(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font)
    : hwnd_(CreateControl(parent, "STATIC", SS_LEFT, caption, rect, dpi, font)), rect_(rect) {}
Win32Label::~Win32Label() = default;
void Win32Label::SetCaption(const std::string& caption) {
    ::SetWindowTextA(hwnd_, caption.c_str());
    ::UpdateWindow(hwnd_);  // shown at once, even in the middle of a long operation
}
std::string Win32Label::Caption() const { return TextOf(hwnd_); }

Win32Frame::Win32Frame(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font,
                       bool visible)
    : rect_(rect) {
    auto instance = reinterpret_cast<HINSTANCE>(::GetWindowLongPtrA(parent, GWLP_HINSTANCE));
    RegisterWindowClass(instance, kFrameClass, FrameProc);
    RECT r = ToPixels(rect, dpi);
    hwnd_ = ::CreateWindowExA(WS_EX_CONTROLPARENT, kFrameClass, caption.c_str(),
                              WS_CHILD | WS_CLIPCHILDREN | (visible ? WS_VISIBLE : 0), r.left, r.top, r.right - r.left,
                              r.bottom - r.top, parent, nullptr, instance, nullptr);
    if (hwnd_ != nullptr && font != nullptr) ::SendMessageA(hwnd_, WM_SETFONT, reinterpret_cast<WPARAM>(font), FALSE);
}
Win32Frame::~Win32Frame() = default;
void Win32Frame::SetCaption(const std::string& caption) { ::SetWindowTextA(hwnd_, caption.c_str()); }
std::string Win32Frame::Caption() const { return TextOf(hwnd_); }
void Win32Frame::SetVisible(bool visible) { ::ShowWindow(hwnd_, visible ? SW_SHOW : SW_HIDE); }
bool Win32Frame::Visible() const { return (::GetWindowLongPtrA(hwnd_, GWL_STYLE) & WS_VISIBLE) != 0; }

Win32CheckBox::Win32CheckBox(HWND parent, const std::string& caption, const TwipsRect& rect, UINT dpi, HFONT font)
    : hwnd_(CreateControl(parent, "BUTTON", WS_TABSTOP | BS_AUTOCHECKBOX, caption, rect, dpi, font)), rect_(rect) {
    Tag(hwnd_, this, Kind::kCheckBox);
}
Win32CheckBox::~Win32CheckBox() { Untag(hwnd_); }
void Win32CheckBox::SetCaption(const std::string& caption) { ::SetWindowTextA(hwnd_, caption.c_str()); }
std::string Win32CheckBox::Caption() const { return TextOf(hwnd_); }
void Win32CheckBox::SetValue(bool checked) {
    ::SendMessageA(hwnd_, BM_SETCHECK, checked ? BST_CHECKED : BST_UNCHECKED, 0);
}
bool Win32CheckBox::Value() const { return ::SendMessageA(hwnd_, BM_GETCHECK, 0, 0) == BST_CHECKED; }

}  // namespace vantorel::win32
