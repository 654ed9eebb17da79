#include "DrawingFiles.h"
#include "HostCli.h"
#include "drawing/Database.h"
#include "sample/ProductDataWriter.h"
#include "sample/ProjectGenerator.h"

#include <QElapsedTimer>
#include <QFileInfo>

namespace zvhost {

namespace {

const char* const kGenerateUsage =
    "usage: zvhost generate --out FILE.dxf [--seed N] [--terminals N] [--pages N]\n"
    "                       [--numbers strip|project] [--data DIR]\n"
    "       zvhost generate --blocks DIR\n";

struct GenerateOptions {
    QString out, data, blocks;
    zvsample::GeneratorOptions generator;
};

// A whole number of at least `least`; false when the text is none.
bool number(const QString& text, long long least, long long& into) {
    bool ok = false;
    into = text.toLongLong(&ok);
    return ok && into >= least;
}

QString parse(const QStringList& args, GenerateOptions& options) {
    for (int i = 0; i < args.size(); ++i) {
        const QString& arg = args[i];
        if (i + 1 >= args.size()) return arg + " needs a value";
        const QString value = args[++i];
        long long n = 0;
        if (arg == "--out") {
            options.out = value;
        } else if (arg == "--data") {
            options.data = value;
        } else if (arg == "--blocks") {
            options.blocks = value;
        } else if (arg == "--seed") {
            bool ok = false;
            options.generator.seed = value.toULongLong(&ok);
            if (!ok) return "--seed needs a whole number";
        } else if (arg == "--terminals") {
            if (!number(value, 0, n) || n > 10'000'000) return "--terminals needs 0 to 10000000";
            options.generator.terminals = static_cast<int>(n);
        } else if (arg == "--pages") {
            if (!number(value, 1, n) || n > 1'000'000) return "--pages needs 1 to 1000000";
            options.generator.pages = static_cast<int>(n);
        } else if (arg == "--numbers") {
            if (value != "strip" && value != "project") return "--numbers needs strip or project";
            options.generator.projectNumbers = value == "project";
        } else {
            return "unknown option " + arg;
        }
    }
    if (options.out.isEmpty() && options.blocks.isEmpty()) return "--out or --blocks is needed";
    return {};
}

bool writeBlocks(CliContext& context, const QString& root) {
    try {
        const auto files = zvsample::ProductDataWriter(root.toStdString()).writeAll();
        context.out << "block files: " << files.size() << " under " << root << "\n";
        return true;
    } catch (const std::exception& error) {
        context.err << "zvhost: " << error.what() << "\n";
        return false;
    }
}

void printCounts(QTextStream& out, const zvsample::GeneratedCounts& c) {
    out << "pages: " << c.pages << "\n"
        << "terminals: " << c.terminals << " (virtual " << c.virtualTerminals << ", BOR- "
        << c.borTerminals << ")\n"
        << "wires: " << c.wires << " (" << c.wirePolylines << " polylines)\n"
        << "cables: " << c.cables << " (" << c.leads << " leads, " << c.blindConnections
        << " blind connections)\n"
        << "masters: " << c.masters << ", contacts: " << c.contacts << ", routes: " << c.routes
        << "\n";
}

}  // namespace

// zvhost generate: a sample project, and the product data's block drawings.
int runGenerateSubcommand(CliContext& context) {
    GenerateOptions options;
    const QString problem = parse(context.args, options);
    if (!problem.isEmpty()) {
        context.err << "zvhost generate: " << problem << "\n" << kGenerateUsage;
        return kExitUsage;
    }
    if (!options.blocks.isEmpty() && !writeBlocks(context, options.blocks)) return kExitFailure;
    if (!options.data.isEmpty() && !writeBlocks(context, options.data)) return kExitFailure;
    if (options.out.isEmpty()) return kExitOk;
    QElapsedTimer timer;
    timer.start();
    zvsample::ProjectGenerator generator(options.generator);
    const auto database = generator.generate();
    QString error;
    if (!writeDrawing(*database, options.out, &error)) {
        context.err << "zvhost: " << error << "\n";
        return kExitFailure;
    }
    context.out << "wrote " << options.out << " (" << QFileInfo(options.out).size() << " bytes, "
                << QString::number(timer.elapsed() / 1000.0, 'f', 2) << " s)\n";
    printCounts(context.out, generator.counts());
    return kExitOk;
}

}  // namespace zvhost
