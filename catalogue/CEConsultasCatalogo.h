#pragma once
// The catalogue look-ups of the lists. Each runs one short statement through the catalogue
// connection, with the upgrades on failure, and reads the first row. Keys go into the
// statements between single quotes as they are, without escaping: a key holding a quote or
// a backslash answers empty at once, and is never sent.
#include "CERegistrosCatalogo.h"

#include <QString>
#include <QStringList>

class CEConexaoCatalogo;

class CEConsultasCatalogo {
public:
    // Works on the module's catalogue connection.
    CEConsultasCatalogo();
    explicit CEConsultasCatalogo(CEConexaoCatalogo& conexao);

    // Descriptions in the catalogue language (the setting libLang); empty when missing.
    QString DescricaoComp(const QString& chave) const;
    QString DescricaoFio(const QString& chave) const;
    QString DescricaoCabo(const QString& chave) const;
    // The list flags of a key in a standard, as stored.
    QString ListaComp(const QString& chave, const QString& norma) const;
    QString ListaFio(const QString& chave, const QString& norma) const;
    QString ListaCabo(const QString& chave, const QString& norma) const;
    // All columns of the key's row in a user table, as name, U+000C, value.
    QStringList ColunasUsuario(const QString& tabela, const QString& colunaChave,
                               const QString& chave) const;
    QStringList ColunasComp(const QString& chave) const;
    QStringList ColunasFio(const QString& chave) const;
    QStringList ColunasCabo(const QString& chave) const;
    // The material code of a component.
    QString MaterialSap(const QString& chave) const;
    // The accessories of a component, as key, "#", quantity; one per row, in row order.
    QStringList AcessoriosDe(const QString& chave) const;
    // The component type number, as text.
    QString TipoComp(const QString& chave) const;
    // The block of a component in a representation and standard.
    QString BlocoRepresentacao(const QString& chave, const QString& norma,
                               const QString& representacao) const;
    // Page groups: the title, the title attribute of its page model, the sequence flag.
    QString GrupoNome(const QString& grupo, const QString& idioma) const;
    QString GrupoDescricao(const QString& grupo, const QString& idioma) const;
    QString GrupoSequencial(const QString& grupo, const QString& idioma) const;
    // The heading of a user column from its dictionary, trimmed; the tag when there is none.
    QString PromptCampo(const QString& campo, bool fio) const;

    // The user table and its key column of the three kinds.
    static const char* const kTabelaComp;
    static const char* const kChaveComp;
    static const char* const kTabelaFio;
    static const char* const kChaveFio;
    static const char* const kTabelaCabo;
    static const char* const kChaveCabo;

private:
    // The first row's value of the column, or empty.
    QString Primeiro(const QString& instrucao, const QString& coluna) const;
    // The rows of a look-up of `modelo`, with a `?` for each of `valores` (see
    // CEConexaoCatalogo::ConsultarValores).
    CERegistrosCatalogo Consultar(const QString& modelo, const QStringList& valores) const;
    QString Primeiro(const QString& modelo, const QStringList& valores,
                     const QString& coluna) const;
    static QString Idioma();

    CEConexaoCatalogo& conexao_;
};
