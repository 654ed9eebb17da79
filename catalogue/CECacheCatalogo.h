#pragma once
// The catalogue answers of one run, kept by the reader that owns this object: the catalogue
// is asked once per distinct key (and standard) and kind. Made empty with the reader,
// gone with it.
#include "CEConsultasCatalogo.h"

#include <QHash>
#include <QString>
#include <QStringList>

class CECacheCatalogo {
public:
    // Asks the module's catalogue connection.
    CECacheCatalogo() = default;
    explicit CECacheCatalogo(CEConexaoCatalogo& conexao) : consultas_(conexao) {}

    // Descriptions; one the catalogue doesn't give is replaced by the message of section
    // ZVLISTAS for its kind (108 component, 109 cable, 110 wire), kept like a real one.
    QString DescricaoComp(const QString& chave);
    QString DescricaoFio(const QString& chave);
    QString DescricaoCabo(const QString& chave);
    // List flags of key and standard, in upper case.
    QString ListaComp(const QString& chave, const QString& norma);
    QString ListaFio(const QString& chave, const QString& norma);
    QString ListaCabo(const QString& chave, const QString& norma);
    // User columns as name, U+000C, value.
    QStringList ColunasComp(const QString& chave);
    QStringList ColunasFio(const QString& chave);
    QStringList ColunasCabo(const QString& chave);
    QString MaterialSap(const QString& chave);
    // Accessory texts: key, "#", quantity.
    QStringList AcessoriosDe(const QString& chave);
    QString TipoComp(const QString& chave);
    QString BlocoRepresentacao(const QString& chave, const QString& norma,
                               const QString& representacao);

    // The look-ups without the cache.
    const CEConsultasCatalogo& Consultas() const { return consultas_; }

    static constexpr int kMsgSemDescricaoComp = 108;
    static constexpr int kMsgSemDescricaoCabo = 109;
    static constexpr int kMsgSemDescricaoFio = 110;

private:
    template <typename Valor, typename Consulta>
    static const Valor& Lembra(QHash<QString, Valor>& mapa, const QString& chave,
                               Consulta consulta) {
        auto it = mapa.constFind(chave);
        if (it == mapa.constEnd()) it = mapa.insert(chave, consulta());
        return it.value();
    }
    // The key of two or three parts, joined by the field separator.
    static QString Chave(const QString& a, const QString& b, const QString& c = QString());
    static QString Descricao(const QString& texto, int mensagem);

    CEConsultasCatalogo consultas_;
    QHash<QString, QString> descricoesComp_, descricoesFio_, descricoesCabo_;
    QHash<QString, QString> listaComp_, listaFio_, listaCabo_;
    QHash<QString, QStringList> colunasComp_, colunasFio_, colunasCabo_;
    QHash<QString, QString> materiais_, tipos_, blocos_;
    QHash<QString, QStringList> acessorios_;
};
