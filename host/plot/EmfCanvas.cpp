#include "EmfCanvas.h"

#include <libEMF/emf.h>

#include <cstdio>

namespace zvplot {

struct EmfCanvas::State {
    FILE* file = nullptr;
    HDC dc = 0;
    HPEN pen = 0;
    HBRUSH brush = 0;
};

namespace {

COLORREF colorRef(std::uint32_t rgb) {
    return RGB((rgb >> 16) & 0xFF, (rgb >> 8) & 0xFF, rgb & 0xFF);
}

}  // namespace

EmfCanvas::EmfCanvas() : state_(std::make_unique<State>()) {}

EmfCanvas::~EmfCanvas() {
    close();
}

bool EmfCanvas::open(const std::string& path, double widthMm, double heightMm) {
    state_->file = std::fopen(path.c_str(), "wb");
    if (!state_->file) return false;
    // The frame is in hundredths of a millimetre.
    RECT frame{0, 0, static_cast<LONG>(widthMm * 100), static_cast<LONG>(heightMm * 100)};
    state_->dc = CreateEnhMetaFileWithFILEA(0, state_->file, &frame, "ZVListas\0page\0");
    if (!state_->dc) {
        std::fclose(state_->file);
        state_->file = nullptr;
        return false;
    }
    const int pixels = GetDeviceCaps(state_->dc, HORZRES);
    const int millimetres = GetDeviceCaps(state_->dc, HORZSIZE);
    unitsPerMm_ = millimetres > 0 ? double(pixels) / millimetres : 4.0;
    SetMapMode(state_->dc, MM_TEXT);
    SetBkMode(state_->dc, TRANSPARENT);
    SetPolyFillMode(state_->dc, ALTERNATE);
    SetTextAlign(state_->dc, TA_LEFT | TA_BASELINE);
    return true;
}

void EmfCanvas::setPen(std::uint32_t rgb, int width, bool none) {
    if (!state_->dc) return;
    HPEN pen = none ? static_cast<HPEN>(GetStockObject(NULL_PEN))
                    : CreatePen(PS_SOLID, width, colorRef(rgb));
    SelectObject(state_->dc, pen);
    if (state_->pen) DeleteObject(state_->pen);
    state_->pen = none ? 0 : pen;
}

void EmfCanvas::setBrush(std::uint32_t rgb, bool none) {
    if (!state_->dc) return;
    HBRUSH brush =
        none ? static_cast<HBRUSH>(GetStockObject(NULL_BRUSH)) : CreateSolidBrush(colorRef(rgb));
    SelectObject(state_->dc, brush);
    if (state_->brush) DeleteObject(state_->brush);
    state_->brush = none ? 0 : brush;
}

void EmfCanvas::polyline(const std::vector<Point>& points) {
    if (!state_->dc || points.size() < 2) return;
    std::vector<POINT> out(points.size());
    for (std::size_t i = 0; i < points.size(); ++i)
        out[i] = POINT{points[i].x, points[i].y};
    Polyline(state_->dc, out.data(), static_cast<INT>(out.size()));
}

void EmfCanvas::polyPolygon(const std::vector<Point>& points, const std::vector<int>& counts) {
    if (!state_->dc || points.empty() || counts.empty()) return;
    std::vector<POINT> out(points.size());
    for (std::size_t i = 0; i < points.size(); ++i)
        out[i] = POINT{points[i].x, points[i].y};
    std::vector<INT> sizes(counts.begin(), counts.end());
    PolyPolygon(state_->dc, out.data(), sizes.data(), static_cast<UINT>(sizes.size()));
}

void EmfCanvas::text(int x, int y, const std::u16string& text, int height, int angle,
                     std::uint32_t rgb, const std::u16string& face) {
    if (!state_->dc || text.empty()) return;
    std::u16string name = face.substr(0, 31);
    HFONT font = CreateFontW(-height, 0, angle, angle, FW_NORMAL, 0, 0, 0, DEFAULT_CHARSET,
                             OUT_DEFAULT_PRECIS, CLIP_DEFAULT_PRECIS, ANTIALIASED_QUALITY,
                             DEFAULT_PITCH, reinterpret_cast<LPCWSTR>(name.c_str()));
    HGDIOBJ previous = SelectObject(state_->dc, font);
    SetTextColor(state_->dc, colorRef(rgb));
    TextOutW(state_->dc, x, y, reinterpret_cast<LPCWSTR>(text.c_str()),
             static_cast<INT>(text.size()));
    SelectObject(state_->dc, previous);
    DeleteObject(font);
}

bool EmfCanvas::close() {
    if (!state_->dc) return false;
    HENHMETAFILE metafile = CloseEnhMetaFileWithFILE(state_->dc);
    state_->dc = 0;
    if (metafile) DeleteEnhMetaFile(metafile);
    state_->pen = 0;
    state_->brush = 0;
    const bool flushed = std::fflush(state_->file) == 0 && !std::ferror(state_->file);
    const bool closed = std::fclose(state_->file) == 0;
    state_->file = nullptr;
    return metafile && flushed && closed;
}

}  // namespace zvplot
