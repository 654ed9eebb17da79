#pragma once
// The strip drawing's reader: the export reader's components and terminals, with the
// drawing's own filters on top: components the template refuses, terminals of strips the
// user did not pick, and terminals with nothing wired and no jumper on their strip go.
#include "CEModeloReguas.h"
#include "readers/CCExportDataReader.h"
#include "readers/TabelaChaves.h"

#include <array>
#include <cstdint>
#include <functional>
#include <memory>
#include <string_view>
#include <vector>

class CCBorneDwgWriter;

class CCBorneDwgDataReader : public CCExportDataReader {
public:
    // Each wire is copied into the sides of the one or two terminals it reaches, and each
    // terminal read as an item before any side asks for a neighbour: their readings are not
    // kept. Nor are those of the components the walk makes: the sides ask for few of them,
    // each close to the terminals before and after, so those they read are kept for a while.
    CCBorneDwgDataReader();
    ~CCBorneDwgDataReader() override;
    VetorItens* LerDados(zvdb::Database* database, const std::optional<QStringList>& paginas,
                         CETemplate& modelo, CIProgress& progresso) override;

    // The strip and number of the terminals, one key for each language that gives both, and
    // the numbers of the fields the terminals are asked for, looked up once.
    struct Chaves {
        TabelaChaves<CEModeloReguas::ChaveBorne, bool> bornes;
        std::array<std::uint32_t, 3> reguas{}, numeros{};
        std::uint32_t relacaoIni = 0, relacaoFim = 0, jumper = 0;
        // Whether each terminal given has a wire on a side, read in the keys' pass while its
        // fields are at hand: those need no second look.
        std::vector<char> comFio;
    };
    static Chaves ChavesBornes(const VetorItens& bornes);
    // True when the terminal has a wire on a side, or a jumper to a number of its strip
    // among the keys (strip and number in any of the three languages).
    static bool Ligado(const CEItemLista& borne, const Chaves& chaves);

    // The writer the read is for: the components' symbols' blocks are found by the one that
    // will place them, once. Without it the components keep every field.
    CCBorneDwgWriter* Escritor = nullptr;

protected:
    // Keeps of the component the fields the drawing or the template's filter may read.
    void ComponenteLido(CEItemLista& item) override;
    // The first component of a key tells what those of its key keep: the later ones are read
    // for that alone.
    void SimboloGuardado(const CEItemLista& item) override;
    CamposDoSimbolo* CamposDaLeitura(std::string_view bloco, const QString& chave) override;
    // Keeps of the terminal the fields the drawing may read.
    void LadosLidos(CEItemLista& borne) override;

private:
    struct Cortes;
    std::unique_ptr<Cortes> cortes_;  // while a read runs; none: the components stay whole
    // While a read runs, the fields the terminals keep (none: all), and its answers by name
    // number: 0 not asked yet, 1 kept, 2 not.
    std::function<bool(const QString&)> doBorne_;
    std::vector<char> ficaNoBorne_;
};
