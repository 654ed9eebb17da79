#include "ZVString.h"

#include <charconv>
#include <cstdio>
#include <string>

namespace {

// Calls `token(inicio, fim)` for each run of characters between separators, in order, until
// it answers false. Called for every layer name, key and extended-data text a reader meets:
// plain loops over the characters, no per-character calls.
template <class F>
bool PercorreTokens(const QString& texto, const QString& separadores, F token) {
    const QChar* c = texto.constData();
    const QChar* sep = separadores.constData();
    const int n = texto.size(), m = separadores.size();
    const auto separa = [sep, m](QChar x) {
        for (int k = 0; k < m; ++k)
            if (sep[k] == x) return true;
        return false;
    };
    int inicio = -1;
    for (int i = 0; i <= n; ++i) {
        const bool corta = i == n || separa(c[i]);
        if (corta && inicio >= 0) {
            if (!token(inicio, i)) return false;
            inicio = -1;
        } else if (!corta && inicio < 0) {
            inicio = i;
        }
    }
    return true;
}

}  // namespace

QStringList ZVString::Divide(const QString& separadores) const {
    QStringList tokens;
    PercorreTokens(*this, separadores, [&](int inicio, int fim) {
        tokens << QString(constData() + inicio, fim - inicio);
        return true;
    });
    return tokens;
}

bool ZVString::DivideEmDois(const QString& separadores, QString& primeiro, QString& segundo) const {
    // Every key and extended-data field of a list passes here: the token bounds are found
    // without a list, and a text without separators is shared, not copied.
    int inicio[2] = {0, 0}, fim[2] = {0, 0};
    int tokens = 0;
    const bool ate2 = PercorreTokens(*this, separadores, [&](int i, int f) {
        if (tokens == 2) return false;
        inicio[tokens] = i;
        fim[tokens++] = f;
        return true;
    });
    if (!ate2 || tokens == 0) return false;
    const QChar* texto = constData();
    // both made before either output is set: an output may be this text itself
    QString um = inicio[0] == 0 && fim[0] == size()
                     ? static_cast<const QString&>(*this)
                     : QString(texto + inicio[0], fim[0] - inicio[0]);
    QString dois = tokens == 2 ? QString(texto + inicio[1], fim[1] - inicio[1]) : QString();
    primeiro = std::move(um);
    segundo = std::move(dois);
    return true;
}

bool ZVString::DivideEmTres(const QString& separadores, QString& primeiro, QString& segundo,
                            QString& terceiro) const {
    const QStringList tokens = Divide(separadores);
    if (tokens.size() != 3) return false;
    primeiro = tokens[0];
    segundo = tokens[1];
    terceiro = tokens[2];
    return true;
}

ZVString ZVString::DeReal(double valor, int precisao) {
    // What printf writes for "%.*f" (six digits by default), made without going through the
    // format machinery: every length and total of a list passes here.
    char buffer[512];
    const int digitos = precisao >= 0 ? precisao : 6;
    const std::to_chars_result feito =
        std::to_chars(buffer, buffer + sizeof buffer, valor, std::chars_format::fixed, digitos);
    if (feito.ec == std::errc())
        return ZVString(QString::fromLatin1(buffer, int(feito.ptr - buffer)));
    std::snprintf(buffer, sizeof buffer, "%.*f", digitos, valor);
    return ZVString(QString::fromLatin1(buffer));
}

ZVString ZVString::DeHandle(std::uint64_t handle) {
    // Every item has the text of its handle: written here, upper-case hexadecimal digits
    // without leading zeros.
    QChar digitos[16];
    int n = 0;
    do {
        digitos[15 - n++] = QLatin1Char("0123456789ABCDEF"[handle & 15]);
        handle >>= 4;
    } while (handle);
    return ZVString(QString(digitos + 16 - n, n));
}

std::uint64_t ZVString::ParaHandle() const {
    // A drawing's handles are plain hexadecimal digits: read them here; anything else
    // (blanks, a sign, a prefix, too many digits) goes the long way.
    const int n = size();
    if (n > 0 && n <= 15) {
        std::uint64_t valor = 0;
        const QChar* c = constData();
        int i = 0;
        for (; i < n; ++i) {
            const char16_t u = c[i].unicode();
            int digito;
            if (u >= '0' && u <= '9')
                digito = u - '0';
            else if (u >= 'A' && u <= 'F')
                digito = u - 'A' + 10;
            else if (u >= 'a' && u <= 'f')
                digito = u - 'a' + 10;
            else
                break;
            valor = valor << 4 | std::uint64_t(digito);
        }
        if (i == n) return valor;
    }
    bool ok = false;
    const qulonglong handle = toULongLong(&ok, 16);
    return ok ? handle : 0;
}

int ZVString::ParaInteiro() const {
    const QString t = trimmed();
    int fim = (t.startsWith('-') || t.startsWith('+')) ? 1 : 0;
    while (fim < t.size() && t[fim].unicode() >= '0' && t[fim].unicode() <= '9')
        ++fim;
    return t.left(fim).toInt();
}

namespace {
QString DoisDigitos(int valor) {
    return QString::number(valor).rightJustified(2, '0');
}
}  // namespace

QString ZVString::Data(const QDate& dia) {
    return QString(DoisDigitos(dia.day()) + "/" + DoisDigitos(dia.month()) + "/" +
                   DoisDigitos(dia.year() % 100));
}

QString ZVString::Hora(const QTime& hora) {
    return QString(DoisDigitos(hora.hour()) + ":" + DoisDigitos(hora.minute()) + ":" +
                   DoisDigitos(hora.second()));
}

namespace {

// The natural form of the text appended to `destino`, one code unit at a time.
template <class Destino>
void AcrescentaNatural(const QString& texto, Destino& destino) {
    constexpr int kLargura = 10;
    const QChar* p = texto.constData();
    const QChar* fim = p + texto.size();
    while (p < fim) {
        const QChar* inicio = p;
        while (p < fim && p->unicode() >= '0' && p->unicode() <= '9')
            ++p;
        const int digitos = int(p - inicio);
        if (digitos == 0) {
            destino.push_back(char16_t((p++)->unicode()));
            continue;
        }
        for (int i = digitos; i < kLargura; ++i)
            destino.push_back(u'0');
        for (const QChar* d = inicio; d < p; ++d)
            destino.push_back(char16_t(d->unicode()));
    }
}

}  // namespace

QString ZVString::FormaNatural(const QString& texto) {
    std::u16string natural;
    natural.reserve(size_t(texto.size()) + 10);
    AcrescentaNatural(texto, natural);
    return QString(reinterpret_cast<const QChar*>(natural.data()), int(natural.size()));
}

void ZVString::AcrescentaFormaNatural(const QString& texto, std::vector<char16_t>& destino) {
    AcrescentaNatural(texto, destino);
}
