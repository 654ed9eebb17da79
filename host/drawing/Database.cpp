#include "Database.h"

namespace zvdb {

Database::Database() = default;
Database::~Database() = default;

}  // namespace zvdb
