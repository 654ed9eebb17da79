#include "CIDlgExporta.h"

#include "CIDlgExportConfig.h"
#include "CIDlgNome.h"
#include "CIDlgOpcoes.h"
#include "CIFiltro.h"
#include "CISelProps.h"
#include "cad/CICad.h"
#include "export/CEExportConfigs.h"
#include "export/CEExportacao.h"
#include "export/RespostasExportacao.h"
#include "host/sdk/Document.h"
#include "host/sdk/SystemServices.h"
#include "readers/SelecaoPaginas.h"
#include "settings/CIMensagens.h"

#include <QComboBox>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QSignalBlocker>
#include <QStandardPaths>
#include <QVBoxLayout>

using namespace JanelaDialogo;

namespace {

constexpr int kTituloJanela = 1;
constexpr int kArquivoExiste = 0x37;
constexpr int kNaoSalva = 0xFF;
constexpr int kNomeProposto = 0xE9;
constexpr int kNomeExiste = 0x100;
constexpr int kNomeExisteCaixa = 0x101;
constexpr int kConfirmaExclusao = 0x104;
constexpr int kFiltros = 7;
constexpr int kPaginas = 8;
constexpr int kRotuloPaginas = 0xD;

// The kinds of list in the order the dialog offers them, with their labels.
constexpr std::pair<int, int> kTipos[] = {
    {10, CEExportacao::Bornes},  {0xB, CEExportacao::Fios},       {0xF8, CEExportacao::Anilhas},
    {0x36, CEExportacao::Comps}, {0xC, CEExportacao::FiosEComps}, {0xD, CEExportacao::Paginas},
    {0x4B, CEExportacao::Cabos}, {0x4C, CEExportacao::Tudo},
};
// The formats of the page kind and of the others, in order, with their labels.
constexpr std::pair<int, int> kFormatosPaginas[] = {
    {0x12, CEExportacao::Png}, {0x13, CEExportacao::Dwg}, {0x14, CEExportacao::Dwf},
    {0x15, CEExportacao::Dxf}, {0x16, CEExportacao::Emf}, {0x17, CEExportacao::Pdf},
};
constexpr std::pair<int, int> kFormatosDados[] = {
    {0xE, CEExportacao::Csv},
    {0x10, CEExportacao::Xml},
    {0x11, CEExportacao::Html},
    {0xFB, CEExportacao::Xlsx},
};

int RotuloFormato(int formato) {
    for (const auto& [rotulo, numero] : kFormatosPaginas)
        if (numero == formato) return rotulo;
    for (const auto& [rotulo, numero] : kFormatosDados)
        if (numero == formato) return rotulo;
    return 0;
}

// The file dialog's pattern of a format; images are offered as bitmaps, as always.
QString Padrao(int formato) {
    return formato == CEExportacao::Png ? QStringLiteral("*.BMP")
                                        : "*." + CEExportacao::PalavraDeTipoOut(formato);
}

bool ExisteSemCaixa(const CEExportConfigs& configs, const QString& nome) {
    for (const auto& config : configs.Configs)
        if (config->Nome.compare(nome, Qt::CaseInsensitive) == 0) return true;
    return false;
}

QPushButton* Botao(int texto) {
    auto* botao = new QPushButton(Mensagem(texto));
    botao->setAutoDefault(false);
    return botao;
}

}  // namespace

CIDlgExporta::CIDlgExporta(CEExportacao* exportacao, CEExportConfigs* configs,
                           const QString& tipoPalavra, QWidget* pai)
    : QDialog(pai ? pai : JanelaPrincipal()),
      exportacao_(exportacao),
      configs_(configs),
      tipoDado_(tipoPalavra),
      rascunho_(std::make_unique<CEExportacao>()),
      nome_(new QLineEdit),
      tipo_(new QComboBox),
      formato_(new QComboBox),
      arquivo_(new QLineEdit),
      paginas_(new QLineEdit),
      resumo_(new QListWidget),
      botaoPaginas_(Botao(kPaginas)),
      botaoFiltros_(Botao(kFiltros)),
      botaoExcluir_(Botao(kExcluir)) {
    nome_->setReadOnly(true);
    paginas_->setReadOnly(true);
    paginas_->setPlaceholderText(Mensagem(kTodasPaginas));
    arquivo_->setMinimumWidth(380);
    // The desktop's tests and a user's accessibility tools find the file field by name.
    arquivo_->setObjectName("export:file");
    setObjectName("export");
    for (const auto& [rotulo, numero] : kTipos)
        tipo_->addItem(Mensagem(rotulo), numero);
    connect(tipo_, QOverload<int>::of(&QComboBox::activated), this, &CIDlgExporta::MudaTipo);
    connect(formato_, QOverload<int>::of(&QComboBox::activated), this, &CIDlgExporta::MudaFormato);

    auto* linhaConfig = new QHBoxLayout;
    linhaConfig->addWidget(nome_, 1);
    const std::pair<int, void (CIDlgExporta::*)()> acoesConfig[] = {
        {kNova, &CIDlgExporta::NovaConfig},
        {kAbrir, &CIDlgExporta::AbreConfig},
        {kSalvar, nullptr},
    };
    for (const auto& [texto, acao] : acoesConfig) {
        QPushButton* botao = Botao(texto);
        if (acao)
            connect(botao, &QPushButton::clicked, this, acao);
        else
            connect(botao, &QPushButton::clicked, this, [this] { SalvaConfig(); });
        linhaConfig->addWidget(botao);
    }
    connect(botaoExcluir_, &QPushButton::clicked, this, &CIDlgExporta::ExcluiConfig);
    linhaConfig->addWidget(botaoExcluir_);

    auto* linhaArquivo = new QHBoxLayout;
    linhaArquivo->addWidget(arquivo_, 1);
    QPushButton* procurar = Botao(kProcurar);
    connect(procurar, &QPushButton::clicked, this, &CIDlgExporta::Procura);
    linhaArquivo->addWidget(procurar);
    connect(arquivo_, &QLineEdit::textEdited, this, [this] { Atualiza(); });

    auto* linhaPaginas = new QHBoxLayout;
    linhaPaginas->addWidget(paginas_, 1);
    connect(botaoPaginas_, &QPushButton::clicked, this, &CIDlgExporta::SelecionaPaginas);
    linhaPaginas->addWidget(botaoPaginas_);

    auto* formulario = new QFormLayout;
    formulario->addRow(Mensagem(kConfiguracao), linhaConfig);
    formulario->addRow(Mensagem(kTipoLista), tipo_);
    formulario->addRow(Mensagem(kFormato), formato_);
    formulario->addRow(Mensagem(kArquivo), linhaArquivo);
    formulario->addRow(Mensagem(kRotuloPaginas), linhaPaginas);
    resumo_->setSelectionMode(QAbstractItemView::NoSelection);
    resumo_->setFocusPolicy(Qt::NoFocus);
    resumo_->setMinimumHeight(150);
    formulario->addRow(Mensagem(kColunasExportadas), resumo_);
    rotuloResumo_ = formulario->labelForField(resumo_);

    auto* editores = new QHBoxLayout;
    QPushButton* colunas = Botao(kColunasBotao);
    connect(colunas, &QPushButton::clicked, this, &CIDlgExporta::AbreColunas);
    connect(botaoFiltros_, &QPushButton::clicked, this, &CIDlgExporta::AbreFiltros);
    QPushButton* opcoes = Botao(kOpcoesBotao);
    connect(opcoes, &QPushButton::clicked, this, &CIDlgExporta::AbreOpcoes);
    editores->addWidget(colunas);
    editores->addWidget(botaoFiltros_);
    editores->addWidget(opcoes);
    editores->addStretch();
    auto* ok = new QPushButton(Mensagem(kOk));
    ok->setDefault(true);
    connect(ok, &QPushButton::clicked, this, &CIDlgExporta::accept);
    QPushButton* cancelar = Botao(kCancelar);
    connect(cancelar, &QPushButton::clicked, this, &CIDlgExporta::reject);
    editores->addWidget(ok);
    editores->addWidget(cancelar);

    auto* layout = new QVBoxLayout(this);
    layout->addLayout(formulario);
    layout->addStretch();
    layout->addLayout(editores);
    setWindowTitle(Mensagem(kTituloJanela));
}

CIDlgExporta::~CIDlgExporta() = default;

int CIDlgExporta::Executa() {
    Inicia();
    return exec() == QDialog::Accepted ? 1 : 0;
}

void CIDlgExporta::Inicia() {
    NomeConfig = configs_->ObtemConfigAtiva();
    CarregaTela(RespostasExportacao::PalavraInicial(*configs_, NomeConfig, tipoDado_));
    modificada_ = false;
    Atualiza();
}

void CIDlgExporta::CarregaTela(const QString& palavra) {
    TipoPalavra = palavra;
    RespostasExportacao::CarregaTela(*rascunho_, *configs_, NomeConfig, palavra,
                                     CIMensagens::IdiomaAtual());
    {
        const QSignalBlocker bloqueio(tipo_);
        tipo_->setCurrentIndex(tipo_->findData(rascunho_->TipoIn));
    }
    AtualizaFormatos();
    AplicaFormato();
    TipoAnterior = rascunho_->TipoIn;
}

void CIDlgExporta::AtualizaFormatos() {
    const bool paginas = rascunho_->TipoIn == CEExportacao::Paginas;
    const QSignalBlocker bloqueio(formato_);
    if (TipoAnterior < 0 || (TipoAnterior == CEExportacao::Paginas) != paginas) {
        formato_->clear();
        if (paginas)
            for (const auto& [rotulo, numero] : kFormatosPaginas)
                formato_->addItem(Mensagem(rotulo), numero);
        else
            for (const auto& [rotulo, numero] : kFormatosDados)
                formato_->addItem(Mensagem(rotulo), numero);
        formato_->setCurrentIndex(0);
    }
    const int achado = formato_->findData(rascunho_->TipoOut);
    formato_->setCurrentIndex(achado < 0 ? 0 : achado);
    rascunho_->TipoOut = rascunho_->TipoOutPagina = formato_->currentData().toInt();
}

void CIDlgExporta::AplicaFormato() {
    arquivo_->setText(NomeArquivo(arquivo_->text(), CEExportacao::ExtensaoDe(rascunho_->TipoOut),
                                  ArquivoPadrao()));
    arquivo_->setCursorPosition(arquivo_->text().size());
}

void CIDlgExporta::MudaTipo(int indice) {
    const int tipo = tipo_->itemData(indice).toInt();
    if (tipo == rascunho_->TipoIn) return;
    CarregaTela(CEExportacao::PalavraDeTipoIn(tipo));
    Atualiza();
}

void CIDlgExporta::MudaFormato(int indice) {
    const int formato = formato_->itemData(indice).toInt();
    if (formato == rascunho_->TipoOut) return;
    rascunho_->TipoOut = rascunho_->TipoOutPagina = formato;
    AplicaFormato();
    Modifica();
}

void CIDlgExporta::Procura() {
    const int formato = rascunho_->TipoOut;
    const QString filtro = Mensagem(RotuloFormato(formato)) + "|" + Padrao(formato) + "|";
    QString escolhido;
    if (EscolheArquivo) {
        escolhido = EscolheArquivo(filtro, arquivo_->text(), Mensagem(kTituloJanela));
    } else {
        // The product's palette stays locked while a file dialog is open.
        CICad::zvInvokeVoid("zvAlternaStatusBloqueioPalette");
        escolhido = CICad::DialogoArquivo(false, filtro, arquivo_->text(), Mensagem(kTituloJanela),
                                          "export:file");
        CICad::zvInvokeVoid("zvAlternaStatusBloqueioPalette");
        if (QDir::separator() == '/') escolhido.replace('\\', '/');
    }
    if (escolhido.isEmpty()) return;
    arquivo_->setText(escolhido);
    arquivo_->setCursorPosition(escolhido.size());
    Atualiza();
}

void CIDlgExporta::SelecionaPaginas() {
    // The picker works on the drawing, so the dialog steps aside while it runs.
    hide();
    std::optional<QStringList> escolhidas;
    if (EscolhePaginas)
        escolhidas = EscolhePaginas();
    else
        ::SelecionaPaginas(true, escolhidas);
    show();
    raise();
    activateWindow();
    if (!escolhidas) return;
    QString paginas;
    for (const QString& pagina : *escolhidas)
        paginas += pagina + ";";
    rascunho_->SetOpcao("PAGINAS", paginas);
    Atualiza();
}

void CIDlgExporta::AbreColunas() {
    CISelProps dialogo(rascunho_->Colunas, this);
    dialogo.MostraDialogo = MostraDialogo;
    if (Mostra(MostraDialogo, dialogo) == QDialog::Accepted) Modifica();
}

void CIDlgExporta::AbreFiltros() {
    CIFiltro dialogo(*rascunho_, this);
    if (Mostra(MostraDialogo, dialogo) == QDialog::Accepted) Modifica();
}

void CIDlgExporta::AbreOpcoes() {
    CIDlgOpcoes dialogo(*rascunho_, rascunho_->TipoOut, this);
    if (Mostra(MostraDialogo, dialogo) == QDialog::Accepted) Modifica();
}

void CIDlgExporta::NovaConfig() {
    const QString base = Mensagem(kNomeProposto);
    QString proposto = base;
    for (int n = 1; ExisteSemCaixa(*configs_, proposto); ++n)
        proposto = base + " " + QString::number(n);
    QString nome;
    for (;;) {
        CIDlgNome dialogo(proposto, this);
        if (Mostra(MostraDialogo, dialogo) != QDialog::Accepted) return;
        nome = dialogo.Nome();
        if (nome.isEmpty()) return;
        proposto = nome;
        if (configs_->Config(nome)) {
            Avisa(MostraDialogo, this, kNomeExiste);
        } else if (ExisteSemCaixa(*configs_, nome)) {
            Avisa(MostraDialogo, this, kNomeExisteCaixa);
        } else {
            break;
        }
    }
    // The new configuration starts as what the dialog shows; it is stored when saved.
    NomeConfig = nome;
    Modifica();
}

void CIDlgExporta::AbreConfig() {
    QStringList nomes;
    for (const auto& config : configs_->Configs)
        if (!config->Nome.isEmpty()) nomes << config->Nome;
    CIDlgExportConfig dialogo(nomes, NomeConfig, this);
    if (Mostra(MostraDialogo, dialogo) != QDialog::Accepted) return;
    const QString escolhida = dialogo.Selecionada();
    if (escolhida.isEmpty() || !GuardaAlteracoes()) return;
    NomeConfig = escolhida;
    configs_->DefineConfigAtiva(escolhida);
    CarregaTela(RespostasExportacao::PalavraInicial(*configs_, escolhida, tipoDado_));
    modificada_ = false;
    Atualiza();
}

bool CIDlgExporta::SalvaConfig() {
    const CEExportacao& r = *rascunho_;
    const QString palavra = CEExportacao::PalavraDeTipoIn(r.TipoIn);
    CEExportSecao& secao = configs_->ObtemSecao(NomeConfig, palavra);
    CEExportSecao& geral = configs_->ObtemSecao(NomeConfig, QString());
    secao.Opcoes.definir("TIPO_IN", palavra);
    geral.Opcoes.definir("TIPO_IN", palavra);
    secao.Opcoes.definir("TIPO_OUT", CEExportacao::PalavraDeTipoOut(r.TipoOut));
    for (const auto& padrao : CEExportSecao::OpcoesPadrao())
        secao.Opcoes.definir(padrao.first, r.GetOpcao(padrao.first));
    secao.Colunas.clear();
    for (const CEPropExport& c : r.Colunas)
        secao.Colunas.push_back({c.Tag, c.Visivel, c.Agrupa, c.Titulo, c.Literal, c.Concatena,
                                 c.Direita, c.Tamanho, c.Preenche});
    secao.Filtros.clear();
    for (const CEFiltroExport& f : r.Filtros)
        secao.Filtros.push_back({f.Campo, f.Operador, f.Valor});
    configs_->DefineConfigAtiva(NomeConfig);
    QString erro;
    const bool gravou = configs_->SalvaConfigs(&erro);
    // The user is not told, but the mark stays while the file does not hold the changes.
    if (!gravou) CICad::Log("The export configuration was not saved: " + erro);
    modificada_ = !gravou;
    Atualiza();
    return gravou;
}

void CIDlgExporta::ExcluiConfig() {
    if (NomeConfig.isEmpty()) return;
    if (Pergunta(MostraDialogo, this, kConfirmaExclusao, QMessageBox::Yes | QMessageBox::No) !=
        QMessageBox::Yes)
        return;
    configs_->RemoveConfig(NomeConfig);
    QString erro;
    if (!configs_->SalvaConfigs(&erro))
        CICad::Log("The export configuration was not saved: " + erro);
    NomeConfig = configs_->Configs.empty() ? QString() : configs_->Configs.front()->Nome;
    CarregaTela(RespostasExportacao::PalavraInicial(*configs_, NomeConfig, tipoDado_));
    modificada_ = false;
    Atualiza();
}

bool CIDlgExporta::GuardaAlteracoes() {
    if (!modificada_) return true;
    const auto resposta = Pergunta(MostraDialogo, this, kNaoSalva,
                                   QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel);
    if (resposta == QMessageBox::Cancel) return false;
    if (resposta == QMessageBox::Yes) SalvaConfig();
    return true;
}

void CIDlgExporta::accept() {
    const QString arquivo = arquivo_->text().trimmed();
    if (arquivo.isEmpty()) {
        // Nothing to write to: the user types or browses for a file first.
        arquivo_->setFocus();
        return;
    }
    if (QFile existente(arquivo); existente.open(QIODevice::ReadOnly)) {
        existente.close();
        if (Pergunta(MostraDialogo, this, kArquivoExiste, QMessageBox::Yes | QMessageBox::No) !=
            QMessageBox::Yes)
            return;
    }
    if (!GuardaAlteracoes()) return;
    const CEExportacao& r = *rascunho_;
    exportacao_->TipoIn = r.TipoIn;
    exportacao_->TipoOut = r.TipoOut;
    exportacao_->TipoOutPagina = r.TipoOutPagina;
    exportacao_->Arquivo = arquivo;
    exportacao_->Colunas = r.Colunas;
    exportacao_->Filtros = r.Filtros;
    exportacao_->Opcoes = r.Opcoes;
    QDialog::accept();
}

void CIDlgExporta::reject() {
    if (!GuardaAlteracoes()) return;
    QDialog::reject();
}

void CIDlgExporta::Modifica() {
    modificada_ = true;
    Atualiza();
}

void CIDlgExporta::Atualiza() {
    setWindowTitle(Mensagem(kTituloJanela) + " - " + NomeConfig + (modificada_ ? "*" : ""));
    nome_->setText(NomeConfig);
    botaoExcluir_->setEnabled(!NomeConfig.isEmpty());
    const int tipoIn = rascunho_->TipoIn;
    const int formato = rascunho_->TipoOut;
    botaoPaginas_->setEnabled(tipoIn == CEExportacao::Paginas || formato == CEExportacao::Pdf ||
                              formato == CEExportacao::Dwg);
    botaoFiltros_->setEnabled(tipoIn != CEExportacao::Paginas);
    paginas_->setText(rascunho_->GetOpcao("PAGINAS"));
    // Whole pages have no columns to show.
    resumo_->setVisible(tipoIn != CEExportacao::Paginas);
    if (rotuloResumo_) rotuloResumo_->setVisible(tipoIn != CEExportacao::Paginas);
    resumo_->clear();
    for (const CEPropExport& coluna : rascunho_->Colunas)
        if (coluna.Visivel) resumo_->addItem(coluna.Titulo);
}

QString CIDlgExporta::NomeArquivo(const QString& texto, const QString& extensao,
                                  const QString& padrao) {
    QString caminho = texto.isEmpty() ? padrao : texto;
    const int barra = int(std::max(caminho.lastIndexOf('/'), caminho.lastIndexOf('\\')));
    const QString pasta = caminho.left(barra + 1);
    QString nome = caminho.mid(barra + 1);
    const QStringList partes = nome.split('.', Qt::SkipEmptyParts);
    if (!partes.isEmpty()) nome.remove("." + partes.last());
    return pasta + nome + extensao;
}

QString CIDlgExporta::ArquivoPadrao() {
    const zvsdk::Document* documento = zvsdk::activeDocument();
    const QFileInfo desenho(documento ? documento->fileName() : QString());
    QString pasta = desenho.fileName().isEmpty() ? QString() : desenho.absolutePath();
    if (pasta.isEmpty() || !QDir(pasta).exists())
        pasta = QStandardPaths::writableLocation(QStandardPaths::DocumentsLocation);
    if (pasta.isEmpty()) pasta = QDir::rootPath();
    if (!pasta.endsWith('/') && !pasta.endsWith('\\')) pasta += '/';
    const QString nome = desenho.fileName();
    return pasta + (nome.isEmpty() ? QStringLiteral("export") : nome);
}
