#pragma once
// The schema upgrades of the catalogue, in their order. Each looks on the engine at hand
// for its table or column and makes it only when it is missing, so running them all on a
// current catalogue changes nothing.
#include <QString>
#include <QStringList>

#include <functional>
#include <vector>

class CEConexaoCatalogo;
class CEDialetoCatalogo;

class CEAtualizacaoCatalogo {
public:
    explicit CEAtualizacaoCatalogo(CEConexaoCatalogo& conexao);

    // Is the catalogue one the upgrades may change: an empty database or a catalogue?
    bool Atualizavel();
    // Runs every upgrade in order, when the catalogue may be changed. The changes made, one "step:
    // change" line each; a change whose statements failed is logged and listed with "(failed)".
    QStringList Executar();
    // The changes that Executar would make now; none on what it may not change. A table that an
    // earlier step would create is not looked into, so its later changes show only once it exists.
    QStringList Pendentes();

    static constexpr int kPassos = 19;

private:
    struct Alteracao {
        int passo;
        QString descricao;
        std::function<bool()> necessaria;
        std::function<bool()> aplicar;
    };

    std::vector<Alteracao> Alteracoes(const CEDialetoCatalogo& d);
    void Estrutura(std::vector<Alteracao>& lista, const CEDialetoCatalogo& d);
    void Colunas(std::vector<Alteracao>& lista, const CEDialetoCatalogo& d);
    void Paginas(std::vector<Alteracao>& lista, const CEDialetoCatalogo& d);
    Alteracao Tabela(int passo, const QString& tabela, const QStringList& instrucoes);
    Alteracao Coluna(int passo, const QString& tabela, const QString& coluna,
                     const QString& instrucao);
    Alteracao Largura(int passo, const QString& tabela, const QString& coluna, int largura,
                      const CEDialetoCatalogo& d);
    Alteracao Idiomas(const CEDialetoCatalogo& d);
    // The catalogue's language in use: the first of BDLANGUAGE, or "1".
    QString IdiomaDoCatalogo();
    bool ExecutarTodas(const QStringList& instrucoes);

    CEConexaoCatalogo& conexao_;
};
