#include "xml/Encoding.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "base/WhiteSpace.h"

#include <algorithm>
#include <cerrno>
#include <iconv.h>
#include <new>

namespace qx {

namespace {

constexpr std::string_view declarationStart = "<?xml";

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

enum class Conversion { whole, cutOff, malformed };

// Moves the input behind what was converted: all of it, unless it ends inside a character, or
// means nothing in the one encoding, or cannot be said in the other.
Conversion run(iconv_t converter, std::string_view& input, std::string& output) {
    char block[16 * 1024];
    char* from = const_cast<char*>(input.data());
    std::size_t left = input.size();
    while (true) {
        char* to = block;
        std::size_t room = sizeof block;
        const std::size_t result = ::iconv(converter, &from, &left, &to, &room);
        const int failure = errno;
        output.append(block, sizeof block - room);
        input.remove_prefix(input.size() - left);
        if (result != static_cast<std::size_t>(-1))
            return Conversion::whole;
        if (failure != E2BIG)
            return failure == EINVAL ? Conversion::cutOff : Conversion::malformed;
    }
}

// What the converter still holds back at the end of a text.
bool flush(iconv_t converter, std::string& output) {
    char block[64];
    char* to = block;
    std::size_t room = sizeof block;
    const std::size_t result = ::iconv(converter, nullptr, nullptr, &to, &room);
    output.append(block, sizeof block - room);
    return result != static_cast<std::size_t>(-1);
}

// The encoding that the first bytes show: by a byte-order mark, or by how "<?" is stored. Null for
// none, which leaves encodings that store ASCII as it is.
struct EncodingSignature {
    const char* encoding;
    // How many bytes the byte-order mark takes.
    std::size_t markSize;
};

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
    const bool isUsual = bytes.size() > 1 && bytes[0] == '<' && bytes[1] != '\0';
    if (isUsual)
        return {nullptr, 0};
    for (const Known& known : all)
        if (bytes.starts_with(known.start))
            return known.signature;
    return {nullptr, 0};
}

} // namespace

bool isUTF8Name(std::string_view encoding) noexcept {
    std::string_view expected = encoding.size() == 4 ? "utf8" : "utf-8";
    return std::equal(encoding.begin(), encoding.end(), expected.begin(), expected.end(),
                      [](char a, char b) { return (a >= 'A' && a <= 'Z' ? a + 32 : a) == b; });
}

String encodingInDeclaration(std::string_view text) {
    if (!text.starts_with(declarationStart))
        return nullptr;
    text = text.substr(0, text.find("?>"));
    constexpr std::string_view name = "encoding";
    const std::size_t at = text.find(name);
    if (at == std::string_view::npos || !isWhite(text[at - 1]))
        return nullptr;
    text = withoutLeadingWhite(text.substr(at + name.size()));
    if (!text.starts_with('='))
        return nullptr;
    text = withoutLeadingWhite(text.substr(1));
    if (!text.starts_with('"') && !text.starts_with('\''))
        return nullptr;
    const std::size_t end = text.find(text.front(), 1);
    if (end == std::string_view::npos)
        return nullptr;
    return text.substr(1, end - 1);
}

bool DocumentEncoding::isContradictedBy(std::string_view text) const noexcept {
    return isDeclared && !text.starts_with(declarationStart);
}

DocumentEncoding encodingOf(std::string_view bytes) {
    const EncodingSignature signature = encodingSignature(bytes);
    const bool isSigned = signature.encoding != nullptr;
    const String name = isSigned ? String(signature.encoding) : encodingInDeclaration(bytes);
    if (!name.isEmpty() && !isUTF8Name(name))
        return {name, signature.markSize, !isSigned, nullptr};
    return {nullptr, signature.markSize, false,
            isSigned ? encodingInDeclaration(bytes.substr(signature.markSize)) : name};
}

DecodeResult decode(std::string_view bytes, const String& encoding, std::string& text) {
    TextDecoder decoder(encoding);
    if (!decoder.isKnown())
        return DecodeResult::unknownEncoding;
    text.reserve(text.size() + bytes.size() + bytes.size() / 8);
    const bool isWhole = decoder.decode(bytes, text) && decoder.finish(text);
    return isWhole ? DecodeResult::decoded : DecodeResult::malformed;
}

TextDecoder::TextDecoder(const String& encoding) {
    const iconv_t converter = openConverter("UTF-8", encoding.c_str(), encoding);
    if (converter != noConverter())
        _converter.reset(converter);
}

bool TextDecoder::decode(std::string_view bytes, std::string& text) {
    std::string joined;
    if (!_cutOff.empty()) {
        joined = _cutOff.append(bytes);
        bytes = joined;
    }
    const Conversion result = run(_converter.get(), bytes, text);
    _cutOff = bytes;
    return result != Conversion::malformed;
}

bool TextDecoder::finish(std::string& text) {
    return _cutOff.empty() && flush(_converter.get(), text);
}

TextEncoder::TextEncoder(const String& encoding) : _name(encoding) {
    const iconv_t converter = openConverter(encoding.c_str(), "UTF-8", encoding);
    if (converter == noConverter())
        throw Exception(Exception::invalidArgument,
                        String::concat({"the encoding ", encoding, " is not known"}));
    _converter.reset(converter);
    // A reader must find the declaration: it looks for "<?xml" as it is, or for a signature.
    std::string start;
    if (!convert(declarationStart, start) ||
        (start != declarationStart && encodingSignature(start).encoding == nullptr))
        throw Exception(Exception::invalidArgument,
                        String::concat({"no document can be written in the encoding ", encoding}));
    std::string ascii;
    for (char c = ' '; c < 0x7F; ++c)
        ascii += c;
    _lacksASCII = !comesBack(ascii += '\x7F');
}

void ConverterCloser::operator()(void* converter) const noexcept { ::iconv_close(converter); }

bool TextEncoder::convert(std::string_view text, std::string& bytes) {
    ::iconv(_converter.get(), nullptr, nullptr, nullptr, nullptr);
    return run(_converter.get(), text, bytes) == Conversion::whole &&
           flush(_converter.get(), bytes);
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
