#include "DwgImport.h"

#include "DwgRepair.h"
#include "DxfError.h"
#include "DxfLoader.h"

#include <QByteArray>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>
#include <QStandardPaths>
#include <QTemporaryDir>

#include <array>
#include <utility>

namespace zvdb {

namespace {

// The version marks the converter reads, R13 on.
constexpr std::array<std::pair<std::string_view, std::string_view>, 8> kReadable{{
    {"AC1012", "R13"},
    {"AC1014", "R14"},
    {"AC1015", "2000"},
    {"AC1018", "2004"},
    {"AC1021", "2007"},
    {"AC1024", "2010"},
    {"AC1027", "2013"},
    {"AC1032", "2018"},
}};

constexpr int kDefaultTimeoutSeconds = 120;
constexpr const char* kPackage = "@mlightcad/libredwg-web 0.7.14";

std::string environment(const char* name) {
    return qEnvironmentVariable(name).toStdString();
}

std::string notInstalled(const QString& folder) {
    return "the DWG converter is not installed" +
           (folder.isEmpty() ? std::string() : " in " + folder.toStdString()) +
           ": run `./zv deps`, which installs the npm package " + kPackage +
           " into build/bin/dwg with npm ci (or set ZV_DWG_CONVERTER to the folder that holds "
           "dwg2dxf.mjs and its node_modules)";
}

std::string noNode(const std::string& why) {
    return "reading a DWG drawing needs Node.js 20 or later, which " + why +
           ": install it (apt-get install nodejs) or name the program in ZV_NODE";
}

QByteArray readAll(const QString& path) {
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) return {};
    return file.readAll();
}

}  // namespace

bool DwgImport::looksLikeDwg(std::string_view head) {
    // R13 on: "AC10" and two digits; older releases: "AC1.", "AC2.", "MC0.".
    if (head.size() >= 6 && head.substr(0, 4) == "AC10") {
        return head[4] >= '0' && head[4] <= '9' && head[5] >= '0' && head[5] <= '9';
    }
    return head.size() >= 4 && (head.substr(0, 4) == "AC1." || head.substr(0, 4) == "AC2." ||
                                head.substr(0, 4) == "MC0.");
}

bool DwgImport::isDwgFile(const std::string& path) {
    if (QString::fromStdString(path).endsWith(".dwg", Qt::CaseInsensitive)) return true;
    QFile file(QString::fromStdString(path));
    if (!file.open(QIODevice::ReadOnly)) return false;
    const QByteArray head = file.read(6);
    return looksLikeDwg(std::string_view(head.constData(), static_cast<std::size_t>(head.size())));
}

std::string_view DwgImport::releaseOf(std::string_view versionMark) {
    for (const auto& [mark, release] : kReadable)
        if (mark == versionMark) return release;
    return {};
}

std::unique_ptr<Database> DwgImport::loadFile(const std::string& path, const Setup& setup) {
    const QString file = QString::fromStdString(path);
    QFile input(file);
    if (!input.open(QIODevice::ReadOnly))
        throw DxfError("cannot be opened: " + input.errorString().toStdString());
    const QByteArray headBytes = input.read(6);
    input.close();
    const std::string_view head(headBytes.constData(), static_cast<std::size_t>(headBytes.size()));
    if (!looksLikeDwg(head))
        throw DxfError("not a DWG drawing: it does not begin with a DWG version mark");
    if (releaseOf(head).empty()) {
        if (head.substr(0, 4) == "AC10" && head.substr(0, 6) > "AC1032")
            throw DxfError("a DWG drawing of a version newer than 2018 (" + std::string(head) +
                           "), which can't be read: save it as DXF or as DWG 2018 or older");
        throw DxfError("a DWG drawing older than R13 (" + std::string(head.substr(0, 6)) +
                       "), which can't be read: save it as DXF or as a newer DWG");
    }

    const QString folder = QString::fromStdString(
        setup.converterDir.empty() ? environment("ZV_DWG_CONVERTER") : setup.converterDir);
    const QString script = QDir(folder).filePath("dwg2dxf.mjs");
    if (folder.isEmpty() || !QFileInfo::exists(script) ||
        !QFileInfo::exists(
            QDir(folder).filePath("node_modules/@mlightcad/libredwg-web/package.json")))
        throw DxfError(notInstalled(folder));

    QString node = QString::fromStdString(setup.node.empty() ? environment("ZV_NODE") : setup.node);
    if (node.isEmpty()) {
        node = QStandardPaths::findExecutable("node");
        if (node.isEmpty()) throw DxfError(noNode("was not found on the PATH"));
    } else if (!QFileInfo(node).isExecutable()) {
        throw DxfError(noNode("was not found at " + node.toStdString()));
    }

    int timeout = setup.timeoutSeconds;
    if (timeout <= 0) timeout = qEnvironmentVariableIntValue("ZV_DWG_TIMEOUT");
    if (timeout <= 0) timeout = kDefaultTimeoutSeconds;

    QTemporaryDir work;
    if (!work.isValid())
        throw DxfError("no temporary folder for the DWG conversion: " +
                       work.errorString().toStdString());
    QProcess converter;
    converter.setStandardOutputFile(QProcess::nullDevice());
    converter.setStandardInputFile(QProcess::nullDevice());
    // Liftoff alone starts the converter's WebAssembly in a fraction of the time and memory,
    // with the same output.
    converter.start(
        node, {"--liftoff-only", script, folder, QFileInfo(file).absoluteFilePath(), work.path()});
    if (!converter.waitForStarted(30000))
        throw DxfError(
            noNode("could not be started (" + converter.errorString().toStdString() + ")"));
    if (!converter.waitForFinished(timeout * 1000)) {
        converter.kill();
        converter.waitForFinished(5000);
        throw DxfError("the DWG converter took more than " + std::to_string(timeout) +
                       " s and was stopped; the drawing may be damaged (ZV_DWG_TIMEOUT sets "
                       "the limit in seconds)");
    }
    // The converter's own message is its last line; the package logs before it.
    const QStringList lines =
        QString::fromUtf8(converter.readAllStandardError()).trimmed().split('\n');
    const std::string said = lines.last().trimmed().toStdString();
    if (converter.exitStatus() != QProcess::NormalExit)
        throw DxfError("the DWG converter stopped while reading it; the drawing may be damaged" +
                       (said.empty() ? std::string() : " (" + said + ")"));
    switch (converter.exitCode()) {
        case 0:
            break;
        case 3:
            throw DxfError("the DWG converter could not read it; the drawing may be damaged" +
                           (said.empty() ? std::string() : " (" + said + ")"));
        case 4:
            throw DxfError(notInstalled(folder));
        default:
            throw DxfError("the DWG converter failed with status " +
                           std::to_string(converter.exitCode()) +
                           (said.empty() ? std::string() : ": " + said));
    }

    const QByteArray dxf = readAll(work.filePath("drawing.dxf"));
    const QByteArray facts = readAll(work.filePath("facts.json"));
    if (dxf.isEmpty() || facts.isEmpty())
        throw DxfError("the DWG converter wrote no drawing; the drawing may be damaged");
    DwgRepair repair(std::string_view(facts.constData(), static_cast<std::size_t>(facts.size())));
    std::unique_ptr<Database> database;
    try {
        database = DxfLoader::load(repair.repairText(
            std::string_view(dxf.constData(), static_cast<std::size_t>(dxf.size()))));
    } catch (const DxfError& e) {
        throw DxfError(std::string("the DWG converter's drawing can't be read: ") + e.what());
    }
    repair.repairDrawing(*database);
    return database;
}

}  // namespace zvdb
