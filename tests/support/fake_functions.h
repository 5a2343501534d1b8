// What functions that stand in for the real ones are made of: the types of a function, and lists of its parameters and
// of its arguments by their number, for macros that define one such function a row.
#ifndef MERO_TESTS_SUPPORT_FAKE_FUNCTIONS_H
#define MERO_TESTS_SUPPORT_FAKE_FUNCTIONS_H

#include <cstddef>
#include <tuple>
#include <type_traits>

// TYPE_OF(name) is the type of a function and no more. What else a header says of it, such as which of its arguments
// are never null, decltype(::name) would bring along, and a compiler would warn that no template can keep it.
template <class R, class... Args>
std::type_identity<R(Args...)> TypeOf(R (*)(Args...));
template <class R, class... Args>
std::type_identity<R(Args...) noexcept> TypeOf(R (*)(Args...) noexcept);

#define TYPE_OF(name) decltype(TypeOf(&::name))::type

template <class Function>
struct Signature;

template <class R, class... Args>
struct Signature<R(Args...)> {
  using Result = R;
  using Arguments = std::tuple<Args...>;
  static constexpr bool kNoexcept = false;
};

template <class R, class... Args>
struct Signature<R(Args...) noexcept> : Signature<R(Args...)> {
  static constexpr bool kNoexcept = true;
};

template <class Function, std::size_t kIndex>
using Argument = std::tuple_element_t<kIndex, typename Signature<Function>::Arguments>;

#define PARAMETERS_0(Function)
#define PARAMETERS_1(Function) Argument<Function, 0> a
#define PARAMETERS_2(Function) PARAMETERS_1(Function), Argument<Function, 1> b
#define PARAMETERS_3(Function) PARAMETERS_2(Function), Argument<Function, 2> c
#define PARAMETERS_4(Function) PARAMETERS_3(Function), Argument<Function, 3> d
#define PARAMETERS_5(Function) PARAMETERS_4(Function), Argument<Function, 4> e
#define ARGUMENTS_0
#define ARGUMENTS_1 a
#define ARGUMENTS_2 ARGUMENTS_1, b
#define ARGUMENTS_3 ARGUMENTS_2, c
#define ARGUMENTS_4 ARGUMENTS_3, d
#define ARGUMENTS_5 ARGUMENTS_4, e

// The head of the function `name`, which has `count` parameters: what follows is its body.
#define STAND_IN_FOR(name, count)                                                               \
  extern "C" Signature<TYPE_OF(name)>::Result name(PARAMETERS_##count(TYPE_OF(name))) noexcept( \
      Signature<TYPE_OF(name)>::kNoexcept)

#endif  // MERO_TESTS_SUPPORT_FAKE_FUNCTIONS_H
