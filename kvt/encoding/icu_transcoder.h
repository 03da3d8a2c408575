// Conversion of text between two encodings through ICU.
//
// Each thread keeps one ICU converter for each encoding it has used; an ICUTranscoder is a light object for the
// stack that pairs two of them. Conversion never stops at a bad character: a substitution takes its place, and when
// all the text is converted the loss is thrown as a failure that carries the substituted text.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/string_view.h>

#include <string>

namespace kvt::ex {

namespace detail {
class TranscoderHelper;
}

/// Converts from one encoding to another. It uses converters of the thread that made it and must stay on that
/// thread.
///
/// A copy is a bytewise one: the pivot pointers of the copy address the pivot of the original. Copy a transcoder
/// before its first use only, or start the copy with `reset` true, and do not let it outlive the original.
class KVT_EXPORT ICUTranscoder {
public:
    enum Status {
        Ok = 0,         ///< all input was taken
        OutputFull = 1, ///< the output buffer ended first; call again
        Failed = 2,     ///< ICU gave up
    };

    /// Not valid; it can be assigned to.
    ICUTranscoder() noexcept;

    /// Takes this thread's converters of the two encodings, opening them when needed. Throws
    /// InvalidEncodingException (910005, %0 = "unknown") for `Unknown`, `Binary` and `Wwjd`, which have none.
    ICUTranscoder(Encoding from, Encoding to);

    ICUTranscoder(const ICUTranscoder&) = default;
    ICUTranscoder(ICUTranscoder&&) = default;
    ICUTranscoder& operator=(const ICUTranscoder&) = default;
    ICUTranscoder& operator=(ICUTranscoder&&) = default;
    ~ICUTranscoder() = default;

    /// Whether there are two converters and ICU opened both. The members below need a valid transcoder.
    bool isValid() const noexcept;

    Encoding fromEncoding() const;
    Encoding toEncoding() const;

    /// Whether the longest character of the encoding has one byte. Throws InvalidEncodingException (910005,
    /// %0 = "unknown") for encodings without a converter.
    static bool isSingleByteEncoding(Encoding encoding);

    /// Converts all of `in` and replaces `out` by the result. The units of both are bytes to the converters. `in`
    /// must not view `out`. Between equal encodings the input is copied without being looked at.
    ///
    /// Throws InvalidEncodingException (910005, %0 = the name) when ICU cannot open one of the two, as for an id that
    /// was never handed out. Throws, with `out` holding the substituted text:
    /// - UStringBadEncodingException (910002) when `in` is not valid text of the source encoding;
    /// - UStringTranscodingException (910003) when that was not so and a character has no form in the target.
    ///
    /// Exists for char to char, char16_t and char32_t, the way back, and between char16_t and char32_t.
    template <typename CharIn, typename CharOut>
    void transcode(kvt::future::basic_string_view<CharIn> in, std::basic_string<CharOut>& out);

    /// Converts a piece. `in` is shortened to what was not taken yet, `out` from the buffer to write into to the
    /// part that was written. `flush` says that no input follows, `reset` that the converters start afresh.
    ///
    /// Losses are substituted and not reported; they are remembered in the thread's converters, and the next
    /// transcode() of the same encodings on this thread reports them. See StreamTranscoder for a stream that
    /// reports each loss with its place.
    template <typename CharIn, typename CharOut>
    Status transcodeStream(kvt::future::basic_string_view<CharIn>& in,
                           kvt::future::basic_string_view<CharOut>& out, bool flush, bool reset);

private:
    static constexpr std::size_t pivotUnits = 1024;

    detail::TranscoderHelper& from_helper() const noexcept { return *from_; }
    detail::TranscoderHelper& to_helper() const noexcept { return *to_; }

    detail::TranscoderHelper* from_ = nullptr;
    detail::TranscoderHelper* to_ = nullptr;
    char16_t pivot_[pivotUnits];
    char16_t* pivotSource_ = pivot_;
    char16_t* pivotTarget_ = pivot_;
};

} // namespace kvt::ex
