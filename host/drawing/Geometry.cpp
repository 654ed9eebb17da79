#include "Geometry.h"

#include <algorithm>
#include <cmath>

namespace zvdb {

Point3 cross(const Point3& a, const Point3& b) {
    return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}

double length(const Point3& p) {
    return std::sqrt(p.x * p.x + p.y * p.y + p.z * p.z);
}

Point3 normalized(const Point3& p) {
    const double l = length(p);
    return l > 0 ? p * (1.0 / l) : Point3{0, 0, 1};
}

Transform Transform::identity() {
    return {};
}

Transform Transform::translation(const Point3& move) {
    Transform t;
    t.move = move;
    return t;
}

Transform Transform::scaling(double sx, double sy, double sz) {
    Transform t;
    t.linear = {sx, 0, 0, 0, sy, 0, 0, 0, sz};
    return t;
}

Transform Transform::rotationZ(double radians) {
    Transform t;
    const double c = std::cos(radians), s = std::sin(radians);
    t.linear = {c, -s, 0, s, c, 0, 0, 0, 1};
    return t;
}

Transform Transform::fromOcs(const Point3& extrusion) {
    const Point3 az = normalized(extrusion);
    if (std::abs(az.x) < 1e-12 && std::abs(az.y) < 1e-12 && az.z > 0) return identity();
    // The arbitrary axis rule of the drawing format.
    const Point3 ax = normalized(std::abs(az.x) < 1.0 / 64 && std::abs(az.y) < 1.0 / 64
                                     ? cross(Point3{0, 1, 0}, az)
                                     : cross(Point3{0, 0, 1}, az));
    const Point3 ay = normalized(cross(az, ax));
    Transform t;
    t.linear = {ax.x, ay.x, az.x, ax.y, ay.y, az.y, ax.z, ay.z, az.z};
    return t;
}

Point3 Transform::applyVector(const Point3& v) const {
    const auto& m = linear;
    return {m[0] * v.x + m[1] * v.y + m[2] * v.z, m[3] * v.x + m[4] * v.y + m[5] * v.z,
            m[6] * v.x + m[7] * v.y + m[8] * v.z};
}

Point3 Transform::apply(const Point3& p) const {
    return applyVector(p) + move;
}

Transform Transform::operator*(const Transform& other) const {
    Transform t;
    for (int r = 0; r < 3; ++r) {
        for (int c = 0; c < 3; ++c) {
            double sum = 0;
            for (int k = 0; k < 3; ++k)
                sum += linear[r * 3 + k] * other.linear[k * 3 + c];
            t.linear[r * 3 + c] = sum;
        }
    }
    t.move = apply(other.move);
    return t;
}

void BoundingBox::add(const Point3& p) {
    min = {std::min(min.x, p.x), std::min(min.y, p.y), std::min(min.z, p.z)};
    max = {std::max(max.x, p.x), std::max(max.y, p.y), std::max(max.z, p.z)};
}

void BoundingBox::add(const BoundingBox& box) {
    if (box.isEmpty()) return;
    add(box.min);
    add(box.max);
}

}  // namespace zvdb
