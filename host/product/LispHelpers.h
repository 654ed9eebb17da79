#pragma once
// Small conversions shared by the product's LISP functions.
#include "lisp/Interpreter.h"

#include <QString>

#include <string>
#include <vector>

namespace zvproduct {

inline zvlisp::Value lispText(const std::string& text) {
    return zvlisp::Value::string(QString::fromStdString(text));
}

inline zvlisp::Value lispTexts(const std::vector<std::string>& texts) {
    zvlisp::ListBuilder list;
    for (const std::string& text : texts)
        list.add(lispText(text));
    return list.take();
}

inline zvlisp::Value lispTexts(const QStringList& texts) {
    zvlisp::ListBuilder list;
    for (const QString& text : texts)
        list.add(zvlisp::Value::string(text));
    return list.take();
}

inline std::string stdText(zvlisp::Interpreter& lisp, const zvlisp::Value& value) {
    return lisp.toStr(value).toStdString();
}

// The strings of a list, nested lists flattened; other atoms are skipped.
inline void collectTexts(const zvlisp::Value& value, std::vector<std::string>& out) {
    if (value.isString()) out.push_back(value.asString().toStdString());
    for (zvlisp::Value rest = value; rest.isCons(); rest = zvlisp::cdr(rest))
        collectTexts(zvlisp::car(rest), out);
}

}  // namespace zvproduct
