// The points among an object's extended data, read from its items without making the list
// of all of them: the cut point of every terminal is asked this way.
#include "CICad.h"
#include "CICadInterno.h"

#include <charconv>
#include <cmath>
#include <span>
#include <string_view>

using namespace cicad;

namespace {

// A plain decimal text is read as it stands; anything else (spaces, signs, words) takes the
// text's own reading, which the two agree on for every finite number.
double Real(std::string_view texto) {
    double valor = 0.0;
    const char* fim = texto.data() + texto.size();
    const auto [ate, erro] = std::from_chars(texto.data(), fim, valor);
    if (erro == std::errc() && ate == fim && std::isfinite(valor)) return valor;
    return Q(texto).toDouble();
}

}  // namespace

std::vector<CEPonto> CICad::PontosXData(const OdDbObjectId& id, const char* aplicacao) {
    std::vector<CEPonto> pontos;
    zvdb::DbObject* objeto = Objeto(id);
    if (!objeto) return pontos;
    const std::span<const zvdb::Tag> itens = objeto->xdataItems(aplicacao);
    for (std::size_t i = 0; i < itens.size(); ++i) {
        const int codigo = itens[i].code;
        if (codigo < 1010 || codigo > 1013) continue;
        // As GetXData reads them: y and z from the next two items with their codes.
        CEPonto p{Real(itens[i].value), 0.0, 0.0};
        for (std::size_t j = i + 1; j < itens.size() && j <= i + 2; ++j) {
            if (itens[j].code == codigo + 10) p.y = Real(itens[j].value);
            if (itens[j].code == codigo + 20) p.z = Real(itens[j].value);
        }
        while (i + 1 < itens.size() &&
               (itens[i + 1].code == codigo + 10 || itens[i + 1].code == codigo + 20))
            ++i;
        pontos.push_back(p);
    }
    return pontos;
}
