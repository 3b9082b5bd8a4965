#pragma once

#include <type_traits>
#include <utility>

namespace veltrane
{

// Calls fn with a compile-time copy of flag (or of choice, 0 <= choice < count), so that
// a setting fixed for the block picks a specialised loop instead of being tested on
// every sample.
template <typename Fn>
void withFlag (bool flag, Fn&& fn)
{
    if (flag)
        fn (std::true_type {});
    else
        fn (std::false_type {});
}

template <int count, int first = 0, typename Fn>
void withChoice (int choice, Fn&& fn)
{
    if constexpr (first + 1 < count)
    {
        if (choice != first)
            return withChoice<count, first + 1> (choice, std::forward<Fn> (fn));
    }

    fn (std::integral_constant<int, first> {});
}

} // namespace veltrane
