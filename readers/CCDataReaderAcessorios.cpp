// Accessories: parts a component carries without being drawn, from the catalogue and from
// the symbol's own extended data.
#include "CCDataReader.h"

#include "CEAtributo.h"
#include "CEListaAtributos.h"
#include "lists/CETemplate.h"

#include <algorithm>
#include <vector>

namespace {

// A quantity beyond this is a typing error in the catalogue or the drawing, not a part
// count: it stops there, so that one bad row can't exhaust memory.
constexpr int kMaximoUnidades = 100000;

// An accessory key and how many units of it: one entry per catalogue row or symbol pair,
// not one text per unit.
struct Unidades {
    QString chave;
    int quantidade;
};

void Conta(const QString& chave, int quantidade, std::vector<Unidades>& contados,
           QStringList& zerados) {
    if (chave.isEmpty()) return;
    if (quantidade == 0) {
        zerados << chave;
        return;
    }
    if (quantidade > kMaximoUnidades) {
        CICad::Log("accessory " + chave + ": quantity " + QString::number(quantidade) + " cut to " +
                   QString::number(kMaximoUnidades));
        quantidade = kMaximoUnidades;
    }
    if (quantidade > 0) contados.push_back({chave, quantidade});
}

}  // namespace

std::uint32_t CCDataReader::LeiturasAcessorios::numero(AcessoriosLidos&& lidos) {
    const auto novo = std::uint32_t(distintas.size());
    if (!lidos.vinculos.isEmpty()) {
        distintas.push_back(std::move(lidos));
        return novo;
    }
    const auto [igual, nova] =
        semVinculos.try_emplace(SemVinculos{lidos.chave, lidos.norma, lidos.temChave}, novo);
    if (nova) distintas.push_back(std::move(lidos));
    return igual->second;
}

void CCDataReader::LeiturasAcessorios::limpa() {
    porSimbolo.limpa();
    distintas.clear();
    semVinculos.clear();
}

const std::vector<std::pair<QString, int>>& CCDataReader::AcessoriosDoCatalogo(
    const QString& chave) {
    auto it = acessoriosCatalogo_.constFind(chave);
    if (it != acessoriosCatalogo_.constEnd()) return *it;
    std::vector<std::pair<QString, int>> pares;
    for (const QString& texto : catalogo_.AcessoriosDe(chave)) {
        const QStringList partes = texto.split('#');
        pares.emplace_back(partes.value(0), ZVString(partes.value(1)).ParaInteiro());
    }
    return *acessoriosCatalogo_.insert(chave, std::move(pares));
}

const CCDataReader::UnidadeAcessorio& CCDataReader::UnidadeDaBase(BaseAcessorio& base,
                                                                  const QString& qtd) {
    for (const UnidadeAcessorio& unidade : base.unidades)
        if (unidade.qtd == qtd) return unidade;
    // Owners of many quantities keep this bounded: the oldest goes.
    constexpr std::size_t kMaxUnidades = 16;
    if (base.unidades.size() >= kMaxUnidades) base.unidades.erase(base.unidades.begin());
    CEItemLista unidade;
    unidade.campos = base.item.campos;
    unidade.definirCampo(NumeroCampo<"QTD">(), qtd);
    unidade.copiarCampos(base.colunas);
    // The room a kept item leaves, as an item of these fields had before they were shared.
    unidade.campos.compactar(FolgaDosCampos(unidade.campos));
    unidade.campos.partilhar();
    return base.unidades.emplace_back(UnidadeAcessorio{qtd, std::move(unidade.campos)});
}

CEItemLista* CCDataReader::NovoItemDaUnidade(const UnidadeAcessorio& unidade) {
    auto* item = new CEItemLista;
    item->campos = unidade.campos;
    return item;
}

VetorItens CCDataReader::ExpandeAcessorios(CEItemLista& dono, const zv::CEListaAtributos* atributos,
                                           CETemplate* modelo, QStringList caminho,
                                           const QString& normaDono) {
    Q_UNUSED(atributos);
    // Names as texts made once: this runs for every member of every listed material.
    static const QString kRecursivo = QStringLiteral("PBLACERECUR");
    static const QString kRelacao = QStringLiteral("PBLACERELACAO");
    static const QString kAtributos = QStringLiteral("PBLADDATRIBACE");
    static const QString kZero = QStringLiteral("0");
    const std::uint32_t campoChave = NumeroCampo<"ZV_KEY">();
    const std::uint32_t campoQtd = NumeroCampo<"QTD">();
    const std::uint32_t campoLista = NumeroCampo<"ZV_LISTA">();
    auto estaListado = [campoLista](const CEItemLista& item) {
        const QString* lista = item.campos.procura(campoLista);
        return lista && *lista == QLatin1String("S");
    };
    const OdDbObjectId primeiro = dono.ids.empty() ? OdDbObjectId() : dono.ids.front();
    QString norma = normaDono;
    // What the symbol's reading kept of it, or null: read here.
    const AcessoriosLidos* lidos = primeiro.isNull() ? nullptr : AcessoriosGuardados(primeiro);
    if (lidos) {
        if (lidos->temChave) dono.definirCampo(campoChave, lidos->chave);
        if (norma.isEmpty()) norma = lidos->norma;
    } else if (!primeiro.isNull()) {
        QString chave, normaEntidade;
        if (ChaveENorma(primeiro, chave, normaEntidade)) dono.definirCampo(campoChave, chave);
        if (norma.isEmpty()) norma = normaEntidade;
    }
    const QString* campoDono = dono.campos.procura(campoChave);
    const QString chaveDono = campoDono ? *campoDono : QString();

    std::vector<Unidades> contados;
    QStringList zerados;
    for (const auto& [chave, quantidade] : AcessoriosDoCatalogo(chaveDono))
        Conta(chave, quantidade, contados, zerados);
    if (!primeiro.isNull()) {
        RegistraAppVinculos(primeiro.database());
        // Pairs of strings, quantity first; a string without its partner is left out.
        QStringList textos;
        if (lidos) {
            textos = lidos->vinculos;
        } else {
            for (const CEItemXData& item : CICad::GetXData(primeiro, "ZV_VINC_ADITIVO"))
                if (item.codigo == 1000) textos << item.texto;
        }
        for (int i = 0; i + 1 < textos.size(); i += 2)
            Conta(textos[i + 1], ZVString(textos[i]).ParaInteiro(), contados, zerados);
    }

    // The fields every unit of an accessory key starts with, made once per key and standard
    // and shared by the units' copies until one of them changes; with the user columns.
    auto base = [&](const QString& chave) -> BaseAcessorio& {
        auto it = basesAcessorio_.find({chave, norma});
        if (it != basesAcessorio_.end()) return it->second;
        CEItemLista item;
        item.definirCampo("ZV_LISTA_TIPO", "ACE");
        item.definirCampo("ZV_LISTA", catalogo_.ListaComp(chave, norma));
        item.definirCampo("ZV_KEY", chave);
        const QString descricao = catalogo_.DescricaoComp(chave);
        item.definirCampo("DESCRICAO", descricao);
        item.definirCampo("TP_DESCRI", descricao);
        CEItemLista colunas;
        LeColunasUsuario(QString(), colunas, catalogo_.ColunasComp(chave));
        return basesAcessorio_
            .emplace(std::pair(chave, norma),
                     BaseAcessorio{std::move(item), std::move(colunas), {}})
            .first->second;
    };

    VetorItens resultado;
    if (contados.empty() && zerados.isEmpty()) return resultado;
    const bool recursivo = modelo && modelo->LerLogico(kRecursivo);
    // The path matters only to a recursion: a plain expansion adds nothing to it.
    if (recursivo) caminho << chaveDono;
    std::size_t unidades = std::size_t(zerados.size());
    for (const Unidades& u : contados)
        unidades += std::size_t(u.quantidade);
    resultado.reserve(unidades);
    const bool relacao = modelo && modelo->LerLogico(kRelacao);
    const bool atributosDono = !modelo && CICad::GetBoolLisp(kAtributos);
    const QString* qtdDono = dono.campos.procura(campoQtd);
    const QString qtd = qtdDono && !qtdDono->isEmpty() ? *qtdDono : QStringLiteral("1");
    for (const auto& [chave, quantidade] : contados)
        for (int u = 0; u < quantidade; ++u) {
            // The owner's fields a unit takes, if any: a unit without them is a copy of the
            // unit's own.
            CEItemLista* item = nullptr;
            if (atributosDono && !primeiro.isNull()) {
                item = new CEItemLista;
                std::unique_ptr<zv::CEListaAtributos> lista;
                CICad::GetAtributosPorId(primeiro, lista, false, false);
                for (int i = 0; lista && i < lista->Quantidade(); ++i)
                    item->definirCampo((*lista)[i].GetTag(), (*lista)[i].GetValor());
            } else if (relacao) {
                item = new CEItemLista;
                for (CampoTraduzido campo :
                     {CampoTraduzido::Relacao, CampoTraduzido::Regua, CampoTraduzido::Numero})
                    for (int idioma = 1; idioma <= 3; ++idioma) {
                        const QString nome = CICad::TagTraduzida(campo, idioma);
                        QString valor;
                        if (dono.obterCampo(nome, valor)) item->definirCampo(nome, valor);
                    }
            }
            BaseAcessorio& b = base(chave);
            if (!item || item->campos.isEmpty()) {
                delete item;
                item = NovoItemDaUnidade(UnidadeDaBase(b, qtd));
            } else {
                item->copiarCampos(b.item);
                item->definirCampo(campoQtd, qtd);
                item->copiarCampos(b.colunas);
            }
            const bool listado = estaListado(*item);
            if (listado && modelo && !modelo->FiltraItem(*item)) {
                delete item;
                continue;
            }
            if (recursivo && !caminho.contains(chave)) {
                VetorItens filhos = ExpandeAcessorios(*item, nullptr, modelo, caminho, norma);
                if (listado) resultado.push_back(item);
                resultado.juntarSemRepetir(filhos);
            } else if (listado) {
                resultado.push_back(item);
            }
            if (!listado) delete item;
        }
    for (const QString& chave : zerados) {
        if (std::any_of(contados.begin(), contados.end(),
                        [&chave](const Unidades& u) { return u.chave == chave; }))
            continue;
        // A zero row is a unit of quantity 0: its fields are joined once per key.
        CEItemLista* item = NovoItemDaUnidade(UnidadeDaBase(base(chave), kZero));
        if (estaListado(*item) && (!modelo || modelo->FiltraItem(*item)))
            resultado.push_back(item);
        else
            delete item;
    }
    return resultado;
}
