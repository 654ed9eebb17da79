#pragma once
// The export dialog: the user picks a stored configuration (or makes, saves or deletes
// one), a kind of list, a format and a file, the pages, and opens the editors of the
// columns, the filters and the format options. Confirmed, it fills the export driver.
//
// It edits a driver of its own and copies it into the command's driver only on
// confirmation, so a cancel leaves the command's driver as it was. Loading a kind of list
// goes through the same code as the scripted answers of a host without windows
// (RespostasExportacao), so both fill a driver alike.
#include "JanelaDialogo.h"

#include <QDialog>
#include <QStringList>

#include <functional>
#include <memory>
#include <optional>

class CEExportConfigs;
class CEExportacao;
class QComboBox;
class QLineEdit;
class QListWidget;
class QPushButton;

class CIDlgExporta : public QDialog {
public:
    // `tipoPalavra` is the command's kind of list, empty for the general command. The
    // configurations are loaded by the caller (the command reports a damaged file).
    CIDlgExporta(CEExportacao* exportacao, CEExportConfigs* configs, const QString& tipoPalavra,
                 QWidget* pai = nullptr);
    ~CIDlgExporta() override;

    // Loads and shows the dialog; 1 when the user confirmed it, and then the driver holds
    // the kind, formats, file, columns, filters and options.
    int Executa();
    // The start: the active configuration, its last kind (unless the command gave one),
    // then the kind's section.
    void Inicia();

    // The fields' effects, as a user's change of each runs them.
    void MudaTipo(int indice);
    void MudaFormato(int indice);
    void Procura();
    void SelecionaPaginas();
    void AbreColunas();
    void AbreFiltros();
    void AbreOpcoes();
    void NovaConfig();
    void AbreConfig();
    // Stores the dialog's settings as the configuration's section and its last kind, and
    // writes the file; false when the file could not be written (the user is not told).
    bool SalvaConfig();
    void ExcluiConfig();
    // OK and Cancel, with their questions.
    void accept() override;
    void reject() override;

    // The file field's text when the format changes: an empty text takes `padrao` (the
    // drawing's folder and name); the name's last extension goes, wherever it stands in
    // the name, and `extensao` is appended.
    static QString NomeArquivo(const QString& texto, const QString& extensao,
                               const QString& padrao);
    // The drawing's folder and name, or the documents folder when that folder is gone.
    static QString ArquivoPadrao();

    QString NomeConfig;
    QString TipoPalavra;
    int TipoAnterior = -1;
    bool Modificada() const { return modificada_; }
    // What the dialog shows, before it is copied into the command's driver.
    const CEExportacao& Rascunho() const { return *rascunho_; }

    // How sub-dialogs and questions are shown (tests answer them), how the target file
    // and the pages are asked for.
    JanelaDialogo::Mostrador MostraDialogo;
    std::function<QString(const QString& filtro, const QString& inicio, const QString& titulo)>
        EscolheArquivo;
    std::function<std::optional<QStringList>()> EscolhePaginas;

    QComboBox* Tipo() const { return tipo_; }
    QComboBox* Formato() const { return formato_; }
    QLineEdit* Arquivo() const { return arquivo_; }
    QLineEdit* Paginas() const { return paginas_; }
    QListWidget* Resumo() const { return resumo_; }
    QPushButton* BotaoPaginas() const { return botaoPaginas_; }
    QPushButton* BotaoFiltros() const { return botaoFiltros_; }
    QPushButton* BotaoExcluir() const { return botaoExcluir_; }

private:
    void CarregaTela(const QString& palavra);
    void AtualizaFormatos();
    void AplicaFormato();
    void Atualiza();
    void Modifica();
    // Asks about unsaved changes: false when the user cancels.
    bool GuardaAlteracoes();

    CEExportacao* exportacao_;
    CEExportConfigs* configs_;
    QString tipoDado_;
    std::unique_ptr<CEExportacao> rascunho_;
    bool modificada_ = false;
    QLineEdit* nome_;
    QComboBox* tipo_;
    QComboBox* formato_;
    QLineEdit* arquivo_;
    QLineEdit* paginas_;
    QListWidget* resumo_;
    QWidget* rotuloResumo_ = nullptr;
    QPushButton* botaoPaginas_;
    QPushButton* botaoFiltros_;
    QPushButton* botaoExcluir_;
};
