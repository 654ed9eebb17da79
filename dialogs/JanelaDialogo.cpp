#include "JanelaDialogo.h"

#include "cad/CICad.h"
#include "host/sdk/AtomicFile.h"
#include "settings/CIMensagens.h"

#include <QAbstractButton>
#include <QApplication>
#include <QDialog>
#include <QDir>
#include <QFile>
#include <QMainWindow>
#include <QScreen>
#include <QWidget>

#include <limits>

namespace JanelaDialogo {

QString Mensagem(int numero) {
    return CIMensagens::Mensagem("ZVLISTAS", numero);
}

int Mostra(const Mostrador& mostrador, QDialog& dialogo) {
    return mostrador ? mostrador(dialogo) : dialogo.exec();
}

QMessageBox::StandardButton Pergunta(const Mostrador& mostrador, QWidget* pai, int numero,
                                     QMessageBox::StandardButtons botoes) {
    QMessageBox caixa(QMessageBox::Question, Mensagem(1), Mensagem(numero), botoes,
                      pai ? pai : JanelaPrincipal());
    const std::pair<QMessageBox::StandardButton, int> nomes[] = {
        {QMessageBox::Yes, kSim}, {QMessageBox::No, kNao}, {QMessageBox::Cancel, kCancelar}};
    QMessageBox::StandardButton ultimo = QMessageBox::NoButton;
    for (const auto& [botao, texto] : nomes)
        if (QAbstractButton* b = caixa.button(botao)) {
            b->setText(Mensagem(texto));
            ultimo = botao;
        }
    caixa.setEscapeButton(caixa.button(ultimo));
    const int resposta = Mostra(mostrador, caixa);
    return botoes.testFlag(QMessageBox::StandardButton(resposta))
               ? QMessageBox::StandardButton(resposta)
               : ultimo;
}

void Avisa(const Mostrador& mostrador, QWidget* pai, int numero) {
    QMessageBox caixa(QMessageBox::Information, Mensagem(1), Mensagem(numero), QMessageBox::Ok,
                      pai ? pai : JanelaPrincipal());
    caixa.button(QMessageBox::Ok)->setText(Mensagem(kOk));
    Mostra(mostrador, caixa);
}

QWidget* JanelaPrincipal() {
    if (!qobject_cast<QApplication*>(QCoreApplication::instance())) return nullptr;
    for (QWidget* janela : QApplication::topLevelWidgets())
        if (qobject_cast<QMainWindow*>(janela) && janela->isVisible()) return janela;
    QWidget* ativa = QApplication::activeWindow();
    return ativa && !qobject_cast<QDialog*>(ativa) ? ativa : nullptr;
}

QString RaizPerfil() {
    // The system variable is read through the document's LISP, as the host knows it.
    if (!CICad::AvaliaLisp("(setq pblTmpRaizPerfil (getvar \"ROAMABLEROOTPREFIX\"))")) return {};
    QString raiz = CICad::GetStringLisp("pblTmpRaizPerfil");
    CICad::SetNilLisp("pblTmpRaizPerfil");
    if (raiz.isEmpty()) return {};
    raiz.replace('\\', '/');
    if (!raiz.endsWith('/')) raiz += '/';
    return raiz;
}

QString PastaEstilos() {
    const QString raiz = RaizPerfil();
    return raiz.isEmpty() ? QString() : raiz + "plotstyles";
}

QString PastaEstado() {
    const QString raiz = RaizPerfil();
    if (raiz.isEmpty()) return {};
    const QString pasta = raiz + "ZVDLG";
    if (!QDir().mkpath(pasta)) return {};
    return pasta;
}

namespace {

// The leading decimal number of a line, as the C library reads it; 0 without one.
int Numero(const QByteArray& linha) {
    int i = 0;
    while (i < linha.size() && (linha[i] == ' ' || linha[i] == '\t'))
        ++i;
    bool negativo = false;
    if (i < linha.size() && (linha[i] == '-' || linha[i] == '+')) negativo = linha[i++] == '-';
    long long valor = 0;
    for (; i < linha.size() && linha[i] >= '0' && linha[i] <= '9'; ++i) {
        valor = valor * 10 + (linha[i] - '0');
        if (valor > std::numeric_limits<int>::max()) valor = std::numeric_limits<int>::max();
    }
    return int(negativo ? -valor : valor);
}

}  // namespace

std::optional<std::vector<int>> LeValores(const QByteArray& texto, int linhas) {
    std::vector<int> valores;
    int inicio = 0;
    while (int(valores.size()) < linhas && inicio < texto.size()) {
        int fim = texto.indexOf('\n', inicio);
        if (fim < 0) fim = texto.size();
        QByteArray linha = texto.mid(inicio, fim - inicio);
        if (linha.endsWith('\r')) linha.chop(1);
        // A line too long for the reader's buffer leaves the stream failed: reading ends.
        if (linha.size() > kMaxLinha) break;
        valores.push_back(Numero(linha));
        inicio = fim + 1;
    }
    if (valores.size() < 4) return std::nullopt;
    return valores;
}

std::optional<std::vector<int>> LeArquivo(const QString& caminho, int linhas) {
    QFile arquivo(caminho);
    if (caminho.isEmpty() || !arquivo.open(QIODevice::ReadOnly)) return std::nullopt;
    // Lines past those wanted are never read; the cap keeps a huge file from being loaded.
    return LeValores(arquivo.read(qint64(linhas) * (kMaxLinha + 2) + 1), linhas);
}

QByteArray TextoValores(const std::vector<int>& valores) {
    QByteArray texto;
    for (int v : valores)
        texto += QByteArray::number(v) + "\r\n";
    return texto;
}

bool GravaArquivo(const QString& caminho, const std::vector<int>& valores) {
    if (caminho.isEmpty()) return false;
    zvsdk::AtomicFile arquivo(caminho);
    return arquivo.open() && arquivo.write(TextoValores(valores)) && arquivo.commit();
}

std::vector<int> Posicao(const QWidget& janela) {
    const QRect r = janela.geometry();
    return {r.x(), r.y(), r.width(), r.height()};
}

void AplicaPosicao(QWidget& janela, const std::vector<int>& valores) {
    if (valores.size() < 4) return;
    const QRect r(valores[0], valores[1], valores[2], valores[3]);
    if (r.width() < 50 || r.height() < 50) return;
    bool cabe = false;
    for (const QScreen* tela : QGuiApplication::screens())
        cabe = cabe || tela->availableGeometry().intersects(r);
    if (!cabe) {
        // The window keeps the size it had but is not put off every screen.
        janela.resize(r.size());
        return;
    }
    janela.setGeometry(r);
}

}  // namespace JanelaDialogo
