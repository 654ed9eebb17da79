#include "SystemLisp.h"

#include "Application.h"
#include "lisp/Function.h"
#include "lisp/Interpreter.h"
#include "product/ProductSettings.h"
#include "sdk/UserInterface.h"

#include <QProcess>
#include <QStringList>

namespace zvhost {

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::Value;

namespace {

// Configuration names are "AppData/APPLICATION/.../NAME"; the rest of the file is not
// LISP's to read or write.
bool validConfigName(const QString& name) {
    const QStringList parts = name.split('/');
    return parts.size() >= 3 && parts.first().compare("AppData", Qt::CaseInsensitive) == 0 &&
           std::none_of(parts.begin(), parts.end(), [](const QString& p) { return p.isEmpty(); });
}

Value getcfg(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    if (!validConfigName(name)) return Value();
    const zvproduct::ProductSettings settings;
    const QString value = settings.value(name);
    return value.isNull() ? Value() : Value::string(value);
}

Value setcfg(Interpreter& in, Args a) {
    const QString& name = in.toStr(a[0]);
    const QString& value = in.toStr(a[1]);
    if (!validConfigName(name)) return Value();
    QString error;
    if (!zvproduct::ProductSettings::store(name, value, &error)) in.fail("setcfg: " + error);
    return a[1];
}

// (startapp app [file]): the program runs on its own; its process number, nil when it
// could not start.
Value startapp(Interpreter& in, Args a) {
    const QString& program = in.toStr(a[0]);
    QStringList arguments;
    if (a.has(1) && !a[1].isNil()) arguments << in.toStr(a[1]);
    qint64 pid = 0;
    if (program.isEmpty() || !QProcess::startDetached(program, arguments, QString(), &pid))
        return Value();
    return Value::integer(std::int32_t(pid > 0 ? pid : 1));
}

}  // namespace

void installSystemFunctions(Interpreter& lisp) {
    lisp.define(
        "alert",
        [](Interpreter& in, Args a) {
            const QString& text = in.toStr(a[0]);
            Application* app = Application::instance();
            if (app && app->userInterface())
                app->userInterface()->messageBox(text, QStringLiteral("ZVListas"));
            else
                in.write(text + "\n");
            return Value();
        },
        1, 1);
    lisp.define("getcfg", getcfg, 1, 1);
    lisp.define("setcfg", setcfg, 2, 2);
    lisp.define("startapp", startapp, 1, 2);
    lisp.define(
        "help",
        // No help viewer in this host: the topic asked for is named on the command line.
        [](Interpreter& in, Args a) {
            const QString file = a.has(0) && !a[0].isNil() ? in.toStr(a[0]) : QString();
            const QString topic = a.has(1) && !a[1].isNil() ? in.toStr(a[1]) : QString();
            if (a.has(2) && !a[2].isNil()) in.toStr(a[2]);
            in.write("; help is in docs/lisp.md" +
                     (topic.isEmpty() ? QString() : " (topic " + topic + ")") + "\n");
            return Value::string(file);
        },
        0, 3);
}

}  // namespace zvhost
