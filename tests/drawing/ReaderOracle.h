#pragma once
// What the fuzzer and the regression tests ask of the DXF reader for any bytes: they read or
// throw DxfError, and what reads is written and read back with the same entities, blocks and
// layers. Every ASCII input is also tried in binary form.
#include "BinaryDxf.h"

#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/TagReader.h"

#include <memory>
#include <string>

namespace zvtest {

// The reader's message for the bytes; empty when they read.
inline std::string errorOf(const std::string& bytes) {
    try {
        zvdb::DxfLoader::load(bytes);
    } catch (const zvdb::DxfError& e) {
        return e.what();
    }
    return {};
}

inline std::size_t entityCount(const zvdb::Database& database) {
    std::size_t count = 0;
    for (const zvdb::BlockRecord* block : database.blocks())
        count += block->entityCount();
    return count;
}

// Empty when the bytes are refused or survive a round trip; else what went wrong.
inline std::string roundTripProblem(const std::string& bytes) {
    std::unique_ptr<zvdb::Database> database;
    try {
        database = zvdb::DxfLoader::load(bytes);
    } catch (const zvdb::DxfError&) {
        return {};
    }
    const std::string written = zvdb::DxfWriter::toText(*database);
    std::unique_ptr<zvdb::Database> again;
    try {
        again = zvdb::DxfLoader::load(written);
    } catch (const zvdb::DxfError& e) {
        return std::string("the written file does not read: ") + e.what();
    }
    if (!again->modelSpace()) return "no model space after the round trip";
    if (entityCount(*again) != entityCount(*database))
        return "entities " + std::to_string(entityCount(*database)) + " became " +
               std::to_string(entityCount(*again));
    if (again->blocks().size() != database->blocks().size()) return "the blocks changed";
    if (again->layers().size() != database->layers().size()) return "the layers changed";
    return {};
}

// The problems of the bytes and of their binary form.
inline std::string readerProblem(const std::string& bytes) {
    std::string problem = roundTripProblem(bytes);
    if (!problem.empty() || zvdb::TagReader::isBinary(bytes)) return problem;
    std::string binary;
    try {
        binary = binaryDxf(bytes);
    } catch (const zvdb::DxfError&) {
        return {};
    }
    problem = roundTripProblem(binary);
    return problem.empty() ? problem : "binary: " + problem;
}

}  // namespace zvtest
