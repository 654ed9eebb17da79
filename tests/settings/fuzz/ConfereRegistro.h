#pragma once
// What must hold for any settings file, shared by the libFuzzer target and the regression
// test: reading never fails; a save either leaves the file byte for byte (an unreadable
// file, or a value the file can't hold) or writes one in which every record read before
// reads the same and the new value reads back.
//
// The input is the file's bytes; after its last NUL byte, if any, comes the value to save.
#include "settings/CIRegistro.h"

#include <QByteArray>
#include <QDomDocument>
#include <QFile>
#include <QString>
#include <QStringList>

inline QByteArray LeArquivoRegistro() {
    QFile arquivo(CIRegistro::ArquivoRegistro());
    return arquivo.open(QIODevice::ReadOnly) ? arquivo.readAll() : QByteArray();
}

// Empty when all holds, else what went wrong. ZV_DATA_DIR names a folder of the caller's,
// with its FV folder made.
inline QString ConfereRegistro(const QByteArray& entrada) {
    const int nul = entrada.lastIndexOf('\0');
    const QByteArray conteudo = nul < 0 ? entrada : entrada.left(nul);
    const QString valor =
        nul < 0 ? QStringLiteral("valor") : QString::fromUtf8(entrada.mid(nul + 1));
    {
        QFile arquivo(CIRegistro::ArquivoRegistro());
        if (!arquivo.open(QIODevice::WriteOnly | QIODevice::Truncate) ||
            arquivo.write(conteudo) != conteudo.size())
            return "cannot write the input file";
    }
    const QString problema = CIRegistro::ProblemaArquivo();
    // The keys of the file, as a reader finds them.
    QStringList chaves;
    QDomDocument documento;
    if (documento.setContent(conteudo))
        for (QDomElement e = documento.documentElement().firstChildElement("registro");
             !e.isNull() && chaves.size() < 64; e = e.nextSiblingElement("registro"))
            if (e.attribute("key") != "FuzzKey") chaves << e.attribute("key");
    QStringList antes;
    for (const QString& chave : chaves)
        antes << CIRegistro::LerRegistro(chave);
    // The typed readers must cope with whatever the values hold.
    CIRegistro::DBPass();
    CIRegistro::IdiomaMenuSel();

    QString erro;
    const bool salvo = CIRegistro::GravarRegistro("FuzzKey", valor, &erro);
    const QByteArray depois = LeArquivoRegistro();
    if (!salvo) {
        if (erro.isEmpty()) return "a failed save gave no reason";
        if (depois != conteudo) return "a failed save changed the file: " + erro;
        return {};
    }
    if (!problema.isEmpty()) return "an unreadable file was replaced: " + problema;
    if (!CIRegistro::ProblemaArquivo().isEmpty())
        return "the saved file does not read: " + CIRegistro::ProblemaArquivo();
    if (CIRegistro::LerRegistro("FuzzKey") != valor) return "the saved value does not read back";
    for (int i = 0; i < chaves.size(); ++i)
        if (CIRegistro::LerRegistro(chaves[i]) != antes[i])
            return "the record " + chaves[i] + " changed on a save of another key";
    return {};
}
