// SPDX-License-Identifier: Apache-2.0
// Engines as objects, each on every kind of device that it has a road for: their class, copies,
// assignments and moves.
#include <cstdint>
#include <dlfcn.h>
#include <link.h>
#include <memory>
#include <string>
#include <type_traits>
#include <typeinfo>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"
#include "frame/engine_backend.hpp"
#include "message.hpp"

namespace {

namespace tarn = kestrel::tarn;
namespace rng = kestrel::tarn::rng;
using namespace tarn_test;

template <typename Engine>
rng::detail::engine_base_impl<Engine>* impl_of(Engine& engine) {
  return rng::detail::engine_access::impl(engine);
}

template <typename Case>
std::string unsupported(const sycl::queue& queue) {
  return std::string("kestrel::tarn::rng::") + Case::name + ": unsupported device: " +
         queue.get_device().template get_info<sycl::info::device::name>();
}

template <typename Case>
class engine_objects : public over_cases<Case> {};
TYPED_TEST_SUITE(engine_objects, every_case, case_name);

template <typename Type, typename = void>
inline constexpr bool is_complete = false;
template <typename Type>
inline constexpr bool is_complete<Type, std::void_t<decltype(sizeof(Type))>> = true;

TYPED_TEST(engine_objects, are_values_on_an_implementation) {
  using Engine = typename TypeParam::Engine;
  using base = rng::detail::engine_base<Engine>;
  using impl = rng::detail::engine_base_impl<Engine>;
  static_assert(std::is_base_of_v<base, Engine> && sizeof(Engine) == sizeof(base));
  static_assert(sizeof(base) == sizeof(sycl::queue) + sizeof(std::unique_ptr<impl>));
  static_assert(!std::is_polymorphic_v<Engine> && std::is_copy_constructible_v<Engine> &&
                std::is_copy_assignable_v<Engine>);
  static_assert(std::is_nothrow_move_constructible_v<Engine> &&
                std::is_nothrow_move_assignable_v<Engine>);
  static_assert(!std::is_convertible_v<sycl::queue, Engine> && !std::is_copy_constructible_v<impl>);
  static_assert(std::has_virtual_destructor_v<impl>);
  using rng::detail::engine_base_impl_backend;
  static_assert(is_complete<engine_base_impl_backend<Engine, device_type::cpu>>);
  static_assert(TypeParam::gpu || !is_complete<engine_base_impl_backend<Engine, device_type::gpu>>,
                "an engine for CPU queues alone has no backend on a GPU");
}

// The table of virtual functions is as long as the dynamic loader says: the offset to the top of
// the object, the type, and the destructor in its two forms.
TYPED_TEST(engine_objects, have_no_virtual_operation_but_the_destructor) {
  using impl = rng::detail::engine_base_impl<typename TypeParam::Engine>;
  const std::string name = std::string("_ZTV") + typeid(impl).name();
  void* const functions = ::dlsym(RTLD_DEFAULT, name.c_str());
  ASSERT_NE(functions, nullptr) << name;
  Dl_info place = {};
  void* symbol = nullptr;
  ASSERT_NE(::dladdr1(functions, &place, &symbol, RTLD_DL_SYMENT), 0);
  EXPECT_EQ(place.dli_sname, name);
  EXPECT_EQ(static_cast<const ElfW(Sym)*>(symbol)->st_size, 4 * sizeof(void*));
}

TYPED_TEST(engine_objects, go_on_alone_as_copies) {
  for (const std::int64_t before : {0, 5, 1000}) {
    auto source = TypeParam::make();
    next(source, before);
    auto copy = source;
    EXPECT_EQ(copy.get_queue(), source.get_queue());
    EXPECT_NE(impl_of(copy), impl_of(source));
    expect_next<TypeParam>(source, before, 9);
    expect_next<TypeParam>(copy, before, 3);
    copy = source;
    next(source, 2);
    expect_next<TypeParam>(copy, before + 9, 700);
    expect_next<TypeParam>(source, before + 11, 5);
  }
}

TYPED_TEST(engine_objects, outlive_the_source_of_a_copy) {
  auto copy = TypeParam::make();
  {
    auto source = TypeParam::make();
    next(source, 7);
    copy = source;
  }
  expect_next<TypeParam>(copy, 7, 9);
}

TYPED_TEST(engine_objects, stay_when_assigned_to_themselves) {
  auto engine = TypeParam::make();
  next(engine, 3);
  const auto* impl = impl_of(engine);
  auto& same = engine;
  engine = same;
  EXPECT_EQ(impl_of(engine), impl);
  EXPECT_EQ(engine.get_queue(), same.get_queue());
  expect_next<TypeParam>(engine, 3, 9);
}

TYPED_TEST(engine_objects, are_left_empty_by_moves_and_can_be_assigned_to) {
  auto source = TypeParam::make();
  next(source, 5);
  const auto* impl = impl_of(source);
  auto target = std::move(source);
  EXPECT_EQ(impl_of(target), impl);
  EXPECT_EQ(impl_of(source), nullptr);
  expect_next<TypeParam>(target, 5, 3);

  source = TypeParam::make();  // by move
  expect_next<TypeParam>(source, 0, 3);
  auto third = std::move(source);
  source = target;  // by copy
  expect_next<TypeParam>(source, 8, 3);
  expect_next<TypeParam>(target, 8, 3);
  target = std::move(third);
  EXPECT_EQ(impl_of(third), nullptr);
  expect_next<TypeParam>(target, 3, 3);
}  // `third` ends here without an implementation

// Where the engine has no road an assignment takes the queue over and says nothing, and a copy is
// refused.
TYPED_TEST(engine_objects, keep_their_implementation_on_a_device_without_a_road) {
  std::vector<sycl::queue> roadless = {accelerator_queue()};
  if (!TypeParam::gpu) {
    roadless.push_back(gpu_queue());
  }
  for (const sycl::queue& queue : roadless) {
    auto source = TypeParam::make();
    next(source, 2);
    source.get_queue() = queue;
    auto target = TypeParam::make();
    next(target, 11);
    const auto* impl = impl_of(target);
    target = source;
    EXPECT_EQ(target.get_queue(), queue);
    EXPECT_EQ(impl_of(target), impl);
    target.get_queue() = TypeParam::queue();
    expect_next<TypeParam>(target, 11, 9);

    EXPECT_EQ(message_of<tarn::unsupported_device>([&] { auto copy = source; }),
              unsupported<TypeParam>(queue));
    source.get_queue() = TypeParam::queue();
    expect_next<TypeParam>(source, 2, 9);

    auto empty = std::move(source);
    target.get_queue() = queue;
    source = target;  // onto a moved-from engine: the queue, and still no implementation
    EXPECT_EQ(source.get_queue(), queue);
    EXPECT_EQ(impl_of(source), nullptr);
  }
}

// The device of the source's queue decides, not that of the target's.
TYPED_TEST(engine_objects, cross_over_to_the_device_of_the_source) {
  auto source = TypeParam::make();
  next(source, 5);
  auto target = TypeParam::make(cpu_queue(), 9);
  target = source;
  EXPECT_EQ(target.get_queue(), source.get_queue());
  expect_next<TypeParam>(target, 5, 9);

  auto back = TypeParam::make(cpu_queue());
  next(back, 3);
  target = back;
  EXPECT_TRUE(target.get_queue().get_device().is_cpu());
  expect_next<TypeParam>(target, 3, 9);
}

}  // namespace
