#include "xml/XMLSplitter.h"

#include "base/WhiteSpace.h"
#include "xml/ByteRuns.h"

namespace qx {

namespace {

constexpr std::string_view comment = "<!--";
constexpr std::string_view cdata = "<![CDATA[";
constexpr std::string_view doctype = "<!DOCTYPE";

bool isWhiteAt(std::string_view text, std::size_t at) noexcept {
    return at < text.size() && isWhite(text[at]);
}

// Behind the mark; none where there is none.
std::size_t endOf(std::string_view mark, std::string_view text, std::size_t from) noexcept {
    const std::size_t at = text.find(mark, from);
    return at != std::string_view::npos ? at + mark.size() : at;
}

std::string_view localPart(std::string_view name) noexcept {
    return name.substr(name.find(':') + 1);
}

} // namespace

XMLSplitter::XMLSplitter(String itemName, Match match)
    : _match(match),
      _itemName(match == Match::names ? std::move(itemName) : String(localPart(itemName))),
      _itemStart(_itemName.isEmpty() ? '\0' : _itemName.view().front()) {}

bool XMLSplitter::isItemName(std::string_view name) const noexcept {
    return (_match == Match::names ? name : localPart(name)) == _itemName;
}

void XMLSplitter::goOver(std::string_view text, std::size_t enough) {
    _text = text;
    do {
        if (_depth != 0 && _seen == 0)
            goOverItem();
    } while (_cut < enough && _at < _text.size() && !_isFaulty && goOverNext());
    _text = {};
}

void XMLSplitter::removeUpToCut() {
    _at -= _cut;
    _seen -= std::min(_seen, _cut);
    _cut = 0;
    _itemCount = 0;
    // What comes before a root goes with some declaration: a text of nothing is another fault.
    if (_prologue.empty())
        _prologue = "<?xml version=\"1.0\"?>";
    for (Open& open : _open)
        open.place = none;
}

std::string XMLSplitter::opening() const {
    std::string text = _prologue;
    for (const Open& open : _open)
        text += open.tag;
    return text += _root;
}

std::string XMLSplitter::closing() const {
    std::string text = _open.empty() && _root.empty() ? noItem() : "";
    for (auto open = _open.rbegin(); open != _open.rend(); ++open)
        text.append("</").append(open->name()).append(">");
    return text;
}

// An empty root.
std::string XMLSplitter::noItem() const { return _itemName == "a" ? "<b/>" : "<a/>"; }

bool XMLSplitter::fail() {
    _isFaulty = true;
    return false;
}

// Behind something that is whole. False where the text ends before.
bool XMLSplitter::pass(End end) {
    if (end == none) {
        _seen = std::max(_seen, _text.size());
        return false;
    }
    _at = end;
    _seen = 0;
    if (_depth == 0)
        _cut = end;
    return true;
}

// The next byte from there on that may mean something in a tag; it may stand behind the text.
inline std::size_t XMLSplitter::nextMark(std::size_t from) const noexcept {
    const char* const begin = _text.data();
    return static_cast<std::size_t>(endOfRun<tagByte>(begin + from, begin + _text.size()) - begin);
}

bool XMLSplitter::goOverNext() {
    if (_text[_at] != '<')
        return pass(_text.find('<', resume(0)));
    if (_at + 1 == _text.size())
        return false;
    switch (_text[_at + 1]) {
    case '/':
        return goOverEndTag();
    case '!':
        return goOverDeclaration();
    case '?':
        return goOverInstruction();
    default:
        return goOverStartTag();
    }
}

// Goes over what an item holds, most of a document, up to what may end it: a tag of its name, or a
// comment and the like, which may have such a tag in it. No other "<" needs to be looked at. What
// stands near the end of the text is left alone.
void XMLSplitter::goOverItem() {
    MarkupStarts starts(_text.data() + _at, _text.data() + _text.size());
    while (const char* const start = starts.next()) {
        _at = static_cast<End>(start - _text.data());
        if (start[1] == '!' || start[1] == '?')
            return;
        const std::size_t name = _at + (start[1] == '/' ? 2 : 1);
        if ((_match == Match::localNames || _text[name] == _itemStart) && isItemName(nameAt(name)))
            return;
    }
}

// A zero byte ends the last one.
std::string_view XMLSplitter::nameAt(std::size_t begin) const noexcept {
    const char* at = _text.data() + begin;
    while (is(*at, nameByte))
        ++at;
    return {_text.data() + begin, at};
}

XMLSplitter::End XMLSplitter::behind(std::string_view mark, std::size_t from) const {
    // The mark may have been cut off.
    const std::size_t seen = _seen - std::min(_seen, mark.size() - 1);
    return endOf(mark, _text, std::max(from, seen));
}

bool XMLSplitter::goOverDeclaration() {
    const std::string_view rest = _text.substr(_at);
    if (rest.starts_with(comment))
        return pass(behind("-->", _at + comment.size()));
    if (rest.starts_with(cdata))
        return pass(behind("]]>", _at + cdata.size()));
    for (const std::string_view start : {comment, cdata, doctype})
        if (rest.size() < start.size() && start.starts_with(rest))
            return false;
    if (!rest.starts_with(doctype) || !_open.empty() || !_root.empty())
        return fail();
    // It is looked through again only when it is twice as long as before.
    if (_text.size() - _at < 2 * (_seen - std::min(_seen, _at)))
        return false;
    const End end = endOfDoctype();
    if (end != none)
        _prologue += _text.substr(_at, end - _at);
    return pass(end);
}

// Its own ">": none of the declarations in it.
XMLSplitter::End XMLSplitter::endOfDoctype() const {
    bool isInSubset = false;
    std::size_t at = _at + doctype.size();
    while (at != none && (at = _text.find_first_of("\"'[]<>", at)) != none) {
        const char c = _text[at];
        if (c == '>' && !isInSubset)
            return at + 1;
        if (c == '[' || c == ']')
            isInSubset = c == '[';
        if (c == '"' || c == '\'')
            at = endOf({&c, 1}, _text, at + 1);
        else if (_text.substr(at).starts_with(comment))
            at = endOf("-->", _text, at + comment.size());
        else if (_text.substr(at).starts_with("<?"))
            at = endOf("?>", _text, at);
        else
            ++at;
    }
    return none;
}

bool XMLSplitter::goOverInstruction() {
    const End end = behind("?>", _at);
    const bool isDeclaration = _at == 0 && _open.empty() && _root.empty() &&
                               _text.starts_with("<?xml") && isWhiteAt(_text, 5);
    if (isDeclaration && end != none)
        _prologue = _text.substr(0, end);
    return pass(end);
}

// Behind the ">" that no quotes hold. No "<" may come before.
XMLSplitter::End XMLSplitter::endOfTag() {
    for (std::size_t at = nextMark(resume(1)); at < _text.size(); at = nextMark(at + 1)) {
        const char c = _text[at];
        if (c == '<') {
            fail();
            return none;
        }
        if (c == '>' && _quote == 0)
            return at + 1;
        if (c == '"' || c == '\'')
            _quote = _quote == 0 ? c : _quote == c ? '\0' : _quote;
    }
    return none;
}

// The start tag without the attributes that mean nothing inside the element: those may bring in
// much. One that is no tag stays as it is.
std::string XMLSplitter::reopened(std::string_view tag, std::size_t nameSize) {
    std::string kept(tag.substr(0, nameSize + 1));
    for (std::size_t at = nameSize + 1;;) {
        at = std::min(tag.find_first_not_of(" \t\r\n", at), tag.size() - 1);
        if (tag[at] == '>' || tag[at] == '/')
            return kept += '>';
        const std::size_t quote = tag.find_first_of("\"'", at);
        const std::size_t end = quote != none ? tag.find(tag[quote], quote + 1) : none;
        if (end == none)
            return std::string(tag);
        const std::string_view attribute = tag.substr(at, end + 1 - at);
        if (attribute.starts_with("xml"))
            kept.append(" ").append(attribute);
        at = end + 1;
    }
}

bool XMLSplitter::goOverStartTag() {
    const End end = endOfTag();
    if (end == none)
        return pass(end);
    const std::string_view tag = _text.substr(_at, end - _at);
    const bool isEmpty = tag[tag.size() - 2] == '/';
    if (_open.empty() && !_root.empty())
        return fail();
    const std::size_t nameSize = tag.find_first_of(" \t\r\n/>") - 1;
    const bool isItem = isItemName(tag.substr(1, nameSize));
    if (_depth != 0) {
        _depth += isItem && !isEmpty ? 1 : 0;
        return pass(end);
    }
    if (isItem)
        _depth = 1;
    else
        _open.push_back({reopened(tag, nameSize), nameSize, _at});
    return isEmpty ? endElement(end) : pass(end);
}

bool XMLSplitter::goOverEndTag() {
    std::size_t mark = nextMark(resume(1));
    while (mark < _text.size() && _text[mark] != '<' && _text[mark] != '>')
        mark = nextMark(mark + 1);
    if (mark >= _text.size())
        return pass(none);
    if (_text[mark] == '<')
        return fail();
    const End end = mark + 1;
    const std::string_view name = withoutTrailingWhite(_text.substr(_at + 2, end - _at - 3));
    if (_depth != 0)
        return isItemName(name) ? endElement(end) : pass(end);
    if (_open.empty() || name != _open.back().name())
        return fail();
    return endElement(end);
}

bool XMLSplitter::endElement(End end) {
    if (_depth == 0) {
        _open.pop_back();
    } else if (--_depth == 0) {
        ++_itemCount;
        if (!_open.empty())
            ++_open.back().items;
    }
    // No name of an item, whatever the root was called.
    if (_depth == 0 && _open.empty())
        _root = noItem();
    return pass(end);
}

} // namespace qx
