#include "RespostasExportacao.h"

#include "CEExportConfigs.h"
#include "CEExportacao.h"
#include "host/sdk/UserInterface.h"

#include <algorithm>

namespace RespostasExportacao {

namespace {

const QString kPrefixo = QStringLiteral("export:");
const QString kOpcao = QStringLiteral("export:option:");

// The first format of the kind's list: what the dialog selects when the stored one can't be.
int PrimeiroFormato(int tipoIn) {
    return tipoIn == CEExportacao::Paginas ? CEExportacao::Png : CEExportacao::Csv;
}

}  // namespace

void CarregaSecao(CEExportacao& exp, CEExportConfigs& configs, const QString& config,
                  const QString& secao) {
    const CEExportSecao& s = configs.ObtemSecao(config, secao);
    const int formato = CEExportacao::TipoOutDePalavra(s.Opcoes.valor("TIPO_OUT"));
    exp.TipoOut = exp.TipoOutPagina =
        CEExportacao::FormatoServe(exp.TipoIn, formato) ? formato : PrimeiroFormato(exp.TipoIn);
    for (const auto& padrao : CEExportSecao::OpcoesPadrao())
        exp.SetOpcao(padrao.first, s.Opcoes.valor(padrao.first));
    for (auto linha = s.Colunas.rbegin(); linha != s.Colunas.rend(); ++linha) {
        auto coluna =
            std::find_if(exp.Colunas.begin(), exp.Colunas.end(),
                         [&](const CEPropExport& c) { return c.Titulo == linha->Titulo; });
        if (coluna == exp.Colunas.end()) {
            exp.Colunas.emplace_back(linha->Tag);
            coluna = exp.Colunas.end() - 1;
        }
        coluna->Titulo = linha->Titulo;
        coluna->Tamanho = linha->Tamanho;
        coluna->Preenche = linha->Preenche;
        coluna->Visivel = linha->Visivel;
        coluna->Agrupa = linha->Agrupa;
        coluna->Literal = linha->Literal;
        coluna->Concatena = linha->Concatena;
        coluna->Direita = linha->Direita;
        std::rotate(exp.Colunas.begin(), coluna, coluna + 1);
    }
}

QString PalavraInicial(const CEExportConfigs& configs, const QString& config,
                       const QString& tipoPalavra) {
    QString palavra = tipoPalavra;
    if (palavra.isEmpty())
        if (const CEExportConfig* c = configs.Config(config))
            if (const CEExportSecao* geral = c->Secao(QString()))
                palavra = geral->Opcoes.valor("TIPO_IN");
    if (CEExportacao::TipoInDePalavra(palavra) == 0) palavra = QStringLiteral("BORNES");
    return palavra;
}

void CarregaTela(CEExportacao& exp, CEExportConfigs& configs, const QString& config,
                 const QString& palavra, int idioma) {
    exp.TipoIn = CEExportacao::TipoInDePalavra(palavra);
    if (!exp.AplicaConfig(configs, palavra, config))
        exp.Colunas = CEExportacao::ColunasPadrao(exp.TipoIn, idioma);
    CarregaSecao(exp, configs, config, palavra);
}

Resultado Preenche(CEExportacao& exp, CEExportConfigs& configs, const QString& tipoPalavra,
                   zvsdk::UserInterface& ui, int idioma, QString* erro) {
    const auto invalido = [erro](const QString& porque) {
        if (erro) *erro = porque;
        return Resultado::Invalido;
    };
    // Answers the dialog does not know are a script's typing error, not something to skip.
    const QStringList conhecidas = {"export:config", "export:type", "export:format", "export:pages",
                                    "export:file"};
    for (const QString& nome : ui.presetAnswerNames(kPrefixo))
        if (!conhecidas.contains(nome) && !(nome.startsWith(kOpcao) && nome.size() > kOpcao.size()))
            return invalido("unknown answer '" + nome + "'");

    QString config = configs.ObtemConfigAtiva();
    if (const auto dada = ui.presetAnswer("export:config")) {
        if (!configs.Config(*dada))
            return invalido("no export configuration is named '" + *dada + "'");
        config = *dada;
    }

    QString palavra = PalavraInicial(configs, config, tipoPalavra);
    if (const auto dada = ui.presetAnswer("export:type")) {
        if (CEExportacao::TipoInDePalavra(*dada) == 0)
            return invalido("'" + *dada + "' is no kind of list (export:type)");
        palavra = *dada;
    }
    CarregaTela(exp, configs, config, palavra, idioma);

    if (const auto dada = ui.presetAnswer("export:format")) {
        const int formato = CEExportacao::TipoOutDePalavra(*dada);
        if (formato < 0) return invalido("'" + *dada + "' is no export format (export:format)");
        if (!CEExportacao::FormatoServe(exp.TipoIn, formato))
            return invalido("the format " + *dada + " is not for the list " + palavra);
        exp.TipoOut = exp.TipoOutPagina = formato;
    }
    for (const QString& nome : ui.presetAnswerNames(kOpcao))
        exp.SetOpcao(nome.mid(kOpcao.size()), ui.presetAnswer(nome).value_or(QString()));
    if (const auto paginas = ui.presetAnswer("export:pages")) exp.SetOpcao("PAGINAS", *paginas);

    // The target file confirms the dialog; the host names a missing one.
    const auto arquivo = ui.answer("export:file", QStringLiteral("export file"));
    if (!arquivo) return Resultado::Cancelado;
    if (arquivo->trimmed().isEmpty()) return invalido("the answer export:file is empty");
    exp.Arquivo = *arquivo;
    return Resultado::Confirmado;
}

}  // namespace RespostasExportacao
