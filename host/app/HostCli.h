#pragma once
// The zvhost program: its options, its subcommands and the run of a drawing's commands.
#include <QStringList>
#include <QTextStream>

namespace zvhost {

// Exit statuses of zvhost.
enum ExitStatus { kExitOk = 0, kExitFailure = 1, kExitUsage = 2 };

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

}  // namespace zvhost
