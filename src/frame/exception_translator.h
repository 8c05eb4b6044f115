// Any exception as one HResultException: a chain of elements, each for one exception type.
#pragma once

#include "zelt/error.h"

#include <utility>

namespace Qor {

/// Translates the exception being handled.
class ExceptionTranslatorBase {
public:
    virtual ~ExceptionTranslatorBase() = default;
    virtual HResultException translate() const = 0;
};

/// Ends the chain: nobody knew the exception, so it goes on.
class ExceptionTranslatorTail final : public ExceptionTranslatorBase {
public:
    [[noreturn]] HResultException translate() const override { throw; }
};

/// Lets the elements behind it try first; an exception of type E that comes back is its own.
template <class E, class F>
class ExceptionTranslator final : public ExceptionTranslatorBase {
public:
    ExceptionTranslator(F translate_one, const ExceptionTranslatorBase& next)
        : translate_one_(std::move(translate_one)), next_(next)
    {
    }
    HResultException translate() const override
    {
        try {
            return next_.translate();
        } catch (const E& e) {
            return translate_one_(e);
        }
    }

private:
    F translate_one_;
    const ExceptionTranslatorBase& next_;
};

/// Only while an exception is being handled. Translations of several threads take turns.
HResultException TranslateCurrentException();

} // namespace Qor
