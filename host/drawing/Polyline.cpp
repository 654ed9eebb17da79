#include "Polyline.h"

#include "Database.h"
#include "TagList.h"
#include "TagValues.h"

namespace zvdb {

std::vector<Point3> Polyline::vertices() const {
    std::vector<Point3> points;
    if (!isLightweight()) {
        for (Entity* vertex : subEntities())
            if (!vertex->isErased()) points.push_back(vertex->point(10));
        return points;
    }
    const auto all = tags();
    const std::size_t end = xdataStart();
    // Counted first, so that the array is made once at its size; the same walk finds the
    // elevation where real(38) would (outside application groups).
    std::size_t count = 0;
    const Tag* elevationTag = nullptr;
    bool inGroup = false;
    for (std::size_t i = 1; i < end; ++i) {
        const Tag& tag = all[i];
        if (tag.code == 10) {
            ++count;
        } else if (TagList::opensGroup(tag)) {
            inGroup = true;
        } else if (TagList::closesGroup(tag)) {
            inGroup = false;
        } else if (tag.code == 38 && !inGroup && !elevationTag) {
            elevationTag = &tag;
        }
    }
    const double elevation = elevationTag ? TagValues::toReal(elevationTag->value, 0.0) : 0.0;
    points.reserve(count);
    for (std::size_t i = 1; i < end; ++i) {
        if (all[i].code == 10)
            points.push_back(Point3{TagValues::toReal(all[i].value), 0.0, elevation});
        else if (all[i].code == 20 && !points.empty())
            points.back().y = TagValues::toReal(all[i].value);
    }
    return points;
}

void Polyline::setVertices(const std::vector<Point3>& points) {
    if (!isLightweight()) {
        for (Entity* vertex : subEntities())
            vertex->erase();
        for (const Point3& p : points)
            database().addVertex(*this, p);
        return;
    }
    const std::size_t end = xdataStart();
    auto& all = editTags();
    std::vector<Tag> kept;
    kept.reserve(all.size());
    std::size_t insertAt = 0;
    for (std::size_t i = 0; i < all.size(); ++i) {
        const int code = all[i].code;
        const bool vertexTag = i < end && (code == 10 || code == 20 || code == 40 || code == 41 ||
                                           code == 42 || code == 91);
        if (vertexTag) {
            if (insertAt == 0) insertAt = kept.size();
            continue;
        }
        kept.push_back(all[i]);
    }
    if (insertAt == 0) insertAt = std::min(kept.size(), end);
    TagListBuilder builder(database().arena());
    for (const Point3& p : points)
        builder.point(10, p, false);
    const auto added = builder.take();
    kept.insert(kept.begin() + static_cast<std::ptrdiff_t>(insertAt), added.begin(), added.end());
    all = std::move(kept);
    setInteger(90, static_cast<long long>(points.size()), "AcDbPolyline");
}

void Polyline::setClosed(bool closed) {
    const long long flags = integer(70);
    setInteger(70, closed ? (flags | 1) : (flags & ~1LL),
               isLightweight() ? "AcDbPolyline" : "AcDb2dPolyline");
}

}  // namespace zvdb
