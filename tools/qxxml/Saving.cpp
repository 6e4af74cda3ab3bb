#include "qxxml/Saving.h"

#include <QXXMLMarshalling/QXXMLUpdate.h>

#include "qxxml/Failure.h"

#include <algorithm>
#include <cstdio>
#include <string_view>
#include <vector>

namespace qxxml {

namespace {

std::vector<std::string_view> linesOf(std::string_view text) {
    std::vector<std::string_view> lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        lines.push_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

std::size_t breaksIn(const qx::String& text) {
    return static_cast<std::size_t>(std::count(text.view().begin(), text.view().end(), '\n'));
}

// A run of lines that other lines take the place of; counted from 0, the ends are behind it.
struct Change {
    std::size_t before, beforeEnd, now, nowEnd;
};

std::string printed(const Change& change, const std::vector<std::string_view>& before,
                    const std::vector<std::string_view>& now) {
    auto [from, to, first, last] = change;
    to = std::min(to, before.size());
    last = std::min(last, now.size());
    while (from < to && first < last && before[from] == now[first])
        ++from, ++first;
    while (from < to && first < last && before[to - 1] == now[last - 1])
        --to, --last;
    std::string text = "@@ -" + std::to_string(from + (from < to ? 1 : 0)) + "," +
                       std::to_string(to - from) + " +" +
                       std::to_string(first + (first < last ? 1 : 0)) + "," +
                       std::to_string(last - first) + " @@\n";
    for (; from < to; ++from)
        text += "-" + std::string(before[from]) + "\n";
    for (; first < last; ++first)
        text += "+" + std::string(now[first]) + "\n";
    return text;
}

// As a program that compares files prints it, without lines around what changes.
std::string difference(const QXXMLUpdate& update, const std::string& original) {
    const auto before = linesOf(original);
    const auto now = linesOf(update.bytes()->view());
    std::string text;
    std::size_t added = 0, removed = 0; // lines, by the changes so far
    const auto& edits = update.edits();
    for (std::size_t i = 0; i < edits.size();) {
        Change change{edits[i].line - 1, edits[i].line, 0, 0};
        change.now = change.before + added - removed;
        for (; i < edits.size() && edits[i].line <= change.beforeEnd; ++i) {
            change.beforeEnd =
                std::max(change.beforeEnd, edits[i].line + breaksIn(edits[i].oldText));
            added += breaksIn(edits[i].newText);
            removed += breaksIn(edits[i].oldText);
        }
        change.nowEnd = change.beforeEnd + added - removed;
        text += printed(change, before, now);
    }
    return text;
}

void warn(const std::string& text) {
    std::fputs(("qxxml: warning: " + text + "\n").c_str(), stderr);
}

} // namespace

std::string saved(const Session& session, QXXMLMarshaller& marshaller, const std::string& original,
                  const qx::Value& object) {
    const auto update = QXXMLUpdate::updatedText(marshaller, original, object);
    if (!update)
        throw Failure(update.error(), session.file());
    for (const QXXMLUpdate::Unshown& value : update->unshown())
        warn(message("No XML shows the value of: %@", value.keyPath));
    for (const qx::String& keyPath : update->writtenAnew())
        warn(message("Its element was written anew: %@", keyPath));
    const Options& options = session.options();
    if (options.inPlace) {
        const auto written = QXXMLUpdate::updateFile(marshaller, object, options.document);
        if (!written)
            throw Failure(written.error(), session.file());
    }
    if (options.diff)
        return difference(*update, original);
    return options.inPlace ? std::string() : std::string(update->bytes()->view());
}

} // namespace qxxml
