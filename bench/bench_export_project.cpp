// exportacaoBornes through zvhost on the generated bench project (20,000 terminals, or the
// size given), to CSV and to XLSX, beside bench/exporta_bornes_ezdxf.py doing the same job
// with ezdxf (read the terminals and their attributes, write the same columns as CSV).
// Prints the times, the ratios and PASS or FAIL against the goals: the CSV export at least
// 50 times faster than the ezdxf script, the XLSX export within twice the CSV export.
// Each time is the whole process, opening the drawing included; the best of three runs.
#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QProcess>
#include <QTemporaryDir>

#include <algorithm>
#include <cstdio>

namespace {

// Seconds of the best of `vezes` runs; negative when a run fails.
double Mede(const QString& programa, const QStringList& args, const QProcessEnvironment& env,
            const QString& pasta, int vezes = 3) {
    double melhor = -1;
    for (int i = 0; i < vezes; ++i) {
        QProcess p;
        p.setProcessEnvironment(env);
        p.setWorkingDirectory(pasta);
        QElapsedTimer relogio;
        relogio.start();
        p.start(programa, args);
        if (!p.waitForFinished(3600000) || p.exitStatus() != QProcess::NormalExit ||
            p.exitCode() != 0) {
            std::fprintf(stderr, "%s %s failed:\n%s\n", qPrintable(programa),
                         qPrintable(args.join(' ')), p.readAllStandardError().constData());
            return -1;
        }
        const double s = double(relogio.nsecsElapsed()) / 1e9;
        melhor = melhor < 0 ? s : std::min(melhor, s);
    }
    return melhor;
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    const QString tamanho = app.arguments().value(1, "20000");
    QTemporaryDir pasta;
    const QString dados = pasta.filePath("data"), produto = pasta.filePath("product") + "/";
    QDir().mkpath(dados);
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert("ZV_DATA_DIR", dados);
    env.insert("ZV_PRODUCT_DIR", produto);
    const QString fonte = ZV_SOURCE_DIR;
    for (const char* sub : {"templates", "config"}) {
        QDir().mkpath(produto + sub);
        for (const QString& f : QDir(fonte + "/data/" + sub).entryList(QDir::Files))
            QFile::copy(fonte + "/data/" + sub + "/" + f, produto + sub + "/" + f);
    }
    const QString zvhost = QString(ZV_BIN_DIR) + "/zvhost";
    const QString catalogo = fonte + "/data/catalogue/";
    const QString projeto = pasta.filePath("p.dxf");
    if (Mede(zvhost,
             {"catalogue", "--build", dados + "/catalogo.db", catalogo + "catalogo-esquema.sql",
              catalogo + "catalogo-dados.sql"},
             env, pasta.path(), 1) < 0 ||
        Mede(zvhost,
             {"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + dados + "/",
              "DBName=catalogo.db", "libLang=1"},
             env, pasta.path(), 1) < 0 ||
        Mede(zvhost,
             {"generate", "--out", projeto, "--seed", "7", "--terminals", tamanho, "--numbers",
              "project", "--data", produto},
             env, pasta.path(), 1) < 0)
        return 1;
    auto exporta = [&](const QString& formato, const QString& arquivo) {
        return Mede(zvhost,
                    {"--quiet", "--load", produto + "config/zvconfig.lsp", "--answer",
                     "export:config=Completa", "--answer", "export:type=BORNES", "--answer",
                     "export:format=" + formato, "--answer", "export:file=" + arquivo, projeto,
                     "exportacaoBornes"},
                    env, pasta.path());
    };
    const double csv = exporta("CSV", pasta.filePath("bornes.csv"));
    const double xlsx = exporta("XLSX", pasta.filePath("bornes.xlsx"));
    const double base = Mede(zvhost, {"--quiet", projeto}, env, pasta.path());
    const double ezdxf =
        Mede("/usr/bin/python3",
             {fonte + "/bench/exporta_bornes_ezdxf.py", projeto, pasta.filePath("ezdxf.csv")}, env,
             pasta.path(), 1);
    if (csv < 0 || xlsx < 0 || base < 0) return 1;
    std::printf("exportacaoBornes, %s terminals: CSV %.3f s, XLSX %.3f s, opening alone %.3f s\n",
                qPrintable(tamanho), csv, xlsx, base);
    bool passa = xlsx <= 2 * csv;
    if (ezdxf < 0) {
        std::printf("ezdxf: not available (/usr/bin/python3 with python3-ezdxf)\n");
    } else {
        std::printf("ezdxf script: %.3f s; ratio ezdxf/CSV export %.1fx (goal at least 50x)\n",
                    ezdxf, ezdxf / csv);
        passa = passa && ezdxf >= 50 * csv;
    }
    std::printf("XLSX/CSV %.2f (goal at most 2)\n%s\n", xlsx / csv, passa ? "PASS" : "FAIL");
    return 0;
}
