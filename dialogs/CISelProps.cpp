#include "CISelProps.h"

#include "CIDlgPropDetail.h"

#include <QDialogButtonBox>
#include <QDir>
#include <QHBoxLayout>
#include <QListWidget>
#include <QPushButton>
#include <QVBoxLayout>

using namespace JanelaDialogo;

namespace {

QString Caminho() {
    const QString pasta = PastaEstado();
    return pasta.isEmpty() ? QString() : QDir(pasta).filePath(CISelProps::kArquivo);
}

}  // namespace

CISelProps::CISelProps(std::vector<CEPropExport>& colunas, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()),
      colunas_(colunas),
      linhas_(colunas),
      lista_(new QListWidget) {
    setWindowTitle(Mensagem(kColunasTitulo));
    lista_->setMinimumSize(300, 260);
    auto* lateral = new QVBoxLayout;
    const std::pair<int, void (CISelProps::*)()> acoes[] = {
        {kSubir, &CISelProps::Sobe},
        {kDescer, &CISelProps::Desce},
        {kRemover, &CISelProps::Remove},
        {kEditar, &CISelProps::Edita},
        {kAdicionarColuna, &CISelProps::Adiciona},
    };
    for (const auto& [texto, acao] : acoes) {
        auto* botao = new QPushButton(Mensagem(texto));
        botao->setAutoDefault(false);
        connect(botao, &QPushButton::clicked, this, acao);
        lateral->addWidget(botao);
    }
    lateral->addStretch();
    connect(lista_, &QListWidget::itemDoubleClicked, this, &CISelProps::Edita);
    auto* botoes = new QDialogButtonBox;
    botoes->addButton(Mensagem(kOk), QDialogButtonBox::AcceptRole)->setDefault(true);
    botoes->addButton(Mensagem(kCancelar), QDialogButtonBox::RejectRole);
    connect(botoes, &QDialogButtonBox::accepted, this, &CISelProps::accept);
    connect(botoes, &QDialogButtonBox::rejected, this, &QDialog::reject);
    auto* meio = new QHBoxLayout;
    meio->addWidget(lista_, 1);
    meio->addLayout(lateral);
    auto* layout = new QVBoxLayout(this);
    layout->addLayout(meio);
    layout->addWidget(botoes);
    Preenche(linhas_.empty() ? -1 : 0);
    if (const auto valores = LeArquivo(Caminho(), 4)) AplicaPosicao(*this, *valores);
}

void CISelProps::Preenche(int atual) {
    lista_->clear();
    for (const CEPropExport& coluna : linhas_) {
        auto* linha = new QListWidgetItem(coluna.Titulo, lista_);
        linha->setFlags(Qt::ItemIsEnabled | Qt::ItemIsSelectable | Qt::ItemIsUserCheckable);
        linha->setCheckState(coluna.Visivel ? Qt::Checked : Qt::Unchecked);
        if (coluna.Titulo != coluna.Tag) linha->setToolTip(coluna.Tag);
    }
    if (atual >= 0 && atual < lista_->count()) lista_->setCurrentRow(atual);
}

void CISelProps::LeMarcas() {
    for (int i = 0; i < lista_->count() && i < int(linhas_.size()); ++i)
        linhas_[size_t(i)].Visivel = lista_->item(i)->checkState() == Qt::Checked;
}

void CISelProps::Sobe() {
    const int i = lista_->currentRow();
    if (i <= 0) return;
    LeMarcas();
    std::swap(linhas_[size_t(i)], linhas_[size_t(i - 1)]);
    Preenche(i - 1);
}

void CISelProps::Desce() {
    const int i = lista_->currentRow();
    if (i < 0 || i + 1 >= int(linhas_.size())) return;
    LeMarcas();
    std::swap(linhas_[size_t(i)], linhas_[size_t(i + 1)]);
    Preenche(i + 1);
}

void CISelProps::Remove() {
    const int i = lista_->currentRow();
    if (i < 0 || i >= int(linhas_.size())) return;
    LeMarcas();
    linhas_.erase(linhas_.begin() + i);
    Preenche(std::min(i, int(linhas_.size()) - 1));
}

void CISelProps::UnicoGrupo(size_t grupo) {
    if (!linhas_[grupo].Agrupa) return;
    for (size_t i = 0; i < linhas_.size(); ++i)
        if (i != grupo) linhas_[i].Agrupa = false;
}

void CISelProps::Edita() {
    const int i = lista_->currentRow();
    if (i < 0 || i >= int(linhas_.size())) return;
    LeMarcas();
    CEPropExport editada = linhas_[size_t(i)];
    CIDlgPropDetail detalhe(editada, this);
    if (Mostra(MostraDialogo, detalhe) != QDialog::Accepted) return;
    linhas_[size_t(i)] = editada;
    UnicoGrupo(size_t(i));
    Preenche(i);
}

void CISelProps::Adiciona() {
    LeMarcas();
    CEPropExport nova;
    CIDlgPropDetail detalhe(nova, this);
    if (Mostra(MostraDialogo, detalhe) != QDialog::Accepted) return;
    linhas_.push_back(nova);
    UnicoGrupo(linhas_.size() - 1);
    Preenche(int(linhas_.size()) - 1);
}

void CISelProps::accept() {
    LeMarcas();
    colunas_ = linhas_;
    GravaArquivo(Caminho(), Posicao(*this));
    QDialog::accept();
}
