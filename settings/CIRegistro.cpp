#include "CIRegistro.h"

#include "readers/ZVString.h"

#include <QDir>
#include <QDomDocument>
#include <QFile>
#include <QSaveFile>
#include <QStandardPaths>

#include <mutex>

namespace {

// One lock around every read and write of the file, made on first use.
std::mutex& Trava() {
    static std::mutex trava;
    return trava;
}

const char* const kArquivo = "FV/FVREG2022SP0.xml";

// The whole file, parsed; `ilegivel` tells a file that holds something but doesn't parse.
QDomDocument Carrega(bool* ilegivel = nullptr) {
    QDomDocument documento;
    QFile arquivo(CIRegistro::ArquivoRegistro());
    bool falhou = false;
    if (arquivo.open(QIODevice::ReadOnly))
        falhou = !documento.setContent(&arquivo) && arquivo.size() > 0;
    else
        falhou = arquivo.exists();
    if (ilegivel) *ilegivel = falhou;
    return documento;
}

QDomElement Registro(const QDomDocument& documento, const QString& chave) {
    for (QDomElement e = documento.documentElement().firstChildElement("registro"); !e.isNull();
         e = e.nextSiblingElement("registro"))
        if (e.attribute("key") == chave) return e;
    return {};
}

// The password is kept as the hex of its UTF-16 code units, each mixed with a key.
const char16_t kChaveSenha[] = u"ZVListas";

QString Transforma(QString texto) {
    for (int i = 0; i < texto.size(); ++i)
        texto[i] = QChar(char16_t(texto[i].unicode() ^ kChaveSenha[i % 8]));
    return texto;
}

}  // namespace

QString CIRegistro::PastaDadosComuns() {
    const QString variavel = qEnvironmentVariable("ZV_DATA_DIR");
    if (!variavel.isEmpty()) return variavel;
    // The first of the system's data folders ($XDG_DATA_DIRS, /usr/local/share by default).
    const QStringList pastas =
        QStandardPaths::standardLocations(QStandardPaths::GenericDataLocation);
    const QString pessoal = QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation);
    for (const QString& pasta : pastas)
        if (pasta != pessoal) return pasta;
    return QStringLiteral("/usr/local/share");
}

QString CIRegistro::ArquivoRegistro() {
    QString pasta = PastaDadosComuns();
    if (!pasta.endsWith('/') && !pasta.endsWith('\\')) pasta += '/';
    return pasta + kArquivo;
}

QString CIRegistro::PastaTemporaria() {
    const QString pasta = QDir::tempPath();
    return QDir(pasta).exists() ? pasta : QString();
}

QString CIRegistro::LerRegistro(const QString& chave) {
    std::lock_guard<std::mutex> guarda(Trava());
    const QDomElement e = Registro(Carrega(), chave);
    return e.isNull() ? QString() : e.attribute("value");
}

void CIRegistro::GravarRegistro(const QString& chave, const QString& valor) {
    std::lock_guard<std::mutex> guarda(Trava());
    bool ilegivel = false;
    QDomDocument documento = Carrega(&ilegivel);
    // The other modules' keys live in the same file: one we can't read is never replaced.
    if (ilegivel) return;
    if (documento.documentElement().isNull())
        documento.appendChild(documento.createElement("registros"));
    // The parse drops the declaration; the file keeps saying that it is UTF-8.
    if (!documento.firstChild().isProcessingInstruction())
        documento.insertBefore(
            documento.createProcessingInstruction("xml", "version=\"1.0\" encoding=\"UTF-8\""),
            documento.firstChild());
    QDomElement e = Registro(documento, chave);
    if (e.isNull()) {
        e = documento.createElement("registro");
        e.setAttribute("key", chave);
        documento.documentElement().appendChild(e);
    }
    e.setAttribute("value", valor);
    const QString caminho = ArquivoRegistro();
    QDir().mkpath(QFileInfo(caminho).absolutePath());
    QSaveFile arquivo(caminho);
    if (!arquivo.open(QIODevice::WriteOnly)) return;
    arquivo.write(documento.toByteArray(2));
    arquivo.commit();  // a failed save is not reported
}

QString CIRegistro::DBPass() {
    const QByteArray bytes = QByteArray::fromHex(LerRegistro("DBPass").toLatin1());
    QString texto(bytes.size() / 2, QChar());
    for (int i = 0; i < texto.size(); ++i)
        texto[i] = QChar(char16_t((uchar(bytes[2 * i]) << 8) | uchar(bytes[2 * i + 1])));
    return Transforma(texto);
}

void CIRegistro::SetDBPass(const QString& senha) {
    QByteArray bytes;
    for (QChar c : Transforma(senha))
        bytes.append(char(c.unicode() >> 8)).append(char(c.unicode()));
    GravarRegistro("DBPass", QString::fromLatin1(bytes.toHex()));
}

int CIRegistro::IdiomaMenuSel() {
    // Like _wtoi: the leading decimal number, 0 when there is none.
    return ZVString(LerRegistro("IdiomaMenuSel")).ParaInteiro();
}

void CIRegistro::SetIdiomaMenuSel(int idioma) {
    GravarRegistro("IdiomaMenuSel", QString::number(idioma));
}
