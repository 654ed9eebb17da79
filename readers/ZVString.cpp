#include "ZVString.h"

#include <cstdio>

QStringList ZVString::Divide(const QString& separadores) const {
    // Called for every layer name, key and extended-data text a reader meets: plain loops
    // over the characters, no per-character calls.
    const QChar* texto = constData();
    const QChar* sep = separadores.constData();
    const int n = size(), m = separadores.size();
    const auto separa = [sep, m](QChar c) {
        for (int k = 0; k < m; ++k)
            if (sep[k] == c) return true;
        return false;
    };
    QStringList tokens;
    int inicio = -1;
    for (int i = 0; i <= n; ++i) {
        const bool corta = i == n || separa(texto[i]);
        if (corta && inicio >= 0) {
            tokens << QString(texto + inicio, i - inicio);
            inicio = -1;
        } else if (!corta && inicio < 0) {
            inicio = i;
        }
    }
    return tokens;
}

bool ZVString::DivideEmDois(const QString& separadores, QString& primeiro, QString& segundo) const {
    const QStringList tokens = Divide(separadores);
    if (tokens.size() != 1 && tokens.size() != 2) return false;
    primeiro = tokens[0];
    segundo = tokens.size() == 2 ? tokens[1] : QString();
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
    char buffer[512];
    if (precisao >= 0)
        std::snprintf(buffer, sizeof buffer, "%.*f", precisao, valor);
    else
        std::snprintf(buffer, sizeof buffer, "%f", valor);
    return ZVString(QString::fromLatin1(buffer));
}

ZVString ZVString::DeHandle(std::uint64_t handle) {
    return ZVString(QString::number(qulonglong(handle), 16).toUpper());
}

std::uint64_t ZVString::ParaHandle() const {
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

QString ZVString::FormaNatural(const QString& texto) {
    constexpr int kLargura = 10;
    QString natural;
    natural.reserve(texto.size() + kLargura);
    const QChar* p = texto.constData();
    const QChar* fim = p + texto.size();
    while (p < fim) {
        const QChar* inicio = p;
        while (p < fim && p->unicode() >= '0' && p->unicode() <= '9')
            ++p;
        const int digitos = int(p - inicio);
        if (digitos == 0) {
            natural += *p++;
            continue;
        }
        if (digitos < kLargura) natural += QString(kLargura - digitos, '0');
        natural.append(inicio, digitos);
    }
    return natural;
}
