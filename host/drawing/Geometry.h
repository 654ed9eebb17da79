#pragma once
// Plain geometry for the drawing: points, affine transforms and bounding boxes.
#include <array>

namespace zvdb {

struct Point3 {
    double x = 0.0, y = 0.0, z = 0.0;
    friend bool operator==(const Point3&, const Point3&) = default;
    Point3 operator+(const Point3& o) const { return {x + o.x, y + o.y, z + o.z}; }
    Point3 operator-(const Point3& o) const { return {x - o.x, y - o.y, z - o.z}; }
    Point3 operator*(double f) const { return {x * f, y * f, z * f}; }
};

Point3 cross(const Point3& a, const Point3& b);
double length(const Point3& p);
Point3 normalized(const Point3& p);

// An affine transform: a 3x3 linear part (columns are the images of the axes) and a move.
class Transform {
public:
    static Transform identity();
    static Transform translation(const Point3& move);
    static Transform scaling(double sx, double sy, double sz);
    static Transform rotationZ(double radians);
    // From an object coordinate system (extrusion direction) to world coordinates.
    static Transform fromOcs(const Point3& extrusion);

    Point3 apply(const Point3& p) const;
    Point3 applyVector(const Point3& v) const;
    // this after other: (a * b).apply(p) == a.apply(b.apply(p)).
    Transform operator*(const Transform& other) const;

    std::array<double, 9> linear{1, 0, 0, 0, 1, 0, 0, 0, 1};  // row-major
    Point3 move;
};

// An axis-aligned box; empty until something is added.
struct BoundingBox {
    Point3 min{1e300, 1e300, 1e300};
    Point3 max{-1e300, -1e300, -1e300};
    bool isEmpty() const { return min.x > max.x; }
    void add(const Point3& p);
    void add(const BoundingBox& box);
};

}  // namespace zvdb
