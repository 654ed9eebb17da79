#pragma once
// A temporary folder with what the list commands need, made as a user sets it up: the demo
// catalogue and the settings that name it (dados/), the product's templates and
// configuration (produto/), and a generated project (p.dxf).
#include "ZvhostRun.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

namespace zvtest {

class ProductFolder {
public:
    // Empty on success, else what went wrong.
    QString prepare(const QStringList& generate = {"--seed", "3", "--terminals", "60"}) {
        if (!folder_.isValid()) return "no temporary folder";
        QDir().mkpath(path("dados"));
        const QString catalogue = buildDemoCatalogue(path("dados"), environment());
        if (!catalogue.isEmpty()) return catalogue;
        for (const char* sub : {"templates", "config"}) {
            const QString from = QString(ZV_SOURCE_DIR) + "/data/" + sub + "/";
            QDir().mkpath(path("produto/") + sub);
            for (const QString& f : QDir(from).entryList(QDir::Files))
                QFile::copy(from + f, path("produto/") + sub + "/" + f);
        }
        const HostRun run =
            zvhost(QStringList{"generate", "--out", project(), "--data", path("produto") + "/"}
                   << generate);
        return run.status == 0 ? QString() : run.err;
    }

    QString path(const QString& name) const { return folder_.filePath(name); }
    QString project() const { return path("p.dxf"); }
    QProcessEnvironment environment() const {
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert("ZV_DATA_DIR", path("dados"));
        env.insert("ZV_PRODUCT_DIR", path("produto") + "/");
        return env;
    }
    HostRun zvhost(const QStringList& args, const Limits& limits = {}) const {
        return runZvhost(args, environment(), folder_.path(), 300000, limits);
    }
    // The arguments that run the terminal list with the user configuration loaded.
    QStringList terminalList(const QString& in, const QString& out) const {
        return {"--quiet",
                "--load",
                path("produto/config/zvconfig.lsp"),
                in,
                "-o",
                out,
                "gerarListaBornesGrf"};
    }

private:
    QTemporaryDir folder_;
};

}  // namespace zvtest
