#include "UserConfig.h"

#include "lisp/Interpreter.h"

#include <QDir>
#include <QFileInfo>

namespace zvproduct {

QString UserConfig::file() {
    const QString folder = qEnvironmentVariable("ZV_DATA_DIR");
    if (folder.isEmpty()) return {};
    for (const char* name : {"zvconfig.lsp", "config/zvconfig.lsp"}) {
        const QString path = QDir(folder).filePath(name);
        if (QFileInfo(path).isFile()) return path;
    }
    return {};
}

bool UserConfig::load(zvlisp::Interpreter& lisp, const QString& path) {
    QString message;
    lisp.catching([&] { return lisp.load(path); }, &message);
    if (message.isEmpty()) return true;
    lisp.write("\n; error: " + message + "\n; in the user configuration " + path + "\n");
    return false;
}

}  // namespace zvproduct
