// zvdesk: the desktop host. The same documents, module and drawing files as zvhost, with
// windows for what zvhost answers from a script.
#include "CommandLineDevice.h"
#include "DeskTexts.h"
#include "DeskUserInterface.h"
#include "MainWindow.h"
#include "PageBrowser.h"
#include "PageView.h"

#include "app/Application.h"

#include <QApplication>
#include <QFileInfo>
#include <QMessageBox>
#include <QTextStream>

#include <csignal>
#include <cstdio>

namespace {

const char* const kUsage =
    "usage: zvdesk [options] [DRAWING]\n"
    "\n"
    "The desktop host of ZVListas: opens DRAWING (a DXF project drawing) with its pages,\n"
    "the module's commands in the Commands menu and a LISP console.\n"
    "\n"
    "options:\n"
    "  --load FILE.lsp       load a LISP file into every drawing opened (repeatable)\n"
    "  --module FILE         load this module instead of the ZVListas module beside zvdesk\n"
    "  --no-module           load no module\n"
    "  --page PAGE           show this page first (a page layer, e.g. COMANDO$0001$A)\n"
    "  --screenshot FILE.png open DRAWING, show its first page (or --page) fitted, write a\n"
    "                        picture of the main window and exit (works without a display)\n"
    "  -h, --help            this text\n"
    "\n"
    "exit status: 0; 1 when the drawing, the module or the screenshot fails; 2 for a usage\n"
    "error.\n";

struct Options {
    QString drawing;
    QStringList loads;
    QString module;
    bool noModule = false;
    QString screenshot;
    QString page;
};

// Empty when the arguments are good, else what is wrong.
QString parse(const QStringList& args, Options& options) {
    for (int i = 0; i < args.size(); ++i) {
        const QString& arg = args[i];
        auto value = [&](QString& into) {
            if (i + 1 >= args.size()) return false;
            into = args[++i];
            return true;
        };
        QString text;
        if (arg == "--load") {
            if (!value(text)) return "--load needs a file";
            options.loads << text;
        } else if (arg == "--module") {
            if (!value(options.module)) return "--module needs a file";
        } else if (arg == "--no-module") {
            options.noModule = true;
        } else if (arg == "--page") {
            if (!value(options.page)) return "--page needs a page";
        } else if (arg == "--screenshot") {
            if (!value(options.screenshot)) return "--screenshot needs a file";
        } else if (arg.startsWith('-') && arg.size() > 1) {
            return "unknown option " + arg;
        } else if (options.drawing.isEmpty()) {
            options.drawing = arg;
        } else {
            return "one drawing at a time";
        }
    }
    return {};
}

bool hasDisplay() {
    return !qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM") ||
           !qEnvironmentVariableIsEmpty("DISPLAY") ||
           !qEnvironmentVariableIsEmpty("WAYLAND_DISPLAY");
}

}  // namespace

int main(int argc, char** argv) {
    // A file-size limit makes a save fail with a message instead of ending the program.
    std::signal(SIGXFSZ, SIG_IGN);
    QStringList args;
    for (int i = 1; i < argc; ++i)
        args << QString::fromLocal8Bit(argv[i]);
    if (args.contains("-h") || args.contains("--help")) {
        std::fputs(kUsage, stdout);
        return 0;
    }
    Options options;
    const QString problem = parse(args, options);
    if (!problem.isEmpty()) {
        std::fprintf(stderr, "zvdesk: %s\n%s", qPrintable(problem), kUsage);
        return 2;
    }
    const bool screenshot = !options.screenshot.isEmpty();
    if (!hasDisplay()) {
        // A picture needs no screen; a window does.
        if (!screenshot) {
            std::fputs(
                "zvdesk: no display (DISPLAY is not set); run it in a desktop session or "
                "under xvfb-run\n",
                stderr);
            return 1;
        }
        qputenv("QT_QPA_PLATFORM", "offscreen");
    }
    static QtMessageHandler previous = nullptr;
    previous = qInstallMessageHandler(
        [](QtMsgType type, const QMessageLogContext& context, const QString& message) {
            // Platform notes that say nothing to a user.
            if (message.startsWith(QLatin1String("QStandardPaths: XDG_RUNTIME_DIR not set")) ||
                message.contains(QLatin1String("does not support propagateSizeHints")))
                return;
            if (previous) previous(type, context, message);
        });
    QApplication app(argc, argv);
    QApplication::setApplicationName("zvdesk");
    zvdesk::DeskTexts::setLanguage(zvdesk::DeskTexts::settingsLanguage());

    zvdesk::CommandLineDevice commandLine;
    QTextStream out(&commandLine);
    out.setCodec("UTF-8");
    auto ui = std::make_unique<zvdesk::DeskUserInterface>();
    zvdesk::DeskUserInterface& desk = *ui;
    zvhost::Application host(std::move(ui), out);
    zvdesk::MainWindow window(host, desk);
    window.setLoadFiles(options.loads);
    commandLine.setListener([&window](const QString& text) { window.print(text); });
    // What the module says while it unloads comes after the window has gone.
    struct Unlisten {
        zvdesk::CommandLineDevice& device;
        ~Unlisten() { device.setListener({}); }
    } unlisten{commandLine};
    auto fail = [&](const QString& text) {
        if (screenshot)
            std::fprintf(stderr, "zvdesk: %s\n", qPrintable(text));
        else
            desk.messageBox(text, "zvdesk");
    };

    // The module first: it hears of every document opened after it.
    if (!options.noModule) {
        const QString module =
            options.module.isEmpty() ? host.executableFolder() + "/libzvlistas.so" : options.module;
        QString error;
        if (!host.loadModule(module, &error)) {
            fail(zvdesk::words(zvdesk::Text::NoModule).arg(error));
            if (screenshot) return 1;
        }
    }
    window.show();
    bool opened = false;
    if (!options.drawing.isEmpty()) {
        QString error;
        opened = window.openDrawing(options.drawing, &error, screenshot);
        if (!opened && screenshot) {
            fail(error);
            return 1;
        }
    }
    if (!opened) window.newDrawing();
    if (!options.page.isEmpty() && !window.showPage(options.page)) {
        fail("no such page: " + options.page);
        if (screenshot) return 1;
    }
    if (!screenshot) return QApplication::exec();

    const QString first = window.pageBrowser()->firstPage();
    if (options.page.isEmpty() && !first.isEmpty()) window.showPage(first);
    QApplication::processEvents();
    window.pageView()->fit();
    if (!window.screenshot(options.screenshot)) {
        std::fprintf(stderr, "zvdesk: %s: the picture could not be written\n",
                     qPrintable(options.screenshot));
        return 1;
    }
    return 0;
}
