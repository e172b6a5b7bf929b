#pragma once

#include <cstddef>
#include <string_view>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

/// Copies of the ASCII run at the start of a text, which is most of every path: the transcoders stand on them.
/// Each copies up to the first character that is not ASCII, and answers how many characters it copied.
namespace fl::i18n::detail {

#ifdef __SSE2__

/// Copies `Block` (16 or 8) characters at a time while all of them are ASCII, from `done` on; answers where it stopped.
template <std::size_t Block>
std::size_t widen_ascii_blocks(std::string_view text, char16_t* out, std::size_t done) noexcept
{
    __m128i const zero = _mm_setzero_si128();
    for (; text.size() - done >= Block; done += Block) {
        auto const* source = reinterpret_cast<__m128i const*>(text.data() + done);
        __m128i const bytes = Block == 16 ? _mm_loadu_si128(source) : _mm_loadl_epi64(source);
        if (_mm_movemask_epi8(bytes) != 0) {
            break;
        }
        auto* target = reinterpret_cast<__m128i*>(out + done);
        _mm_storeu_si128(target, _mm_unpacklo_epi8(bytes, zero));
        if constexpr (Block == 16) {
            _mm_storeu_si128(target + 1, _mm_unpackhi_epi8(bytes, zero));
        }
    }
    return done;
}

/// Copies `Block` (16 or 8) characters at a time while all of them are ASCII, from `done` on; answers where it stopped.
template <std::size_t Block>
std::size_t narrow_ascii_blocks(std::u16string_view text, char* out, std::size_t done) noexcept
{
    __m128i const zero = _mm_setzero_si128();
    __m128i const aboveAscii = _mm_set1_epi16(-0x80);
    for (; text.size() - done >= Block; done += Block) {
        auto const* source = reinterpret_cast<__m128i const*>(text.data() + done);
        __m128i const low = _mm_loadu_si128(source);
        __m128i const high = Block == 16 ? _mm_loadu_si128(source + 1) : zero;
        __m128i const excess = _mm_and_si128(_mm_or_si128(low, high), aboveAscii);
        if (_mm_movemask_epi8(_mm_cmpeq_epi8(excess, zero)) != 0xFFFF) {
            break;
        }
        auto* target = reinterpret_cast<__m128i*>(out + done);
        __m128i const bytes = _mm_packus_epi16(low, high);
        if constexpr (Block == 16) {
            _mm_storeu_si128(target, bytes);
        } else {
            _mm_storel_epi64(target, bytes);
        }
    }
    return done;
}

#else

template <std::size_t Block>
std::size_t widen_ascii_blocks(std::string_view /*text*/, char16_t* /*out*/, std::size_t done) noexcept
{
    return done;
}

template <std::size_t Block>
std::size_t narrow_ascii_blocks(std::u16string_view /*text*/, char* /*out*/, std::size_t done) noexcept
{
    return done;
}

#endif

inline std::size_t widen_ascii(std::string_view text, char16_t* out) noexcept
{
    std::size_t done = widen_ascii_blocks<8>(text, out, widen_ascii_blocks<16>(text, out, 0));
    // What is left of most texts is copied in one more block, of which the first part is copied once more.
    if (done != 0 && text.size() - done < 8 && widen_ascii_blocks<8>(text, out, text.size() - 8) == text.size()) {
        return text.size();
    }
    for (; done < text.size() && static_cast<unsigned char>(text[done]) < 0x80; ++done) {
        out[done] = static_cast<unsigned char>(text[done]);
    }
    return done;
}

inline std::size_t narrow_ascii(std::u16string_view text, char* out) noexcept
{
    std::size_t done = narrow_ascii_blocks<8>(text, out, narrow_ascii_blocks<16>(text, out, 0));
    for (; done < text.size() && text[done] < 0x80; ++done) {
        out[done] = static_cast<char>(text[done]);
    }
    return done;
}

} // namespace fl::i18n::detail
