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
    Symbol* lookUp(const QString& name) const;

    QHash<QString, Symbol*> byName_;
    // Names as code spells them ("reg" for REG), to skip upper-casing on every look-up.
    QHash<QString, Symbol*> bySpelling_;
    std::deque<Symbol> symbols_;
};

}  // namespace zvlisp
