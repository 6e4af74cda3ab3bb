#pragma once

// Settings by name. The first of these that holds a value gives it:
//   1. "-Key value" arguments, once the host has handed its arguments over
//   2. what the program has set
//   3. the user's file $XDG_CONFIG_HOME/<process name>.plist, else in ~/.config, an XML property
//      list; read when a value is first asked for, and again after synchronize() or when the
//      process name changes
//   4. registered defaults
// Nothing is written back to the file. Any thread may read and set; a value that is an object, such
// as a list of the file, is shared by those who ask for it.
//
//     qx::UserDefaults::standardUserDefaults()->setArguments({argv + 1, argv + argc});

#include <QXXMLMarshalling/model/Dictionary.h>

#include <mutex>
#include <span>

namespace qx {

class QX_API UserDefaults final : public Object {
public:
    static Ref<UserDefaults> standardUserDefaults();
    ~UserDefaults() override;

    // Null when no source holds the key, as none holds null.
    Value objectForKey(const String& key);
    // Null when the value is no string.
    String stringForKey(const String& key);
    // False without a value; see Value::boolValue.
    bool boolForKey(const String& key);
    std::int64_t integerForKey(const String& key);

    // Replaces what earlier arguments said. "-Key" takes the argument behind it as its value unless
    // that looks like a key too; "--" ends the search, as a null pointer does, and "--option" is
    // not looked at.
    void setArguments(std::span<const char* const> arguments);
    // A null value is the same as removeObjectForKey; a null key raises NSInvalidArgumentException.
    void setObject(const Value& value, const String& key);
    // Forgets what the program set; the sources behind show through.
    void removeObjectForKey(const String& key);
    // Replaces the registered default of that key. Null for either raises
    // NSInvalidArgumentException.
    void registerDefault(const Value& value, const String& key);
    // Forgets the user's file, which is read again when it is needed.
    void synchronize();

protected:
    const Class& describedClass() const override;

private:
    friend Ref<UserDefaults> make<UserDefaults>();

    UserDefaults();
    Ref<Dictionary> userFile();

    std::mutex _mutex;
    Ref<Dictionary> _arguments;
    Ref<Dictionary> _set;
    Ref<Dictionary> _file; // null: not read yet
    String _fileProcess;
    std::size_t _synchronizations = 0;
    Ref<Dictionary> _registered;
};

} // namespace qx
