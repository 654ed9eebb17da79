#include "SymbolTable.h"

namespace zvlisp {

SymbolTable::~SymbolTable() {
    // Values may hold functions whose bodies name other symbols: empty all values first.
    for (Symbol& symbol : symbols_)
        symbol.value = Value();
}

Symbol* SymbolTable::intern(const QString& name) {
    const QString upper = name.toUpper();
    auto it = byName_.constFind(upper);
    if (it != byName_.constEnd()) return it.value();
    Symbol* symbol = &symbols_.emplace_back(upper);
    byName_.insert(upper, symbol);
    return symbol;
}

Symbol* SymbolTable::find(const QString& name) const {
    return byName_.value(name.toUpper());
}

std::vector<Symbol*> SymbolTable::all() {
    std::vector<Symbol*> result;
    result.reserve(symbols_.size());
    for (Symbol& symbol : symbols_)
        result.push_back(&symbol);
    return result;
}

}  // namespace zvlisp
