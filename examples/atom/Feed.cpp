#include "Feed.h"

namespace atom {

void describeClasses() {
    qx::Class::define<Text>("Text").members<&Text::type, &Text::text, &Text::unknown>();
    qx::Class::define<Link>("Link").members<&Link::rel, &Link::href, &Link::unknown>();
    qx::Class::define<Entry>("Entry")
        .members<&Entry::id, &Entry::title, &Entry::updated, &Entry::links, &Entry::unknown>();
    qx::Class::define<Feed>("Feed")
        .members<&Feed::id, &Feed::title, &Feed::updated, &Feed::links, &Feed::entries,
                 &Feed::unknown>();
}

Text* titleOf(Feed& feed, const std::string& id) {
    const auto made = [](std::optional<Text>& title) { return title ? &*title : &title.emplace(); };
    if (feed.id == id)
        return made(feed.title);
    for (Entry& entry : feed.entries)
        if (entry.id == id)
            return made(entry.title);
    return nullptr;
}

} // namespace atom
