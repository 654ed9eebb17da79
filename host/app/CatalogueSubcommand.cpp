// "zvhost catalogue ...": the module's catalogue tool, run with a console user interface so
// its message boxes and command-line messages reach stderr and stdout as in a drawing run.
#include "Application.h"
#include "ConsoleUserInterface.h"
#include "HostCli.h"

#include <QCoreApplication>

#include <dlfcn.h>

#include <vector>

namespace zvhost {

namespace {

using WriteFunction = void (*)(void* context, int channel, const char* utf8);
using CatalogueTool = int (*)(int argc, const char* const* argv, WriteFunction write,
                              void* context);

void writeTo(void* context, int channel, const char* utf8) {
    auto* cli = static_cast<CliContext*>(context);
    QTextStream& stream = channel == 2 ? cli->err : cli->out;
    stream << QString::fromUtf8(utf8);
    stream.flush();
}

}  // namespace

int runCatalogueSubcommand(CliContext& context) {
    const QString folder =
        QCoreApplication::instance() ? QCoreApplication::applicationDirPath() : QStringLiteral(".");
    const QString modulePath = folder + "/libzvlistas.so";
    Application app(std::make_unique<ConsoleUserInterface>(context.out, context.err, false),
                    context.out);
    app.openDocument(folder + "/catalogue.dxf");

    void* module =
        dlopen(modulePath.toLocal8Bit().constData(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
    if (!module) {
        context.err << "zvhost: cannot load module: " << dlerror() << "\n";
        return kExitFailure;
    }
    auto tool = reinterpret_cast<CatalogueTool>(dlsym(module, "zvCatalogueTool"));
    if (!tool) {
        context.err << "zvhost: the module " << modulePath << " has no catalogue tool\n";
        dlclose(module);
        return kExitFailure;
    }
    std::vector<QByteArray> bytes;
    for (const QString& arg : context.args)
        bytes.push_back(arg.toUtf8());
    std::vector<const char*> argv;
    for (const QByteArray& arg : bytes)
        argv.push_back(arg.constData());
    const int status = tool(int(argv.size()), argv.data(), writeTo, &context);
    context.out.flush();
    context.err.flush();
    dlclose(module);
    return status;
}

}  // namespace zvhost
