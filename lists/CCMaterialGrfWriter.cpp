#include "CCMaterialGrfWriter.h"

#include "CETemplate.h"
#include "CETemplateLisp.h"
#include "cad/CICad.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"
#include "readers/NomeCampo.h"
#include "readers/VetorItens.h"
#include "readers/ZVString.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <vector>

namespace {

const QString kCache = QStringLiteral("###FUNCAOCACHE");

bool ComecaCom(const QString& tag, const char* a, const char* b) {
    return tag.startsWith(a, Qt::CaseInsensitive) || tag.startsWith(b, Qt::CaseInsensitive);
}

bool EhFuncao(const QString& tag) {
    return ComecaCom(tag, "FUNCAO", "FUNCTION");
}

bool EhAcessorio(const CEItemLista& item) {
    return item.valorCampo("ZV_LISTA_TIPO").compare("ACE", Qt::CaseInsensitive) == 0;
}

// Fields that name a tag, a wire or cable, or a strip: never spread over rows as families.
bool CampoSemFamilia(const QString& campo) {
    static const QSet<QString> kCampos = {"RELACAO", "TAG",     "ETIQUETA", "CABO",  "FIO",
                                          "WIRE",    "ALAMBRE", "REGUA",    "STRIP", "REGLETA"};
    return kCampos.contains(campo);
}

// The value of an expression for the published item; empty unless a string, and empty after
// an error (the symbol is cleared first, so an earlier row's value can't show through).
QString Avalia(const QString& expressao) {
    CICad::SetNilLisp("INVOKELISP_LISTAS_TMP");
    return CCListaPaginada::AvaliaFuncao(expressao);
}

// The items a walk over chains has met: open addressing in one array, since a large list
// holds hundreds of thousands and a node per item costs more than the sums themselves.
class ItensVistos {
public:
    explicit ItensVistos(size_t quantos) {
        tabela_.assign(std::bit_ceil(std::max<size_t>(16, 2 * quantos)), nullptr);
    }
    bool contem(const CEItemLista* item) const { return tabela_[lugar(item)] == item; }
    void insere(const CEItemLista* item) {
        const size_t i = lugar(item);
        if (tabela_[i] == item) return;
        tabela_[i] = item;
        if (2 * ++quantos_ > tabela_.size()) cresce();
    }

private:
    // The item's slot, or the empty one where it would go.
    size_t lugar(const CEItemLista* item) const {
        const size_t mascara = tabela_.size() - 1;
        size_t i = (std::uintptr_t(item) >> 4) * 0x9E3779B97F4A7C15ull >> 20 & mascara;
        while (tabela_[i] && tabela_[i] != item)
            i = (i + 1) & mascara;
        return i;
    }
    void cresce() {
        std::vector<const CEItemLista*> antiga(tabela_.size() * 2, nullptr);
        antiga.swap(tabela_);
        for (const CEItemLista* item : antiga)
            if (item) tabela_[lugar(item)] = item;
    }

    std::vector<const CEItemLista*> tabela_;
    size_t quantos_ = 0;
};

// Fields shared by members of a group (an accessory's units), before and after its sums:
// the same sums on the same fields give the same fields, shared again.
struct Somados {
    CamposItem antes, depois;
};

// The group's sums into one member's fields.
void SomaMembro(CamposItem& campos, const std::vector<CamposItem::Campo>& lote,
                std::vector<Somados>& somados) {
    if (campos.partilhado()) {
        for (const Somados& s : somados)
            if (s.antes.partilhaCom(campos)) {
                campos = s.depois;
                return;
            }
    }
    // A group's members come from a few units: the oldest goes beyond those.
    constexpr std::size_t kMaxSomados = 8;
    const CamposItem antes = campos.partilhado() ? campos : CamposItem();
    // Room for exactly those it lacks, which the reader mostly left: an array that moved
    // for them, in every item at once, would be new memory for the whole list.
    campos.reservar(size_t(campos.size()) + CCMaterialGrfWriter::SomasAusentes(campos));
    campos.juntarOrdenados(lote);
    if (!antes.partilhado()) return;
    campos.partilhar();
    if (somados.size() >= kMaxSomados) somados.erase(somados.begin());
    somados.push_back({antes, campos});
}

// The running grid, in single precision as the drawing keeps it.
struct Grade {
    float x0 = 0, y0 = 0, x = 0, y = 0;
    double espaco = 0;
    int linhas = 0, colunas = 1, contagem = 0, coluna = 0;
};

}  // namespace

CCMaterialGrfWriter::itemDet CCMaterialGrfWriter::LeEspecificacao(const QString& tag,
                                                                  const QString& texto) {
    itemDet det;
    det.tag = tag;
    det.texto = texto;
    if (texto.startsWith('%')) return det;
    const QStringList partes = ZVString(texto).Divide("%");
    if (partes.size() < 2) return det;
    det.campo = partes[0];
    const QStringList quatro = ZVString(partes[1]).Divide("$");
    if (quatro.size() < 4) return det;
    det.modo = quatro[0];
    det.limite = ZVString(quatro[1]).ParaInteiro();
    det.submodo = quatro[2];
    det.separador = quatro[3];
    det.valido = true;
    return det;
}

std::size_t CCMaterialGrfWriter::SomasAusentes(const CamposItem& campos) {
    // Looked up, not numbered: the reader asks before the sums name them, and the names'
    // order stays that of their first field.
    static const NomeCampo kSomas[] = {NomeCampo(QStringLiteral("QTD")),
                                       NomeCampo(QStringLiteral("COMPRIMENTO")),
                                       NomeCampo(QStringLiteral("LENGTH"))};
    std::size_t ausentes = 0;
    for (const NomeCampo& nome : kSomas) {
        const std::uint32_t numero = nome.ParaBuscar();
        ausentes += numero == CamposItem::kSemNome || !campos.procura(numero) ? 1 : 0;
    }
    return ausentes;
}

void CCMaterialGrfWriter::SomaGrupos(VetorItens& itens, int digitos) {
    // By name number: this reads and writes three fields of every member of every group.
    const std::uint32_t campoQtd = NumeroCampo<"QTD">();
    const std::uint32_t campoComprimento = NumeroCampo<"COMPRIMENTO">();
    const std::uint32_t campoLength = NumeroCampo<"LENGTH">();
    auto real = [](const QString* texto) {
        return texto ? double(float(CETemplateLisp::TextoParaReal(*texto))) : 0.0;
    };
    ItensVistos feitos(itens.size());
    std::vector<Somados> somados;
    for (CEItemLista* item : itens) {
        if (!item || feitos.contem(item)) continue;
        double qtd = 0, comprimento = 0;
        for (CEItemLista* m = item; m && !feitos.contem(m); m = m->ligado) {
            const QString* q = m->campos.procura(campoQtd);
            qtd += !q || q->isEmpty() ? 1.0 : real(q);
            comprimento += real(m->campos.procura(campoComprimento));
            feitos.insere(m);
        }
        const bool inteiro = std::isfinite(qtd) && qtd == std::trunc(qtd) && std::abs(qtd) < 2e9;
        // One text per group, shared by its members.
        const QString textoQtd =
            inteiro ? QString::number(int(qtd)) : ZVString::DeReal(qtd, digitos);
        const QString textoComprimento = ZVString::DeReal(comprimento, digitos);
        // The three fields in one merge: an item's array grows once, if at all.
        std::vector<CamposItem::Campo> lote = {{campoQtd, textoQtd},
                                               {campoComprimento, textoComprimento},
                                               {campoLength, textoComprimento}};
        std::sort(
            lote.begin(), lote.end(),
            [](const CamposItem::Campo& x, const CamposItem::Campo& y) { return x.nome < y.nome; });
        somados.clear();
        for (CEItemLista* m = item; m; m = m->ligado) {
            SomaMembro(m->campos, lote, somados);
            if (m->ligado == item) break;
        }
    }
    for (size_t k = 0; k < itens.size(); ++k)
        if (itens[k]) {
            itens[k]->definirCampoInteiro("SEQUENCIA", int(k + 1));
            itens[k]->definirCampoInteiro("SEQUENCE", int(k + 1));
        }
}

bool CCMaterialGrfWriter::LinhaItem(const CEItemLista& item, Especificacoes& defs, int r,
                                    QHash<QString, QString>& mapa) {
    bool conteudo = false;
    for (itemDet& s : defs)
        s.contador = 0;
    std::vector<QString> atual(defs.size());
    std::vector<QSet<QString>> vistos(defs.size());
    for (const CEItemLista* m = &item; m; m = m->ligado) {
        for (size_t k = 0; k < defs.size(); ++k) {
            itemDet& s = defs[k];
            if (!s.valido) continue;
            if (s.modo.compare("M", Qt::CaseInsensitive) != 0) {
                if (++s.contador == r) mapa[s.texto] = m->valorCampo(s.campo);
            } else if (s.submodo == "C") {
                const QString v = m->valorCampo(s.campo);
                if (vistos[k].contains(v)) continue;
                const int n = int(s.separador.size() + atual[k].size() + v.size());
                if (n > s.limite) {
                    if (s.contador == r) {
                        mapa[s.texto] = atual[k];
                        conteudo = true;
                    }
                    atual[k] = v;
                    ++s.contador;
                } else {
                    atual[k] = atual[k].isEmpty() ? v : atual[k] + s.separador + v;
                }
                vistos[k].insert(v);
            }
        }
    }
    for (int k = 0; k <= r; ++k)
        for (itemDet& s : defs) {
            if (!s.valido || CampoSemFamilia(s.campo)) continue;
            if (s.submodo == "C") {
                QString texto = item.valorCampo(s.campo);
                for (int n = 1; item.temCampo(s.campo + QString::number(n)); ++n)
                    texto += s.separador + item.valorCampo(s.campo + QString::number(n));
                mapa[s.texto] = texto;
            } else if (s.submodo == "L") {
                const QString nome =
                    s.contador == 0 ? s.campo : s.campo + QString::number(s.contador);
                QString valor;
                if (item.obterCampo(nome, valor)) {
                    if (s.contador == r && !valor.isEmpty()) {
                        mapa[s.texto] = valor;
                        conteudo = true;
                    }
                    ++s.contador;
                }
            }
        }
    for (size_t k = 0; k < defs.size(); ++k) {
        const itemDet& s = defs[k];
        if (s.valido && s.modo.compare("M", Qt::CaseInsensitive) == 0 && s.submodo == "C" &&
            s.contador == r) {
            mapa[s.texto] = atual[k];
            conteudo = true;
        }
    }
    return conteudo;
}

bool CCMaterialGrfWriter::LinhaTexto(CEItemLista& item, Especificacoes& defs, int r,
                                     QHash<QString, QString>& mapa, bool ultima, bool& funcao,
                                     bool* temLinha) {
    // The expression runs once per member, not once per wrapped row.
    // A published item must not change: the answers join it once LISP lets go of it.
    std::vector<std::pair<QString, QString>> respostas;
    for (CEItemLista* m = &item; m; m = m->ligado) {
        respostas.clear();
        for (const itemDet& s : defs) {
            if (!s.valido || s.modo.compare("M", Qt::CaseInsensitive) != 0 || !EhFuncao(s.tag))
                continue;
            const QString campo = s.campo + kCache;
            const auto dada = [&campo](const auto& r) { return r.first == campo; };
            if (m->temCampo(campo) || std::any_of(respostas.begin(), respostas.end(), dada))
                continue;
            if (respostas.empty()) m->paraLisp();
            respostas.emplace_back(campo, Avalia(s.campo));
        }
        if (respostas.empty()) continue;
        CEItemLista::limparLisp();
        for (const auto& [campo, valor] : respostas)
            m->definirCampo(campo, valor);
    }
    bool conteudo = false;
    for (const CEItemLista* m = &item; m; m = m->ligado)
        for (const itemDet& s : defs) {
            if (!s.valido || s.modo.compare("M", Qt::CaseInsensitive) != 0 || s.submodo == "C")
                continue;
            QString v = m->valorCampo(s.campo).trimmed();
            QString cache;
            if (EhFuncao(s.tag) && m->obterCampo(s.campo + kCache, cache)) v = cache.trimmed();
            QString linha;
            for (int k = 0; k <= r; ++k) {
                int corte = s.limite;
                for (int p = s.limite; p >= 1; --p)
                    if (p >= v.size() || v[p] == ' ') {
                        corte = p;
                        break;
                    }
                corte = std::max(corte, 0);
                linha = v.left(corte);
                v = v.mid(corte).trimmed();
            }
            mapa[s.texto] = linha;
            if (temLinha && !linha.isEmpty()) *temLinha = true;
            if (!linha.isEmpty() && (!v.isEmpty() || !ultima)) conteudo = true;
            if (!linha.isEmpty() && EhFuncao(s.tag)) funcao = true;
        }
    return conteudo;
}

std::vector<CEPaginaLista> CCMaterialGrfWriter::Diagrama(VetorItens& entrada, CETemplate& modelo) {
    std::vector<CEPaginaLista> paginas;
    VetorItens itens;
    for (CEItemLista* item : entrada)
        if (item) itens.push_back(item);
    if (itens.empty()) return paginas;
    bool multi = false;
    for (const itemDet& s : especificacoes)
        multi = multi || s.valido;
    const int branco = modelo.LerInteiro("*NUM_LINHAS_BRANCO*");
    Grade g;
    g.linhas = modelo.LerInteiro("*LINHAS_POR_PAGINA*");
    g.colunas = modelo.LerLogico("*COLUNA_SN*") ? modelo.LerInteiro("*NUMERO_COLUNA*") : 1;
    g.x0 = g.x = float(CICad::Simples(modelo.LerReal("*X_INIC_LISTA*")));
    g.y0 = g.y = float(CICad::Simples(modelo.LerReal("*Y_INIC_LISTA*")));
    g.espaco = modelo.LerReal("*ESPACO_HORIZONTAL*");
    const float h =
        float(CICad::Simples(CETemplateLisp::TextoParaReal(modelo.LerTexto("TAM_DETALHE"))));
    const float hAce =
        float(CICad::Simples(CETemplateLisp::TextoParaReal(modelo.LerTexto("TAM_DETALHE_VINCL"))));
    const QStringList chaves = modelo.LerListaTexto("*ZV_CHAVE_QUEBRA_PAGINA*");
    const QString quebraCfg = modelo.LerTexto("*QUEBRA_POR_CFG*");
    const int numeroLinhas = modelo.LerInteiro("*NUMERO_LINHAS*");
    const bool vinculos = modelo.LerInteiro("*IMP_VINCL*") == 1;
    const int n = int(itens.size());

    paginas.push_back({});
    paginas.back().atributos = CCListaPaginada::CamposPrimeiraPagina(n);
    paginas.back().atributos.insert("DATE", paginas.back().atributos.value("DATA"));
    paginas.back().atributos.insert("TIME", paginas.back().atributos.value("HORA"));
    paginas.back().atributos.insert("PAGE", "1");

    auto novaPagina = [&](int indice) {
        CEPaginaLista pagina;
        pagina.atributos = paginas.back().atributos;
        pagina.atributos.insert("PAGINA", QString::number(indice));
        pagina.atributos.insert("PAGE", QString::number(indice));
        paginas.push_back(std::move(pagina));
    };
    auto altura = [&](const CEItemLista& item) { return EhAcessorio(item) ? hAce : h; };
    auto coloca = [&](CEItemLista* item, std::shared_ptr<CEItemLista> proprio, float hh) {
        paginas.back().linhas.push_back({item,
                                         double(CICad::Simples(g.x)),
                                         double(CICad::Simples(g.y)),
                                         {},
                                         {},
                                         std::move(proprio)});
        ++g.contagem;
        g.y = float(CICad::Simples(g.y - hh));
    };
    // A key change between item i and the next: blank rows or a new page, at the first.
    auto quebra = [&](int i, bool comAcessorios) {
        if (i + 1 >= n) return;
        const CEItemLista* seguinte = itens[size_t(i + 1)];
        const CEItemLista* este = itens[size_t(i)];
        if (comAcessorios && vinculos) {
            if (EhAcessorio(*seguinte)) return;
            if (EhAcessorio(*este))
                for (int k = i - 1; k >= 0; --k)
                    if (!EhAcessorio(*itens[size_t(k)])) {
                        este = itens[size_t(k)];
                        break;
                    }
        }
        for (const QString& chave : chaves) {
            if (seguinte->valorCampo(chave) == este->valorCampo(chave)) continue;
            if (quebraCfg == "L") {
                g.y = float(CICad::Simples(g.y - float(numeroLinhas) * h));
                g.contagem += numeroLinhas;
            } else if (quebraCfg == "P") {
                novaPagina(i + 1);
                g.contagem = g.coluna = 0;
                g.x = g.x0;
                g.y = g.y0;
            }
            return;
        }
    };
    // Where the current item's first row stands: page and row.
    size_t paginaPrimeira = 0, linhaPrimeira = 0;
    const bool quebraItem = modelo.LerLogico("*QUEBRA_ITEM_SN*");
    auto fimDeColuna = [&](int i, bool restam) {
        if (g.contagem < g.linhas) return;
        g.contagem = 0;
        ++g.coluna;
        g.x = float(CICad::Simples(g.x + g.espaco));
        g.y = g.y0;
        const size_t paginaFim = paginas.size() - 1;
        if (g.coluna >= g.colunas && !restam && i + 1 < n) {
            g.coluna = 0;
            novaPagina(i + 1);
            g.x = g.x0;
        } else if (restam) {
            novaPagina(i + 1);
            g.x = g.x0;
        }
        // An unfinished item that did not start its page moves whole to the new column.
        if (!restam || quebraItem || paginaPrimeira != paginaFim || linhaPrimeira == 0) return;
        std::vector<CELinhaLista>& origem = paginas[paginaFim].linhas;
        std::vector<CELinhaLista> movidas(
            std::make_move_iterator(origem.begin() + long(linhaPrimeira)),
            std::make_move_iterator(origem.end()));
        origem.erase(origem.begin() + long(linhaPrimeira), origem.end());
        paginaPrimeira = paginas.size() - 1;
        linhaPrimeira = paginas.back().linhas.size();
        for (CELinhaLista& linha : movidas) {
            const float hh = linha.item ? altura(*itens[size_t(i)]) : h;
            coloca(linha.item, std::move(linha.proprio), hh);
        }
    };

    int r = 0;
    for (int i = 0; i < n;) {
        CEItemLista& item = *itens[size_t(i)];
        Especificacoes& defs = EhAcessorio(item) ? especificacoesAce : especificacoes;
        const float hh = altura(item);
        QHash<QString, QString> mapa;
        bool funcao = false;
        const bool a = LinhaItem(item, defs, r, mapa);
        bool temLinha = false;
        const bool b =
            LinhaTexto(item, defs, r, mapa, g.contagem + 1 >= g.linhas, funcao, &temLinha);
        // `pede`: the item wants a further row. A last line on a column's last row asks for
        // none, but is still drawn: its text must not be lost.
        const bool pede = a || funcao || b;
        CEItemLista* linhaItem = nullptr;
        if (r == 0) {
            coloca(&item, nullptr, hh);
            paginaPrimeira = paginas.size() - 1;
            linhaPrimeira = paginas.back().linhas.size() - 1;
            linhaItem = &item;
        } else if (multi && (pede || temLinha)) {
            auto continua = std::make_shared<CEItemLista>();
            if (EhAcessorio(item)) continua->definirCampo("ZV_LISTA_TIPO", "ACE");
            linhaItem = continua.get();
            coloca(linhaItem, continua, hh);
        } else {
            // The item is done: blank rows, then the break before the next one.
            for (int k = 0; k < branco && !paginas.back().linhas.empty(); ++k) {
                auto vazio = std::make_shared<CEItemLista>();
                coloca(vazio.get(), vazio, h);
                if (g.contagem >= g.linhas) {
                    const size_t antes = paginas.size();
                    fimDeColuna(i, false);
                    if (paginas.size() != antes || g.coluna >= g.colunas) break;
                }
            }
            quebra(i, true);
            fimDeColuna(i, false);
            r = 0;
            ++i;
            continue;
        }
        for (auto it = mapa.constBegin(); it != mapa.constEnd(); ++it)
            linhaItem->definirCampo(it.key(), it.value());
        if ((!multi || !pede) && branco < 1) {
            r = 0;
            quebra(i, false);
            fimDeColuna(i, false);
            ++i;
        } else {
            ++r;
            fimDeColuna(i, multi && pede);
        }
    }

    if (!modelo.LerTexto("LISTA_TOTAL").isEmpty()) {
        CEPaginaLista total;
        total.pagina_total = true;
        auto somas = std::make_shared<CEItemLista>();
        for (const auto& [campo, soma] : totais)
            somas->definirCampoReal(campo, soma, digitos_);
        total.linhas.push_back({somas.get(), double(g.x0), double(g.y0), {}, {}, somas});
        paginas.push_back(std::move(total));
    }
    while (!paginas.empty() && paginas.back().linhas.empty())
        paginas.pop_back();
    return paginas;
}

void CCMaterialGrfWriter::LeEspecificacoes(const std::vector<CCListaPaginada::Bloco>& blocos) {
    auto le = [](const CCListaPaginada::Bloco& bloco, Especificacoes& defs) {
        defs.clear();
        if (!bloco.existe()) return;
        const auto definicoes = CICad::GetDefinicoesAtributos(bloco.arquivo, bloco.nome);
        for (int i = 0; definicoes && i < definicoes->Quantidade(); ++i)
            defs.push_back(LeEspecificacao((*definicoes)[i].GetTag(), (*definicoes)[i].GetValor()));
    };
    le(blocos[1], especificacoes);
    le(blocos[2], especificacoesAce);
    totais.clear();
    if (!blocos[4].existe()) return;
    const auto definicoes = CICad::GetDefinicoesAtributos(blocos[4].arquivo, blocos[4].nome);
    for (int i = 0; definicoes && i < definicoes->Quantidade(); ++i)
        if (ComecaCom((*definicoes)[i].GetTag(), "VARIAVEL", "VARIABLE"))
            totais.emplace((*definicoes)[i].GetValor(), 0.0);
}

void CCMaterialGrfWriter::Pergunta(const std::vector<CCListaPaginada::Bloco>& blocos) {
    const CCListaPaginada::Bloco* ordem[4] = {&blocos[0], &blocos[1], &blocos[2], &blocos[3]};
    for (int b = 0; b < 4; ++b) {
        respostas_[b].clear();
        if (!ordem[b]->existe()) continue;
        const auto definicoes = CICad::GetDefinicoesAtributos(ordem[b]->arquivo, ordem[b]->nome);
        QSet<QString> vistos;
        for (int i = 0; definicoes && i < definicoes->Quantidade(); ++i) {
            const zv::CEAtributo& d = (*definicoes)[i];
            if (!d.GetTag().startsWith("ENTRADA", Qt::CaseInsensitive)) continue;
            const QString prompt = d.GetPrompt().isEmpty() ? d.GetTag() : d.GetPrompt();
            if (vistos.contains(prompt)) continue;
            vistos.insert(prompt);
            respostas_[b].emplace_back(prompt, QString());
        }
        if (respostas_[b].empty()) continue;
        QString texto = "(ENTRA_VIA_DD (LIST ";
        for (const auto& [prompt, resposta] : respostas_[b])
            texto += "\"" + QString(prompt).replace("\\", "\\\\").replace("\"", "\\\"") + "\" ";
        texto += "))";
        if (!CICad::AvaliaLisp(texto)) continue;
        const QStringList respostas = CICad::GetListaLisp("*LST_ATRIBS_ENTRADA*");
        for (size_t k = 0; k < respostas_[b].size() && int(k) < respostas.size(); ++k)
            respostas_[b][k].second = respostas[int(k)];
    }
}

namespace {

QString Resposta(const std::vector<std::pair<QString, QString>>& respostas, const QString& prompt) {
    for (const auto& [p, r] : respostas)
        if (p == prompt) return r;
    return {};
}

}  // namespace

void CCMaterialGrfWriter::InsereCampos(const CCListaPaginada::Bloco& bloco, const QString& layer,
                                       const QHash<QString, QString>& campos, bool maiusculas,
                                       int mapa) {
    if (!bloco.existe()) return;
    const OdDbObjectId ref = CICad::InsereBloco(bloco.arquivo, bloco.nome, layer, 0, 0, 0, 0);
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributos(ref, atributos, true, false);
    for (int i = 0; atributos && i < atributos->Quantidade(); ++i) {
        zv::CEAtributo& atributo = (*atributos)[i];
        if (atributo.GetTag().compare("ENTRADA", Qt::CaseInsensitive) == 0) {
            atributo.SetValor(Resposta(respostas_[mapa], atributo.GetPrompt()));
            continue;
        }
        const QString chave = maiusculas ? atributo.GetValor().toUpper() : atributo.GetValor();
        atributo.SetValor(campos.value(chave));
    }
}

void CCMaterialGrfWriter::InsereLinha(const CCListaPaginada::Bloco& bloco, const QString& layer,
                                      const CELinhaLista& linha, bool variasColunas) {
    if (!bloco.existe() || !linha.item) return;
    const OdDbObjectId ref =
        CICad::InsereBloco(bloco.arquivo, bloco.nome, layer, linha.x, linha.y, 0, 0);
    if (ref.isNull()) return;
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributos(ref, atributos, true, false);
    const CEItemLista& item = *linha.item;
    bool publicado = false;
    for (int i = 0; atributos && i < atributos->Quantidade(); ++i) {
        zv::CEAtributo& atributo = (*atributos)[i];
        const QString tag = atributo.GetTag();
        const QString valor = atributo.GetValor();
        if (ComecaCom(tag, "VARIAVEL", "VARIABLE")) {
            atributo.SetValor(item.valorCampo(valor));
        } else if (EhFuncao(tag)) {
            QString texto;
            if (!item.obterCampo(valor, texto)) {
                if (!publicado) item.paraLisp();
                publicado = true;
                texto = Avalia(valor);
            }
            atributo.SetValor(texto);
        } else if (ComecaCom(tag, "ENTRADA", "INPUT")) {
            atributo.SetValor(Resposta(respostas_[1], atributo.GetPrompt()));
        } else if (tag.startsWith("TOTAL", Qt::CaseInsensitive)) {
            double soma = 0;
            for (const CEItemLista* m = &item; m; m = m->ligado)
                soma += CETemplateLisp::TextoParaReal(m->valorCampo(valor));
            atributo.SetValor(ZVString::DeReal(soma, digitos_));
        }
    }
    if (publicado) CEItemLista::limparLisp();
    if (!variasColunas && !item.ids.empty() && !item.ids.front().isNull())
        CICad::SetXData(ref, "KVR_ZV_LINK",
                        {{1000, ZVString::DeHandle(item.ids.front().handle())}});
}

double CCMaterialGrfWriter::SomaCampo(const VetorItens& itens, const QString& campo) {
    // By the field's number; the members of a group share one text of their sums, which is
    // read as a number once (known by being that very text).
    const std::uint32_t numero = CamposItem::numeroSeHouver(campo);
    static const QString kVazio;
    const double vazio = CETemplateLisp::TextoParaReal(kVazio);
    const QString* anterior = nullptr;
    double valorAnterior = 0;
    double soma = 0;
    for (const CEItemLista* item : itens)
        for (const CEItemLista* m = item; m; m = m->ligado) {
            const QString* texto =
                numero == CamposItem::kSemNome ? nullptr : m->campos.procura(numero);
            if (!texto) {
                soma += vazio;
                continue;
            }
            if (!anterior || !texto->isSharedWith(*anterior)) {
                valorAnterior = CETemplateLisp::TextoParaReal(*texto);
                anterior = texto;
            }
            soma += valorAnterior;
        }
    return soma;
}

void CCMaterialGrfWriter::EscreverItens(VetorItens& itens, CETemplate& modelo) {
    const QString grupo = modelo.LerTexto("FUNCAO_LM_GRF");
    const auto blocos = CCListaPaginada::ResolveBlocos(
        modelo,
        {"LISTA_CABEC", "LISTA_DETALHE", "LISTA_DETALHE_VINCL", "LISTA_RODAPE", "LISTA_TOTAL"},
        {"BLK_CTR_LST_CABEC", "BLK_CTR_LST_DET", "BLK_CTR_LST_DET_ACE", "BLK_CTR_LST_RODAPE",
         "BLK_CTR_LST_TOTAL"},
        grupo);
    digitos_ = CICad::GetIntLisp("PBLINTMATDGTSAFTERDOT", 0);
    const bool variasColunas = modelo.LerLogico("*COLUNA_SN*");
    LeEspecificacoes(blocos);
    SomaGrupos(itens, digitos_);
    for (auto& [campo, soma] : totais)
        soma = SomaCampo(itens, campo);
    std::vector<CEPaginaLista> paginas = Diagrama(itens, modelo);
    Pergunta(blocos);
    CCListaPaginada::CriaPaginas(grupo, paginas);
    for (const CEPaginaLista& pagina : paginas) {
        InsereCampos(blocos[0], pagina.nome, pagina.atributos, true, 0);
        for (const CELinhaLista& linha : pagina.linhas) {
            if (!linha.item) continue;
            if (pagina.pagina_total) {
                InsereLinha(blocos[4], pagina.nome, linha, variasColunas);
                continue;
            }
            const bool ace = EhAcessorio(*linha.item) && blocos[2].existe();
            InsereLinha(ace ? blocos[2] : blocos[1], pagina.nome, linha, variasColunas);
        }
        InsereCampos(blocos[3], pagina.nome, pagina.atributos, false, 3);
    }
    if (CICad::GetBoolLisp("*MACRONASPAGINAS*"))
        for (auto it = paginas.rbegin(); it != paginas.rend(); ++it)
            CICad::zvInvokeVoid("atualizarMacros", {it->nome});
}
