#include "CEExportacao.h"

#include "CCCsvWriter.h"
#include "CCHtmlWriter.h"
#include "CCXlsxWriter.h"
#include "CCXmlWriter.h"
#include "CEExportConfigs.h"
#include "CEExportaPaginas.h"
#include "CEExportaPdf.h"
#include "cad/CICad.h"
#include "readers/ZVString.h"

#include <QLocale>

#include <algorithm>
#include <cmath>
#include <limits>

namespace {

struct Formato {
    int numero;
    const char* palavra;
    const char* extensao;
};

constexpr Formato kFormatos[] = {
    {CEExportacao::Csv, "CSV", ".csv"},    {CEExportacao::Xml, "XML", ".xml"},
    {CEExportacao::Html, "HTML", ".html"}, {CEExportacao::Png, "PNG", ".png"},
    {CEExportacao::Dwg, "DWG", ".dwg"},    {CEExportacao::Dwf, "DWF", ".dwf"},
    {CEExportacao::Dxf, "DXF", ".dxf"},    {CEExportacao::Emf, "EMF", ".emf"},
    {CEExportacao::Pdf, "PDF", ".pdf"},    {CEExportacao::Xlsx, "XLSX", ".xlsx"},
};

QString Campo(const CEItemLista* item, const QString& chave) {
    return item ? item->valorCampo(chave) : QString();
}

// The leading decimal number of a text, as atof reads it ("1.5m" is 1.5, "" is 0).
double Decimal(const QString& texto) {
    const QString t = texto.trimmed();
    int i = 0;
    const auto digitos = [&] {
        const int inicio = i;
        while (i < t.size() && t[i].isDigit() && t[i].unicode() < 128)
            ++i;
        return i > inicio;
    };
    if (i < t.size() && (t[i] == '+' || t[i] == '-')) ++i;
    bool algum = digitos();
    if (i < t.size() && t[i] == '.') {
        ++i;
        algum = digitos() || algum;
    }
    if (!algum) return 0;
    int fim = i;
    if (i < t.size() && (t[i] == 'e' || t[i] == 'E')) {
        ++i;
        if (i < t.size() && (t[i] == '+' || t[i] == '-')) ++i;
        if (digitos()) fim = i;
    }
    bool ok = false;
    const double valor = QLocale::c().toDouble(t.left(fim), &ok);
    return ok && std::isfinite(valor) ? valor : 0;
}

QString Truncado(double soma) {
    constexpr double kLimite = double(std::numeric_limits<long long>::max());
    if (!std::isfinite(soma)) return QStringLiteral("0");
    const double t = std::trunc(std::clamp(soma, -kLimite, kLimite));
    return QString::number(static_cast<long long>(t));
}

// Moves `indice` to the front, keeping the order of the others.
template <typename T>
void ParaFrente(std::vector<T>& v, size_t indice) {
    std::rotate(v.begin(), v.begin() + std::ptrdiff_t(indice),
                v.begin() + std::ptrdiff_t(indice) + 1);
}

// The pages of the project: the PDF export for the PDF format, one file a page otherwise.
bool ExportaPaginasDoProjeto(CEExportacao& exportacao) {
    QHash<QString, QString> opcoes;
    for (const auto& [chave, valor] : exportacao.Opcoes)
        opcoes.insert(chave, valor);
    if (exportacao.TipoOutPagina == CEExportacao::Pdf) {
        if (CEExportaPdf(opcoes, nullptr).Exporta(exportacao.Arquivo)) return true;
        exportacao.Erro = QStringLiteral("the PDF could not be written");
        return false;
    }
    if (CEExportaPaginas(opcoes).Exporta(exportacao.TipoOutPagina, exportacao.Arquivo)) return true;
    exportacao.Erro = QStringLiteral("the pages could not be written");
    return false;
}

}  // namespace

CEExportacao::CEExportacao()
    : WriterCsv(std::make_unique<CCCsvWriter>(this)),
      WriterXml(std::make_unique<CCXmlWriter>(this)),
      WriterHtml(std::make_unique<CCHtmlWriter>(this)),
      WriterXlsx(std::make_unique<CCXlsxWriter>(this)) {
    for (const auto& [chave, valor] : CEExportSecao::OpcoesPadrao()) {
        // The driver has always been seeded with the line-weight switch under this name, so
        // a PDF export finds `PDF_PESOLINHA_SN` only once a configuration was applied.
        if (chave == QLatin1String("PDF_PESOLINHA_SN"))
            Opcoes.definir("PDF_PESOLINHA", valor);
        else
            Opcoes.definir(chave, valor);
    }
    ExportaPaginas = ExportaPaginasDoProjeto;
    Opcoes.definir("PAGINAS", QString());
}

CEExportacao::~CEExportacao() {
    Itens.reset();
    if (ItensLidos) ItensLidos->destruirItens();
}

int CEExportacao::TipoInDePalavra(const QString& palavra) {
    const int indice = int(CEExportSecao::NomesTipos().indexOf(palavra));
    return indice < 0 ? 0 : indice + 1;
}

QString CEExportacao::PalavraDeTipoIn(int tipo) {
    const QStringList& nomes = CEExportSecao::NomesTipos();
    return tipo >= 1 && tipo <= nomes.size() ? nomes[tipo - 1] : QString();
}

int CEExportacao::TipoOutDePalavra(const QString& palavra) {
    for (const Formato& f : kFormatos)
        if (palavra == QLatin1String(f.palavra)) return f.numero;
    return -1;
}

QString CEExportacao::PalavraDeTipoOut(int tipo) {
    for (const Formato& f : kFormatos)
        if (f.numero == tipo) return f.palavra;
    return {};
}

QString CEExportacao::ExtensaoDe(int tipoOut) {
    for (const Formato& f : kFormatos)
        if (f.numero == tipoOut) return f.extensao;
    return {};
}

bool CEExportacao::FormatoServe(int tipoIn, int tipoOut) {
    const bool dados = tipoOut == Csv || tipoOut == Xml || tipoOut == Html || tipoOut == Xlsx;
    if (tipoIn == Paginas) return !dados && !PalavraDeTipoOut(tipoOut).isEmpty();
    return dados && !PalavraDeTipoIn(tipoIn).isEmpty();
}

CCExportWriter* CEExportacao::WriterPara(int tipoOut) const {
    switch (tipoOut) {
        case Csv:
            return WriterCsv.get();
        case Xml:
            return WriterXml.get();
        case Html:
            return WriterHtml.get();
        case Xlsx:
            return WriterXlsx.get();
        default:
            return nullptr;
    }
}

bool CEExportacao::AplicaConfig(CEExportConfigs& configs, const QString& secao,
                                const QString& config) {
    const CEExportSecao& s = configs.ObtemSecao(config, secao);
    Colunas.clear();
    Filtros.clear();
    // Rows are taken from the last: a title seen again shows the column it names, so the
    // row order survives and duplicates fold onto one column.
    for (auto linha = s.Colunas.rbegin(); linha != s.Colunas.rend(); ++linha) {
        auto igual = std::find_if(Colunas.begin(), Colunas.end(),
                                  [&](const CEPropExport& c) { return c.Titulo == linha->Titulo; });
        if (igual != Colunas.end()) {
            igual->Visivel = true;
        } else {
            Colunas.push_back(CEPropExport::DaLinha(*linha));
            igual = Colunas.end() - 1;
        }
        ParaFrente(Colunas, size_t(igual - Colunas.begin()));
    }
    for (auto linha = s.Filtros.rbegin(); linha != s.Filtros.rend(); ++linha) {
        const CEFiltroExport filtro(linha->Campo, linha->Operador, linha->Valor);
        auto igual = std::find(Filtros.begin(), Filtros.end(), filtro);
        if (igual == Filtros.end()) {
            Filtros.push_back(filtro);
            igual = Filtros.end() - 1;
        }
        ParaFrente(Filtros, size_t(igual - Filtros.begin()));
    }
    return !s.Colunas.empty();
}

std::vector<CEPropExport> CEExportacao::ColunasPadrao(int tipoIn, int idioma) {
    const auto traduzida = [idioma](CampoTraduzido campo) {
        return CICad::TagTraduzida(campo, idioma);
    };
    QStringList tags;
    switch (tipoIn) {
        case Bornes:
            tags = QStringList{traduzida(CampoTraduzido::Regua), traduzida(CampoTraduzido::Numero),
                               "DESCRICAO", "RELACAO_INI", "RELACAO_FIM"};
            break;
        case Fios:
            tags = QStringList{traduzida(CampoTraduzido::Fio),
                               "DESCRICAO",
                               "RELACAO_INI",
                               "RELACAO_FIM",
                               "CAMINHOFIO",
                               "PATHWIRE"};
            break;
        case Comps:
            tags = QStringList{traduzida(CampoTraduzido::Relacao), "DESCRICAO"};
            break;
        case FiosEComps:
        case Tudo:
            tags = QStringList{traduzida(CampoTraduzido::Relacao), traduzida(CampoTraduzido::Fio),
                               "DESCRICAO"};
            if (tipoIn == Tudo) tags << "NOME";
            break;
        case Cabos:
            tags =
                QStringList{traduzida(CampoTraduzido::Cabo), "NOME", "RELACAO_INI", "RELACAO_FIM"};
            break;
        case Anilhas:
            tags = QStringList{"ANILHA"};
            break;
        default:
            break;
    }
    std::vector<CEPropExport> colunas;
    for (const QString& tag : tags) {
        colunas.emplace_back(tag);
        // Components are counted by their description.
        if (tag == QLatin1String("DESCRICAO") &&
            (tipoIn == Comps || tipoIn == FiosEComps || tipoIn == Tudo))
            colunas.back().Agrupa = true;
    }
    return colunas;
}

bool CEExportacao::Executa() {
    Erro.clear();
    CICad::SetIntLisp("EXPORTA", TipoIn);
    if (TipoIn != Paginas) {
        if (!Leitor) {
            Erro = QStringLiteral("no reader for this kind of list");
            return false;
        }
        ItensLidos = Leitor(*this);
    }
    Progresso = 30;
    Seleciona();
    if (Itens && TipoIn != Anilhas) {
        Ordena();
        const VetorItens grupos = Agrupa();
        if (!grupos.empty()) Concatena(grupos);
    }
    Progresso = 50;
    bool feito = false;
    if (TipoIn == Paginas) {
        if (ExportaPaginas)
            feito = ExportaPaginas(*this);
        else
            Erro = QStringLiteral("page exports are not available in this edition yet");
    } else if (Itens) {
        if (CCExportWriter* writer = WriterPara(TipoOut)) {
            feito = writer->Escreve(*Itens, Colunas, Arquivo);
            if (!feito) Erro = writer->Erro();
        } else {
            Erro = "no data writer for the format " + PalavraDeTipoOut(TipoOut);
        }
    }
    Progresso = 100;
    Itens.reset();
    return feito;
}

void CEExportacao::Seleciona() {
    Itens.reset();
    if (TipoIn == Paginas) return;
    Itens = std::make_unique<VetorItens>();
    if (!ItensLidos) return;

    // The items of each kind, in the reader's order, in one pass.
    static const QString kTipo = QStringLiteral("ZV_LISTA_TIPO");
    QHash<QString, VetorItens> porTipo;
    for (CEItemLista* item : *ItensLidos) {
        if (!item) continue;
        if (TipoIn == Tudo) {
            Itens->push_back(item);
            continue;
        }
        porTipo[item->valorCampo(kTipo)].push_back(item);
    }
    const auto junta = [&](std::initializer_list<const char16_t*> tipos) {
        for (const char16_t* tipo : tipos) {
            const auto it = porTipo.constFind(QString::fromUtf16(tipo));
            if (it != porTipo.constEnd()) Itens->insert(Itens->end(), it->begin(), it->end());
        }
    };
    switch (TipoIn) {
        case Bornes:
            junta({u"BORNE", u"ACE"});
            if (CICad::GetBoolLisp("*EXPORT_SEL_BORNES*")) {
                zvsdk::ResultBuffer* lista = CICad::zvInvokeLista("zvSelecionaReguas");
                std::optional<QStringList> reguas;
                if (lista) {
                    QStringList nomes;
                    for (int i = 0;; ++i) {
                        const zvsdk::ResultBuffer* no = CICad::NoDaLista(lista, i);
                        if (!no) break;
                        const QString nome = CICad::StringDaLista(lista, i);
                        if (!nome.isEmpty()) nomes << nome;
                    }
                    if (!nomes.isEmpty()) reguas = nomes;
                    CICad::LiberaLista(lista);
                }
                SelecionaReguas(reguas);
            }
            break;
        case Fios:
            junta({u"FIO"});
            break;
        case Comps:
            junta({u"BORNE", u"ACE", u"COMP"});
            break;
        case FiosEComps:
            junta({u"FIO", u"BORNE", u"COMP", u"ACE"});
            break;
        case Cabos:
            junta({u"CABO"});
            break;
        case Anilhas:
            junta({u"ANILHA"});
            break;
        default:
            break;
    }
    Filtra();
}

void CEExportacao::SelecionaReguas(const std::optional<QStringList>& reguas) {
    if (!Itens) return;
    VetorItens selecionados;
    if (reguas) {
        // Per language, the items by their strip: one pass over the items, not one a name.
        std::vector<QHash<QString, VetorItens>> porRegua(3);
        for (int idioma = 1; idioma <= 3; ++idioma) {
            const QString chave = CICad::TagTraduzida(CampoTraduzido::Regua, idioma);
            for (CEItemLista* item : *Itens) {
                QString regua;
                if (item->obterCampo(chave, regua)) porRegua[idioma - 1][regua].push_back(item);
            }
        }
        for (const QString& nome : *reguas)
            for (const auto& mapa : porRegua) {
                const auto it = mapa.constFind(nome);
                if (it != mapa.constEnd())
                    selecionados.insert(selecionados.end(), it->begin(), it->end());
            }
    }
    *Itens = std::move(selecionados);
}

void CEExportacao::Filtra() {
    if (!Itens) return;
    for (const CEFiltroExport& filtro : Filtros) {
        VetorItens passam;
        for (CEItemLista* item : *Itens)
            if (filtro.Aceita(Campo(item, filtro.Campo))) passam.push_back(item);
        *Itens = std::move(passam);
    }
}

QString CEExportacao::Normaliza(const QString& texto) {
    constexpr int kLargura = 10;
    const auto digito = [&texto](int i) {
        return texto[i].unicode() >= '0' && texto[i].unicode() <= '9';
    };
    int inicio = 0;
    while (inicio < texto.size() && !digito(inicio))
        ++inicio;
    int fim = inicio;
    while (fim < texto.size() && digito(fim))
        ++fim;
    const int digitos = fim - inicio;
    if (digitos == 0 || digitos >= kLargura) return texto;
    QString normal = texto;
    normal.insert(inicio, QString(kLargura - digitos, '0'));
    return normal;
}

void CEExportacao::Ordena() {
    if (!Itens) return;
    const QStringList chaves = ZVString(GetOpcao("FLT_NOME_ORDENAR_POR")).Divide(";");
    VetorItens& itens = *Itens;
    if (!chaves.isEmpty() && itens.size() > 1) {
        // Each item's keys are worked out once, not at every comparison.
        struct Chave {
            QString normal;
            QString bruto;
        };
        const size_t k = size_t(chaves.size());
        std::vector<Chave> valores(itens.size() * k);
        for (size_t i = 0; i < itens.size(); ++i)
            for (size_t c = 0; c < k; ++c) {
                QString bruto = Campo(itens[i], chaves[int(c)]);
                valores[i * k + c] = {Normaliza(bruto), std::move(bruto)};
            }
        std::vector<size_t> ordem(itens.size());
        for (size_t i = 0; i < ordem.size(); ++i)
            ordem[i] = i;
        std::stable_sort(ordem.begin(), ordem.end(), [&](size_t a, size_t b) {
            for (size_t c = 0; c < k; ++c) {
                const Chave& x = valores[a * k + c];
                const Chave& y = valores[b * k + c];
                if (const int r = x.normal.compare(y.normal); r != 0) return r < 0;
                if (const int r = x.bruto.compare(y.bruto); r != 0) return r < 0;
            }
            return false;
        });
        VetorItens ordenado;
        ordenado.reserve(itens.size());
        for (size_t i : ordem)
            ordenado.push_back(itens[i]);
        itens = std::move(ordenado);
    }
    if (GetOpcao("FLT_TIPO_ORDEM").compare(QLatin1String("D"), Qt::CaseInsensitive) == 0)
        itens.inverter();
}

void CEExportacao::Numera(CEItemLista& item, int n) const {
    const QString numero = QString::number(n);
    // Day, month and year as eight digits, worked out once a run.
    if (dataTexto_.isEmpty() || diaTexto_ != Hoje) {
        diaTexto_ = Hoje;
        dataTexto_ = QStringLiteral("%1%2%3")
                         .arg(Hoje.day(), 2, 10, QChar('0'))
                         .arg(Hoje.month(), 2, 10, QChar('0'))
                         .arg(Hoje.year(), 4, 10, QChar('0'));
    }
    const QString& data = dataTexto_;
    static const QString kSequencia = QStringLiteral("SEQUENCIA");
    static const QString kSequence = QStringLiteral("SEQUENCE");
    static const QString kData = QStringLiteral("DATA");
    static const QString kDate = QStringLiteral("DATE");
    item.definirCampo(kSequencia, numero);
    item.definirCampo(kSequence, numero);
    item.definirCampo(kData, data);
    item.definirCampo(kDate, data);
}

VetorItens CEExportacao::Agrupa() {
    if (!Itens) return {};
    const auto grupo = std::find_if(Colunas.begin(), Colunas.end(),
                                    [](const CEPropExport& c) { return c.Agrupa; });
    if (grupo == Colunas.end() || grupo->Tag.isEmpty()) {
        int n = 0;
        for (CEItemLista* item : *Itens)
            Numera(*item, ++n);
        return {};
    }
    const QString chave = grupo->Tag;
    struct Grupo {
        CEItemLista* primeiro;
        int quantidade;
        double comprimento;
    };
    std::vector<Grupo> grupos;
    QHash<QString, size_t> indice;
    for (CEItemLista* item : *Itens) {
        const QString valor = item->valorCampo(chave);
        auto it = indice.constFind(valor);
        if (it == indice.constEnd()) {
            it = indice.insert(valor, grupos.size());
            grupos.push_back({item, 0, 0.0});
        }
        Grupo& g = grupos[it.value()];
        ++g.quantidade;
        g.comprimento += Decimal(item->valorCampo("COMPRIMENTO"));
    }
    VetorItens primeiros;
    primeiros.reserve(grupos.size());
    int n = 0;
    for (const Grupo& g : grupos) {
        g.primeiro->definirCampo("QTD", QString::number(g.quantidade));
        const QString comprimento = Truncado(g.comprimento);
        g.primeiro->definirCampo("COMPRIMENTO", comprimento);
        g.primeiro->definirCampo("LENGTH", comprimento);
        Numera(*g.primeiro, ++n);
        primeiros.push_back(g.primeiro);
    }
    return primeiros;
}

void CEExportacao::Concatena(const VetorItens& grupos) {
    const auto grupo = std::find_if(Colunas.begin(), Colunas.end(),
                                    [](const CEPropExport& c) { return c.Agrupa; });
    if (Itens && grupo != Colunas.end()) {
        const QString chave = grupo->Tag;
        for (const CEPropExport& coluna : Colunas) {
            if (!coluna.Concatena) continue;
            QHash<QString, size_t> vistos;
            std::vector<QString> juntos;
            for (CEItemLista* item : *Itens) {
                const QString valor = item->valorCampo(chave);
                if (!vistos.contains(valor)) {
                    vistos.insert(valor, juntos.size());
                    juntos.push_back(ValorColuna(*item, coluna));
                    continue;
                }
                // Onto the last group's text, whichever group the item is in: the fold is
                // right when the sort has put each group together.
                const QString parte = ValorColuna(*item, coluna).trimmed();
                if (!parte.isEmpty()) juntos.back() += ", " + parte;
            }
            for (size_t i = 0; i < juntos.size() && i < grupos.size(); ++i) {
                if (juntos[i].isEmpty()) continue;
                grupos[i]->definirCampo(coluna.Tag, juntos[i]);
                Numera(*grupos[i], int(i) + 1);
            }
        }
    }
    if (Itens) *Itens = grupos;
}

QString CEExportacao::ValorColuna(const CEItemLista& item, const CEPropExport& coluna) {
    const QString& tag = coluna.Tag;
    if (coluna.Literal) return tag;
    if (!tag.contains('{') || !tag.contains('}')) return item.valorCampo(tag);
    // Fill each {KEY} the item has with its trimmed value...
    QString cheio;
    int i = 0;
    while (i < tag.size()) {
        const int abre = tag.indexOf('{', i);
        const int fecha = abre < 0 ? -1 : tag.indexOf('}', abre + 1);
        if (fecha < 0) {
            cheio += tag.midRef(i);
            break;
        }
        cheio += tag.midRef(i, abre - i);
        QString valor;
        if (item.obterCampo(tag.mid(abre + 1, fecha - abre - 1), valor)) {
            cheio += valor.trimmed();
            i = fecha + 1;
        } else {
            cheio += '{';
            i = abre + 1;
        }
    }
    // ...then drop every {...} span that is left, braces and all.
    QString resto;
    i = 0;
    while (i < cheio.size()) {
        const int abre = cheio.indexOf('{', i);
        const int fecha = abre < 0 ? -1 : cheio.indexOf('}', abre + 1);
        if (fecha < 0) {
            resto += cheio.midRef(i);
            break;
        }
        resto += cheio.midRef(i, abre - i);
        i = fecha + 1;
    }
    return resto;
}

QString CEExportacao::Ajusta(const QString& texto, const QString& largura, const QString& preenche,
                             bool direita) {
    const int w = ZVString(largura).ParaInteiro();
    if (w <= 0) return texto;
    if (w < texto.size()) return texto.left(w);
    const QString fill = preenche.isEmpty() ? QStringLiteral(" ") : preenche;
    QString resultado = texto;
    if (resultado.size() >= w) return resultado;
    // A fill of several characters may overshoot the width; it is not cut.
    const int vezes = (w - int(resultado.size()) + int(fill.size()) - 1) / int(fill.size());
    const QString enchimento = fill.repeated(vezes);
    return direita ? enchimento + resultado : resultado + enchimento;
}
