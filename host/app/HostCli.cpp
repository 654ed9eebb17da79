#include "HostCli.h"

#include "Application.h"
#include "ConsoleUserInterface.h"
#include "DocumentLisp.h"
#include "DrawingFiles.h"
#include "HeapTuning.h"
#include "HostDocument.h"
#include "HugePages.h"
#include "Interrupts.h"
#include "drawing/Database.h"
#include "sdk/LispInterface.h"

#include <QFileInfo>

#include <unistd.h>

namespace zvhost {

namespace {

const Subcommand kSubcommands[] = {
    {"lisp", "lisp [--answer N=V]... [FILE.lsp]  run a LISP file, or an interactive LISP prompt",
     runLispSubcommand},
    {"dxf-info", "dxf-info DRAWING  version, entity counts, layers, blocks and dictionaries",
     runDxfInfoSubcommand},
    {"catalogue",
     "catalogue --check | --sql STATEMENT | --lookup OPERATION ARG...   the catalogue the\n"
     "                    settings name: engine and schema, one statement, one look-up",
     runCatalogueSubcommand},
    {"generate",
     "generate --out FILE.dxf [--seed N] [--terminals N] [--pages N] [--data DIR]\n"
     "                    a sample project; --blocks DIR writes the product's block drawings",
     runGenerateSubcommand},
    {"plot",
     "plot DRAWING --out FILE.pdf|.png|.emf [--page LAYER] [--paper W,H] [--portrait] [--dpi N]\n"
     "        [--monochrome] [--no-lineweights]   one page drawn as a file",
     runPlotSubcommand},
};

const char* const kUsage =
    "usage: zvhost [options] DRAWING [COMMAND ...]\n"
    "       zvhost SUBCOMMAND [ARGS ...]\n"
    "\n"
    "Opens DRAWING as the active document (a path that does not exist starts a new, empty\n"
    "drawing that will carry that name), loads the ZVListas module, and runs each COMMAND\n"
    "by name as a user typing it. The drawing is saved only when asked to.\n"
    "\n"
    "options:\n"
    "  -o, --output FILE     save the drawing to FILE after the commands (atomically)\n"
    "  --in-place            save the drawing over DRAWING after the commands\n"
    "  --load FILE.lsp       load a LISP file into the document (repeatable, in order)\n"
    "  --eval EXPR           evaluate a LISP expression in the document (repeatable,\n"
    "                        after the --load files)\n"
    "  --answer NAME=VALUE   a scripted answer to a question, picker or file dialog\n"
    "                        (repeatable); e.g. template=lists/bornes.grt,\n"
    "                        question:89=yes, strips=X1,X2, prompt:Client=ACME.\n"
    "                        A question without an answer gets what a cancelling user\n"
    "                        would give, and a line on stderr names the missing answer\n"
    "  --undo                keep an undo journal: each command is one step that the\n"
    "                        commands UNDO [N] and REDO take back and put back\n"
    "  --quiet               no progress bar\n"
    "  --progress-log        write every progress step as a line on stderr\n"
    "  --module FILE         load this module instead of the ZVListas module beside zvhost\n"
    "  --no-module           load no module\n"
    "  --commands            list the commands of the document and exit\n"
    "  -h, --help            this text\n"
    "\n"
    "exit status: 0 on success; 1 when the drawing can't be read or saved (nothing is\n"
    "overwritten), a module or LISP file fails, or memory runs out; 2 for a usage error or\n"
    "an unknown command; 3 when a command fails; 4 when a command is cancelled (a question\n"
    "without an answer, Ctrl+C). After a status other than 0 the drawing is not saved.\n";

struct Options {
    QString drawing;
    QStringList commands;
    QString output;
    bool inPlace = false;
    QStringList loads;
    QStringList evals;
    QStringList answers;
    bool quiet = false;
    bool undo = false;
    bool progressLog = false;
    QString module;
    bool noModule = false;
    bool listCommands = false;
};

void printHelp(QTextStream& out) {
    out << kUsage << "\nsubcommands:\n";
    for (const Subcommand& sub : kSubcommands)
        out << "  zvhost " << sub.synopsis << "\n";
}

// Parses the options; an empty text on success, else what is wrong.
QString parseOptions(const QStringList& args, Options& options) {
    for (int i = 0; i < args.size(); ++i) {
        const QString& arg = args[i];
        auto value = [&](QString& into) {
            if (i + 1 >= args.size()) return false;
            into = args[++i];
            return true;
        };
        QString text;
        if (arg == "-o" || arg == "--output") {
            if (!value(options.output)) return arg + " needs a file";
        } else if (arg == "--in-place") {
            options.inPlace = true;
        } else if (arg == "--load") {
            if (!value(text)) return "--load needs a file";
            options.loads << text;
        } else if (arg == "--eval") {
            if (!value(text)) return "--eval needs an expression";
            options.evals << text;
        } else if (arg == "--answer") {
            if (!value(text) || text.indexOf('=') <= 0) return "--answer needs NAME=VALUE";
            options.answers << text;
        } else if (arg == "--undo") {
            options.undo = true;
        } else if (arg == "--quiet") {
            options.quiet = true;
        } else if (arg == "--progress-log") {
            options.progressLog = true;
        } else if (arg == "--module") {
            if (!value(options.module)) return "--module needs a file";
        } else if (arg == "--no-module") {
            options.noModule = true;
        } else if (arg == "--commands") {
            options.listCommands = true;
        } else if (arg.startsWith('-') && arg.size() > 1) {
            return "unknown option " + arg;
        } else if (options.drawing.isEmpty()) {
            options.drawing = arg;
        } else {
            options.commands << arg;
        }
    }
    if (options.drawing.isEmpty()) return "no drawing given";
    if (options.inPlace && !options.output.isEmpty()) return "-o and --in-place exclude each other";
    return {};
}

// Evaluates the --load files and --eval expressions; false when one fails.
bool runLisp(HostDocument& document, const Options& options, QTextStream& err) {
    if (options.loads.isEmpty() && options.evals.isEmpty()) return true;
    zvsdk::LispInterface* lisp = document.lisp();
    if (!lisp) {
        err << "zvhost: LISP is not available in this build\n";
        return false;
    }
    try {
        for (const QString& file : options.loads) {
            QString quoted = QFileInfo(file).absoluteFilePath();
            quoted.replace('\\', "\\\\").replace('"', "\\\"");
            if (!lisp->lispEvaluate("(load \"" + quoted + "\")")) {
                err << "zvhost: " << file << ": could not be loaded\n";
                return false;
            }
        }
        for (const QString& expression : options.evals) {
            if (!lisp->lispEvaluate(expression)) return false;
        }
    } catch (const std::bad_alloc&) {
        err << "zvhost: out of memory while evaluating LISP; the drawing is not saved\n";
        return false;
    }
    return !interruptRequested();
}

// The exit status after a command and, when it is not 0, a line that says why.
int commandStatus(const QString& command, zvsdk::CommandResult result, QTextStream& err) {
    switch (result) {
        case zvsdk::CommandResult::Succeeded:
            return kExitOk;
        case zvsdk::CommandResult::Failed:
            err << "zvhost: " << command << " failed; the drawing is not saved\n";
            return kExitCommandFailed;
        case zvsdk::CommandResult::Cancelled:
            err << "zvhost: " << command << " was cancelled; the drawing is not saved\n";
            return kExitCommandCancelled;
        case zvsdk::CommandResult::OutOfMemory:
            err << "zvhost: " << command << " ran out of memory; the drawing is not saved\n";
            return kExitFailure;
    }
    return kExitFailure;
}

int runDrawing(const Options& options, QTextStream& out, QTextStream& err) {
    restartWithHugePages(options.drawing);
    keepFreedHeapBlocks();
    shareOneHeap();
    const bool terminal = !options.quiet && isatty(STDOUT_FILENO);
    auto ui = std::make_unique<ConsoleUserInterface>(out, err, terminal);
    for (const QString& answer : options.answers)
        ui->addAnswer(answer);
    ui->setProgressLog(options.progressLog);
    Application app(std::move(ui), out);

    // No DWG writer: refused before any command runs, so the file stays as it is.
    const QString target = options.inPlace ? options.drawing : options.output;
    if (!target.isEmpty() && isDwgDrawing(target)) {
        err << "zvhost: " << dwgWriteRefusal(target) << "\n";
        return kExitFailure;
    }
    std::unique_ptr<zvdb::Database> database;
    if (QFileInfo(options.drawing).isDir()) {
        err << "zvhost: " << options.drawing << ": is a directory, not a drawing\n";
        return kExitFailure;
    }
    if (QFileInfo::exists(options.drawing)) {
        QString error;
        database = readDrawing(options.drawing, &error);
        if (!database) {
            err << "zvhost: " << error << "\n";
            return kExitFailure;
        }
    }
    HostDocument* document =
        app.openDocument(QFileInfo(options.drawing).absoluteFilePath(), std::move(database));
    document->setUndoEnabled(options.undo);

    if (!options.noModule) {
        const QString module =
            options.module.isEmpty() ? app.executableFolder() + "/libzvlistas.so" : options.module;
        QString error;
        if (!app.loadModule(module, &error)) {
            err << "zvhost: cannot load module: " << error << "\n";
            return kExitFailure;
        }
    }
    if (options.listCommands) {
        for (const QString& name : document->commandNames())
            out << name << "\n";
        return kExitOk;
    }
    if (auto* lisp = dynamic_cast<DocumentLisp*>(document->lisp()))
        catchInterrupts(&lisp->interpreter());
    if (!runLisp(*document, options, err)) {
        if (!interruptRequested()) return kExitFailure;
        err << "zvhost: interrupted; the drawing is not saved\n";
        return kExitCommandCancelled;
    }
    for (const QString& command : options.commands) {
        zvsdk::CommandResult result = zvsdk::CommandResult::Succeeded;
        if (!document->execute(command, &result)) {
            err << "zvhost: unknown command: " << command << "\n";
            return kExitUsage;
        }
        if (const int status = commandStatus(command, result, err)) return status;
    }
    if (target.isEmpty()) return kExitOk;
    QString error;
    if (!writeDrawing(*document->database(), target, &error)) {
        err << "zvhost: " << error << "\n";
        return kExitFailure;
    }
    return kExitOk;
}

}  // namespace

int runHost(const QStringList& args, QTextStream& out, QTextStream& err, QTextStream& in) {
    if (args.isEmpty()) {
        err << kUsage;
        return kExitUsage;
    }
    if (args.contains("-h") || args.contains("--help")) {
        printHelp(out);
        return kExitOk;
    }
    for (const Subcommand& sub : kSubcommands) {
        if (args.first() == QLatin1String(sub.name)) {
            CliContext context{args.mid(1), out, err, in};
            return sub.run(context);
        }
    }
    Options options;
    const QString problem = parseOptions(args, options);
    if (!problem.isEmpty()) {
        err << "zvhost: " << problem << "\n" << kUsage;
        return kExitUsage;
    }
    return runDrawing(options, out, err);
}

}  // namespace zvhost
