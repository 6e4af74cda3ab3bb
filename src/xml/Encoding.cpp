#include "xml/Encoding.h"

#include <QXXMLMarshalling/base/Exception.h>

#include <algorithm>
#include <cerrno>
#include <iconv.h>
#include <new>

namespace qx {

namespace {

bool isAlphanumeric(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
}

// The converter's names take suffixes such as //TRANSLIT, which a document must not bring in.
bool isEncodingName(std::string_view name) {
    return !name.empty() && std::all_of(name.begin(), name.end(), [](char c) {
        return isAlphanumeric(c) || c == '-' || c == '_' || c == '.' || c == ':';
    });
}

// What iconv_open answers for a name that it does not know.
iconv_t noConverter() {
    return reinterpret_cast<iconv_t>(-1); // NOLINT(performance-no-int-to-ptr): so it is defined
}

iconv_t open(const char* to, const char* from) {
    const iconv_t converter = ::iconv_open(to, from);
    if (converter == noConverter() && errno != EINVAL)
        throw std::bad_alloc();
    return converter;
}

// The C library also says that it does not know an encoding when it lacks the memory to load it. An
// answer counts when there is memory for it.
iconv_t openConverter(const char* to, const char* from, std::string_view name) {
    constexpr std::size_t enough = std::size_t{1} << 20;
    if (!isEncodingName(name))
        return noConverter();
    const iconv_t converter = open(to, from);
    if (converter != noConverter())
        return converter;
    ::operator delete(::operator new(enough));
    return open(to, from);
}

// False at bytes that mean nothing in the one encoding or cannot be said in the other.
bool run(iconv_t converter, std::string_view input, std::string& output) {
    char block[16 * 1024];
    char* from = const_cast<char*>(input.data());
    std::size_t left = input.size();
    bool flushing = false;
    while (true) {
        char* to = block;
        std::size_t room = sizeof block;
        const std::size_t result = flushing ? ::iconv(converter, nullptr, nullptr, &to, &room)
                                            : ::iconv(converter, &from, &left, &to, &room);
        const int failure = errno;
        output.append(block, sizeof block - room);
        if (result != static_cast<std::size_t>(-1)) {
            if (flushing)
                return true;
            flushing = true;
        } else if (failure != E2BIG) {
            return false;
        }
    }
}

} // namespace

bool isUTF8Name(std::string_view encoding) noexcept {
    std::string_view expected = encoding.size() == 4 ? "utf8" : "utf-8";
    return std::equal(encoding.begin(), encoding.end(), expected.begin(), expected.end(),
                      [](char a, char b) { return (a >= 'A' && a <= 'Z' ? a + 32 : a) == b; });
}

EncodingSignature encodingSignature(std::string_view bytes) noexcept {
    using namespace std::string_view_literals;
    struct Known {
        std::string_view start;
        EncodingSignature signature;
    };
    // Of two where one starts the other, the longer stands first.
    static constexpr Known all[] = {
        {"\xEF\xBB\xBF"sv, {"UTF-8", 3}},    {"\0\0\xFE\xFF"sv, {"UTF-32BE", 4}},
        {"\xFF\xFE\0\0"sv, {"UTF-32LE", 4}}, {"\xFE\xFF"sv, {"UTF-16BE", 2}},
        {"\xFF\xFE"sv, {"UTF-16LE", 2}},     {"\0\0\0<"sv, {"UTF-32BE", 0}},
        {"<\0\0\0"sv, {"UTF-32LE", 0}},      {"\0<"sv, {"UTF-16BE", 0}},
        {"<\0"sv, {"UTF-16LE", 0}}};
    for (const Known& known : all)
        if (bytes.starts_with(known.start))
            return known.signature;
    return {nullptr, 0};
}

DecodeResult decode(std::string_view bytes, const String& encoding, std::string& text) {
    iconv_t converter = openConverter("UTF-8", encoding.c_str(), encoding);
    if (converter == noConverter())
        return DecodeResult::unknownEncoding;
    struct Closer {
        iconv_t converter;
        ~Closer() { ::iconv_close(converter); }
    } const closer{converter};
    text.reserve(text.size() + bytes.size() + bytes.size() / 8);
    return run(converter, bytes, text) ? DecodeResult::decoded : DecodeResult::malformed;
}

TextEncoder::TextEncoder(const String& encoding) : _name(encoding) {
    const iconv_t converter = openConverter(encoding.c_str(), "UTF-8", encoding);
    if (converter == noConverter())
        throw Exception(Exception::invalidArgument,
                        String::concat({"the encoding ", encoding, " is not known"}));
    _converter.reset(converter);
    // A reader must find the declaration: it looks for "<?xml" as it is, or for a signature.
    std::string start;
    constexpr std::string_view declaration = "<?xml";
    if (!convert(declaration, start) ||
        (start != declaration && encodingSignature(start).encoding == nullptr))
        throw Exception(Exception::invalidArgument,
                        String::concat({"no document can be written in the encoding ", encoding}));
    std::string ascii;
    for (char c = ' '; c < 0x7F; ++c)
        ascii += c;
    _lacksASCII = !comesBack(ascii += '\x7F');
}

void TextEncoder::Closer::operator()(void* converter) const noexcept { ::iconv_close(converter); }

bool TextEncoder::convert(std::string_view text, std::string& bytes) {
    ::iconv(_converter.get(), nullptr, nullptr, nullptr, nullptr);
    return run(_converter.get(), text, bytes);
}

bool TextEncoder::comesBack(std::string_view text) {
    std::string bytes;
    std::string back;
    return convert(text, bytes) && decode(bytes, _name, back) == DecodeResult::decoded &&
           back == text;
}

bool TextEncoder::canEncode(char32_t c, std::string_view character) {
    const auto known = _known.find(c);
    if (known != _known.end())
        return known->second;
    const bool can = comesBack(character);
    _known.emplace(c, can);
    return can;
}

std::string TextEncoder::encoded(std::string_view text) {
    std::string bytes;
    std::string back;
    if (!convert(text, bytes) || decode(bytes, _name, back) != DecodeResult::decoded ||
        back != text)
        throw Exception(Exception::invalidArgument,
                        String::concat({"the text does not come back from the encoding ", _name}));
    return bytes;
}

} // namespace qx
