#pragma once

// Edits of an object, a line each:
//
//     lines[1].text = VALUE       as support::show() prints it (marshaller/Cases.h)
//     insert lines[0] VALUE       before the item that stands there
//     remove lines[0]
//     move lines[0] 2             to where it is item 2
//     move lines[0] parts[1].lines[2]     into another list, once it is gone from its own
//
// and the lines that an update changes: "- " before an old one, "+ " before a new one.

#include "marshaller/Cases.h"

namespace edits {

// The object and the key or item that a path leads to.
class Place {
public:
    Place(const qx::Value& root, const std::string& path) : _holder(root) {
        std::istringstream steps(path);
        std::string last;
        for (std::string step; std::getline(steps, step, '.');) {
            const std::size_t bracket = step.find('[');
            enter(last);
            last = step.substr(0, bracket);
            if (bracket == std::string::npos)
                continue;
            enter(last);
            last = step.substr(bracket);
        }
        _last = last;
    }
    void set(const qx::Value& value) const {
        if (_last.front() == '[')
            array().replace(index(), value);
        else
            _holder.object()->setValueForKey(value, _last);
    }
    qx::Array& array() const { return *_holder.as<qx::Array>(); }
    std::size_t index() const { return std::stoul(_last.substr(1)); }

private:
    void enter(const std::string& step) {
        if (step.empty())
            return;
        _holder = step.front() == '['
                      ? qx::Value(_holder.as<qx::Array>()->at(std::stoul(step.substr(1))))
                      : _holder.object()->valueForKey(step);
    }

    qx::Value _holder;
    std::string _last;
};

inline void apply(const qx::Value& root, const std::string& edits) {
    std::istringstream lines(edits);
    for (std::string line; std::getline(lines, line);) {
        std::istringstream words(line);
        std::string first, path, rest;
        words >> first >> path;
        std::getline(words, rest);
        const auto value = [&] { return cases::Maker(rest).value(); };
        if (first == "insert") {
            const Place place(root, path);
            place.array().insert(place.index(), value());
        } else if (first == "remove") {
            const Place place(root, path);
            place.array().remove(place.index());
        } else if (first == "move") {
            const Place place(root, path);
            const qx::Value item = place.array().at(place.index());
            place.array().remove(place.index());
            const bool isElsewhere = rest.find('[') != std::string::npos;
            const Place target(root, isElsewhere ? rest.substr(1) : path);
            target.array().insert(isElsewhere ? target.index() : std::stoul(rest), item);
        } else {
            Place(root, first).set(value());
        }
    }
}

inline std::vector<std::string> linesOf(const std::string& text) {
    std::istringstream stream(text);
    std::vector<std::string> lines;
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

// Of small texts.
inline std::string difference(const std::string& before, const std::string& now) {
    const auto a = linesOf(before), b = linesOf(now);
    std::vector<std::vector<std::size_t>> same(a.size() + 1,
                                               std::vector<std::size_t>(b.size() + 1));
    for (std::size_t i = a.size(); i-- > 0;)
        for (std::size_t j = b.size(); j-- > 0;)
            same[i][j] =
                a[i] == b[j] ? same[i + 1][j + 1] + 1 : std::max(same[i + 1][j], same[i][j + 1]);
    std::string difference;
    std::size_t i = 0, j = 0;
    while (i < a.size() || j < b.size()) {
        if (i < a.size() && j < b.size() && a[i] == b[j]) {
            ++i, ++j;
        } else if (i < a.size() && (j == b.size() || same[i + 1][j] >= same[i][j + 1])) {
            difference += "- " + a[i++] + "\n";
        } else {
            difference += "+ " + b[j++] + "\n";
        }
    }
    return difference;
}

} // namespace edits
