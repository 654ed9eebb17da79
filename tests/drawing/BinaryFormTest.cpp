// The fuzzer reads every ASCII input in its binary form too (fuzz/BinaryDxf.h): the two forms
// of a drawing read into the same objects, layers and tags.
#include "drawing/fuzz/BinaryDxf.h"

#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"
#include "drawing/TagReader.h"

#include <gtest/gtest.h>

#include <QFile>

#include <string>

namespace {

std::string contentOf(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll().toStdString() : std::string();
}

std::vector<std::string> layerNames(const zvdb::Database& database) {
    std::vector<std::string> names;
    for (const zvdb::LayerRecord* layer : database.layers())
        names.emplace_back(layer->name());
    return names;
}

class BinaryForm : public ::testing::TestWithParam<const char*> {};

TEST_P(BinaryForm, ReadsAsTheAsciiFileDoes) {
    const std::string ascii = contentOf(QString(ZV_TEST_DIR "/fuzz/corpus/") + GetParam());
    ASSERT_FALSE(ascii.empty());
    const std::string binary = zvfuzz::toBinaryDxf(zvdb::TagReader::readAscii(ascii));
    ASSERT_TRUE(zvdb::TagReader::isBinary(binary));

    auto fromAscii = zvdb::DxfLoader::load(ascii);
    auto fromBinary = zvdb::DxfLoader::load(binary);
    EXPECT_EQ(fromBinary->version(), fromAscii->version());
    EXPECT_EQ(fromBinary->objectCount(), fromAscii->objectCount());
    EXPECT_EQ(layerNames(*fromBinary), layerNames(*fromAscii));
    const std::vector<zvdb::Tag> written =
        zvdb::TagReader::readAscii(zvdb::DxfWriter::toText(*fromAscii));
    const std::vector<zvdb::Tag> writtenFromBinary =
        zvdb::TagReader::readAscii(zvdb::DxfWriter::toText(*fromBinary));
    ASSERT_EQ(writtenFromBinary.size(), written.size());
    for (std::size_t i = 0; i < written.size(); ++i)
        ASSERT_EQ(writtenFromBinary[i].code, written[i].code) << "tag " << i;
}

INSTANTIATE_TEST_SUITE_P(Corpus, BinaryForm, ::testing::Values("r12.dxf", "r2000.dxf"));

}  // namespace
