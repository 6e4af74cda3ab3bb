#pragma once

// Property lists in XML: the root element "plist" holds one value.
//
//     <plist version="1.0">
//         <dict>
//             <key>CFBundleIdentifier</key> <string>org.example.Client</string>
//             <key>Sizes</key>              <array><integer>1</integer><real>2.5</real></array>
//             <key>Lenient</key>            <true/>
//         </dict>
//     </plist>
//
// Dictionaries become qx::Dictionary, arrays qx::Array, data (base 64) qx::Data, dates their text.

#include <QXXMLMarshalling/model/Dictionary.h>

namespace qx {

struct PropertyList {
    Ref<Dictionary> values; // empty for a missing file, and for one that is no such list
    String problem;         // null unless the file is there and cannot be used

    // Keep the values first: the host's log function may ask for what they say, and the file must
    // not be read, and warned about, again for that.
    void warn() const;
};

PropertyList readPropertyList(const String& path);

} // namespace qx
