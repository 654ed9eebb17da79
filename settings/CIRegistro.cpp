#include "CIRegistro.h"

#include "host/sdk/AtomicFile.h"

#include "readers/ZVString.h"

#include <QDir>
#include <QDomDocument>
#include <QFile>
#include <QFileInfo>
#include <QStandardPaths>

#include <mutex>

namespace {

// One lock around every read and write of the file, made on first use.
std::mutex& Trava() {
    static std::mutex trava;
    return trava;
}

const char* const kArquivo = "FV/FVREG2022SP0.xml";

// The file as read: its records, or why it can't be used.
struct Leitura {
    QDomDocument documento;
    QString problema;
};

Leitura Carrega() {
    Leitura leitura;
    const QString caminho = CIRegistro::ArquivoRegistro();
    const QFileInfo info(caminho);
    if (!info.exists()) return leitura;
    QFile arquivo(caminho);
    if (info.isDir() || !arquivo.open(QIODevice::ReadOnly)) {
        leitura.problema =
            "cannot read " + caminho + ": " +
            (info.isDir() ? QStringLiteral("it is a folder") : arquivo.errorString());
        return leitura;
    }
    const QByteArray conteudo = arquivo.readAll();
    if (arquivo.error() != QFileDevice::NoError) {
        leitura.problema = "cannot read " + caminho + ": " + arquivo.errorString();
        return leitura;
    }
    // An empty file holds nothing to keep.
    if (conteudo.isEmpty()) return leitura;
    QString mensagem;
    int linha = 0, coluna = 0;
    if (!leitura.documento.setContent(conteudo, &mensagem, &linha, &coluna)) {
        leitura.documento = QDomDocument();
        leitura.problema = QString("the settings file %1 does not parse (line %2, column %3: %4)")
                               .arg(caminho)
                               .arg(linha)
                               .arg(coluna)
                               .arg(mensagem);
    }
    return leitura;
}

QDomElement Registro(const QDomDocument& documento, const QString& chave) {
    for (QDomElement e = documento.documentElement().firstChildElement("registro"); !e.isNull();
         e = e.nextSiblingElement("registro"))
        if (e.attribute("key") == chave) return e;
    return {};
}

// Every record as key and value, in order.
QList<QPair<QString, QString>> Registros(const QDomDocument& documento) {
    QList<QPair<QString, QString>> registros;
    for (QDomElement e = documento.documentElement().firstChildElement("registro"); !e.isNull();
         e = e.nextSiblingElement("registro"))
        registros << qMakePair(e.attribute("key"), e.attribute("value"));
    return registros;
}

// Can an XML 1.0 file hold the text? Control characters but tab and line ends, unpaired
// surrogates and the two non-characters can't be written.
bool TextoXml(const QString& texto) {
    for (int i = 0; i < texto.size(); ++i) {
        const char16_t c = texto[i].unicode();
        if (c < 0x20 && c != 0x9 && c != 0xA && c != 0xD) return false;
        if (c == 0xFFFE || c == 0xFFFF) return false;
        if (QChar::isHighSurrogate(c)) {
            if (i + 1 >= texto.size() || !texto[i + 1].isLowSurrogate()) return false;
            ++i;
        } else if (QChar::isLowSurrogate(c)) {
            return false;
        }
    }
    return true;
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
    const QDomElement e = Registro(Carrega().documento, chave);
    return e.isNull() ? QString() : e.attribute("value");
}

bool CIRegistro::GravarRegistro(const QString& chave, const QString& valor, QString* erro) {
    return GravarRegistros({{chave, valor}}, erro);
}

QString CIRegistro::ProblemaArquivo() {
    std::lock_guard<std::mutex> guarda(Trava());
    return Carrega().problema;
}

bool CIRegistro::GravarRegistros(const QList<QPair<QString, QString>>& valores, QString* erro) {
    std::lock_guard<std::mutex> guarda(Trava());
    const QString caminho = ArquivoRegistro();
    auto falha = [&](const QString& motivo) {
        if (erro) *erro = motivo;
        return false;
    };
    Leitura leitura = Carrega();
    // The other modules' keys live in the same file: one we can't read is never replaced.
    if (!leitura.problema.isEmpty()) return falha(leitura.problema + "; nothing was saved");
    for (const auto& [chave, valor] : valores)
        if (chave.isEmpty() || !TextoXml(chave) || !TextoXml(valor))
            return falha("could not save " + caminho + ": the setting \"" + chave +
                         "\" holds a character that the file cannot hold");
    QDomDocument& documento = leitura.documento;
    if (documento.documentElement().isNull())
        documento.appendChild(documento.createElement("registros"));
    // The parse drops the declaration; the file keeps saying that it is UTF-8.
    if (!documento.firstChild().isProcessingInstruction())
        documento.insertBefore(
            documento.createProcessingInstruction("xml", "version=\"1.0\" encoding=\"UTF-8\""),
            documento.firstChild());
    for (const auto& [chave, valor] : valores) {
        QDomElement e = Registro(documento, chave);
        if (e.isNull()) {
            e = documento.createElement("registro");
            e.setAttribute("key", chave);
            documento.documentElement().appendChild(e);
        }
        e.setAttribute("value", valor);
    }
    const QByteArray conteudo = documento.toByteArray(2);
    // What is saved must read back as what it holds, or the next reader loses every key.
    QDomDocument relido;
    if (!relido.setContent(conteudo) || Registros(relido) != Registros(documento))
        return falha("could not save " + caminho + ": the new file would not read back");

    if (!QDir().mkpath(QFileInfo(caminho).absolutePath()))
        return falha("could not save " + caminho + ": cannot make its folder");
    // A temporary file beside it, renamed over it only when every byte is on the disk.
    zvsdk::AtomicFile arquivo(caminho);
    if (!arquivo.open() || !arquivo.write(conteudo) || !arquivo.commit())
        return falha(arquivo.errorString());
    return true;
}

QString CIRegistro::DBPass() {
    const QByteArray bytes = QByteArray::fromHex(LerRegistro("DBPass").toLatin1());
    QString texto(bytes.size() / 2, QChar());
    for (int i = 0; i < texto.size(); ++i)
        texto[i] = QChar(char16_t((uchar(bytes[2 * i]) << 8) | uchar(bytes[2 * i + 1])));
    return Transforma(texto);
}

QString CIRegistro::SenhaGuardada(const QString& senha) {
    QByteArray bytes;
    for (QChar c : Transforma(senha))
        bytes.append(char(c.unicode() >> 8)).append(char(c.unicode()));
    return QString::fromLatin1(bytes.toHex());
}

bool CIRegistro::SetDBPass(const QString& senha) {
    return GravarRegistro("DBPass", SenhaGuardada(senha));
}

int CIRegistro::IdiomaMenuSel() {
    // Like _wtoi: the leading decimal number, 0 when there is none.
    return ZVString(LerRegistro("IdiomaMenuSel")).ParaInteiro();
}

bool CIRegistro::SetIdiomaMenuSel(int idioma) {
    return GravarRegistro("IdiomaMenuSel", QString::number(idioma));
}
