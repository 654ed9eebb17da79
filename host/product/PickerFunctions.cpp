// Pickers and prompts: zv_seleciona_paginas, zvselpagsolucao, zvSelecionaReguas,
// ENTRA_VIA_DD. They ask the host's user interface by answer name; a cancel gives nil.
#include "LispHelpers.h"
#include "PageRegistry.h"
#include "ProductLisp.h"

#include "sdk/UserInterface.h"

#include <QRegularExpression>

#include <optional>
#include <unordered_set>

namespace zvproduct {

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::Value;

namespace {

std::optional<QString> ask(const ProductContext& context, const QString& name,
                           const QString& prompt) {
    zvsdk::UserInterface* ui = context.userInterface ? context.userInterface() : nullptr;
    if (!ui) return std::nullopt;
    return ui->answer(name, prompt);
}

QStringList splitAnswer(const QString& answer) {
    QStringList parts = answer.split(QRegularExpression("[;,]"), Qt::SkipEmptyParts);
    for (QString& part : parts)
        part = part.trimmed();
    parts.removeAll(QString());
    return parts;
}

// The pages answered, in the order given; "*" is every page. Names that are no page of the
// project are reported and left out.
Value pickPages(Interpreter& lisp, const ProductContext& context) {
    zvdb::Database* database = context.database ? context.database() : nullptr;
    if (!database) return Value();
    const auto pages = PageRegistry(*database).pages();
    QStringList all;
    for (const std::string& page : pages)
        all << QString::fromStdString(page);
    const auto answer = ask(context, "pages", "Pages (" + all.join(";") + ")");
    if (!answer) return Value();
    if (answer->trimmed() == "*") return lispTexts(all);
    const std::unordered_set<std::string> known(pages.begin(), pages.end());
    QStringList chosen;
    for (const QString& page : splitAnswer(*answer)) {
        if (known.count(page.toStdString()))
            chosen << page;
        else
            lisp.write("\nNo such page: " + page);
    }
    return lispTexts(chosen);
}

Value enterPrompts(Interpreter& lisp, const ProductContext& context, const Value& prompts) {
    std::vector<std::string> texts;
    collectTexts(prompts, texts);
    zvlisp::ListBuilder answers;
    for (const std::string& text : texts) {
        const QString prompt = QString::fromStdString(text);
        const auto answer = ask(context, "prompt:" + prompt, prompt);
        if (!answer) {
            lisp.setGlobal("*LST_ATRIBS_ENTRADA*", Value());
            return Value();
        }
        answers.add(Value::string(*answer));
    }
    lisp.setGlobal("*LST_ATRIBS_ENTRADA*", answers.take());
    return lisp.t();
}

}  // namespace

void installPickerFunctions(Interpreter& lisp, const ProductContext& context) {
    lisp.define(
        "zv_seleciona_paginas", [context](Interpreter& in, Args) { return pickPages(in, context); },
        1, 2);
    // Elements "PROJECT#PAGE" as answered (the projects of the solution are other drawings).
    lisp.define(
        "zvselpagsolucao",
        [context](Interpreter&, Args) {
            const auto answer = ask(context, "pages", "Pages of the solution (PROJECT#PAGE;...)");
            return answer ? lispTexts(splitAnswer(*answer)) : Value();
        },
        0, 1);
    lisp.define(
        "zvSelecionaReguas",
        [context](Interpreter&, Args) {
            const auto answer = ask(context, "strips", "Terminal strips (X1,X2...)");
            return answer ? lispTexts(splitAnswer(*answer)) : Value();
        },
        0, 0);
    lisp.define(
        "ENTRA_VIA_DD",
        [context](Interpreter& in, Args a) { return enterPrompts(in, context, a[0]); }, 1, 1);
}

}  // namespace zvproduct
