#include "CCBorneGrfWriter.h"

#include "CETemplate.h"
#include "CETemplateLisp.h"
#include "cad/CICad.h"
#include "readers/CCBorneDataReader.h"
#include "readers/VetorItens.h"
#include "readers/ZVString.h"
#include "settings/CIMensagens.h"

#include <utility>

namespace {

constexpr auto& kReguas = CCBorneDataReader::kCamposRegua;
constexpr auto& kNumeros = CCBorneDataReader::kCamposNumero;
constexpr int kSemMarca = 4;

using Grade = CCListaPaginada::Grade;

void NovaPagina(std::vector<CEPaginaLista>& paginas, Grade& grade, const CEItemLista& item,
                int indice) {
    grade.Reinicia();
    CEPaginaLista pagina;
    pagina.atributos = paginas.back().atributos;
    pagina.atributos.insert("PAGINA", QString::number(indice));
    for (const char* campo : kReguas)
        pagina.atributos.insert(campo, item.valorCampo(campo));
    paginas.push_back(std::move(pagina));
}

// Blank rows to the end of the column, numbered on from the strip's last terminal.
void Preenche(CEPaginaLista& pagina, Grade& grade, const CEItemLista& ultimo) {
    int numero = ZVString(CCBorneDataReader::Numero(ultimo)).ParaInteiro();
    while (grade.contagem < grade.linhas) {
        auto branco = std::make_shared<CEItemLista>();
        for (const char* campo : kReguas)
            branco->definirCampo(campo, ultimo.valorCampo(campo));
        for (const char* campo : kNumeros)
            branco->definirCampo(campo, QString::number(numero + 1));
        branco->ids.push_back(OdDbObjectId());
        ++numero;
        grade.Coloca(pagina, branco.get(), branco);
    }
}

}  // namespace

std::optional<QSet<QString>> CCBorneGrfWriter::CamposDasLinhas(CETemplate& modelo) {
    QSet<QString> nomes;
    // Only the row block takes an item's fields; the header and footer take the page's.
    const QString valor = modelo.LerTexto("LISTA_DETALHE");
    if (!valor.isEmpty()) {
        const QString nome = "BLK_CTR_LST_DET_BORN" + modelo.LerTexto("FUNCAO_LSTGRT");
        const std::optional<QSet<QString>> doBloco = CCListaPaginada::CamposDoBloco(
            {"LISTA_DETALHE", nome, CCListaPaginada::CaminhoBloco(valor)}, true);
        if (!doBloco) return std::nullopt;
        nomes = *doBloco;
    }
    CCListaPaginada::JuntaOrdemEQuebras(modelo, nomes);
    const std::optional<QSet<QString>> doFiltro =
        CETemplateLisp::CamposDaExpressao(modelo.LerTexto("*FILTRO_TEMPLATE*").trimmed());
    if (!doFiltro) return std::nullopt;
    return nomes.unite(*doFiltro);
}

std::vector<CEPaginaLista> CCBorneGrfWriter::Diagrama(VetorItens& itens, CETemplate& modelo) {
    std::vector<CEPaginaLista> paginas;
    VetorItens presentes;
    for (CEItemLista* item : itens)
        if (item) presentes.push_back(item);
    if (presentes.empty()) return paginas;
    Grade grade = Grade::DoModelo(modelo);
    const QStringList chaves = modelo.LerListaTexto("*ZV_CHAVE_QUEBRA_PAGINA*");
    const int n = int(presentes.size());
    paginas.push_back({});
    paginas.back().atributos = CCListaPaginada::CamposPrimeiraPagina(n);
    for (const char* campo : kReguas)
        paginas.back().atributos.insert(campo, CCBorneDataReader::Regua(*presentes[0]));
    // Read once: nothing in the layout runs LISP that could change it.
    const bool preenche = modelo.LerLogico("*PREENCHE_ATE_FINAL*");
    QString seguinte = CCBorneDataReader::Regua(*presentes[0]);
    for (int i = 0; i < n; ++i) {
        CEItemLista& item = *presentes[size_t(i)];
        grade.Coloca(paginas.back(), &item);
        // Each item's strip is read once: as the next one's, then as its own.
        const QString atual = std::exchange(
            seguinte, i + 1 < n ? CCBorneDataReader::Regua(*presentes[size_t(i + 1)]) : QString());
        bool quebra = false;
        if (!preenche && i + 1 < n) {
            if (atual != seguinte) {
                // The sense is as configured: true leaves blank rows, false breaks the page.
                if (!modelo.LerLogico("*QUEBRA_PAGINA*")) {
                    quebra = true;
                } else {
                    const int espaco = modelo.LerInteiro("*LINHAS_ESPACO*");
                    grade.contagem += espaco;
                    grade.y = float(CICad::Simples(grade.y - espaco * grade.h));
                }
            } else {
                const CEItemLista& proximo = *presentes[size_t(i + 1)];
                for (const QString& chave : chaves)
                    if (proximo.valorCampo(chave) != item.valorCampo(chave)) {
                        quebra = true;
                        break;
                    }
            }
        }
        if (preenche && (i + 1 == n || atual != seguinte)) Preenche(paginas.back(), grade, item);
        if (quebra) NovaPagina(paginas, grade, *presentes[size_t(i + 1)], i + 1);
        // The column end runs after a break too: with no rows per column it moves the new
        // page's first row on a column, or on a page when there is one column.
        if (grade.contagem >= grade.linhas) {
            grade.contagem = 0;
            ++grade.coluna;
            grade.x = float(CICad::Simples(grade.x + grade.espaco));
            grade.y = grade.y0;
            if (grade.coluna >= grade.colunas && i + 1 < n)
                NovaPagina(paginas, grade, *presentes[size_t(i + 1)], i + 1);
        }
    }
    return paginas;
}

void CCBorneGrfWriter::MarcaJumpers(std::vector<CEPaginaLista>& paginas, int colunas) {
    std::vector<CELinhaLista*> linhas;
    for (CEPaginaLista& pagina : paginas)
        for (CELinhaLista& linha : pagina.linhas) {
            linha.marcas.assign(size_t(std::max(colunas, 0)), kSemMarca);
            linhas.push_back(&linha);
        }
    auto coloca = [](CELinhaLista& linha, int coluna, int marca) {
        if (coluna >= 0)
            linha.marcas[size_t(coluna)] = marca;
        else
            linha.marcas_extra.push_back(marca);
    };
    for (size_t h = 0; h < linhas.size(); ++h) {
        const CEItemLista* inicio = linhas[h]->item;
        if (!inicio || !inicio->proximo || inicio->anterior) continue;
        bool emCurso = false;
        int coluna = -1;
        const CEItemLista* atual = inicio;
        // Rows before the head cannot start its bar: the walk begins at the head's row.
        for (size_t r = h; r < linhas.size(); ++r) {
            CELinhaLista* linha = linhas[r];
            if (!atual) break;
            if (!emCurso) {
                if (linha->item != inicio) continue;
                const auto livre = std::find(linha->marcas.begin(), linha->marcas.end(), kSemMarca);
                coluna = livre == linha->marcas.end() ? -1 : int(livre - linha->marcas.begin());
                coloca(*linha, coluna, 0);
                emCurso = true;
                atual = atual->proximo;
            } else if (linha->item == atual) {
                coloca(*linha, coluna, atual->proximo ? 1 : 3);
                atual = atual->proximo;
            } else {
                coloca(*linha, coluna, 2);
            }
        }
    }
}

void CCBorneGrfWriter::ImportaMarcas(CETemplate& modelo, const QString& grupo) {
    static const char* const kSimbolos[] = {"*LISTA_JUMPER_INI*", "*LISTA_JUMPER_MEIO*",
                                            "*LISTA_JUMPER_CONT*", "*LISTA_JUMPER_FIM*"};
    marcas_.clear();
    for (const char* simbolo : kSimbolos) {
        const QString valor = modelo.LerTexto(simbolo);
        const QStringList partes = ZVString(valor).Divide("\\");
        marcas_.push_back({simbolo, (partes.isEmpty() ? QString() : partes.last()) + grupo,
                           CCListaPaginada::CaminhoBloco(valor)});
    }
    for (const auto& marca : marcas_)
        if (!CICad::ExisteArquivo(marca.arquivo))
            throw ZVString(CIMensagens::Mensagem("ZVLISTAS", 150) + marca.arquivo);
    for (const auto& marca : marcas_)
        CICad::RecarregaBloco(marca.arquivo, marca.nome);
}

void CCBorneGrfWriter::InsereMarcas(const CELinhaLista& linha, const QString& layer) {
    auto insere = [&](int marca, double x) {
        if (marca < 0 || marca > 3) return;
        const auto& bloco = marcas_[size_t(marca)];
        detalhes_.insercoes.Insere(bloco.arquivo, bloco.nome, layer, x, linha.y);
    };
    for (size_t k = 0; k < linha.marcas.size(); ++k)
        insere(linha.marcas[k], linha.x + double(k) * distColunas_);
    for (int marca : linha.marcas_extra)
        insere(marca, linha.x + (numColunas_ - 1) * distColunas_);
}

void CCBorneGrfWriter::EscreverItens(VetorItens& itens, CETemplate& modelo) {
    const QString grupo = modelo.LerTexto("FUNCAO_LSTGRT");
    distColunas_ = modelo.LerReal("*DIST_COLUNAS_CFG*");
    numColunas_ = modelo.LerInteiro("*NUM_COLUNAS_CFG*");
    visualizarJumper_ = modelo.LerTexto("*VISUALIZAR_JUMPER_CFG*") == "1";
    const bool variasColunas = modelo.LerLogico("*COLUNA_SN*");
    detalhes_.Reinicia();
    const auto blocos = CCListaPaginada::ResolveBlocos(
        modelo, {"LISTA_CABEC", "LISTA_DETALHE", "LISTA_RODAPE", "LISTA_TOTAL"},
        {"BLK_CTR_LST_CABEC_BORN", "BLK_CTR_LST_DET_BORN", "BLK_CTR_LST_RODAPE_BORN",
         "BLK_CTR_LST_TOTAL_BORN"},
        grupo);
    if (visualizarJumper_) ImportaMarcas(modelo, grupo);
    std::vector<CEPaginaLista> paginas = Diagrama(itens, modelo);
    MarcaJumpers(paginas, numColunas_);
    CCListaPaginada::CriaPaginas(grupo, paginas);
    for (const CEPaginaLista& pagina : paginas) {
        CCListaPaginada::InsereCampos(blocos[0], pagina.nome, pagina.atributos, true);
        for (const CELinhaLista& linha : pagina.linhas) {
            if (!linha.item) continue;
            CCListaPaginada::InsereDetalhe(detalhes_, blocos[1], pagina.nome, linha, variasColunas);
            if (visualizarJumper_) InsereMarcas(linha, pagina.nome);
        }
        CCListaPaginada::InsereCampos(blocos[2], pagina.nome, pagina.atributos, false);
    }
}
