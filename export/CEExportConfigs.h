#pragma once
// The stored export configurations of a user: the file "cfgexportacao_2014.ini" in the
// folder of `*DIR_ZVCFG*`, its model in memory, its reader, its writer and the migration
// from "cfgexportacao.ini".
//
// The file is text, one byte a character (Latin-1), lines ending in CR LF. A line's kind is
// its first character after trimming: "{name}" a configuration, "-KEY=VALUE" one of its
// values, "[name]" a section, "*" a column row of nine fields, "#" a filter row of three,
// anything else "KEY=VALUE", an option of the last section. Fields are split with runs of
// separators counting as one, so an empty field makes the next ones slide left; that is how
// files have always been read, and it is kept.
#include "CEExportConfig.h"

#include <QByteArray>
#include <QString>

#include <memory>
#include <vector>

class CEExportConfigs {
public:
    static constexpr const char* kArquivo = "cfgexportacao_2014.ini";
    static constexpr const char* kArquivoAntigo = "cfgexportacao.ini";
    // Longer lines mean a damaged file.
    static constexpr int kMaxLinha = 2000;
    // Stands for a row's own separator inside a field.
    static constexpr const char* kEscape = "__=X=__";

    // The one list of the process, made on first use.
    static CEExportConfigs& Global();

    std::vector<std::unique_ptr<CEExportConfig>> Configs;

    // Replaces the list with what the text holds. False, and the list untouched, when a
    // line is longer than kMaxLinha.
    bool LeTexto(const QByteArray& bytes);
    // The whole file as it is written.
    QByteArray Texto() const;

    // Migrates, then loads the file of `*DIR_ZVCFG*` (see CarregaDe).
    void CarregaConfigs();
    // Writes the whole list to the file of `*DIR_ZVCFG*`, atomically; false with the reason
    // in `erro` when it can't, and then the old file stays as it was.
    bool SalvaConfigs(QString* erro = nullptr) const;

    // Loads from a folder: copies the older file to the new name when only the older one
    // exists; a missing or unreadable file leaves the list as it was. A damaged file (a line
    // that is too long) is dropped, and when the older file is there it is copied over the
    // new one without leave to overwrite, which fails with std::filesystem::filesystem_error
    // for "copy_file": the damaged file is never replaced silently.
    void CarregaDe(const QString& pasta);
    // Refuses, keeping the old file, a list with a line too long to be read back.
    bool SalvaEm(const QString& pasta, QString* erro) const;
    // The length of the longest line of a text, line ends not counted.
    static int LinhaMaisLonga(const QByteArray& texto);
    // The folder joined with a file name: a separator goes between them unless the folder
    // ends in one or is a bare drive name ("C:"); an absolute file name wins.
    static QString Caminho(const QString& pasta, const QString& arquivo);
    // The folder of `*DIR_ZVCFG*`.
    static QString PastaConfig();

    // The section, made (with the configuration) when it is missing. Names compare exactly.
    CEExportSecao& ObtemSecao(const QString& config, const QString& secao);
    // The configuration of that exact name, or null.
    CEExportConfig* Config(const QString& nome) const;
    // `CFG_ATIVO` of the configuration with the empty name; empty when there is none.
    QString ObtemConfigAtiva() const;
    void DefineConfigAtiva(const QString& nome);
    // Removes the configuration and clears `CFG_ATIVO`; the unnamed one always stays.
    void RemoveConfig(const QString& nome);
};
