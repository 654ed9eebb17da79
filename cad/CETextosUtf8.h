#pragma once
// UTF-8 copies of the few texts one call hands to the drawing: plain ASCII ones, the most,
// go to a buffer on the stack, the others to strings of their own. The views given stay
// good while the object lives.
#include <QString>

#include <cstddef>
#include <forward_list>
#include <string>
#include <string_view>

class CETextosUtf8 {
public:
    CETextosUtf8() = default;
    CETextosUtf8(const CETextosUtf8&) = delete;
    CETextosUtf8& operator=(const CETextosUtf8&) = delete;

    std::string_view Guarda(const QString& texto) {
        const auto tamanho = static_cast<std::size_t>(texto.size());
        if (tamanho <= sizeof buffer_ - usado_) {
            const QChar* letras = texto.constData();
            char* destino = buffer_ + usado_;
            std::size_t i = 0;
            for (; i < tamanho && letras[i].unicode() < 0x80; ++i)
                destino[i] = static_cast<char>(letras[i].unicode());
            if (i == tamanho) {
                usado_ += tamanho;
                return {destino, tamanho};
            }
        }
        outros_.push_front(texto.toStdString());
        return outros_.front();
    }
    std::string_view Guarda(std::string texto) {
        outros_.push_front(std::move(texto));
        return outros_.front();
    }

private:
    char buffer_[1024];
    std::size_t usado_ = 0;
    std::forward_list<std::string> outros_;  // nodes stay where they are
};
