#pragma once

// Names with a count each, in the order in which they were first added. Serves as a plain set too.

#include <QXXMLMarshalling/model/Value.h>

#include <vector>

namespace qx {

class QX_API CountedSet final : public Object {
public:
    CountedSet() = default;
    CountedSet(std::initializer_list<std::string_view> names);
    ~CountedSet() override;

    void add(const String& name, std::size_t times = 1);
    // Lowers the name's count by one and forgets the name at zero; an absent name is ignored.
    void remove(const String& name);
    // Lowers the name's count by one; false for an absent name.
    bool take(const String& name);
    // Lowers the count by as much, not below zero.
    void remove(const String& name, std::size_t times);
    void removeAll() noexcept;
    [[nodiscard]] Ref<CountedSet> mutableCopy() const;

    std::size_t countFor(const String& name) const noexcept;
    bool contains(const String& name) const noexcept { return countFor(name) != 0; }
    // How many distinct names there are.
    std::size_t count() const noexcept { return _count; }
    bool isEmpty() const noexcept { return _count == 0; }
    // The distinct names in order.
    std::vector<String> names() const;

    // "(name [2], other [1])".
    String description() const override;
    bool isEqual(const Object& other) const override;

protected:
    const Class& describedClass() const override;

private:
    struct Entry {
        String name;
        std::size_t count; // 0: removed, the name stays in its place
    };
    std::size_t positionOf(const String& name) const noexcept;
    void makeRoom();

    std::vector<Entry> _entries;
    std::vector<std::uint32_t> _index; // empty while there are few entries
    std::size_t _count = 0;
};

} // namespace qx
