#pragma once
// What the export dialogs share: their texts by message number, the parent window, the
// questions they ask, and the small files that keep where a dialog stood on the screen.
#include <QByteArray>
#include <QMessageBox>
#include <QString>

#include <functional>
#include <optional>
#include <vector>

class QDialog;
class QWidget;

namespace JanelaDialogo {

// Texts of the dialogs that have no number of their own in the older message tables.
enum Texto : int {
    kConfiguracao = 1100,
    kNova = 1101,
    kAbrir = 1102,
    kSalvar = 1103,
    kExcluir = 1104,
    kTipoLista = 1105,
    kFormato = 1106,
    kArquivo = 1107,
    kProcurar = 1108,
    kColunasBotao = 1109,
    kOpcoesBotao = 1110,
    kOk = 1111,
    kCancelar = 1112,
    kOpcoesTitulo = 1113,
    kOpcao = 1114,
    kValor = 1115,
    kAbrirConfig = 1116,
    kNomeConfig = 1117,
    kNome = 1118,
    kFiltrosTitulo = 1119,
    kCampo = 1120,
    kOperador = 1121,
    kAdicionar = 1122,
    kAlterar = 1123,
    kRemover = 1124,
    kCampos = 1125,
    kOrdenarPor = 1126,
    kCrescente = 1127,
    kDecrescente = 1128,
    kColunasTitulo = 1129,
    kSubir = 1130,
    kDescer = 1131,
    kEditar = 1132,
    kAdicionarColuna = 1133,
    kColuna = 1134,
    kTitulo = 1135,
    kLargura = 1136,
    kPreenche = 1137,
    kAgrupa = 1138,
    kLiteral = 1139,
    kConcatena = 1140,
    kAlinhamento = 1141,
    kEsquerda = 1142,
    kDireita = 1143,
    kOrdem = 1144,
    kColunasExportadas = 1145,
    kOrdenacao = 1146,
    kTodasPaginas = 1147,
    kSim = 0x34,
    kNao = 0x35,
};

// The text of a message of this module's section.
QString Mensagem(int numero);

// A dialog is shown modally through this; tests put their own in its place to fill the
// dialog and answer as a user would. Returns what QDialog::exec() returns (a message box:
// the standard button pressed).
using Mostrador = std::function<int(QDialog&)>;
int Mostra(const Mostrador& mostrador, QDialog& dialogo);

// A question by message number, with its buttons named by messages (yes, no, cancel).
// Returns the standard button pressed; closing the box counts as the last button.
QMessageBox::StandardButton Pergunta(const Mostrador& mostrador, QWidget* pai, int numero,
                                     QMessageBox::StandardButtons botoes);
// A message box with one button.
void Avisa(const Mostrador& mostrador, QWidget* pai, int numero);

// The window a dialog without a parent stands on: the application's main window.
QWidget* JanelaPrincipal();

// The host's `ROAMABLEROOTPREFIX`, with a "/" at its end; empty when it names nothing.
QString RaizPerfil();
// The host's plot style folder (below the same root); empty when there is none.
QString PastaEstilos();

// Window geometry files. Each holds one decimal integer on a line, nothing else.
constexpr int kMaxLinha = 2000;
constexpr int kPadraoLarguraColuna = 75;
// The folder "ZVDLG" below the host's `ROAMABLEROOTPREFIX`, made when missing; empty when
// the host names no such folder (and then nothing is kept).
QString PastaEstado();
// Reads at most `linhas` lines of at most kMaxLinha characters while the text is sound; a
// line counts as its leading decimal number (0 when it has none). A longer line ends the
// reading. Nothing when fewer than four values were read: the dialog keeps its defaults.
std::optional<std::vector<int>> LeValores(const QByteArray& texto, int linhas);
std::optional<std::vector<int>> LeArquivo(const QString& caminho, int linhas);
// One value a line, CR LF; written atomically, false when it can't be.
QByteArray TextoValores(const std::vector<int>& valores);
bool GravaArquivo(const QString& caminho, const std::vector<int>& valores);
// The four values of a window's placement: left, top, width and height.
std::vector<int> Posicao(const QWidget& janela);
// Puts a window where four values say, when they describe a size that fits a screen.
void AplicaPosicao(QWidget& janela, const std::vector<int>& valores);

}  // namespace JanelaDialogo
