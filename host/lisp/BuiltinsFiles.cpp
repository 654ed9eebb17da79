// Files, load, findfile and getenv.
#include "Builtins.h"
#include "Interpreter.h"
#include "LispFile.h"

namespace zvlisp {

namespace {

LispFile* toFile(Interpreter& in, const Value& v, bool forReading) {
    if (v.type() != Type::File) in.badType("streamp", v);
    auto* file = static_cast<LispFile*>(v.asObject());
    if (!file->isOpen() || file->reading() != forReading) in.badType("streamp", v);
    return file;
}

Value openFile(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    const QString& mode = in.toStr(a[1]);
    const QString lower = mode.toLower();
    if (lower != QLatin1String("r") && lower != QLatin1String("w") && lower != QLatin1String("a"))
        in.fail("bad argument value: " + mode);
    LispFile* file = LispFile::open(name, mode);
    return file ? Value::object(Type::File, file) : Value();
}

Value writeText(Interpreter& in, Args a, const QString& text) {
    if (a.has(1) && !a[1].isNil())
        toFile(in, a[1], false)->write(text);
    else
        in.write(text);
    return a[0];
}

Value load(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    if (a.has(1) && in.findFile(LispFile::withLspExtension(name)).isEmpty() &&
        in.findFile(name).isEmpty())
        return a[1];
    return in.load(name);
}

}  // namespace

void registerFileBuiltins(Interpreter& in) {
    in.define("open", openFile, 2, 3);
    in.define(
        "close",
        [](Interpreter& in, Args a) {
            if (a[0].type() != Type::File) in.badType("streamp", a[0]);
            auto* file = static_cast<LispFile*>(a[0].asObject());
            // A file that did not reach the disk is an error the program must see.
            const bool wasOpen = file->isOpen();
            if (!file->close() && wasOpen) in.fail(file->errorString());
            return Value();
        },
        1, 1);
    in.define(
        "read-line",
        [](Interpreter& in, Args a) {
            QString line;
            if (!a.has(0)) return Value();  // reading the keyboard is not offered
            return toFile(in, a[0], true)->readLine(&line) ? Value::string(line) : Value();
        },
        0, 1);
    in.define(
        "read-char",
        [](Interpreter& in, Args a) {
            if (!a.has(0)) return Value();
            const int c = toFile(in, a[0], true)->readChar();
            return c < 0 ? Value() : Value::integer(c == '\r' ? '\n' : c);
        },
        0, 1);
    in.define(
        "write-line",
        [](Interpreter& in, Args a) { return writeText(in, a, in.toStr(a[0]) + "\n"); }, 1, 2);
    in.define(
        "write-char",
        [](Interpreter& in, Args a) {
            return writeText(in, a, QString(QChar(char16_t(in.toInt(a[0])))));
        },
        1, 2);
    in.define(
        "findfile",
        [](Interpreter& in, Args a) {
            const QString path = in.findFile(in.toStr(a[0]));
            return path.isEmpty() ? Value() : Value::string(path);
        },
        1, 1);
    in.define("load", load, 1, 2);
    in.define(
        "getenv",
        [](Interpreter& in, Args a) {
            const QByteArray name = in.toStr(a[0]).toLocal8Bit();
            if (!qEnvironmentVariableIsSet(name.constData())) return Value();
            return Value::string(qEnvironmentVariable(name.constData()));
        },
        1, 1);
}

}  // namespace zvlisp
