#pragma once
// A QPaintDevice that writes an enhanced metafile: paths become polylines and filled
// polygons, texts stay texts with their face, height and angle.
#include <QPaintDevice>
#include <QString>

#include <memory>

namespace zvplot {

class EmfCanvas;
class EmfPaintEngine;

class EmfPaintDevice : public QPaintDevice {
public:
    // The metafile at `path`, for a picture of the given size in millimetres.
    EmfPaintDevice(const QString& path, double widthMm, double heightMm);
    ~EmfPaintDevice() override;

    // False when the file could not be made.
    bool isOpen() const { return open_; }
    // Ends the metafile; false when it could not be written whole.
    bool finish();

    QPaintEngine* paintEngine() const override;

protected:
    int metric(PaintDeviceMetric metric) const override;

private:
    std::unique_ptr<EmfCanvas> canvas_;
    std::unique_ptr<EmfPaintEngine> engine_;
    double widthMm_, heightMm_;
    bool open_ = false;
};

}  // namespace zvplot
