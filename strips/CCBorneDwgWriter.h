#pragma once
// The terminal-strip drawing: lays the items out as strips of terminal blocks with the
// symbols wired to them, jumper tracks and detail bands, makes the pages in the template's
// group and inserts the blocks. It takes the item vector of the strip reader: components
// (ZV_LISTA_TIPO "COMP") and terminals ("BORNE").
#include "CEModeloReguas.h"
#include "cad/CEInsercoesBlocos.h"
#include "catalogue/CECacheCatalogo.h"
#include "lists/CCListaPaginada.h"
#include "module/CCDataWriter.h"

#include <QSet>
#include <QString>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

class CEItemLista;
struct OdDbObjectId;

class CCBorneDwgWriter : public CCDataWriter {
public:
    // Reads the block-name prefix (*ZV_PREFIX*) and the shared folder (*DIRETORIO_REDE*).
    CCBorneDwgWriter();
    // The model goes to the module's freeing thread.
    ~CCBorneDwgWriter() override;

    void EscreverItens(VetorItens& itens, CETemplate& modelo) override { Escreve(itens, modelo); }
    // Throws message 150 with the path when a block file the template names is missing;
    // then nothing has been drawn.
    void Escreve(VetorItens& itens, CETemplate& modelo);

    // A block as the drawing knows it: name and file.
    struct Bloco {
        QString nome;
        QString arquivo;
        bool existe() const { return !arquivo.isEmpty(); }
    };
    // A template's block value, a path below the shared folder without extension: the
    // name is the prefix and the path's last piece, the file the folder, path and ".dwg".
    Bloco BlocoConfigurado(const QString& valor) const;

    // The names of a terminal's fields the drawing may read, in upper case: each cell's tag
    // and default text in the terminal and detail blocks (either may name a field), the
    // names a function cell looks up by name, and the template's detail and page-break
    // fields. None when a function cell may read any field (it sees the item as `reg`, as a
    // filter does), or a block file the template names cannot be read.
    static std::optional<QSet<QString>> CamposDosBornes(CETemplate& modelo);
    // The same for a component: the cells of the block its key gives in the template's
    // standard and representation, as the drawing will place it, and the key and handle
    // that every symbol reads. None when the block cannot be read or has a function cell
    // that may read any field.
    std::optional<QSet<QString>> CamposDoSimbolo(const CEItemLista& componente, CETemplate& modelo);

    // The laid-out model of the last run.
    const CEModeloReguas& Modelo() const { return modelo_; }

private:
    struct Config;
    Bloco BlocoSimbolo(const CEItemLista& item);
    OdDbObjectId Insere(const Bloco& bloco, const QString& layer, double x, double y);
    void DesenhaRegua(CEReguaDwg& regua, const QString& layer);
    // A run's detail block, filled from the run's last terminal.
    void InsereDetalhe(const CEDetalheReguaDwg& detalhe, const QString& layer, double x, double y);
    void DesenhaSemBorne(const std::vector<CESimboloDwg*>& simbolos, const QString& layer);
    // The block placed with its attributes filled from the item: functions evaluated with
    // the item's fields, VARIAVEL cells from the field their text names, any other from the
    // field of the tag's name. Null when the block has no file.
    OdDbObjectId InserePreenchido(const Bloco& bloco, const QString& layer, double x, double y,
                                  const CEItemLista& item);

    // What a block's attribute asks of an item: the field its default text names (a
    // VARIAVEL cell), or the field of the tag's own name, by number. Blocks repeat their
    // cells over every terminal and symbol: each is looked at once.
    struct CampoDaCelula {
        bool variavel = false;
        CECampoPorNumero campo;
    };
    static CampoDaCelula Celula(const QString& tag, const QString& padrao);
    CECelulasBloco<CampoDaCelula> celulas_;
    QString prefixo_;
    QString pastaRede_;
    CEModeloReguas modelo_;
    CECacheCatalogo catalogo_;
    QHash<QString, Bloco> blocosSimbolo_;
    // The run's blocks, filled from their items.
    CCListaPaginada::BlocosPreenchidos preenchidos_;
    // The run's bare blocks: frames, separators and jumpers.
    CEInsercoesBlocos insercoes_;

    // The template's values of the run.
    QString norma_, representacao_;
    std::string representacaoUtf8_;  // the symbols' link, as their extended data holds it
    Bloco regua_, borne_, detalhe_, traco_;
    Bloco pontes_[5];  // by track state; 0 is never drawn
    double passo_ = 0.0, distJumper_ = 0.0, entreBornes_ = 0.0, passoSemBorne_ = 0.0;
    int bornesPorRegua_ = 0;
};
