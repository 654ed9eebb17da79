#include "CIDlgOpcoes.h"

#include "JanelaDialogo.h"
#include "export/CEExportacao.h"

#include <QComboBox>
#include <QDialogButtonBox>
#include <QDir>
#include <QHeaderView>
#include <QIntValidator>
#include <QLineEdit>
#include <QPushButton>
#include <QTableWidget>
#include <QVBoxLayout>

using namespace JanelaDialogo;

namespace {

constexpr int kPrimeiroPapel = 0xBA;
constexpr int kPapeis = 10;
constexpr int kPaisagem = 0x97;
constexpr int kRetrato = 0x98;

QComboBox* Lista(const std::vector<std::pair<QString, QString>>& entradas, const QString& valor) {
    auto* lista = new QComboBox;
    for (const auto& [rotulo, dado] : entradas)
        lista->addItem(rotulo, dado);
    const int achada = lista->findData(valor);
    lista->setCurrentIndex(achada < 0 ? 0 : achada);
    return lista;
}

}  // namespace

std::vector<std::pair<QString, int>> CIDlgOpcoes::Chaves(int tipoOut) {
    switch (tipoOut) {
        case CEExportacao::Csv:
            return {
                {"CSV_CABECALHO_SN", 0x2A}, {"CSV_DELIM_CAMPO", 0x2B}, {"CSV_DELIM_TEXTO", 0x2C}};
        case CEExportacao::Xml:
            return {{"XML_VAZIAS_SN", 0x30}, {"XML_PROMPT_SN", 0x31}};
        case CEExportacao::Html:
            return {{"HTML_CABECALHO_SN", 0x2A},
                    {"HTML_CABE_NEG_SN", 0x32},
                    {"HTML_LARG_TABELA", 0x33}};
        case CEExportacao::Xlsx:
            return {
                {"XLSX_CABECALHO_SN", 0x2A}, {"XLSX_TEMPLATE", 0x2F}, {"XLSX_LINHA_INI_INT", 0x9B}};
        case CEExportacao::Png:
        case CEExportacao::Dwg:
        case CEExportacao::Dwf:
        case CEExportacao::Dxf:
        case CEExportacao::Emf:
            return {{"DWG_SEPARADOR", 0x70}, {"DWG_NUMERO_DIGITOS", 0x71}};
        case CEExportacao::Pdf:
            return {{"PDF_SMART_SN", 0xFA},
                    {"PDF_PAPER_SIZE_PZ", 0x4E},
                    {"PDF_ORIENTATION_LP", 0x4F},
                    {"PDF_TABELA_ESTILO", 0x6B},
                    {"PDF_DPI", 0x6F},
                    {"PDF_PESOLINHA_SN", 0xDF},
                    {"PDF_WATERMARK", 0x2D}};
        default:
            return {};
    }
}

CIDlgOpcoes::CIDlgOpcoes(CEExportacao& exportacao, int tipoOut, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()), exportacao_(exportacao), tabela_(new QTableWidget) {
    setWindowTitle(Mensagem(kOpcoesTitulo) + " - " + CEExportacao::PalavraDeTipoOut(tipoOut));
    const auto chaves = Chaves(tipoOut);
    tabela_->setColumnCount(2);
    tabela_->setRowCount(int(chaves.size()));
    tabela_->setHorizontalHeaderLabels({Mensagem(kOpcao), Mensagem(kValor)});
    tabela_->verticalHeader()->hide();
    tabela_->setSelectionMode(QAbstractItemView::NoSelection);
    tabela_->setEditTriggers(QAbstractItemView::NoEditTriggers);
    for (int i = 0; i < int(chaves.size()); ++i) {
        const auto& [chave, numero] = chaves[size_t(i)];
        auto* rotulo = new QTableWidgetItem(Mensagem(numero));
        rotulo->setToolTip(chave);
        tabela_->setItem(i, 0, rotulo);
        tabela_->setCellWidget(i, 1, CriaEditor(chave, exportacao.GetOpcao(chave)));
        chaves_.push_back(chave);
    }
    tabela_->resizeColumnToContents(0);
    tabela_->setColumnWidth(0, std::max(tabela_->columnWidth(0) + 12, 180));
    tabela_->setColumnWidth(1, 240);
    tabela_->horizontalHeader()->setStretchLastSection(true);
    tabela_->resizeRowsToContents();
    tabela_->setMinimumWidth(tabela_->columnWidth(0) + 260);
    int altura = tabela_->horizontalHeader()->sizeHint().height() + 6;
    for (int i = 0; i < tabela_->rowCount(); ++i)
        altura += tabela_->rowHeight(i);
    tabela_->setMinimumHeight(std::min(altura, 400));

    auto* botoes = new QDialogButtonBox;
    botoes->addButton(Mensagem(kOk), QDialogButtonBox::AcceptRole)->setDefault(true);
    botoes->addButton(Mensagem(kCancelar), QDialogButtonBox::RejectRole);
    connect(botoes, &QDialogButtonBox::accepted, this, &CIDlgOpcoes::accept);
    connect(botoes, &QDialogButtonBox::rejected, this, &QDialog::reject);
    auto* layout = new QVBoxLayout(this);
    layout->addWidget(tabela_);
    layout->addWidget(botoes);
}

QWidget* CIDlgOpcoes::CriaEditor(const QString& chave, const QString& valor) {
    if (chave.endsWith("_SN")) return Lista({{Mensagem(kSim), "S"}, {Mensagem(kNao), "N"}}, valor);
    if (chave.endsWith("_LP"))
        return Lista({{Mensagem(kPaisagem), "L"}, {Mensagem(kRetrato), "P"}}, valor);
    if (chave.endsWith("ILO")) {
        // None, then the plot style tables the host has.
        std::vector<std::pair<QString, QString>> estilos = {{QString(), QString()}};
        const QString pasta = PastaEstilos();
        if (!pasta.isEmpty())
            for (const QString& arquivo : QDir(pasta).entryList({"*.ctb", "*.CTB"}, QDir::Files,
                                                                QDir::Name | QDir::IgnoreCase))
                estilos.emplace_back(arquivo, arquivo);
        return Lista(estilos, valor);
    }
    if (chave.endsWith("_PZ")) {
        std::vector<std::pair<QString, QString>> papeis;
        for (int i = 0; i < kPapeis; ++i) {
            const QString nome = Mensagem(kPrimeiroPapel + i);
            papeis.emplace_back(nome, nome);
        }
        QComboBox* lista = Lista(papeis, valor);
        // No paper yet reads as the upright A4 sheet.
        if (valor.isEmpty())
            for (int i = 0; i < lista->count(); ++i)
                if (lista->itemText(i).startsWith("A4")) {
                    lista->setCurrentIndex(i);
                    break;
                }
        return lista;
    }
    auto* campo = new QLineEdit(valor);
    if (chave.endsWith("_INT")) campo->setValidator(new QIntValidator(0, 1000000, campo));
    return campo;
}

QString CIDlgOpcoes::Valor(int linha) const {
    QWidget* editor = tabela_->cellWidget(linha, 1);
    if (auto* lista = qobject_cast<QComboBox*>(editor)) return lista->currentData().toString();
    if (auto* campo = qobject_cast<QLineEdit*>(editor)) return campo->text();
    return {};
}

QWidget* CIDlgOpcoes::Editor(const QString& chave) const {
    for (int i = 0; i < int(chaves_.size()); ++i)
        if (chaves_[size_t(i)] == chave) return tabela_->cellWidget(i, 1);
    return nullptr;
}

void CIDlgOpcoes::accept() {
    for (int i = 0; i < int(chaves_.size()); ++i)
        exportacao_.SetOpcao(chaves_[size_t(i)], Valor(i));
    QDialog::accept();
}
