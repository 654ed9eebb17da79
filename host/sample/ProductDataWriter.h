#pragma once
// Writes the block drawings of the product data folder: the list blocks (header, detail,
// first-row, accessory, footer and total rows, jumper marks), the strip drawing blocks, the
// front and strip views of the catalogue's components and the sheet frames, as
// DADOS/<standard>/BLOCOS/<block>.dxf below a root folder. Every file holds its entities on
// layer "0" only, with no block references in it.
#include <string>
#include <vector>

namespace zvsample {

class ProductDataWriter {
public:
    explicit ProductDataWriter(std::string root) : root_(std::move(root)) {}

    // Writes every block file; answers the paths written. Throws zvdb::DxfError when a file
    // can't be written.
    std::vector<std::string> writeAll();

private:
    void writeListBlocks();
    void writeStripBlocks();
    void writeViews();
    void writeFrames();

    std::string root_;
    std::vector<std::string> written_;
};

}  // namespace zvsample
