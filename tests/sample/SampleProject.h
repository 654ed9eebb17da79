#pragma once
// Reading helpers over a generated project, for the sample tests: attributes and extended
// data by name, the page layers, and one generated project shared by the tests of a run.
#include "drawing/Database.h"
#include "sample/ProjectGenerator.h"

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace zvtest {

struct SampleProject {
    std::unique_ptr<zvdb::Database> db;
    zvsample::GeneratedCounts counts;
};

// Generated once per options and kept for the run.
const SampleProject& sampleProject(std::uint64_t seed, int terminals, int pages);

std::string attributeValue(const zvdb::DbObject& reference, std::string_view tag);
// The string items of an application, in order.
std::vector<std::string> xdataTexts(const zvdb::DbObject& object, std::string_view application);
std::vector<zvdb::Point3> xdataPoints(const zvdb::DbObject& object, std::string_view application);
bool isPageLayer(std::string_view name);

}  // namespace zvtest
