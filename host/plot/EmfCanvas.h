#pragma once
// A thin door to the metafile library: its Windows-style declarations stay in one source,
// so the rest of the plotter sees only plain types.
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace zvplot {

class EmfCanvas {
public:
    struct Point {
        int x = 0, y = 0;
    };

    EmfCanvas();
    ~EmfCanvas();
    EmfCanvas(const EmfCanvas&) = delete;
    EmfCanvas& operator=(const EmfCanvas&) = delete;

    // Starts a metafile at `path` for a picture of this size; false when it can't be made.
    bool open(const std::string& path, double widthMm, double heightMm);
    // Device units per millimetre of the metafile's reference device.
    double unitsPerMm() const { return unitsPerMm_; }
    // The pen for lines (width in device units, 0 the thinnest) and the brush for fills
    // (transparent = no fill).
    void setPen(std::uint32_t rgb, int width, bool none = false);
    void setBrush(std::uint32_t rgb, bool none = false);
    void polyline(const std::vector<Point>& points);
    // Several closed shapes filled together (alternate filling), outlined by the pen.
    void polyPolygon(const std::vector<Point>& points, const std::vector<int>& counts);
    // Text on its baseline at (x, y): character height in device units, angle in tenths of
    // a degree counter-clockwise.
    void text(int x, int y, const std::u16string& text, int height, int angle, std::uint32_t rgb,
              const std::u16string& face);
    // Writes the end of the metafile and closes it; false when writing failed.
    bool close();

private:
    struct State;
    std::unique_ptr<State> state_;
    double unitsPerMm_ = 1.0;
};

}  // namespace zvplot
