#include "CIFiltro.h"

#include "JanelaDialogo.h"
#include "export/CEExportacao.h"

#include <QComboBox>
#include <QDialogButtonBox>
#include <QDir>
#include <QGridLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QToolButton>
#include <QTreeWidget>
#include <QVBoxLayout>

#include <algorithm>

using namespace JanelaDialogo;

namespace {

constexpr int kPrimeiroOperador = 99;  // the eight operators' labels follow in order
constexpr int kOperadores = 8;

QString Caminho() {
    const QString pasta = PastaEstado();
    return pasta.isEmpty() ? QString() : QDir(pasta).filePath(CIFiltro::kArquivo);
}

QString RotuloOperador(int operador) {
    return operador >= 0 && operador < kOperadores ? Mensagem(kPrimeiroOperador + operador)
                                                   : QString::number(operador);
}

// The heading, the rows and the widest operator label with some room, never below the
// default nor wider than a third of a usual window.
int LarguraInicial(const QTreeWidget& lista, int coluna) {
    const QFontMetrics medida = lista.fontMetrics();
    int largura = medida.horizontalAdvance(lista.headerItem()->text(coluna));
    if (coluna == 1)
        for (int i = 0; i < kOperadores; ++i)
            largura = std::max(largura, medida.horizontalAdvance(RotuloOperador(i)));
    for (int i = 0; i < lista.topLevelItemCount(); ++i)
        largura = std::max(largura, medida.horizontalAdvance(lista.topLevelItem(i)->text(coluna)));
    return std::clamp(largura + 24, kPadraoLarguraColuna, 240);
}

}  // namespace

CIFiltro::CIFiltro(CEExportacao& exportacao, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()),
      exportacao_(exportacao),
      linhas_(exportacao.Filtros),
      lista_(new QTreeWidget),
      campo_(new QComboBox),
      operador_(new QComboBox),
      valor_(new QLineEdit),
      disponiveis_(new QListWidget),
      ordenar_(new QListWidget),
      ordem_(new QComboBox) {
    setWindowTitle(Mensagem(kFiltrosTitulo));
    lista_->setColumnCount(3);
    lista_->setHeaderLabels({Mensagem(kCampo), Mensagem(kOperador), Mensagem(kValor)});
    lista_->setRootIsDecorated(false);
    lista_->setMinimumHeight(140);
    connect(lista_, &QTreeWidget::currentItemChanged, this, &CIFiltro::MostraLinha);

    // The fields offered are those of the columns; any other may be typed.
    QStringList campos;
    for (const CEPropExport& coluna : exportacao.Colunas)
        if (!coluna.Literal && !coluna.Tag.contains('{') && !campos.contains(coluna.Tag))
            campos << coluna.Tag;
    for (const CEFiltroExport& filtro : linhas_)
        if (!campos.contains(filtro.Campo)) campos << filtro.Campo;
    campo_->setEditable(true);
    campo_->addItems(campos);
    campo_->setMinimumContentsLength(14);
    for (int i = 0; i < kOperadores; ++i)
        operador_->addItem(RotuloOperador(i), i);

    auto* edicao = new QGridLayout;
    edicao->addWidget(new QLabel(Mensagem(kCampo)), 0, 0);
    edicao->addWidget(new QLabel(Mensagem(kOperador)), 0, 1);
    edicao->addWidget(new QLabel(Mensagem(kValor)), 0, 2);
    edicao->addWidget(campo_, 1, 0);
    edicao->addWidget(operador_, 1, 1);
    edicao->addWidget(valor_, 1, 2);
    auto* acoes = new QHBoxLayout;
    const std::pair<int, void (CIFiltro::*)()> botoesFiltro[] = {
        {kAdicionar, &CIFiltro::Adiciona},
        {kAlterar, &CIFiltro::Altera},
        {kRemover, &CIFiltro::Remove},
    };
    acoes->addStretch();
    for (const auto& [texto, acao] : botoesFiltro) {
        auto* botao = new QPushButton(Mensagem(texto));
        botao->setAutoDefault(false);
        connect(botao, &QPushButton::clicked, this, acao);
        acoes->addWidget(botao);
    }

    // The sort: fields not sorted by at the left, the sort keys in order at the right.
    const QStringList chaves =
        exportacao.GetOpcao("FLT_NOME_ORDENAR_POR").split(';', Qt::SkipEmptyParts);
    ordenar_->addItems(chaves);
    for (const QString& campo : campos)
        if (!chaves.contains(campo)) disponiveis_->addItem(campo);
    connect(disponiveis_, &QListWidget::itemDoubleClicked, this, &CIFiltro::ParaOrdem);
    connect(ordenar_, &QListWidget::itemDoubleClicked, this, &CIFiltro::DaOrdem);
    auto* para = new QToolButton;
    para->setArrowType(Qt::RightArrow);
    connect(para, &QToolButton::clicked, this, &CIFiltro::ParaOrdem);
    auto* de = new QToolButton;
    de->setArrowType(Qt::LeftArrow);
    connect(de, &QToolButton::clicked, this, &CIFiltro::DaOrdem);
    auto* setas = new QVBoxLayout;
    setas->addStretch();
    setas->addWidget(para);
    setas->addWidget(de);
    setas->addStretch();
    ordem_->addItem(Mensagem(kCrescente), "C");
    ordem_->addItem(Mensagem(kDecrescente), "D");
    ordem_->setCurrentIndex(
        exportacao.GetOpcao("FLT_TIPO_ORDEM").compare("D", Qt::CaseInsensitive) == 0 ? 1 : 0);
    auto* grade = new QGridLayout;
    grade->addWidget(new QLabel(Mensagem(kCampos)), 0, 0);
    grade->addWidget(new QLabel(Mensagem(kOrdenarPor)), 0, 2);
    grade->addWidget(disponiveis_, 1, 0);
    grade->addLayout(setas, 1, 1);
    grade->addWidget(ordenar_, 1, 2);
    auto* direcao = new QHBoxLayout;
    direcao->addWidget(new QLabel(Mensagem(kOrdem)));
    direcao->addWidget(ordem_);
    direcao->addStretch();
    grade->addLayout(direcao, 2, 0, 1, 3);
    disponiveis_->setMinimumHeight(100);
    ordenar_->setMinimumHeight(100);
    auto* ordenacao = new QGroupBox(Mensagem(kOrdenacao));
    ordenacao->setLayout(grade);

    auto* botoes = new QDialogButtonBox;
    botoes->addButton(Mensagem(kOk), QDialogButtonBox::AcceptRole)->setDefault(true);
    botoes->addButton(Mensagem(kCancelar), QDialogButtonBox::RejectRole);
    connect(botoes, &QDialogButtonBox::accepted, this, &CIFiltro::accept);
    connect(botoes, &QDialogButtonBox::rejected, this, &QDialog::reject);
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(lista_);
    layout->addLayout(edicao);
    layout->addLayout(acoes);
    layout->addWidget(ordenacao);
    layout->addWidget(botoes);
    Preenche(linhas_.empty() ? -1 : 0);

    // Without a stored width a column starts at 75, or wider when its heading needs it.
    std::vector<int> valores(kLinhasArquivo - 4, 0);
    if (const auto lidos = LeArquivo(Caminho(), kLinhasArquivo)) {
        AplicaPosicao(*this, *lidos);
        for (size_t i = 4; i < lidos->size(); ++i)
            valores[i - 4] = (*lidos)[i];
    }
    for (int i = 0; i < 3; ++i) {
        const int guardada = valores[size_t(i)];
        lista_->setColumnWidth(i, guardada > 10 ? guardada : LarguraInicial(*lista_, i));
    }
}

void CIFiltro::Preenche(int atual) {
    lista_->clear();
    for (const CEFiltroExport& filtro : linhas_)
        new QTreeWidgetItem(lista_, {filtro.Campo, RotuloOperador(filtro.Operador), filtro.Valor});
    if (atual >= 0 && atual < lista_->topLevelItemCount())
        lista_->setCurrentItem(lista_->topLevelItem(atual));
}

void CIFiltro::MostraLinha() {
    const int i = lista_->indexOfTopLevelItem(lista_->currentItem());
    if (i < 0 || i >= int(linhas_.size())) return;
    const CEFiltroExport& filtro = linhas_[size_t(i)];
    campo_->setCurrentText(filtro.Campo);
    operador_->setCurrentIndex(operador_->findData(filtro.Operador));
    valor_->setText(filtro.Valor);
}

CEFiltroExport CIFiltro::DaEdicao() const {
    return CEFiltroExport(campo_->currentText().trimmed(), operador_->currentData().toInt(),
                          valor_->text());
}

void CIFiltro::Adiciona() {
    const CEFiltroExport filtro = DaEdicao();
    if (filtro.Campo.isEmpty()) return;
    linhas_.push_back(filtro);
    Preenche(int(linhas_.size()) - 1);
}

void CIFiltro::Altera() {
    const int i = lista_->indexOfTopLevelItem(lista_->currentItem());
    const CEFiltroExport filtro = DaEdicao();
    if (i < 0 || i >= int(linhas_.size()) || filtro.Campo.isEmpty()) return;
    linhas_[size_t(i)] = filtro;
    Preenche(i);
}

void CIFiltro::Remove() {
    const int i = lista_->indexOfTopLevelItem(lista_->currentItem());
    if (i < 0 || i >= int(linhas_.size())) return;
    linhas_.erase(linhas_.begin() + i);
    Preenche(std::min(i, int(linhas_.size()) - 1));
}

void CIFiltro::ParaOrdem() {
    if (QListWidgetItem* campo = disponiveis_->takeItem(disponiveis_->currentRow())) {
        ordenar_->addItem(campo);
        ordenar_->setCurrentItem(campo);
    }
}

void CIFiltro::DaOrdem() {
    if (QListWidgetItem* campo = ordenar_->takeItem(ordenar_->currentRow())) {
        disponiveis_->addItem(campo);
        disponiveis_->setCurrentItem(campo);
    }
}

void CIFiltro::accept() {
    exportacao_.Filtros = linhas_;
    QStringList chaves;
    for (int i = 0; i < ordenar_->count(); ++i)
        chaves << ordenar_->item(i)->text();
    exportacao_.SetOpcao("FLT_NOME_ORDENAR_POR", chaves.join(';'));
    exportacao_.SetOpcao("FLT_TIPO_ORDEM", ordem_->currentData().toString());
    std::vector<int> valores = Posicao(*this);
    for (int i = 0; i < 3; ++i)
        valores.push_back(lista_->columnWidth(i));
    GravaArquivo(Caminho(), valores);
    QDialog::accept();
}
