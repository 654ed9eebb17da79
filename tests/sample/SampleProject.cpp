#include "SampleProject.h"

#include "drawing/Attribute.h"
#include "drawing/BlockReference.h"

#include <charconv>
#include <regex>

namespace zvtest {

const SampleProject& sampleProject(std::uint64_t seed, int terminals, int pages) {
    static std::map<std::tuple<std::uint64_t, int, int>, SampleProject> made;
    SampleProject& project = made[{seed, terminals, pages}];
    if (!project.db) {
        zvsample::ProjectGenerator generator({seed, terminals, pages});
        project.db = generator.generate();
        project.counts = generator.counts();
    }
    return project;
}

std::string attributeValue(const zvdb::DbObject& reference, std::string_view tag) {
    const auto* insert = dynamic_cast<const zvdb::BlockReference*>(&reference);
    const zvdb::Attribute* attribute = insert ? insert->attribute(tag) : nullptr;
    return attribute ? std::string(attribute->textValue()) : std::string();
}

// Xrecords are read from their tags: the drawing API keeps all their tags as data.
std::vector<zvdb::Tag> xdataOf(const zvdb::DbObject& object, std::string_view application) {
    if (!object.isType("XRECORD")) return object.xdata(application);
    std::vector<zvdb::Tag> items;
    bool inside = false;
    for (const zvdb::Tag& tag : object.tags()) {
        if (tag.code == 1001) {
            inside = tag.value == application;
            continue;
        }
        if (inside && tag.code >= 1000) items.push_back(tag);
    }
    return items;
}

std::vector<std::string> xdataTexts(const zvdb::DbObject& object, std::string_view application) {
    std::vector<std::string> texts;
    for (const zvdb::Tag& tag : xdataOf(object, application))
        if (tag.code == 1000) texts.emplace_back(tag.value);
    return texts;
}

std::vector<zvdb::Point3> xdataPoints(const zvdb::DbObject& object, std::string_view application) {
    std::vector<zvdb::Point3> points;
    const auto tags = xdataOf(object, application);
    auto real = [](std::string_view text) {
        double value = 0;
        std::from_chars(text.data(), text.data() + text.size(), value);
        return value;
    };
    for (std::size_t i = 0; i + 2 < tags.size(); ++i)
        if (tags[i].code == 1010)
            points.push_back(
                {real(tags[i].value), real(tags[i + 1].value), real(tags[i + 2].value)});
    return points;
}

bool isPageLayer(std::string_view name) {
    static const std::regex page("[A-Z_]+\\$[0-9]{4,}\\$A");
    return std::regex_match(name.begin(), name.end(), page);
}

}  // namespace zvtest
