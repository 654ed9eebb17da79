#pragma once
// One page of a strip drawing and the strips on it, top to bottom.
#include <QString>

#include <vector>

class CEReguaDwg;

class CEPaginaDwg {
public:
    CEPaginaDwg() = default;
    // Laid-out pages know no layer yet: the writer names them when it makes them.
    QString nome;
    std::vector<CEReguaDwg*> reguas;

    // How many strips the page holds.
    int Quantidade() const;
};
