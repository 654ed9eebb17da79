#include "CETemplateLisp.h"

#include "cad/CICad.h"
#include "readers/CEItemLista.h"

#include <QVarLengthArray>

#include <algorithm>
#include <charconv>
#include <limits>

bool CETemplateLisp::Carregar() {
    zvsdk::ResultBuffer* resultado = CICad::zvInvokeLista("ZVCarregaTemplate", {Caminho()});
    const bool carregou = resultado && resultado->restype == zvsdk::RTT;
    CICad::LiberaLista(resultado);
    return carregou;
}

int CETemplateLisp::LerInteiro(const QString& simbolo) {
    return CICad::GetIntLisp(simbolo, 0);
}

double CETemplateLisp::LerReal(const QString& simbolo) {
    return CICad::GetRealLisp(simbolo, 0.0);
}

QString CETemplateLisp::LerTexto(const QString& simbolo) {
    return CICad::GetStringLisp(simbolo, QString());
}

QStringList CETemplateLisp::LerListaTexto(const QString& simbolo) {
    return CICad::GetListaLisp(simbolo);
}

bool CETemplateLisp::LerLogico(const QString& simbolo) {
    return CICad::GetBoolLisp(simbolo);
}

void CETemplateLisp::LerPonto(const QString& simbolo, double& x, double& y) {
    const QStringList partes = LerTexto(simbolo).split(',');
    x = TextoParaReal(partes.value(0));
    y = TextoParaReal(partes.value(1));
}

namespace {

// The expression's atoms and parentheses; a string keeps its quotes. False on a string left open
// or with an escape, whose text the reader would have to read as LISP does.
bool Fatias(const QString& texto, QStringList& fatias) {
    for (int i = 0; i < texto.size();) {
        const QChar c = texto[i];
        if (c.isSpace()) {
            ++i;
        } else if (c == '(' || c == ')') {
            fatias << QString(c);
            ++i;
        } else if (c == '"') {
            QString literal(c);
            for (++i; i < texto.size() && texto[i] != '"'; ++i) {
                if (texto[i] == '\\') return false;
                literal += texto[i];
            }
            if (i == texto.size()) return false;
            fatias << literal + '"';
            ++i;
        } else {
            const int inicio = i;
            while (i < texto.size() && !texto[i].isSpace() && texto[i] != '(' && texto[i] != ')' &&
                   texto[i] != '"')
                ++i;
            fatias << texto.mid(inicio, i - inicio);
        }
    }
    return true;
}

// Functions that see nothing of the item but their arguments.
bool Simples(const QString& simbolo) {
    static const QSet<QString> kSimples = {
        "/=",   "=",      "<",      ">",      "<=",  ">=",    "and",     "or",      "not",
        "null", "eq",     "equal",  "car",    "cdr", "assoc", "strcase", "wcmatch", "atoi",
        "atof", "strlen", "substr", "strcat", "nil", "t",     "if",      "+",       "-"};
    return kSimples.contains(simbolo.toLower());
}

// Digits, a sign, a point or an exponent alone: no symbol that could name a function.
bool Numero(const QString& fatia) {
    bool numero = false;
    fatia.toDouble(&numero);
    return numero && std::all_of(fatia.begin(), fatia.end(), [](QChar c) {
               return c.isDigit() || QStringLiteral("+-.eE").contains(c);
           });
}

bool Literal(const QString& fatia) {
    return fatia.startsWith('"');
}

}  // namespace

namespace {

// The names an expression looks fields up by, as it writes them, (assoc "NAME" reg), when
// that is all it reads of the item, among plain functions; none otherwise.
std::optional<QStringList> NomesDaExpressao(const QString& expressao) {
    QStringList fatias;
    if (!Fatias(expressao, fatias)) return std::nullopt;
    QStringList nomes;
    for (int i = 0; i < fatias.size(); ++i) {
        const QString& fatia = fatias[i];
        if (fatia == "(" || fatia == ")" || Literal(fatia) || Numero(fatia)) continue;
        // `reg` holds the item's fields (CEItemLista::paraLisp).
        if (fatia.compare(QLatin1String("reg"), Qt::CaseInsensitive) == 0) {
            const bool porNome = i >= 3 && i + 1 < fatias.size() && fatias[i - 3] == "(" &&
                                 fatias[i - 2].toLower() == "assoc" && Literal(fatias[i - 1]) &&
                                 fatias[i + 1] == ")";
            if (!porNome) return std::nullopt;
            nomes << fatias[i - 1].mid(1, fatias[i - 1].size() - 2);
        } else if (!Simples(fatia)) {
            return std::nullopt;
        }
    }
    return nomes;
}

// Answers kept per filter text: a filter over a field of values that never repeat keeps
// this many at most.
constexpr int kMaxRespostas = 4096;

}  // namespace

std::optional<QSet<QString>> CETemplateLisp::CamposDaExpressao(const QString& expressao) {
    const std::optional<QStringList> nomes = NomesDaExpressao(expressao);
    if (!nomes) return std::nullopt;
    QSet<QString> campos;
    for (const QString& nome : *nomes)
        campos << nome.toUpper();
    return campos;
}

void CETemplateLisp::LeFiltro(const QString& filtro) {
    static const QString simboloResposta("INVOKELISP_LISTAS_TMP");
    filtroLido_ = filtro;
    avaliacao_ = "(progn (setq " + simboloResposta + " " + filtro + " ) (princ))";
    respostas_.clear();
    nomesDoFiltro_.reset();
    const std::optional<QStringList> nomes = NomesDaExpressao(filtro);
    if (!nomes) return;
    nomesDoFiltro_.emplace();
    for (const QString& nome : *nomes)
        nomesDoFiltro_->push_back({nome, CamposItem::kSemNome});
}

void CETemplateLisp::ChaveDoFiltro(const CEItemLista& item, QString& chave) {
    chave.clear();
    for (auto& [nome, numero] : *nomesDoFiltro_) {
        // A name not numbered yet may be by the next item.
        if (numero == CamposItem::kSemNome) numero = CamposItem::numeroSeHouver(nome);
        const QString* valor =
            numero == CamposItem::kSemNome ? nullptr : item.campos.procura(numero);
        // Absent, or present with the value's length first: no two keys read alike.
        if (!valor) {
            chave += QChar(0);
            continue;
        }
        chave += QChar(1);
        chave += QChar(ushort(valor->size() & 0xFFFF));
        chave += QChar(ushort(valor->size() >> 16));
        chave += *valor;
    }
}

bool CETemplateLisp::FiltraItem(const CEItemLista& item) {
    static const QString simboloFiltro("*FILTRO_TEMPLATE*");
    static const QString simboloResposta("INVOKELISP_LISTAS_TMP");
    const QString filtro = LerTexto(simboloFiltro).trimmed();
    if (filtro.isEmpty()) return true;
    // The text to evaluate is made again only when the filter changes: the host keeps what
    // it read of the same text.
    if (filtro != filtroLido_) LeFiltro(filtro);
    // A filter that reads only fields it names answers as it did for the same values, and
    // leaves in LISP what its evaluation left: its answer and the item's entity.
    if (nomesDoFiltro_) {
        ChaveDoFiltro(item, chave_);
        const auto achada = respostas_.constFind(chave_);
        if (achada != respostas_.constEnd()) {
            item.entidadeParaLisp();
            if (achada->tipo == zvsdk::RTSTR) {
                CICad::SetStringLisp(simboloResposta, achada->texto);
            } else if (achada->tipo == zvsdk::RTT) {
                zvsdk::ResultBuffer t;
                t.restype = zvsdk::RTT;
                CICad::SetChainLisp(simboloResposta, &t);
            } else {
                CICad::SetNilLisp(simboloResposta);
            }
            CEItemLista::limparLisp();
            return achada->tipo != zvsdk::RTNIL;
        }
    }
    item.paraLisp();
    const bool avaliou = CICad::AvaliaLisp(avaliacao_);
    const short tipo = CICad::TipoSimboloLisp(simboloResposta);
    CEItemLista::limparLisp();
    // Only an evaluation that ran is kept: one that failed left an earlier answer.
    if (nomesDoFiltro_ && avaliou &&
        (tipo == zvsdk::RTT || tipo == zvsdk::RTNIL || tipo == zvsdk::RTSTR)) {
        if (respostas_.size() >= kMaxRespostas) respostas_.clear();
        respostas_.insert(
            chave_,
            {tipo, tipo == zvsdk::RTSTR ? CICad::GetStringLisp(simboloResposta) : QString()});
    }
    // Anything but nil passes, 0 and "" too.
    return tipo != zvsdk::RTNIL && tipo != zvsdk::RTNONE;
}

double CETemplateLisp::TextoParaReal(const QString& texto) {
    // The leading number is picked out by hand and read in ASCII: the sums of a list call
    // this once per field of every item, so it must not cost a pattern match or a new text.
    // Whatever the locale, the decimal mark of a template is the point.
    const QChar* p = texto.constData();
    const QChar* const fim = p + texto.size();
    while (p != fim && p->isSpace())
        ++p;
    auto digito = [&](const QChar* c) {
        return c != fim && c->unicode() >= '0' && c->unicode() <= '9';
    };
    const QChar* const inicio = p;
    bool negativo = false;
    if (p != fim && (p->unicode() == '+' || p->unicode() == '-')) {
        negativo = p->unicode() == '-';
        ++p;
    }
    // Where the mantissa's first significant digit stands against the point, to tell a
    // number too large from one too small when it does not fit a double.
    long ordem = 0;
    bool significativo = false;
    int digitos = 0;
    for (; digito(p); ++p, ++digitos) {
        if (p->unicode() != '0') significativo = true;
        if (significativo) ++ordem;
    }
    if (p != fim && p->unicode() == '.') {
        const QChar* depois = p + 1;
        int fracao = 0;
        for (; digito(depois); ++depois, ++fracao) {
            if (significativo) continue;
            if (depois->unicode() != '0')
                significativo = true;
            else
                --ordem;
        }
        if (digitos + fracao == 0) return 0.0;
        digitos += fracao;
        p = depois;
    }
    if (digitos == 0) return 0.0;
    if (p != fim && (p->unicode() == 'e' || p->unicode() == 'E')) {
        const QChar* e = p + 1;
        bool expoenteNegativo = false;
        if (e != fim && (e->unicode() == '+' || e->unicode() == '-')) {
            expoenteNegativo = e->unicode() == '-';
            ++e;
        }
        if (digito(e)) {
            long expoente = 0;
            for (; digito(e); ++e)
                expoente = std::min(expoente * 10 + (e->unicode() - '0'), 100000000L);
            ordem += expoenteNegativo ? -expoente : expoente;
            p = e;
        }
    }
    // The matched text is plain ASCII; from_chars takes no leading '+'.
    const QChar* numero = inicio;
    if (numero->unicode() == '+') ++numero;
    QVarLengthArray<char, 64> ascii(int(p - numero));
    for (int i = 0; i < ascii.size(); ++i)
        ascii[i] = char(numero[i].unicode());
    double valor = 0.0;
    const auto r = std::from_chars(ascii.data(), ascii.data() + ascii.size(), valor);
    if (r.ec == std::errc::result_out_of_range) {
        // Too large is an infinity of the number's sign; too small is zero.
        if (ordem > 0)
            return negativo ? -std::numeric_limits<double>::infinity()
                            : std::numeric_limits<double>::infinity();
        return 0.0;
    }
    return r.ec == std::errc() ? valor : 0.0;
}
