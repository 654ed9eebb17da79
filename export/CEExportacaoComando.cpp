// The export command's road from the dialog to the file and the messages on the way.
#include "CEExportConfigs.h"
#include "CEExportacao.h"
#include "RespostasExportacao.h"
#include "cad/CICad.h"
#include "dialogs/CIDlgExporta.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "module/ZVResultado.h"
#include "settings/CIMensagens.h"

#include <QApplication>

#include <exception>

namespace {

constexpr int kArquivoNaoGravado = 960;
constexpr int kConfiguracaoDanificada = 961;
constexpr int kRespostaInvalida = 962;

void Avisa(int numero, const QString& detalhe) {
    CICad::Imprime("\n" + CIMensagens::Mensagem("ZVLISTAS", numero) + detalhe + "\n");
    ZVResultado::Falhou();
}

// A host without windows answers the dialog from its script; a bad answer is reported.
RespostasExportacao::Resultado PreencheDoRoteiro(CEExportacao& exp, CEExportConfigs& configs,
                                                 const QString& tipoPalavra,
                                                 zvsdk::UserInterface& ui) {
    QString erro;
    const auto resultado = RespostasExportacao::Preenche(exp, configs, tipoPalavra, ui,
                                                         CIMensagens::IdiomaAtual(), &erro);
    if (resultado == RespostasExportacao::Resultado::Invalido) Avisa(kRespostaInvalida, erro);
    return resultado;
}

}  // namespace

void CEExportacao::Exporta(const QString& tipoPalavra, FuncaoLeitor leitor) {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    zvsdk::UserInterface* ui = servicos ? servicos->userInterface() : nullptr;
    if (!ui) return;
    CEExportConfigs& configs = CEExportConfigs::Global();
    try {
        configs.CarregaConfigs();
    } catch (const std::exception& e) {
        // A damaged file stays for the user to see; nothing is exported from it.
        return Avisa(kConfiguracaoDanificada, QString::fromLocal8Bit(e.what()));
    }
    CEExportacao exp;
    // A host that shows dialogs runs in a widget application; any other answers from a script.
    if (ui->showsDialogs() && qobject_cast<QApplication*>(QCoreApplication::instance())) {
        CIDlgExporta dialogo(&exp, &configs, tipoPalavra);
        if (dialogo.Executa() != 1) {
            ZVResultado::Cancelado();
            return;
        }
    } else {
        switch (PreencheDoRoteiro(exp, configs, tipoPalavra, *ui)) {
            case RespostasExportacao::Resultado::Cancelado:
                ZVResultado::Cancelado();
                return;
            case RespostasExportacao::Resultado::Invalido:
                return;
            case RespostasExportacao::Resultado::Confirmado:
                break;
        }
    }
    // The routes module that wire lengths need is part of this host, so there is nothing
    // to load before the run.
    exp.Leitor = std::move(leitor);
    if (!exp.Executa()) return Avisa(kArquivoNaoGravado, exp.Erro);
    ui->showFile(exp.Arquivo);
    CICad::Regenera();
}
