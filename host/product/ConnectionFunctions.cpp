// Connections: getConexoesTodosFios, getConexoesTodosCabos, getFiosPorLayer, getListaFios,
// getListaFiosProj.
#include "ConnectionAnswers.h"
#include "LispHelpers.h"
#include "PageRegistry.h"
#include "ProductLisp.h"
#include "WireLayerIndex.h"
#include "WireListIndex.h"

#include "drawing/Database.h"
#include "drawing/Polyline.h"
#include "sdk/ResultBuffer.h"

#include <QStringList>

#include <charconv>
#include <memory>
#include <unordered_set>

namespace zvproduct {

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::Value;

namespace {

zvdb::Database& databaseOf(Interpreter& lisp, const ProductContext& context) {
    zvdb::Database* database = context.database ? context.database() : nullptr;
    if (!database) lisp.fail("no drawing");
    return *database;
}

// A page's wires are asked for page after page: the handles' texts are made straight from
// their numbers.
Value handleTexts(const std::vector<std::uint64_t>& handles) {
    zvlisp::ListBuilder list;
    char buffer[24];
    for (std::uint64_t handle : handles) {
        const auto end = std::to_chars(buffer, buffer + sizeof buffer, handle, 16).ptr;
        for (char* c = buffer; c != end; ++c)
            if (*c >= 'a' && *c <= 'f') *c = static_cast<char>(*c - 'a' + 'A');
        list.add(Value::string(QString::fromLatin1(buffer, static_cast<int>(end - buffer))));
    }
    return list.take();
}

QString qText(const std::string& text) {
    return QString::fromUtf8(text.data(), static_cast<int>(text.size()));
}

// ((NUMBER (TEXT x y z) ...) ...); `details` adds "#CONNECTION#BLOCK" to the handle.
Value connectionList(const std::vector<WireConnections>& wires, bool details) {
    zvlisp::ListBuilder all;
    std::string text;
    for (const WireConnections& wire : wires) {
        zvlisp::ListBuilder one;
        one.add(Value::string(qText(wire.number)));
        for (const Touch& touch : wire.touches) {
            text.clear();
            ConnectionAnswers::appendEntryText(touch, details, text);
            zvlisp::ListBuilder entry;
            entry.add(Value::string(qText(text)));
            entry.add(Value::real(touch.point.x));
            entry.add(Value::real(touch.point.y));
            entry.add(Value::real(touch.point.z));
            one.add(entry.take());
        }
        all.add(one.take());
    }
    return all.take();
}

Value ename(zvdb::Database& database, std::uint64_t handle) {
    return Value::object(zvlisp::Type::Ename,
                         new zvlisp::EnameObject(zvsdk::EntityName{&database, handle}));
}

// Layer names from strings and lists, a text cut at ";" too.
std::unordered_set<std::string> layerNames(Args args, int from) {
    std::vector<std::string> texts;
    for (int i = from; i < args.size(); ++i)
        collectTexts(args[i], texts);
    std::unordered_set<std::string> names;
    for (const std::string& text : texts)
        for (const QString& part : QString::fromStdString(text).split(';', Qt::SkipEmptyParts))
            names.insert(part.toStdString());
    return names;
}

}  // namespace

void installConnectionFunctions(Interpreter& lisp, const ProductContext& context) {
    // a LISP caller asks for one kind; the host's module path (see ConnectionAnswers) asks
    // for both in a row and shares these answers
    auto answers =
        context.connections ? context.connections : std::make_shared<ConnectionAnswers>();
    lisp.define(
        "getConexoesTodosFios",
        [context, answers](Interpreter& in, Args) {
            return connectionList(
                answers->answer(in, context, ConnectionAnswers::Kind::Wires, false), true);
        },
        0, 0);
    lisp.define(
        "getConexoesTodosCabos",
        [context, answers](Interpreter& in, Args) {
            return connectionList(
                answers->answer(in, context, ConnectionAnswers::Kind::Cables, false), false);
        },
        0, 0);
    lisp.define(
        "getFiosPorLayer",
        [context, answers](Interpreter& in, Args a) {
            zvdb::Database& database = databaseOf(in, context);
            return handleTexts(
                answers->wireLayersOf(database).polylinesOn(database, stdText(in, a[0])));
        },
        1, 1);
    // The wire reader, the ferrule reader and the material list ask in turn: one index, which
    // the connection answers' index hands over when it walked the drawing as it stands.
    lisp.define("getListaFios", [context, answers](Interpreter& in, Args a) {
        zvdb::Database& database = databaseOf(in, context);
        zvlisp::ListBuilder list;
        for (std::uint64_t handle :
             answers->wireListOf(database).firstPolylines(database, layerNames(a, 0)))
            list.add(ename(database, handle));
        return list.take();
    });
    lisp.define("getListaFiosProj", [context, answers](Interpreter& in, Args a) {
        zvdb::Database& database = databaseOf(in, context);
        return handleTexts(
            answers->wireListOf(database).firstPolylines(database, layerNames(a, 1)));
    });
}

}  // namespace zvproduct
