// The Han language list ("HanLanguageInfo.plist"): which language each Han information field is
// for, and the fields of each language.
//
//   {"tags": {"jyom": "ja", "krpi": "ko", "spin": "zh-Hans", ...},
//    "languages": {"ja": ["jyom"], "zh-Hans": ["spin", "swbx", "swbh", "sbix"], ...}}
//
// Languages are BCP 47 tags; "languages" lists tags in field order. The name field "unam" is not
// a Han field and is not listed.
// Thread-safety: pure function; the value belongs to the caller.
#pragma once

#include "platform/property_list.h"

namespace lumeris::resources {

plist::Value HanLanguageInfo();

}  // namespace lumeris::resources
