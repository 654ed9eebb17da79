#pragma once
// The zvhost program: its options, its subcommands and the run of a drawing's commands.
#include <QStringList>
#include <QTextStream>

namespace zvhost {

// Exit statuses of zvhost (the README's table).
enum ExitStatus {
    kExitOk = 0,
    kExitFailure = 1,          // a file can't be read or saved, a module or LISP file failed,
                               // memory ran out
    kExitUsage = 2,            // bad options, an unknown command
    kExitCommandFailed = 3,    // a command reported an error
    kExitCommandCancelled = 4  // a command was cancelled: a question unanswered, Ctrl+C
};

// What a subcommand gets: its own arguments (without its name) and the streams.
struct CliContext {
    QStringList args;
    QTextStream& out;
    QTextStream& err;
    QTextStream& in;
};

struct Subcommand {
    const char* name;
    const char* synopsis;  // one line for --help
    int (*run)(CliContext& context);
};

// Runs zvhost with its arguments (without the program name); returns the exit status.
int runHost(const QStringList& args, QTextStream& out, QTextStream& err, QTextStream& in);

// Subcommands; each lives in a file of its own and is listed in HostCli.cpp.
int runLispSubcommand(CliContext& context);
int runDxfInfoSubcommand(CliContext& context);
int runCatalogueSubcommand(CliContext& context);
int runGenerateSubcommand(CliContext& context);
int runPlotSubcommand(CliContext& context);

}  // namespace zvhost
