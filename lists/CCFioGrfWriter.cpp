#include "CCFioGrfWriter.h"

#include "CETemplate.h"
#include "CETemplateLisp.h"
#include "cad/CICad.h"
#include "readers/CEListaAtributos.h"
#include "readers/VetorItens.h"
#include "readers/ZVString.h"

#include <cstdint>
#include <iterator>
#include <optional>
#include <span>
#include <string_view>

namespace {

enum { kCabecalho, kDetalhe, kPrimeira, kRodape, kTotal };

// The template's symbol of each block, and the prefix of the block's name in the drawing.
const char* const kSimbolos[] = {"LISTA_CABEC", "LISTA_DETALHE", "LISTA_DETALHE_PRIM",
                                 "LISTA_RODAPE", "LISTA_TOTAL"};
const char* const kPrefixos[] = {"BLK_CTR_LST_CABEC_CABLA", "BLK_CTR_LST_DET_CABLA",
                                 "BLK_CTR_LST_DET_PRIM", "BLK_CTR_LST_RODAPE_CABLA",
                                 "BLK_CTR_LST_TOTAL_CABLA"};

using Grade = CCListaPaginada::Grade;

// A new page goes on with the fields of the page before; PAGINA is the running index of
// the item it starts at.
void NovaPagina(std::vector<CEPaginaLista>& paginas, Grade& grade, int indice) {
    grade.Reinicia();
    CEPaginaLista pagina;
    pagina.atributos = paginas.back().atributos;
    pagina.atributos.insert("PAGINA", QString::number(indice));
    paginas.push_back(std::move(pagina));
}

// Two fields' values as texts; a missing field reads empty.
bool Igual(const QString* a, const QString* b) {
    static const QString kVazio;
    return (a ? *a : kVazio) == (b ? *b : kVazio);
}

bool ComecaCom(const QString& tag, const char* a, const char* b) {
    const QString maiuscula = tag.toUpper();
    return maiuscula.startsWith(QLatin1String(a)) || maiuscula.startsWith(QLatin1String(b));
}

}  // namespace

QStringList CCFioGrfWriter::CamposTotal(const CCListaPaginada::Bloco& total) {
    QStringList campos;
    OdDbObjectId id;
    if (!CICad::GetBlocoId(total.nome, id)) return campos;
    std::unique_ptr<zv::CEListaAtributos> definicoes =
        CICad::GetDefinicoesAtributos(total.arquivo, total.nome);
    for (int i = 0; definicoes && i < definicoes->Quantidade(); ++i) {
        const zv::CEAtributo& definicao = (*definicoes)[i];
        if (ComecaCom(definicao.GetTag(), "VARIAVEL", "VARIABLE") &&
            !campos.contains(definicao.GetValor()))
            campos << definicao.GetValor();
    }
    return campos;
}

std::optional<QSet<QString>> CCFioGrfWriter::CamposDasLinhas(CETemplate& modelo) {
    QSet<QString> nomes;
    const QString grupo = modelo.LerTexto("FUNCAO_LSTGRW");
    // The blocks whose references take an item's fields: the first-row block is never placed.
    for (const size_t bloco : {size_t(kDetalhe), size_t(kTotal)}) {
        const QString valor = modelo.LerTexto(kSimbolos[bloco]);
        if (valor.isEmpty()) continue;
        const std::optional<QSet<QString>> doBloco = CCListaPaginada::CamposDoBloco(
            {kSimbolos[bloco], kPrefixos[bloco] + grupo, CCListaPaginada::CaminhoBloco(valor)});
        if (!doBloco) return std::nullopt;
        nomes.unite(*doBloco);
    }
    CCListaPaginada::JuntaOrdemEQuebras(modelo, nomes);
    CCListaPaginada::JuntaNome(nomes, QStringLiteral("COMPRIMENTO"));
    return nomes;
}

bool CCFioGrfWriter::QuebraComBranco(CETemplate& modelo) {
    Q_UNUSED(modelo);
    return false;
}

std::vector<CEPaginaLista> CCFioGrfWriter::Diagrama(VetorItens& itens, CETemplate& modelo,
                                                    const QStringList& totais) {
    std::vector<CEPaginaLista> paginas;
    Grade grade = Grade::DoModelo(modelo);
    // Null entries are tolerated, and skipped here.
    VetorItens presentes;
    for (CEItemLista* item : itens)
        if (item) presentes.push_back(item);
    const int n = int(presentes.size());
    if (n == 0) return paginas;
    paginas.push_back({});
    paginas.back().atributos = CCListaPaginada::CamposPrimeiraPagina(n);
    presentes.ordenar(modelo.LerListaTexto("*LISTA_DE_SORT*"));
    if (modelo.LerTexto("*ORDEM_CRESCENTE*") != "C") presentes.inverter();
    const QStringList chaves = modelo.LerListaTexto("*ZV_CHAVE_QUEBRA_PAGINA*");
    const int brancas = modelo.LerInteiro("*NUMERO_LINHAS*");
    const bool comBranco = QuebraComBranco(modelo);

    std::vector<double> somas(size_t(totais.size()), 0.0);
    // The fields summed and the break keys by their numbers, found once for all the rows.
    std::vector<CECampoPorNumero> somados, quebras;
    for (const QString& total : totais)
        somados.push_back(CECampoPorNumero::De(total));
    for (const QString& chave : chaves)
        quebras.push_back(CECampoPorNumero::De(chave));
    // Rows repeat a few texts (a length, a quantity): each is read as a number once.
    QHash<QString, double> numeros;
    for (int i = 0; i < n; ++i) {
        CEItemLista& item = *presentes[size_t(i)];
        for (int t = 0; t < totais.size(); ++t) {
            const QString* valor = somados[size_t(t)].Procura(item.campos, totais[t]);
            if (!valor) continue;
            auto numero = numeros.constFind(*valor);
            if (numero == numeros.constEnd())
                numero = numeros.insert(*valor, CETemplateLisp::TextoParaReal(*valor));
            somas[size_t(t)] += numero.value();
        }
        grade.Coloca(paginas.back(), &item);
        if (i + 1 < n) {
            const CEItemLista& proximo = *presentes[size_t(i + 1)];
            for (int c = 0; c < chaves.size(); ++c) {
                CECampoPorNumero& chave = quebras[size_t(c)];
                if (Igual(chave.Procura(proximo.campos, chaves[c]),
                          chave.Procura(item.campos, chaves[c])))
                    continue;
                if (!comBranco) {
                    NovaPagina(paginas, grade, i + 1);
                } else {
                    grade.contagem += brancas;
                    grade.y = float(CICad::Simples(grade.y - brancas * grade.h));
                }
                break;
            }
        }
        // The column end runs after a break too, as the terminal list's does.
        if (grade.contagem >= grade.linhas) {
            grade.contagem = 0;
            grade.y = grade.y0;
            grade.x = float(CICad::Simples(grade.x + grade.espaco));
            ++grade.coluna;
            if (grade.coluna >= grade.colunas && i + 1 < n) NovaPagina(paginas, grade, i + 1);
        }
    }
    // The sorted order is the list's order from here on.
    itens = presentes;

    if (!modelo.LerTexto("LISTA_TOTAL").isEmpty()) {
        auto total = std::make_shared<CEItemLista>();
        const int digitos = CICad::GetIntLisp("PBLINTFIODGTSAFTERDOT", 0);
        for (int t = 0; t < totais.size(); ++t)
            total->definirCampoReal(totais[t], somas[size_t(t)], digitos);
        CEPaginaLista pagina;
        pagina.pagina_total = true;
        grade.Reinicia();
        grade.Coloca(pagina, total.get(), total);
        paginas.push_back(std::move(pagina));
    }
    return paginas;
}

namespace {

// The length as the list prints it: a 32-bit number with the digits asked.
QString ComprimentoImpresso(const QString& comprimento, int digitos) {
    const float numero = float(CETemplateLisp::TextoParaReal(comprimento));
    return ZVString::DeReal(double(numero), digitos);
}

}  // namespace

QString CCFioGrfWriter::ValorVariavel(const CEItemLista& item, const QString& campo, int digitos) {
    const QString valor = item.valorCampo(campo);
    // The length prints as a number; so does any field that holds the same text. A row
    // without a length prints its empty fields as they are.
    const QString comprimento = item.valorCampo("COMPRIMENTO");
    if (comprimento.isEmpty() || valor != comprimento) return valor;
    return ComprimentoImpresso(comprimento, digitos);
}

CCFioGrfWriter::Papel CCFioGrfWriter::PapelDoTag(const QString& tag) {
    // A row block's few tags come back on every row.
    auto achado = papeis_.constFind(tag);
    if (achado != papeis_.constEnd()) return achado.value();
    Papel papel = Papel::Outro;
    if (ComecaCom(tag, "VARIAVEL", "VARIABLE"))
        papel = Papel::Variavel;
    else if (CCListaPaginada::EhFuncao(tag))
        papel = Papel::Funcao;
    else if (ComecaCom(tag, "TOTAL", "TOTAL"))
        papel = Papel::Total;
    papeis_.insert(tag, papel);
    return papel;
}

CCFioGrfWriter::CelulaLinha CCFioGrfWriter::NovaCelula(const QString& tag, const QString& padrao) {
    const Papel papel = PapelDoTag(tag);
    const bool campo = papel == Papel::Variavel || papel == Papel::Total;
    return CelulaLinha{papel, campo ? CECampoPorNumero::De(padrao) : CECampoPorNumero{}};
}

std::optional<QString> CCFioGrfWriter::ValorCelula(Linha& linha, const QString& tag,
                                                   const QString& padrao) {
    CelulaLinha& esta = celulas_.Proxima(
        tag, padrao, [this](const QString& t, const QString& p) { return NovaCelula(t, p); });
    switch (esta.papel) {
        case Papel::Variavel: {
            QString texto = esta.campo.Valor(linha.item.campos, padrao);
            if (linha.comprimento.isEmpty() || texto != linha.comprimento) return texto;
            if (!linha.impresso) linha.impresso = Impresso(linha.comprimento);
            return *linha.impresso;
        }
        case Papel::Total:
            return esta.campo.Valor(linha.item.campos, padrao);
        case Papel::Funcao:
        case Papel::Outro:
            break;
    }
    return std::nullopt;
}

void CCFioGrfWriter::InsereLinha(const CCListaPaginada::Bloco& bloco, const QString& layer,
                                 const CELinhaLista& linha) {
    if (!bloco.existe() || !linha.item) return;
    static const QString kComprimento = QStringLiteral("COMPRIMENTO");
    const CEItemLista& item = *linha.item;
    Linha esta{item, comprimento_.Valor(item.campos, kComprimento), std::nullopt};
    // Two captures: the function object holds them in place, without a copy on the heap.
    const auto valor = [this, &esta](const QString& tag, const QString& padrao) {
        return ValorCelula(esta, tag, padrao);
    };
    celulas_.Inicia(bloco.nome);
    const OdDbObjectId ref =
        preenchidos_.Insere(bloco.arquivo, bloco.nome, layer, linha.x, linha.y, item, valor);
    if (ref.isNull()) return;
    if (!variasColunas_ && !item.ids.empty() && !item.ids.front().isNull()) {
        // The handle's text as DeHandle writes it, made here in UTF-8 for the drawing.
        char digitos[16];
        int n = 0;
        for (std::uint64_t h = item.ids.front().handle(); n == 0 || h; h >>= 4)
            digitos[15 - n++] = "0123456789ABCDEF"[h & 15];
        const std::string_view texto(digitos + 16 - n, size_t(n));
        CICad::SetXDataTextos(ref, "KVR_ZV_LINK", std::span<const std::string_view>(&texto, 1));
    }
}

const QString& CCFioGrfWriter::Impresso(const QString& comprimento) {
    auto achado = impressos_.constFind(comprimento);
    if (achado == impressos_.constEnd())
        achado = impressos_.insert(comprimento, ComprimentoImpresso(comprimento, digitos_));
    return achado.value();
}

void CCFioGrfWriter::EscrevePagina(const CEPaginaLista& pagina) {
    // The first-row block is imported for the template's sake, never placed.
    for (const CELinhaLista& linha : pagina.linhas)
        if (linha.item) InsereLinha(blocos_[kDetalhe], pagina.nome, linha);
}

void CCFioGrfWriter::EscreverItens(VetorItens& itens, CETemplate& modelo) {
    preenchidos_.Reinicia();
    celulas_.Reinicia();
    impressos_.clear();
    comprimento_ = {};
    grupo_ = modelo.LerTexto("FUNCAO_LSTGRW");
    variasColunas_ = modelo.LerLogico("*COLUNA_SN*");
    digitos_ = CICad::GetIntLisp("PBLINTFIODGTSAFTERDOT", 0);
    QStringList simbolos, prefixos;
    for (size_t i = 0; i < std::size(kSimbolos); ++i) {
        simbolos << kSimbolos[i];
        prefixos << kPrefixos[i];
    }
    blocos_ = CCListaPaginada::ResolveBlocos(modelo, simbolos, prefixos, grupo_);
    std::vector<CEPaginaLista> paginas = Diagrama(itens, modelo, CamposTotal(blocos_[kTotal]));
    CCListaPaginada::CriaPaginas(grupo_, paginas);
    for (const CEPaginaLista& pagina : paginas) {
        CCListaPaginada::InsereCampos(blocos_[kCabecalho], pagina.nome, pagina.atributos, true);
        if (!pagina.pagina_total)
            EscrevePagina(pagina);
        else if (!pagina.linhas.empty())
            InsereLinha(blocos_[kTotal], pagina.nome, pagina.linhas.front());
        CCListaPaginada::InsereCampos(blocos_[kRodape], pagina.nome, pagina.atributos, false);
    }
}
