// Every public header of the library that needs nothing but the standard library.
#pragma once

#include <kvt/codec/float_text.h>
#include <kvt/codec/string_adaptors.h>
#include <kvt/codec/wwjd.h>
#include <kvt/datetime/datetime.h>
#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/datetime/utc_offset.h>
#include <kvt/encoding/encoding.h>
#include <kvt/encoding/icu_transcoder.h>
#include <kvt/encoding/stream_transcoder.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/memory.h>
#include <kvt/foundation/optional.h>
#include <kvt/foundation/pimpl.h>
#include <kvt/foundation/string_view.h>
#include <kvt/foundation/throwable.h>
#include <kvt/foundation/translation_scoped.h>
#include <kvt/foundation/vector.h>
#include <kvt/legacy/obsolete_date.h>
#include <kvt/legacy/obsolete_time.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>
#include <kvt/string/ustring_format.h>
#include <kvt/string/ustring_view.h>
