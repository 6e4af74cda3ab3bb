#include "saving/ListMatching.h"

#include <algorithm>
#include <unordered_map>

namespace qx::detail {

namespace {

constexpr std::size_t none = ListMatching::none;

// For each number the longest rising row through all: those that are not in it have moved.
std::vector<bool> longestRise(const std::vector<std::size_t>& numbers) {
    std::vector<std::size_t> ends;                           // of rows, by their length
    std::vector<std::size_t> previous(numbers.size(), none); // in the row
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        if (numbers[i] == none)
            continue;
        const auto place =
            std::lower_bound(ends.begin(), ends.end(), numbers[i],
                             [&](std::size_t end, std::size_t n) { return numbers[end] < n; });
        previous[i] = place != ends.begin() ? *(place - 1) : none;
        if (place != ends.end())
            *place = i;
        else
            ends.push_back(i);
    }
    std::vector<bool> isIn(numbers.size());
    for (std::size_t at = ends.empty() ? none : ends.back(); at != none; at = previous[at])
        isIn[at] = true;
    return isIn;
}

class Matcher {
public:
    Matcher(const std::vector<ListItem>& before, const std::vector<ListItem>& now)
        : _before(before), _now(now), _was(now.size(), none), _isMatched(before.size()) {}

    ListMatching run() {
        Part all{0, _before.size(), 0, _now.size()};
        trim(all);
        matchUnique(all);
        matchByKey([](const ListItem& item) { return std::to_string(item.hash); }, true);
        matchByKey([](const ListItem& item) { return item.key; }, false);
        matchByPlace();
        return {_was, longestRise(_was)};
    }

private:
    // Of both lists.
    struct Part {
        std::size_t before, beforeEnd, now, nowEnd;
    };

    void pair(std::size_t before, std::size_t now) {
        _was[now] = before;
        _isMatched[before] = true;
    }
    bool areEqual(std::size_t before, std::size_t now) const {
        return _before[before].hash == _now[now].hash;
    }
    void trim(Part& part) {
        while (part.before < part.beforeEnd && part.now < part.nowEnd &&
               areEqual(part.before, part.now))
            pair(part.before++, part.now++);
        while (part.before < part.beforeEnd && part.now < part.nowEnd &&
               areEqual(part.beforeEnd - 1, part.nowEnd - 1))
            pair(--part.beforeEnd, --part.nowEnd);
    }
    void matchUnique(const Part& part) {
        struct Count {
            std::size_t before = 0, now = 0, place = 0;
        };
        std::unordered_map<std::uint64_t, Count> counts;
        for (std::size_t i = part.before; i < part.beforeEnd; ++i) {
            Count& count = counts[_before[i].hash];
            ++count.before;
            count.place = i;
        }
        for (std::size_t i = part.now; i < part.nowEnd; ++i)
            ++counts[_now[i].hash].now;
        std::vector<std::size_t> places(_now.size(), none);
        for (std::size_t i = part.now; i < part.nowEnd; ++i)
            if (const Count& count = counts[_now[i].hash]; count.before == 1 && count.now == 1)
                places[i] = count.place;
        const std::vector<bool> isIn = longestRise(places);
        Part between{part.before, part.beforeEnd, part.now, part.nowEnd};
        for (std::size_t i = part.now; i <= part.nowEnd; ++i) {
            if (i < part.nowEnd && !isIn[i])
                continue;
            between.beforeEnd = i < part.nowEnd ? places[i] : part.beforeEnd;
            between.nowEnd = i;
            matchBetween(between);
            if (i == part.nowEnd)
                break;
            pair(places[i], i);
            between.before = places[i] + 1;
            between.now = i + 1;
        }
    }
    void matchBetween(Part part) {
        trim(part);
        std::unordered_map<std::uint64_t, std::vector<std::size_t>> places;
        for (std::size_t i = part.beforeEnd; part.now < part.nowEnd && i-- > part.before;)
            places[_before[i].hash].push_back(i);
        for (std::size_t i = part.now; i < part.nowEnd; ++i) {
            const auto found = places.find(_now[i].hash);
            if (found == places.end() || found->second.empty())
                continue;
            pair(found->second.back(), i);
            found->second.pop_back();
        }
    }
    // Of those that are left; equal ones one after another.
    template <class KeyOf>
    void matchByKey(KeyOf keyOf, bool isOfAnyKind) {
        std::unordered_map<std::string, std::vector<std::size_t>> places;
        for (std::size_t i = _before.size(); i-- > 0;)
            if (std::string key = keyOf(_before[i]); !_isMatched[i] && !key.empty())
                places[std::move(key)].push_back(i);
        for (std::size_t i = 0; i < _now.size() && !places.empty(); ++i) {
            const auto found = _was[i] == none ? places.find(keyOf(_now[i])) : places.end();
            if (found == places.end() || found->second.empty() ||
                (!isOfAnyKind && _before[found->second.back()].kind != _now[i].kind))
                continue;
            pair(found->second.back(), i);
            found->second.pop_back();
        }
    }
    // Of those that stand behind the same item that has its place.
    void matchByPlace() {
        const std::vector<bool> stays = longestRise(_was);
        std::size_t before = 0;
        for (std::size_t i = 0; i < _now.size(); ++i) {
            if (_was[i] != none) {
                if (stays[i])
                    before = _was[i] + 1;
                continue;
            }
            while (before < _before.size() && _isMatched[before] && !isAnchor(before, stays))
                ++before;
            if (before < _before.size() && !_isMatched[before] &&
                _before[before].kind == _now[i].kind)
                pair(before++, i);
        }
    }
    bool isAnchor(std::size_t before, const std::vector<bool>& stays) {
        if (_anchors.empty()) {
            _anchors.resize(_before.size());
            for (std::size_t i = 0; i < _now.size(); ++i)
                if (stays[i])
                    _anchors[_was[i]] = true;
        }
        return _anchors[before];
    }

    const std::vector<ListItem>& _before;
    const std::vector<ListItem>& _now;
    std::vector<std::size_t> _was;
    std::vector<bool> _isMatched;
    std::vector<bool> _anchors;
};

} // namespace

ListMatching match(const std::vector<ListItem>& before, const std::vector<ListItem>& now) {
    return Matcher(before, now).run();
}

} // namespace qx::detail
