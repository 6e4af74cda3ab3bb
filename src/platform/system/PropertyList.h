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

#include <QXXMLMarshalling/platform/Dictionary.h>

namespace qx {

// The dictionary that the file holds; an empty one for a missing file. A file that cannot be read
// or is no such list is warned about, with its path, and counts as empty.
Ref<Dictionary> readPropertyList(const String& path);

} // namespace qx
