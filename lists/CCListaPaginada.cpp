#include "CCListaPaginada.h"

#include "CETemplate.h"
#include "CETemplateLisp.h"
#include "cad/CICad.h"
#include "host/sdk/SystemServices.h"
#include "host/sdk/UserInterface.h"
#include "readers/CEListaAtributos.h"
#include "readers/ZVString.h"
#include "settings/CIMensagens.h"

#include <QDateTime>

#include <algorithm>

namespace {

bool Pergunta(int numero) {
    zvsdk::SystemServices* servicos = zvsdk::systemServices();
    if (!servicos || !servicos->userInterface()) return false;
    return servicos->userInterface()->askYesNo("question:" + QString::number(numero),
                                               CIMensagens::Mensagem("ZVLISTAS", numero), false);
}

}  // namespace

QString CCListaPaginada::CaminhoBloco(const QString& valor) {
    return CICad::GetStringLisp("*DIRETORIO_REDE*") + valor + ".dwg";
}

void CCListaPaginada::ImportaBloco(const Bloco& bloco) {
    if (bloco.existe()) CICad::RecarregaBloco(bloco.arquivo, bloco.nome);
}

void CCListaPaginada::JuntaNome(QSet<QString>& nomes, const QString& nome) {
    nomes << nome.toUpper() << nome.trimmed().toUpper();
}

void CCListaPaginada::JuntaOrdemEQuebras(CETemplate& modelo, QSet<QString>& nomes) {
    for (const char* lista : {"*LISTA_DE_SORT*", "*ZV_CHAVE_QUEBRA_PAGINA*"})
        for (const QString& nome : modelo.LerListaTexto(lista))
            JuntaNome(nomes, nome);
}

bool CCListaPaginada::JuntaCampos(const zv::CEListaAtributos* definicoes, QSet<QString>& nomes,
                                  bool porNome) {
    for (int i = 0; definicoes && i < definicoes->Quantidade(); ++i) {
        const zv::CEAtributo& definicao = (*definicoes)[i];
        if (EhFuncao(definicao.GetTag())) {
            // The function reads its item as `reg`, as a filter does.
            const std::optional<QSet<QString>> lidos =
                porNome ? CETemplateLisp::CamposDaExpressao(definicao.GetValor()) : std::nullopt;
            if (!lidos) return false;
            nomes.unite(*lidos);
            continue;
        }
        JuntaNome(nomes, definicao.GetTag());
        JuntaNome(nomes, definicao.GetValor());
    }
    return true;
}

std::optional<QSet<QString>> CCListaPaginada::CamposDoBloco(const Bloco& bloco, bool porNome) {
    QSet<QString> nomes;
    const std::unique_ptr<zv::CEListaAtributos> doArquivo =
        CICad::LeDefinicoesDoArquivo(bloco.arquivo);
    if (!JuntaCampos(doArquivo.get(), nomes, porNome)) return std::nullopt;
    // The drawing's own block stays when the file fails: without either, nothing says
    // what the rows read.
    OdDbObjectId id;
    const bool noDesenho = CICad::GetBlocoId(bloco.nome, id);
    if (!doArquivo && !noDesenho) return std::nullopt;
    if (noDesenho &&
        !JuntaCampos(CICad::LeDefinicoesAtributos(bloco.arquivo, bloco.nome).get(), nomes, porNome))
        return std::nullopt;
    return nomes;
}

std::vector<CCListaPaginada::Bloco> CCListaPaginada::ResolveBlocos(CETemplate& modelo,
                                                                   const QStringList& simbolos,
                                                                   const QStringList& prefixos,
                                                                   const QString& grupo) {
    std::vector<Bloco> blocos;
    for (int i = 0; i < simbolos.size(); ++i) {
        const QString valor = modelo.LerTexto(simbolos[i]);
        blocos.push_back({simbolos[i], prefixos.value(i) + grupo,
                          valor.isEmpty() ? QString() : CaminhoBloco(valor)});
    }
    for (const Bloco& bloco : blocos)
        if (bloco.existe() && !CICad::ExisteArquivo(bloco.arquivo))
            throw ZVString(CIMensagens::Mensagem("ZVLISTAS", 150) + bloco.arquivo);
    for (const Bloco& bloco : blocos)
        ImportaBloco(bloco);
    return blocos;
}

void CCListaPaginada::CriaPaginas(const QString& grupo, std::vector<CEPaginaLista>& paginas) {
    if (CICad::ExisteGrupo(grupo) && Pergunta(89)) CICad::zvInvokeVoid("apagargrupo", {grupo});
    for (CEPaginaLista& pagina : paginas) {
        zvsdk::ResultBuffer* chamada = zvsdk::newString("criarpagina");
        chamada->rbnext = zvsdk::newString(grupo);
        chamada->rbnext->rbnext = zvsdk::newShort(0);
        CICad::LiberaLista(CICad::InvokeChain(chamada));
        zvsdk::releaseChain(chamada);
        // Whatever layer criarpagina left current is the page, even after a failure.
        pagina.nome = CICad::GetLayerCorrente();
    }
    CICad::zvInvokeVoid("atualizarpaginas");
}

QHash<QString, QString> CCListaPaginada::CamposPrimeiraPagina(int quantidade) {
    const QDateTime agora = QDateTime::currentDateTime();
    return {{"DATA", ZVString::Data(agora.date())},
            {"HORA", ZVString::Hora(agora.time())},
            {"QTD", QString::number(quantidade)},
            {"PAGINA", "1"}};
}

void CCListaPaginada::InsereCampos(const Bloco& bloco, const QString& layer,
                                   const QHash<QString, QString>& campos, bool maiusculas) {
    if (!bloco.existe()) return;
    // Each attribute names by its default value the field it shows.
    CICad::InsereBloco(bloco.arquivo, bloco.nome, layer, 0, 0, 0, 0,
                       [&](const QString&, const QString& padrao) -> std::optional<QString> {
                           return campos.value(maiusculas ? padrao.toUpper() : padrao);
                       });
}

QString CCListaPaginada::AvaliaFuncao(const QString& expressao) {
    CICad::AvaliaLisp("(progn (setq INVOKELISP_LISTAS_TMP " + expressao + " ) (princ))");
    zvsdk::ResultBuffer* valor = CICad::LeSimboloLisp("INVOKELISP_LISTAS_TMP");
    const QString texto = valor && valor->restype == zvsdk::RTSTR ? valor->rstring : QString();
    CICad::LiberaLista(valor);
    return texto;
}

namespace {

// Tags in upper case.
bool EhVariavel(const QString& tag) {
    return tag.startsWith(QLatin1String("VARIAVEL")) || tag.startsWith(QLatin1String("VARIABLE"));
}

CCListaPaginada::CelulaDetalhe NovaCelulaDetalhe(const QString& tag, const QString& padrao) {
    using Celula = CCListaPaginada::CelulaDetalhe;
    const QString maiuscula = tag.toUpper();
    if (EhVariavel(maiuscula)) return Celula{Celula::Tipo::Variavel, CECampoPorNumero::De(padrao)};
    if (CCListaPaginada::EhFuncao(maiuscula)) return Celula{Celula::Tipo::Funcao, {}};
    return Celula{};
}

}  // namespace

void CCListaPaginada::InsereDetalhe(Detalhes& detalhes, const Bloco& bloco, const QString& layer,
                                    const CELinhaLista& linha, bool variasColunas) {
    if (!bloco.existe() || !linha.item) return;
    // A field named by the default value is the attribute's value from the start; functions
    // (their place among the attributes and their text) are worked out in LISP once the
    // reference is whole.
    struct Estado {
        Detalhes& detalhes;
        const CEItemLista& item;
        std::vector<std::pair<size_t, QString>> funcoes;
        size_t indice = 0;
    } estado{detalhes, *linha.item, {}};
    // One capture: the function object holds it in place, without a copy on the heap.
    const auto valores = [&estado](const QString& tag,
                                   const QString& padrao) -> std::optional<QString> {
        CelulaDetalhe& esta = estado.detalhes.celulas.Proxima(tag, padrao, NovaCelulaDetalhe);
        const size_t este = estado.indice++;
        if (esta.tipo == CelulaDetalhe::Tipo::Variavel)
            return esta.campo.Valor(estado.item.campos, padrao);
        if (esta.tipo == CelulaDetalhe::Tipo::Funcao) estado.funcoes.emplace_back(este, padrao);
        return std::nullopt;
    };
    const auto& funcoes = estado.funcoes;
    detalhes.celulas.Inicia(bloco.nome);
    const OdDbObjectId ref =
        detalhes.insercoes.Insere(bloco.arquivo, bloco.nome, layer, linha.x, linha.y, valores);
    if (ref.isNull()) return;
    if (!funcoes.empty()) {
        const std::vector<OdDbObjectId> atributos = CICad::GetIdsAtributos(ref);
        linha.item->paraLisp();
        for (const auto& [posicao, expressao] : funcoes)
            if (posicao < atributos.size())
                CICad::SetValorAtributo(atributos[posicao], AvaliaFuncao(expressao));
        CEItemLista::limparLisp();
    }
    if (!variasColunas && !linha.item->ids.empty() && !linha.item->ids.front().isNull())
        CICad::SetXData(ref, "KVR_ZV_LINK",
                        {{1000, ZVString::DeHandle(linha.item->ids.front().handle())}});
}

CCListaPaginada::Grade CCListaPaginada::Grade::DoModelo(CETemplate& modelo) {
    Grade grade{
        float(CICad::Simples(modelo.LerReal("*X_INIC_LISTA*"))),
        float(CICad::Simples(modelo.LerReal("*Y_INIC_LISTA*"))),
        0,
        0,
        float(CICad::Simples(CETemplateLisp::TextoParaReal(modelo.LerTexto("TAM_DETALHE")))),
        modelo.LerReal("*ESPACO_HORIZONTAL*"),
        modelo.LerInteiro("*LINHAS_POR_PAGINA*"),
        modelo.LerLogico("*COLUNA_SN*") ? modelo.LerInteiro("*NUMERO_COLUNA*") : 1};
    grade.Reinicia();
    return grade;
}

void CCListaPaginada::Grade::Coloca(CEPaginaLista& pagina, CEItemLista* item,
                                    std::shared_ptr<CEItemLista> proprio) {
    // A page's rows take their room at once: a list of a thousand pages would otherwise
    // ask the allocator again at each doubling of each page.
    if (pagina.linhas.capacity() == 0)
        pagina.linhas.reserve(size_t(std::clamp(linhas, 1, kMaxLinhas)) *
                              size_t(std::clamp(colunas, 1, kMaxColunas)));
    pagina.linhas.push_back(
        {item, double(CICad::Simples(x)), double(CICad::Simples(y)), {}, {}, std::move(proprio)});
    ++contagem;
    y = float(CICad::Simples(y - h));
}

bool CCListaPaginada::EhFuncao(const QString& tag) {
    return tag.startsWith(QLatin1String("FUNCAO"), Qt::CaseInsensitive) ||
           tag.startsWith(QLatin1String("FUNCTION"), Qt::CaseInsensitive);
}

OdDbObjectId CCListaPaginada::BlocosPreenchidos::Insere(const QString& arquivo, const QString& nome,
                                                        const QString& layer, double x, double y,
                                                        const CEItemLista& item,
                                                        const Valor& valor) {
    if (arquivo.isEmpty()) return {};
    // The row before's block, named by the very same text, is known to have no functions.
    bool semFuncoes = !nome.isEmpty() && nome.isSharedWith(semFuncoes_);
    if (!semFuncoes) {
        const auto conhecido = comFuncao_.constFind(nome);
        semFuncoes = conhecido != comFuncao_.constEnd() && !conhecido.value();
        if (semFuncoes) semFuncoes_ = nome;
    }
    if (semFuncoes) return insercoes_.Insere(arquivo, nome, layer, x, y, valor);
    const OdDbObjectId referencia = insercoes_.Insere(arquivo, nome, layer, x, y);
    if (referencia.isNull()) return referencia;
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributos(referencia, atributos, false, false);
    bool publicado = false;
    for (int i = 0; atributos && i < atributos->Quantidade(); ++i) {
        zv::CEAtributo& atributo = (*atributos)[i];
        const QString tag = atributo.GetTag();
        if (EhFuncao(tag)) {
            if (!publicado) item.paraLisp();
            publicado = true;
            atributo.SetValor(AvaliaFuncao(atributo.GetValor()));
        } else if (const std::optional<QString> texto = valor(tag, atributo.GetValor())) {
            atributo.SetValor(*texto);
        }
    }
    if (publicado) CEItemLista::limparLisp();
    if (atributos) comFuncao_.insert(nome, publicado);
    return referencia;
}

void CCListaPaginada::Grade::Reinicia() {
    contagem = coluna = 0;
    x = x0;
    y = y0;
}
