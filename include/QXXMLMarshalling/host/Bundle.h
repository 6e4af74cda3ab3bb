#pragma once

// A folder with the resources of a program or a library, described by an XML property list
// Info.plist in it. Bundles are opened once and then shared; any thread may ask for them.
//
//     main bundle        what the host set; else ../share/<process name> beside the folder of the
//                        running program, where that exists; else the program's folder
//     framework bundle   this library's: ../share/QXXMLMarshalling beside its own folder
//     of a class         ../share/<name> beside the folder of its lib<name>.so, else that folder;
//                        for a class of the program itself, the main bundle
//
// Beside a folder of an architecture, lib/x86_64-linux-gnu, say, the share beside lib counts, too.
// A library that is linked in statically lies where the program lies.

#include <QXXMLMarshalling/model/Dictionary.h>

#include <typeinfo>

namespace qx {

class QX_API Bundle final : public Object {
public:
    // Never null: where the program's folder is gone or cannot be told, it holds nothing.
    static Ref<Bundle> mainBundle();
    // Null goes back to the program's own.
    static void setMainBundle(const Ref<Bundle>& bundle);
    static Ref<Bundle> frameworkBundle();
    // The bundle of the program or shared object that holds the class: bundleForClass(typeid(*x)).
    // A class without a virtual function outside of its header lies in each that uses it.
    static Ref<Bundle> bundleForClass(const std::type_info& type);
    // Null when there is no folder at the path.
    static Ref<Bundle> bundleWithPath(const String& path);
    // Among the bundles opened so far, the main and the framework bundle with them; else null.
    static Ref<Bundle> bundleWithIdentifier(const String& identifier);
    // Takes the bundle from those opened: bundleWithPath reads it anew. For a plug-in that goes
    // away.
    static void forget(const Ref<Bundle>& bundle);
    ~Bundle() override;

    const String& bundlePath() const noexcept { return _path; }
    // CFBundleIdentifier; null without one.
    String bundleIdentifier() const;
    // What Info.plist holds, empty without a readable one. Set what it should hold besides before
    // other threads use the bundle.
    const Ref<Dictionary>& infoDictionary() const noexcept { return _info; }
    // An entry of the info dictionary, null without one. The versions of the main bundle are those
    // of ProcessInfo::setProcessVersion where the host has set them.
    Value objectForInfoDictionaryKey(const String& key) const;
    // The path of a file or folder in the bundle, which may lie in a folder of it ("maps/a.xml");
    // null when there is none or the name leads out of the bundle. A type is added behind a dot.
    String pathForResource(const String& name, const String& type = nullptr) const;

    // The translation of an English text, from <language>.lproj/Localizable.strings; the English
    // text itself where there is none. The language is that of the first of LC_ALL, LC_MESSAGES and
    // LANG that is set; what "de_AT" lacks comes from "de". Texts are read once, from UTF-8 or
    // UTF-16; entries that cannot be read are warned about and passed over.
    String localizedString(const String& englishText) const;

    // The class name, the address and the path.
    String description() const override;

protected:
    const Class& describedClass() const override;

private:
    friend Ref<Bundle> make<Bundle>(String&, const Ref<Dictionary>&);

    Bundle(String path, Ref<Dictionary> info) noexcept;

    String _path;
    Ref<Dictionary> _info;
};

} // namespace qx
