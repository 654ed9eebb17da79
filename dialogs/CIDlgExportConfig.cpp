#include "CIDlgExportConfig.h"

#include "JanelaDialogo.h"

#include <QDialogButtonBox>
#include <QHeaderView>
#include <QPushButton>
#include <QTreeWidget>
#include <QVBoxLayout>

using namespace JanelaDialogo;

CIDlgExportConfig::CIDlgExportConfig(const QStringList& nomes, const QString& atual, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()), lista_(new QTreeWidget) {
    setWindowTitle(Mensagem(kAbrirConfig));
    lista_->setColumnCount(1);
    lista_->setHeaderLabels({Mensagem(kConfiguracao)});
    lista_->setRootIsDecorated(false);
    lista_->setColumnWidth(0, 300);
    lista_->setMinimumWidth(320);
    for (const QString& nome : nomes) {
        if (nome.isEmpty()) continue;
        auto* linha = new QTreeWidgetItem(lista_, {nome});
        if (nome == atual) lista_->setCurrentItem(linha);
    }
    auto* botoes = new QDialogButtonBox;
    QPushButton* ok = botoes->addButton(Mensagem(kOk), QDialogButtonBox::AcceptRole);
    botoes->addButton(Mensagem(kCancelar), QDialogButtonBox::RejectRole);
    connect(botoes, &QDialogButtonBox::accepted, this, &QDialog::accept);
    connect(botoes, &QDialogButtonBox::rejected, this, &QDialog::reject);
    connect(lista_, &QTreeWidget::itemDoubleClicked, this, &QDialog::accept);
    const auto atualiza = [this, ok] { ok->setEnabled(!Selecionada().isEmpty()); };
    connect(lista_, &QTreeWidget::currentItemChanged, this, atualiza);
    atualiza();
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(lista_);
    layout->addWidget(botoes);
}

QString CIDlgExportConfig::Selecionada() const {
    const QTreeWidgetItem* linha = lista_->currentItem();
    return linha ? linha->text(0) : QString();
}
