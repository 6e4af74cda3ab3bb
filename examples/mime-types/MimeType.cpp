#include "MimeType.h"

#include <algorithm>

#include <fnmatch.h>

bool Glob::matches(const std::string& fileName) const {
    return fnmatch(pattern.c_str(), fileName.c_str(), isCaseSensitive ? 0 : FNM_CASEFOLD) == 0;
}

std::optional<int> MimeType::weightFor(const std::string& fileName) const {
    std::optional<int> heaviest;
    for (const auto& glob : globs)
        if (glob->matches(fileName))
            heaviest = std::max(heaviest.value_or(0), glob->weight);
    return heaviest;
}

void registerMimeTypes() {
    qx::Class::define<DatabaseObject>("DatabaseObject")
        .property<&DatabaseObject::unboundChildren>("unboundChildren")
        .property<&DatabaseObject::unboundAttributes>("unboundAttributes")
        .property<&DatabaseObject::namespaces>("__namespaces")
        .operation<&DatabaseObject::isRemovable>("isRemovable");
    qx::Class::define<Glob, DatabaseObject>("Glob")
        .property<&Glob::pattern>("pattern")
        .property<&Glob::weight>("weight")
        .property<&Glob::isCaseSensitive>("isCaseSensitive");
    qx::Class::define<MimeType, DatabaseObject>("MimeType")
        .property<&MimeType::name>("name")
        .property<&MimeType::globs>("globs")
        .property<&MimeType::comments>("comments")
        .property<&MimeType::acronyms>("acronyms")
        .property<&MimeType::expandedAcronyms>("expandedAcronyms")
        .property<&MimeType::icons>("icons")
        .property<&MimeType::genericIcons>("genericIcons")
        .property<&MimeType::magic>("magic")
        .property<&MimeType::treeMagic>("treeMagic")
        .property<&MimeType::rootElements>("rootElements")
        .property<&MimeType::aliases>("aliases")
        .property<&MimeType::superclasses>("superclasses");
}
