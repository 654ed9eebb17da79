#pragma once
// The system's text: UTF-16 code units with value semantics, and the helpers the lists use.
// Comparisons are by code unit and case-sensitive.
#include <QDate>
#include <QString>
#include <QStringList>

#include <cstdint>
#include <vector>

class ZVString : public QString {
public:
    using QString::QString;
    ZVString() = default;
    ZVString(const QString& texto) : QString(texto) {}
    ZVString(QString&& texto) : QString(std::move(texto)) {}

    // Three-way, code unit by code unit, then shorter first.
    int Compara(const QString& outro) const { return QString::compare(outro, Qt::CaseSensitive); }
    // The whole prefix must match; a text shorter than the prefix never matches.
    bool ComecaCom(const QString& prefixo) const { return startsWith(prefixo, Qt::CaseSensitive); }
    // Every character of `separadores` ends a token; empty tokens are dropped.
    QStringList Divide(const QString& separadores) const;
    // Exactly two tokens give both, one gives it and empty; otherwise false and the outputs
    // stay as they were.
    bool DivideEmDois(const QString& separadores, QString& primeiro, QString& segundo) const;
    // Exactly three tokens give them; otherwise false and the outputs stay as they were.
    bool DivideEmTres(const QString& separadores, QString& primeiro, QString& segundo,
                      QString& terceiro) const;
    ZVString Apara() const { return ZVString(trimmed()); }
    ZVString Maiusculas() const { return ZVString(toUpper()); }

    static ZVString DeInteiro(long long valor) { return ZVString(QString::number(valor)); }
    // printf's %f, or %.nf when a precision of 0 or more is given.
    static ZVString DeReal(double valor, int precisao = -1);
    // A handle's hexadecimal text, upper case as drawings write it.
    static ZVString DeHandle(std::uint64_t handle);
    // The handle in a hexadecimal text; 0 when the text is not one.
    std::uint64_t ParaHandle() const;

    // The leading decimal number, as atoi reads it; 0 when the text starts with none.
    int ParaInteiro() const;
    // "dd/mm/yy" and "hh:mm:ss", each field two digits, the year modulo 100.
    static QString Data(const QDate& dia);
    static QString Hora(const QTime& hora);

    // The natural form: every run of fewer than ten digits is padded with zeros in front
    // to ten digits, so "2" sorts before "10"; longer runs stay as they are.
    static QString FormaNatural(const QString& texto);
    // The same form appended to `destino`, for many texts kept side by side.
    static void AcrescentaFormaNatural(const QString& texto, std::vector<char16_t>& destino);
};
