#include "xml/ParseFailure.h"

namespace qx {

namespace {

constexpr ErrorText parsersText{0, "%@", parseErrors::notWellFormed};
constexpr ErrorText noText{0, parseErrors::notWellFormed, parseErrors::notWellFormed};

// By the parser's code, and by how its text begins where a code has several.
struct Help {
    int code;
    std::string_view beginning;
    const char* suggestion;
};
constexpr Help helps[] = {
    {5, "", "a document has one root element"},
    {9, "Input is not proper UTF-8", "save it as UTF-8, or have its first line name its encoding"},
    {9, "The document holds a zero byte", "is it UTF-16 without a byte order mark, or no text?"},
    {23, "", "an \"&\" itself is written &amp;"},
    {26, "",
     "XML by itself knows amp, lt, gt, apos and quot; others are written as numbers: &#160;"},
    {38, "", "a \"<\" itself is written &lt;"},
    {39, "", "a value stands in \" or '"},
    {62, "", "\"]]>\" in a text is written ]]&gt;"},
    {64, "", "nothing may stand before it, not even white space"},
    {68, "StartTag", "a \"<\" itself is written &lt;"},
    {68, "xmlParseEntityRef", "an \"&\" itself is written &amp;"},
    {81, "", "does its first line name the right encoding?"},
};

} // namespace

String ParseFailure::suggestion() const {
    const String first = text == &parsersText ? arguments.front().string() : text->message;
    const std::string_view told = first;
    for (const Help& help : helps)
        if (help.code == code && told.starts_with(help.beginning))
            return help.suggestion;
    constexpr std::string_view mismatch = "Opening and ending tag mismatch: ";
    if (!told.starts_with(mismatch))
        return nullptr;
    const std::string_view rest = told.substr(mismatch.size());
    const std::string name(rest.substr(0, rest.find(" line ")));
    return "<" + name + "> needs its </" + name + ">, or is written <" + name + "/>";
}

ParseFailure::ParseFailure(const ErrorText& ours, std::vector<Value> filledIn, std::size_t at)
    : code(ours.code), text(&ours), arguments(std::move(filledIn)), offset(at) {}

ParseFailure::ParseFailure(int parsersCode, std::string_view parsersMessage, std::size_t at)
    : code(parsersCode),
      text(parsersMessage.empty() ? &noText : &parsersText), arguments{parsersMessage}, offset(at) {
}

} // namespace qx
