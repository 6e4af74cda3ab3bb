#include "saving/ListMatching.h"

#include <algorithm>
#include <unordered_map>

namespace qx::detail {

namespace {

constexpr std::size_t none = ListMatching::none;

// Which are in the row that ends there.
std::vector<bool> rowTo(std::size_t end, const std::vector<std::size_t>& previous) {
    std::vector<bool> isIn(previous.size());
    for (std::size_t at = end; at != none; at = previous[at])
        isIn[at] = true;
    return isIn;
}

// For each number the longest rising row through all: those that are not in it have moved.
std::vector<bool> longestRise(const std::vector<std::size_t>& numbers) {
    std::vector<std::size_t> ends;                           // of rows, by their length
    std::vector<std::size_t> previous(numbers.size(), none); // in the row
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        if (numbers[i] == none)
            continue;
        const bool isHighest = ends.empty() || numbers[ends.back()] < numbers[i];
        const auto place = isHighest ? ends.end()
                                     : std::lower_bound(ends.begin(), ends.end(), numbers[i],
                                                        [&](std::size_t end, std::size_t n) {
                                                            return numbers[end] < n;
                                                        });
        previous[i] = place != ends.begin() ? *(place - 1) : none;
        if (place != ends.end())
            *place = i;
        else
            ends.push_back(i);
    }
    return rowTo(ends.empty() ? none : ends.back(), previous);
}

// The rising row of the most weight, which sizeOf() says of each number below `count`.
std::vector<bool> heaviestRise(const std::vector<std::size_t>& numbers, std::size_t count,
                               const ItemSize& sizeOf) {
    struct Row {
        std::size_t weight = 0, end = none;
    };
    // A Fenwick tree: the heaviest of the rows that end with one of so many numbers.
    std::vector<Row> heaviest(count + 1);
    std::vector<std::size_t> previous(numbers.size(), none);
    Row best;
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        if (numbers[i] == none)
            continue;
        Row row;
        for (std::size_t at = numbers[i]; at != 0; at &= at - 1)
            row = heaviest[at].weight > row.weight ? heaviest[at] : row;
        previous[i] = row.end;
        row = {row.weight + sizeOf(numbers[i]), i};
        for (std::size_t at = numbers[i] + 1; at <= count; at += at & (~at + 1))
            heaviest[at] = row.weight > heaviest[at].weight ? row : heaviest[at];
        best = row.weight > best.weight ? row : best;
    }
    return rowTo(best.end, previous);
}

class Matcher {
public:
    Matcher(const std::vector<ListItem>& before, const std::vector<ListItem>& now,
            const Likeness& likeness, const ItemSize& sizeOf)
        : _before(before), _now(now), _was(now.size(), none), _likeness(likeness), _sizeOf(sizeOf),
          _isMatched(before.size()) {}

    // Where one item was changed in its place, there is no need of keys.
    ListMatching run(const std::function<ListKeys()>& findKeys) {
        Part all{0, _before.size(), 0, _now.size()};
        trim(all);
        matchUnique(all);
        matchLeft([&](std::size_t i) { return _before[i].hash; },
                  [&](std::size_t i) { return _now[i].hash; }, true);
        if (_before.size() == _matched + 1 && _now.size() == _matched + 1)
            matchGaps();
        if (findKeys && _before.size() > _matched && _now.size() > _matched)
            if (const ListKeys keys = findKeys(); !keys.now.empty())
                matchLeft([&](std::size_t i) { return keys.before[i]; },
                          [&](std::size_t i) { return keys.now[i]; }, false);
        matchGaps();
        std::vector<bool> stays = longestRise(_was);
        const bool haveMoved =
            std::ranges::count(stays, true) != static_cast<std::ptrdiff_t>(_matched);
        if (haveMoved && _sizeOf)
            stays = heaviestRise(_was, _before.size(), _sizeOf);
        return {std::move(_was), std::move(stays)};
    }

private:
    // Of both lists.
    struct Part {
        std::size_t before, beforeEnd, now, nowEnd;
    };

    void pair(std::size_t before, std::size_t now) {
        _was[now] = before;
        _isMatched[before] = true;
        ++_matched;
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
        counts.reserve(part.beforeEnd - part.before);
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
    // Of those that are left; those of one key one after another.
    template <class KeyBefore, class KeyNow>
    void matchLeft(KeyBefore keyBefore, KeyNow keyNow, bool isOfAnyKind) {
        if (_before.size() == _matched || _now.size() == _matched)
            return;
        std::unordered_map<decltype(keyNow(0)), std::vector<std::size_t>> places;
        for (std::size_t i = _before.size(); i-- > 0;)
            if (!_isMatched[i])
                places[keyBefore(i)].push_back(i);
        for (std::size_t i = 0; i < _now.size(); ++i) {
            const auto found = _was[i] == none ? places.find(keyNow(i)) : places.end();
            if (found == places.end() || found->second.empty() ||
                (!isOfAnyKind && _before[found->second.back()].kind != _now[i].kind))
                continue;
            pair(found->second.back(), i);
            found->second.pop_back();
        }
    }
    // Of those that stand between the same two that have their place.
    void matchGaps() {
        const std::vector<bool> stays = longestRise(_was);
        std::size_t before = 0, now = 0;
        for (std::size_t i = 0; i <= _now.size(); ++i) {
            if (i < _now.size() && !stays[i])
                continue;
            const std::size_t end = i < _now.size() ? _was[i] : _before.size();
            matchGap(before, end, now, i);
            before = end + 1;
            now = i + 1;
        }
    }
    void matchGap(std::size_t before, std::size_t beforeEnd, std::size_t now, std::size_t nowEnd) {
        std::vector<std::size_t> old, fresh;
        for (; now < nowEnd; ++now)
            if (_was[now] == none)
                fresh.push_back(now);
        for (; before < beforeEnd && !fresh.empty(); ++before)
            if (!_isMatched[before])
                old.push_back(before);
        constexpr std::size_t most = 4096;
        if (_likeness && old.size() * fresh.size() <= most)
            return matchAlike(old, fresh);
        for (std::size_t i = 0; i < std::min(old.size(), fresh.size()); ++i)
            if (_before[old[i]].kind == _now[fresh[i]].kind)
                pair(old[i], fresh[i]);
    }
    // The pairs in order that have most in common in sum; any pair is better than none.
    void matchAlike(const std::vector<std::size_t>& old, const std::vector<std::size_t>& fresh) {
        const std::size_t width = fresh.size() + 1;
        std::vector<std::size_t> best((old.size() + 1) * width);
        const auto gain = [&](std::size_t i, std::size_t j) -> std::size_t {
            const bool isSameKind = _before[old[i]].kind == _now[fresh[j]].kind;
            return isSameKind ? 1 + 2 * _likeness(old[i], fresh[j]) : 0;
        };
        std::vector<std::size_t> gains(old.size() * fresh.size());
        for (std::size_t i = old.size(); i-- > 0;)
            for (std::size_t j = fresh.size(); j-- > 0;) {
                const std::size_t with = gains[i * fresh.size() + j] = gain(i, j);
                best[i * width + j] =
                    std::max({best[(i + 1) * width + j], best[i * width + j + 1],
                              with != 0 ? with + best[(i + 1) * width + j + 1] : 0});
            }
        for (std::size_t i = 0, j = 0; i < old.size() && j < fresh.size();) {
            const std::size_t with = gains[i * fresh.size() + j];
            if (with != 0 && best[i * width + j] == with + best[(i + 1) * width + j + 1])
                pair(old[i++], fresh[j++]);
            else if (best[i * width + j] == best[(i + 1) * width + j])
                ++i;
            else
                ++j;
        }
    }

    const std::vector<ListItem>& _before;
    const std::vector<ListItem>& _now;
    std::vector<std::size_t> _was;
    const Likeness& _likeness;
    const ItemSize& _sizeOf;
    std::vector<bool> _isMatched;
    std::size_t _matched = 0; // how many
};

} // namespace

ListMatching match(const std::vector<ListItem>& before, const std::vector<ListItem>& now,
                   const Likeness& likeness, const std::function<ListKeys()>& findKeys,
                   const ItemSize& sizeOf) {
    return Matcher(before, now, likeness, sizeOf).run(findKeys);
}

} // namespace qx::detail
