// The Base64 codec (RFC 4648 standard alphabet) and the Base64 leaf.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>

#include <algorithm>

#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#if defined(__GNUC__) && (defined(__x86_64__) || defined(__i386__))
#include <immintrin.h>
#endif

namespace {

constexpr char kAlphabet[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

// Encoding: the two characters of every 12-bit value, so that three bytes
// take two lookups.
struct PairTable {
    char pair[4096][2];
    constexpr PairTable() : pair() {
        for (int i = 0; i < 4096; ++i) {
            pair[i][0] = kAlphabet[i >> 6];
            pair[i][1] = kAlphabet[i & 0x3F];
        }
    }
};
constexpr PairTable kPairs;

// The 24 bits of the three bytes at `in`, the first byte highest.
inline uint32_t Group(const unsigned char* in) {
    return static_cast<uint32_t>(in[0]) << 16 | static_cast<uint32_t>(in[1]) << 8 | in[2];
}

#if defined(__BYTE_ORDER__) && __BYTE_ORDER__ == __ORDER_BIG_ENDIAN__
constexpr bool kLittleEndian = false;
#else
constexpr bool kLittleEndian = true;
#endif

inline uint64_t ByteSwap(uint64_t value) {
#if defined(__GNUC__)
    return __builtin_bswap64(value);
#else
    uint64_t swapped = 0;
    for (int i = 0; i < 8; ++i, value >>= 8) {
        swapped = swapped << 8 | (value & 0xFF);
    }
    return swapped;
#endif
}

inline uint32_t ByteSwap(uint32_t value) {
    return static_cast<uint32_t>(ByteSwap(static_cast<uint64_t>(value) << 32));
}

// The eight bytes at `in`, the first byte highest.
inline uint64_t LoadHighFirst(const unsigned char* in) {
    uint64_t value;
    memcpy(&value, in, sizeof value);
    return kLittleEndian ? ByteSwap(value) : value;
}

// The eight bytes at `in`, the first byte lowest.
inline uint64_t LoadLowFirst(const unsigned char* in) {
    uint64_t value;
    memcpy(&value, in, sizeof value);
    return kLittleEndian ? value : ByteSwap(value);
}

// The four characters of a 24-bit group.
inline char* PutGroup(char* out, uint32_t group) {
    memcpy(out, kPairs.pair[group >> 12], 2);
    memcpy(out + 2, kPairs.pair[group & 0xFFF], 2);
    return out + 4;
}

// ---------------------------------------------------------------------------
// SSSE3: sixteen characters per step, where the processor has it (checked
// once at run time). Same results as the table code above, which handles
// whatever is left and every block that holds a byte outside the alphabet.
// DWXCORE_BASE64_PORTABLE=1 in the environment keeps to the table code, so
// that the tests run it on every machine and a doubt about the vector code
// can be ruled out in the field.

#if defined(__GNUC__) && (defined(__x86_64__) || defined(__i386__))
#define DWX_BASE64_SSSE3 1

bool HaveSsse3() {
    static const bool have = [] {
        const char* portable = getenv("DWXCORE_BASE64_PORTABLE");
        return !(portable != nullptr && strcmp(portable, "1") == 0) &&
               __builtin_cpu_supports("ssse3");
    }();
    return have;
}

// Twelve bytes, read as sixteen at `in`, to sixteen characters at `out`.
__attribute__((target("ssse3"))) inline void EncodeBlockSsse3(const unsigned char* in, char* out) {
    __m128i bytes = _mm_loadu_si128(reinterpret_cast<const __m128i*>(in));
    // Each 32-bit lane takes the three bytes of one group, as b1 b0 b2 b1.
    bytes =
        _mm_shuffle_epi8(bytes, _mm_setr_epi8(1, 0, 2, 1, 4, 3, 5, 4, 7, 6, 8, 7, 10, 9, 11, 10));
    // Spread the four 6-bit values of each group over the lane's bytes.
    const __m128i high = _mm_mulhi_epu16(_mm_and_si128(bytes, _mm_set1_epi32(0x0FC0FC00)),
                                         _mm_set1_epi32(0x04000040));
    const __m128i low = _mm_mullo_epi16(_mm_and_si128(bytes, _mm_set1_epi32(0x003F03F0)),
                                        _mm_set1_epi32(0x01000010));
    const __m128i values = _mm_or_si128(high, low);
    // The alphabet as offsets per range: 0-25 'A', 26-51 'a', 52-61 '0',
    // 62 '+', 63 '/'. Ranges 52-63 map to 1-12 by saturation, 0-25 to 13.
    __m128i range = _mm_subs_epu8(values, _mm_set1_epi8(51));
    const __m128i capital = _mm_cmpgt_epi8(_mm_set1_epi8(26), values);
    range = _mm_or_si128(range, _mm_and_si128(capital, _mm_set1_epi8(13)));
    const __m128i offsets =
        _mm_setr_epi8('a' - 26, '0' - 52, '0' - 52, '0' - 52, '0' - 52, '0' - 52, '0' - 52,
                      '0' - 52, '0' - 52, '0' - 52, '0' - 52, '+' - 62, '/' - 63, 'A', 0, 0);
    const __m128i chars = _mm_add_epi8(_mm_shuffle_epi8(offsets, range), values);
    _mm_storeu_si128(reinterpret_cast<__m128i*>(out), chars);
}

// Sixteen characters at `in` to twelve bytes at `out`, which has room for
// sixteen. False, with nothing written, when any of them is outside the
// alphabet ('=' included).
__attribute__((target("ssse3"))) inline bool DecodeBlockSsse3(const unsigned char* in,
                                                              unsigned char* out) {
    const __m128i chars = _mm_loadu_si128(reinterpret_cast<const __m128i*>(in));
    const __m128i nibbleMask = _mm_set1_epi8(0x0F);
    const __m128i highNibbles = _mm_and_si128(_mm_srli_epi32(chars, 4), nibbleMask);
    const __m128i lowNibbles = _mm_and_si128(chars, nibbleMask);
    // A byte is in the alphabet exactly when the classes of its two nibbles
    // share no bit.
    const __m128i lowClass =
        _mm_shuffle_epi8(_mm_setr_epi8(0x15, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11, 0x11,
                                       0x13, 0x1A, 0x1B, 0x1B, 0x1B, 0x1A),
                         lowNibbles);
    const __m128i highClass =
        _mm_shuffle_epi8(_mm_setr_epi8(0x10, 0x10, 0x01, 0x02, 0x04, 0x08, 0x04, 0x08, 0x10, 0x10,
                                       0x10, 0x10, 0x10, 0x10, 0x10, 0x10),
                         highNibbles);
    const __m128i clash = _mm_cmpeq_epi8(_mm_and_si128(lowClass, highClass), _mm_setzero_si128());
    if (_mm_movemask_epi8(clash) != 0xFFFF) {
        return false;
    }
    // The value of each character: an offset chosen by its high nibble, and
    // one of its own for '/', which shares the high nibble of '+'.
    const __m128i slash = _mm_cmpeq_epi8(chars, _mm_set1_epi8('/'));
    const __m128i offsets =
        _mm_shuffle_epi8(_mm_setr_epi8(0, 16, 19, 4, -65, -65, -71, -71, 0, 0, 0, 0, 0, 0, 0, 0),
                         _mm_add_epi8(slash, highNibbles));
    const __m128i values = _mm_add_epi8(chars, offsets);
    // Four 6-bit values per 32-bit lane into one 24-bit number, then its
    // three bytes, the highest first, for each lane.
    const __m128i pairs = _mm_maddubs_epi16(values, _mm_set1_epi32(0x01400140));
    const __m128i groups = _mm_madd_epi16(pairs, _mm_set1_epi32(0x00011000));
    const __m128i bytes = _mm_shuffle_epi8(
        groups, _mm_setr_epi8(2, 1, 0, 6, 5, 4, 10, 9, 8, 14, 13, 12, -1, -1, -1, -1));
    _mm_storeu_si128(reinterpret_cast<__m128i*>(out), bytes);
    return true;
}

// The loops stand in functions compiled for SSSE3 themselves, so that the
// block steps inline into them instead of being called once per block.
__attribute__((target("ssse3"))) void EncodeRunSsse3(const unsigned char*& in,
                                                     const unsigned char* end, char*& out) {
    for (; end - in >= 16; in += 12, out += 16) {
        EncodeBlockSsse3(in, out);
    }
}

// Returns the characters decoded; stops before a block with a byte outside
// the alphabet.
__attribute__((target("ssse3"))) size_t DecodeRunSsse3(const unsigned char* in, size_t size,
                                                       unsigned char*& out) {
    size_t pos = 0;
    for (; pos + 16 <= size && DecodeBlockSsse3(in + pos, out); pos += 16, out += 12) {
    }
    return pos;
}
#endif

// Encodes `count` bytes, a multiple of 3, into 4 * count / 3 characters.
char* EncodeWhole(const unsigned char* in, size_t count, char* out) {
    const unsigned char* const end = in + count;
#if DWX_BASE64_SSSE3
    if (HaveSsse3()) {
        EncodeRunSsse3(in, end, out);
    }
#endif
    for (; end - in >= 12; in += 12) {
        const uint64_t first = LoadHighFirst(in);       // bytes 0 to 7
        const uint64_t second = LoadHighFirst(in + 4);  // bytes 4 to 11
        out = PutGroup(out, static_cast<uint32_t>(first >> 40));
        out = PutGroup(out, static_cast<uint32_t>(first >> 16) & 0xFFFFFF);
        out = PutGroup(out, static_cast<uint32_t>(second >> 24) & 0xFFFFFF);
        out = PutGroup(out, static_cast<uint32_t>(second) & 0xFFFFFF);
    }
    for (; in != end; in += 3) {
        out = PutGroup(out, Group(in));
    }
    return out;
}

// Decoding: the value of every byte in each of the four places of a group,
// already shifted there, with kInvalid for every byte outside the alphabet
// ('=' included), so that a group takes four lookups and one test.
constexpr uint32_t kInvalid = 0x80000000u;

struct DecodeTables {
    uint32_t place[4][256];
    constexpr DecodeTables() : place() {
        for (int p = 0; p < 4; ++p) {
            for (int c = 0; c < 256; ++c) {
                place[p][c] = kInvalid;
            }
            for (int i = 0; i < 64; ++i) {
                place[p][static_cast<unsigned char>(kAlphabet[i])] = static_cast<uint32_t>(i)
                                                                     << (18 - 6 * p);
            }
        }
    }
};
constexpr DecodeTables kDecode;

// The four characters at `in` as 24 bits, with kInvalid set when any of
// them is outside the alphabet.
inline uint32_t DecodeGroup(const unsigned char* in) {
    return kDecode.place[0][in[0]] | kDecode.place[1][in[1]] | kDecode.place[2][in[2]] |
           kDecode.place[3][in[3]];
}

// The same for four characters, the first in the lowest byte.
inline uint32_t DecodeGroup(uint32_t chars) {
    return kDecode.place[0][chars & 0xFF] | kDecode.place[1][(chars >> 8) & 0xFF] |
           kDecode.place[2][(chars >> 16) & 0xFF] | kDecode.place[3][chars >> 24];
}

inline unsigned char* PutBytes(unsigned char* out, uint32_t group) {
    out[0] = static_cast<unsigned char>(group >> 16);
    out[1] = static_cast<unsigned char>(group >> 8);
    out[2] = static_cast<unsigned char>(group);
    return out + 3;
}

// The twelve bytes of four 24-bit groups, stored at `out`.
inline void PutFourGroups(unsigned char* out, uint32_t a, uint32_t b, uint32_t c, uint32_t d) {
    uint64_t high = static_cast<uint64_t>(a) << 40 | static_cast<uint64_t>(b) << 16 | c >> 8;
    uint32_t low = (c & 0xFF) << 24 | d;
    if (kLittleEndian) {
        high = ByteSwap(high);
        low = ByteSwap(low);
    }
    memcpy(out, &high, sizeof high);
    memcpy(out + 8, &low, sizeof low);
}

// Decodes whole groups of four valid characters from in[0, size) into `out`
// and stops before the first group that holds a byte outside the alphabet.
// `out` has room for 4 bytes more than it receives.
// Returns the characters used; *end is where the bytes end.
size_t DecodeWhole(const unsigned char* in, size_t size, unsigned char* out, unsigned char** end) {
    size_t pos = 0;
#if DWX_BASE64_SSSE3
    if (HaveSsse3()) {
        pos = DecodeRunSsse3(in, size, out);
    }
#endif
    for (; pos + 16 <= size; pos += 16, out += 12) {
        const uint64_t first = LoadLowFirst(in + pos);
        const uint64_t second = LoadLowFirst(in + pos + 8);
        const uint32_t a = DecodeGroup(static_cast<uint32_t>(first));
        const uint32_t b = DecodeGroup(static_cast<uint32_t>(first >> 32));
        const uint32_t c = DecodeGroup(static_cast<uint32_t>(second));
        const uint32_t d = DecodeGroup(static_cast<uint32_t>(second >> 32));
        if ((a | b | c | d) & kInvalid) {
            break;  // the groups one by one below find where exactly
        }
        PutFourGroups(out, a, b, c, d);
    }
    for (; pos + 4 <= size; pos += 4, out += 3) {
        const uint32_t group = DecodeGroup(in + pos);
        if (group & kInvalid) {
            break;
        }
        PutBytes(out, group);
    }
    *end = out;
    return pos;
}

}  // namespace

std::string base64_encode(const unsigned char* bytes, unsigned int length) {
    std::string text;
    if (bytes == nullptr || length == 0) {
        return text;
    }
    text.resize(4 * ((static_cast<size_t>(length) + 2) / 3));
    const size_t whole = static_cast<size_t>(length) / 3 * 3;
    char* out = EncodeWhole(bytes, whole, &text[0]);
    // A final one or two bytes, completed with zero bits and padded.
    const unsigned int rest = length % 3;
    if (rest != 0) {
        const unsigned char* in = bytes + whole;
        const uint32_t group = static_cast<uint32_t>(in[0]) << 16 | (rest == 2 ? in[1] << 8 : 0);
        out = PutGroup(out, group);
        out[-1] = '=';
        if (rest == 1) {
            out[-2] = '=';
        }
    }
    return text;
}

std::string base64_decode(const std::string& text) {
    const unsigned char* in = reinterpret_cast<const unsigned char*>(text.data());
    const size_t size = text.size();
    std::string bytes;
    // Every whole group, a final partial one, and the 4 bytes that block
    // stores may pass the end by; cut to the bytes decoded below.
    bytes.resize(size / 4 * 3 + 4);
    unsigned char* const begin = reinterpret_cast<unsigned char*>(&bytes[0]);
    unsigned char* out = begin;
    const size_t pos = DecodeWhole(in, size, begin, &out);

    // The valid characters left before the end or the first foreign byte:
    // [0, 3]. Two give one byte, three give two; one gives nothing. Surplus
    // bits of the last character are not tested.
    uint32_t group = 0;
    size_t valid = 0;
    while (valid < 3 && pos + valid < size) {
        const uint32_t value = kDecode.place[valid][in[pos + valid]];
        if (value & kInvalid) {
            break;
        }
        group |= value;
        ++valid;
    }
    if (valid >= 2) {
        *out++ = static_cast<unsigned char>(group >> 16);
        if (valid == 3) {
            *out++ = static_cast<unsigned char>(group >> 8);
        }
    }
    bytes.resize(static_cast<size_t>(out - begin));
    return bytes;
}

// ---------------------------------------------------------------------------
// PTNBase64

PTNBase64::PTNBase64(const char* name, const unsigned char* data, unsigned int length)
    : DWXParseTreeNode(name), pcText(nullptr) {
    if (data != nullptr && length != 0) {
        pcText = Encode(data, length);
    }
}

PTNBase64::PTNBase64(const PTNBase64& other)
    : DWXParseTreeNode(other), pcText(HString(other.pcText)) {}

PTNBase64& PTNBase64::operator=(const PTNBase64& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        SetAsString(other.pcText);
    }
    return *this;
}

PTNBase64::~PTNBase64() {
    free(pcText);
}

char* PTNBase64::Encode(const unsigned char* data, unsigned int length) {
    return HString(base64_encode(data, length).c_str());
}

unsigned char* PTNBase64::Decode(const char* text, unsigned int* length) const {
    const char* source = text != nullptr ? text : pcText;
    const std::string bytes = base64_decode(source != nullptr ? source : "");
    // HMalloc(0) is a valid block, so 0 bytes still give something free() takes.
    unsigned char* buffer = static_cast<unsigned char*>(HMalloc(bytes.size()));
    std::copy(bytes.begin(), bytes.end(), buffer);
    if (length != nullptr) {
        *length = static_cast<unsigned int>(bytes.size());
    }
    return buffer;
}

void PTNBase64::SetAsString(const char* text) {
    char* copy = HString(text);  // copied first: `text` may be our own buffer
    free(pcText);
    pcText = copy;
}

const char* PTNBase64::GetClassName() const {
    return "PTNBase64";
}

DWXParseTreeNode* PTNBase64::Copy() {
    unsigned int length = 0;
    unsigned char* bytes = Decode(nullptr, &length);
    DWXParseTreeNode* copy = new PTNBase64(GetName(), bytes, length);
    free(bytes);
    return KeepSource(copy);
}

char* PTNBase64::GetAsString() const {
    return HString(pcText != nullptr ? pcText : "");
}

void PTNBase64::SetFrom(DWXParseTreeNode* other) {
    auto* source = dynamic_cast<PTNBase64*>(other);
    if (source == nullptr) {
        return;
    }
    // Decoded before the old text goes, so taking from itself keeps the data.
    const std::string bytes = base64_decode(source->pcText != nullptr ? source->pcText : "");
    free(pcText);
    pcText = bytes.empty() ? nullptr
                           : Encode(reinterpret_cast<const unsigned char*>(bytes.data()),
                                    static_cast<unsigned int>(bytes.size()));
}
