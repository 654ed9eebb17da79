#pragma once
// UTF-8 copies of the few texts one call hands to the drawing: those of the basic plane
// (nearly all: ASCII, accents, a section's "mm²") go to a buffer on the stack, the others
// (surrogates) and those that overflow it to strings of their own. The views given stay good
// while the object lives.
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
            if (const std::size_t feitos =
                    Codifica(letras + i, tamanho - i, destino + i, sizeof buffer_ - usado_ - i)) {
                usado_ += i + feitos;
                return {destino, i + feitos};
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
    // The letters as UTF-8 into `destino`: the bytes written, or 0 when a surrogate (left to
    // Qt's conversion) or the room's end comes first.
    static std::size_t Codifica(const QChar* letras, std::size_t quantas, char* destino,
                                std::size_t espaco) {
        std::size_t feitos = 0;
        for (std::size_t i = 0; i < quantas; ++i) {
            const char16_t u = letras[i].unicode();
            const std::size_t bytes = u < 0x80 ? 1 : u < 0x800 ? 2 : 3;
            if (QChar::isSurrogate(u) || espaco - feitos < bytes) return 0;
            char* d = destino + feitos;
            if (bytes == 1) {
                d[0] = static_cast<char>(u);
            } else if (bytes == 2) {
                d[0] = static_cast<char>(0xC0 | (u >> 6));
                d[1] = static_cast<char>(0x80 | (u & 0x3F));
            } else {
                d[0] = static_cast<char>(0xE0 | (u >> 12));
                d[1] = static_cast<char>(0x80 | ((u >> 6) & 0x3F));
                d[2] = static_cast<char>(0x80 | (u & 0x3F));
            }
            feitos += bytes;
        }
        return feitos;
    }

    char buffer_[1024];
    std::size_t usado_ = 0;
    std::forward_list<std::string> outros_;  // nodes stay where they are
};
