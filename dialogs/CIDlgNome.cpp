#include "CIDlgNome.h"

#include "JanelaDialogo.h"

#include <QDialogButtonBox>
#include <QFormLayout>
#include <QLineEdit>
#include <QPushButton>
#include <QVBoxLayout>

using namespace JanelaDialogo;

CIDlgNome::CIDlgNome(const QString& proposto, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()), campo_(new QLineEdit(proposto)) {
    setWindowTitle(Mensagem(kNomeConfig));
    auto* formulario = new QFormLayout;
    formulario->addRow(Mensagem(kNome), campo_);
    campo_->setMinimumWidth(260);
    campo_->selectAll();
    auto* botoes = new QDialogButtonBox;
    ok_ = botoes->addButton(Mensagem(kOk), QDialogButtonBox::AcceptRole);
    botoes->addButton(Mensagem(kCancelar), QDialogButtonBox::RejectRole);
    ok_->setDefault(true);
    connect(botoes, &QDialogButtonBox::accepted, this, &QDialog::accept);
    connect(botoes, &QDialogButtonBox::rejected, this, &QDialog::reject);
    // A configuration without a name would be the unnamed one; that one always exists.
    const auto atualiza = [this] { ok_->setEnabled(!Nome().isEmpty()); };
    connect(campo_, &QLineEdit::textChanged, this, atualiza);
    atualiza();
    auto* layout = new QVBoxLayout(this);
    layout->addLayout(formulario);
    layout->addWidget(botoes);
}

QString CIDlgNome::Nome() const {
    return campo_->text().trimmed();
}
