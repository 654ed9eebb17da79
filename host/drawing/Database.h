#pragma once
// The drawing database of one document.
namespace zvdb {

class Database {
public:
    Database();
    ~Database();
};

}  // namespace zvdb
