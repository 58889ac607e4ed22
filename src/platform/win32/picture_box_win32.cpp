#include "platform/win32/picture_box_win32.h"

#include "platform/win32/gdi_objects.h"

#include <algorithm>
#include <cmath>

namespace vantorel::win32 {
namespace {

// The first pixel whose left (top) edge lies at or after `twips`.
int FirstPixel(double twips, std::int32_t perPixel) { return static_cast<int>(std::ceil(twips / perPixel)); }

}  // namespace

COLORREF GdiPictureBox::Resolve(std::uint32_t colour) {
    if ((colour & 0x80000000u) != 0) return ::GetSysColor(static_cast<int>(colour & 0xFF));
    return static_cast<COLORREF>(colour & 0xFFFFFFu);
}

GdiPictureBox::GdiPictureBox(int width, int height, HWND window) : width_(width), height_(height), window_(window) {
    twipsX_ = 1440 / ScreenDpi(LOGPIXELSX);
    twipsY_ = 1440 / ScreenDpi(LOGPIXELSY);
    dc_ = ::CreateCompatibleDC(nullptr);
    void* bits = nullptr;
    bitmap_ = CreateDib(dc_, width, -height, 32, &bits);
    oldBitmap_ = ::SelectObject(dc_, bitmap_);
    oldFont_ = ::SelectObject(dc_, ::GetStockObject(DEFAULT_GUI_FONT));
    SetBackColor(0xFFFFFFu);
}

GdiPictureBox::~GdiPictureBox() {
    if (dc_ != nullptr) {
        ::SelectObject(dc_, oldFont_);
        ::SelectObject(dc_, oldBitmap_);
        ::DeleteDC(dc_);
    }
    if (bitmap_ != nullptr) ::DeleteObject(bitmap_);
}

void GdiPictureBox::SetBackColor(std::uint32_t colour) {
    HBRUSH brush = ::CreateSolidBrush(Resolve(colour));
    RECT all{0, 0, width_, height_};
    ::FillRect(dc_, &all, brush);
    ::DeleteObject(brush);
    Changed();
}

SIZE GdiPictureBox::Measure(const std::string& text) const {
    SIZE size{};
    ::GetTextExtentPoint32A(dc_, text.c_str(), static_cast<int>(text.size()), &size);
    return size;
}

double GdiPictureBox::TextWidth(const std::string& text) { return static_cast<double>(Measure(text).cx) * twipsX_; }

double GdiPictureBox::TextHeight(const std::string& text) { return static_cast<double>(Measure(text).cy) * twipsY_; }

void GdiPictureBox::Print(const std::string& text) {
    ::SetBkMode(dc_, TRANSPARENT);
    ::SetTextColor(dc_, fore_);
    ::TextOutA(dc_, FirstPixel(x_, twipsX_), FirstPixel(y_, twipsY_), text.c_str(), static_cast<int>(text.size()));
    x_ += TextWidth(text);
    Changed();
}

void GdiPictureBox::FillBox(double x1, double y1, double x2, double y2, std::uint32_t colour) {
    RECT box{FirstPixel(std::min(x1, x2), twipsX_), FirstPixel(std::min(y1, y2), twipsY_),
             FirstPixel(std::max(x1, x2), twipsX_), FirstPixel(std::max(y1, y2), twipsY_)};
    HBRUSH brush = ::CreateSolidBrush(Resolve(colour));
    if (mode_ == platform::DrawMode::XorPen) {
        HGDIOBJ old = ::SelectObject(dc_, brush);
        ::PatBlt(dc_, box.left, box.top, box.right - box.left, box.bottom - box.top, PATINVERT);
        ::SelectObject(dc_, old);
    } else {
        ::FillRect(dc_, &box, brush);
    }
    ::DeleteObject(brush);
    Changed();
}

void GdiPictureBox::Show(HDC target, int x, int y) const {
    ::BitBlt(target, x, y, width_, height_, dc_, 0, 0, SRCCOPY);
}

void GdiPictureBox::Changed() const {
    if (window_ != nullptr) ::InvalidateRect(window_, nullptr, FALSE);
}

}  // namespace vantorel::win32
