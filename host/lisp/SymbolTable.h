#pragma once
// The interned symbols of one interpreter. Symbols live as long as the table, so values
// refer to them by plain pointer.
#include "Symbol.h"

#include <QHash>

#include <deque>
#include <vector>

namespace zvlisp {

class SymbolTable {
public:
    SymbolTable() = default;
    SymbolTable(const SymbolTable&) = delete;
    SymbolTable& operator=(const SymbolTable&) = delete;
    ~SymbolTable();

    // The symbol of this name, made on first use; names ignore case.
    Symbol* intern(const QString& name);
    // The symbol, or null when the name was never used.
    Symbol* find(const QString& name) const;
    std::vector<Symbol*> all();

private:
    QHash<QString, Symbol*> byName_;
    std::deque<Symbol> symbols_;
};

}  // namespace zvlisp
