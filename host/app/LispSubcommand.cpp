// zvhost lisp [--answer NAME=VALUE]... [FILE.lsp]: runs a LISP file in a new document, or reads,
// evaluates and prints expressions from the standard input until it ends. An expression may span
// lines; an error is reported and the session goes on; Ctrl-C cancels a running evaluation.
#include "Application.h"
#include "ConsoleUserInterface.h"
#include "DocumentLisp.h"
#include "HostCli.h"
#include "HostDocument.h"
#include "LispListener.h"
#include "lisp/Printer.h"

#include <QFileInfo>

#include <atomic>
#include <csignal>

#include <unistd.h>

namespace zvhost {

namespace {

std::atomic<zvlisp::Interpreter*> interrupted{nullptr};

void onInterrupt(int) {
    if (zvlisp::Interpreter* lisp = interrupted.load()) lisp->requestCancel();
}

// Evaluates what was typed; false when the text needs more lines to be complete (at the
// end of the input, `last`, it is reported as it is).
bool echo(zvlisp::Interpreter& lisp, const QString& text, QTextStream& out, bool last = false) {
    const bool complete = zvhost::evaluateTyped(
        lisp, text, [&out](const QString& line) { out << line; }, last);
    out.flush();
    return complete;
}

int repl(zvlisp::Interpreter& lisp, CliContext& context) {
    const bool terminal = isatty(STDIN_FILENO);
    interrupted = &lisp;
    auto previous = std::signal(SIGINT, onInterrupt);
    QString pending;
    for (;;) {
        if (terminal) {
            context.out << (pending.isEmpty() ? "_$ " : "   ");
            context.out.flush();
        }
        const QString line = context.in.readLine();
        if (line.isNull()) break;
        pending += line + "\n";
        if (echo(lisp, pending, context.out)) pending.clear();
    }
    if (!pending.trimmed().isEmpty()) echo(lisp, pending, context.out, true);
    std::signal(SIGINT, previous);
    interrupted = nullptr;
    return kExitOk;
}

}  // namespace

int runLispSubcommand(CliContext& context) {
    // --answer NAME=VALUE answers the prompts of getint, getpoint... as in a drawing run.
    auto ui = std::make_unique<ConsoleUserInterface>(context.out, context.err, false);
    QStringList files;
    for (int i = 0; i < context.args.size(); ++i) {
        const QString& arg = context.args[i];
        if (arg == "--answer" && i + 1 < context.args.size() && ui->addAnswer(context.args[i + 1]))
            ++i;
        else if (arg.startsWith("--answer=") && ui->addAnswer(arg.mid(9)))
            continue;
        else
            files << arg;
    }
    if (files.size() > 1 || (files.size() == 1 && files[0].startsWith('-'))) {
        context.err << "usage: zvhost lisp [--answer NAME=VALUE]... [FILE.lsp]\n";
        return kExitUsage;
    }
    context.args = files;
    Application app(std::move(ui), context.out);
    HostDocument* document = app.openDocument(QString());
    auto* lisp = dynamic_cast<DocumentLisp*>(document->lisp());
    if (!lisp) {
        context.err << "zvhost: LISP is not available in this build\n";
        return kExitFailure;
    }
    if (context.args.isEmpty()) return repl(lisp->interpreter(), context);
    const QString path = QFileInfo(context.args[0]).absoluteFilePath();
    const bool ok = lisp->interpreter().evaluate("(load " + zvlisp::Printer::quoted(path) + ")");
    context.out.flush();
    return ok ? kExitOk : kExitFailure;
}

}  // namespace zvhost
