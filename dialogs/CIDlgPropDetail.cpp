#include "CIDlgPropDetail.h"

#include "JanelaDialogo.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QFormLayout>
#include <QIntValidator>
#include <QLineEdit>
#include <QPushButton>
#include <QVBoxLayout>

using namespace JanelaDialogo;

CIDlgPropDetail::CIDlgPropDetail(CEPropExport& coluna, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()),
      coluna_(coluna),
      nome_(new QLineEdit(coluna.Tag)),
      titulo_(new QLineEdit(coluna.Titulo)),
      largura_(new QLineEdit(coluna.Tamanho)),
      preenche_(new QLineEdit(coluna.Preenche)),
      agrupa_(new QCheckBox(Mensagem(kAgrupa))),
      literal_(new QCheckBox(Mensagem(kLiteral))),
      concatena_(new QCheckBox(Mensagem(kConcatena))),
      alinhamento_(new QComboBox) {
    setWindowTitle(Mensagem(kColuna) +
                   (coluna.Titulo.isEmpty() ? QString() : " - " + coluna.Titulo));
    nome_->setMinimumWidth(280);
    largura_->setValidator(new QIntValidator(-9999, 9999, largura_));
    // The fill stays as it was until a width is typed: without a width it does nothing.
    preenche_->setReadOnly(true);
    connect(largura_, &QLineEdit::textEdited, this,
            [this](const QString& texto) { preenche_->setReadOnly(texto.toInt() <= 0); });
    agrupa_->setChecked(coluna.Agrupa);
    literal_->setChecked(coluna.Literal);
    concatena_->setChecked(coluna.Concatena);
    alinhamento_->addItem(Mensagem(kEsquerda));
    alinhamento_->addItem(Mensagem(kDireita));
    alinhamento_->setCurrentIndex(coluna.Direita ? 1 : 0);

    auto* formulario = new QFormLayout;
    formulario->addRow(Mensagem(kNome), nome_);
    formulario->addRow(Mensagem(kTitulo), titulo_);
    formulario->addRow(Mensagem(kLargura), largura_);
    formulario->addRow(Mensagem(kPreenche), preenche_);
    formulario->addRow(QString(), agrupa_);
    formulario->addRow(QString(), literal_);
    formulario->addRow(QString(), concatena_);
    formulario->addRow(Mensagem(kAlinhamento), alinhamento_);
    auto* botoes = new QDialogButtonBox;
    ok_ = botoes->addButton(Mensagem(kOk), QDialogButtonBox::AcceptRole);
    botoes->addButton(Mensagem(kCancelar), QDialogButtonBox::RejectRole);
    ok_->setDefault(true);
    connect(botoes, &QDialogButtonBox::accepted, this, &CIDlgPropDetail::accept);
    connect(botoes, &QDialogButtonBox::rejected, this, &QDialog::reject);
    // A column needs its field: an empty one would write nothing but take a row.
    const auto atualiza = [this] { ok_->setEnabled(!nome_->text().trimmed().isEmpty()); };
    connect(nome_, &QLineEdit::textChanged, this, atualiza);
    atualiza();
    auto* layout = new QVBoxLayout(this);
    layout->addLayout(formulario);
    layout->addWidget(botoes);
}

void CIDlgPropDetail::accept() {
    const QString tag = nome_->text().trimmed();
    if (tag.isEmpty()) return;
    if (coluna_.Rotulo.isEmpty() || coluna_.Rotulo == coluna_.Tag) coluna_.Rotulo = tag;
    coluna_.Tag = tag;
    // An empty heading would break the stored row (its fields would slide), so a column
    // without one is headed by its field.
    const QString titulo = titulo_->text().trimmed();
    coluna_.Titulo = titulo.isEmpty() ? tag : titulo;
    coluna_.Tamanho = largura_->text().trimmed();
    coluna_.Preenche = preenche_->text();
    coluna_.Agrupa = agrupa_->isChecked();
    coluna_.Literal = literal_->isChecked();
    coluna_.Concatena = concatena_->isChecked();
    coluna_.Direita = alinhamento_->currentIndex() == 1;
    QDialog::accept();
}
