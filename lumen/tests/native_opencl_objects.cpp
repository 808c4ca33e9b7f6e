// SPDX-License-Identifier: Apache-2.0
// SYCL objects over OpenCL handles and back: who holds a reference, what is refused.
#include "native_opencl.hpp"

namespace {

using opencl_layer::object;

const char* const source = "kernel void none() {}";

class opencl_objects : public native_opencl {
 protected:
  static int living(object kind) { return opencl_layer::objects(kind); }

  // get_native gives the caller one more reference, to the same object each time.
  template <typename Object>
  static auto expect_shared(const Object& made, object kind) {
    const int before = living(kind);
    const auto handle = sycl::get_native<opencl>(made);
    EXPECT_EQ(living(kind), before + 1);
    EXPECT_EQ(sycl::get_native<opencl>(made), handle);
    EXPECT_EQ(living(kind), before + 2);
    return handle;
  }
};

TEST_F(opencl_objects, a_context_is_one_of_opencl) {
  const sycl::context context(device());
  cl_context handle = expect_shared(context, object::context);
  cl_device_id id = nullptr;
  EXPECT_EQ(cl().clGetContextInfo(handle, CL_CONTEXT_DEVICES, sizeof id, &id, nullptr), CL_SUCCESS);
  EXPECT_EQ(id, id_of(device()));
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(cl().clReleaseContext(handle), CL_SUCCESS);
  }
  const sycl::context other(device());
  EXPECT_NE(native_context(other).get(), handle);
}

TEST_F(opencl_objects, a_context_holds_all_devices_that_it_is_made_for) {
  const sycl::context context(opencl_devices());
  std::vector<cl_device_id> ids(opencl_devices().size() + 1);
  std::size_t size = 0;
  EXPECT_EQ(cl().clGetContextInfo(native_context(context).get(), CL_CONTEXT_DEVICES,
                                  ids.size() * sizeof(cl_device_id), ids.data(), &size),
            CL_SUCCESS);
  ids.resize(size / sizeof(cl_device_id));
  std::vector<cl_device_id> expected;
  for (const sycl::device& each : opencl_devices()) {
    expected.push_back(id_of(each));
  }
  EXPECT_EQ(ids, expected);
}

TEST_F(opencl_objects, a_context_made_over_a_handle_keeps_it_by_a_reference_of_its_own) {
  const int before = living(object::context);
  {
    std::vector<sycl::context> made;
    {
      const native<cl_context> theirs = new_context({id_of(device())});
      made.push_back(sycl::make_context<opencl>(theirs.get()));
      EXPECT_EQ(living(object::context), before + 2);
      EXPECT_EQ(native_context(made[0]).get(), theirs.get());
    }
    EXPECT_EQ(living(object::context), before + 1);
    EXPECT_EQ(made[0].get_devices(), std::vector<sycl::device>{device()});
    EXPECT_EQ(made[0].get_backend(), opencl);
    sycl::queue queue(made[0], device());
    int* const place = sycl::malloc_shared<int>(4, queue);
    queue.fill(place, 3, 4).wait_and_throw();
    EXPECT_EQ(place[3], 3);
    sycl::free(place, queue);
  }
  expect_given_back();
}

TEST_F(opencl_objects, what_a_caller_hands_over_is_released_with_the_sycl_object) {
  cl_int code = -1;
  cl_device_id id = id_of(device());
  cl_context context = cl().clCreateContext(nullptr, 1, &id, nullptr, nullptr, &code);
  cl_command_queue queue = cl().clCreateCommandQueueWithProperties(context, id, nullptr, &code);
  cl_program program =
      cl().clCreateProgramWithSource(context, 1, const_cast<const char**>(&source), nullptr, &code);
  ASSERT_EQ(cl().clBuildProgram(program, 0, nullptr, "", nullptr, nullptr), CL_SUCCESS);
  cl_kernel kernel = cl().clCreateKernel(program, "none", &code);
  {
    namespace make = sycl::detail;
    const sycl::context made = make::make_context(context, {}, opencl, false);
    sycl::queue its = make::make_queue(queue, made, nullptr, false, {}, {}, opencl);
    const auto bundle = make::make_kernel_bundle(program, made, false, opencl);
    const sycl::kernel none = make::make_kernel(kernel, made, &bundle, false, opencl);
    its.submit([&](sycl::handler& h) { h.single_task(none); }).wait_and_throw();
  }
  expect_given_back();
}

TEST_F(opencl_objects, what_is_handed_over_and_refused_is_released) {
  const sycl::context context(device());
  const native<cl_context> other = new_context({id_of(device())});
  const native<cl_program> program = new_program(other.get(), source);
  cl_int code = -1;
  cl_kernel kernel = cl().clCreateKernel(program.get(), "none", &code);
  cl_command_queue queue =
      cl().clCreateCommandQueueWithProperties(other.get(), id_of(device()), nullptr, &code);
  namespace make = sycl::detail;
  EXPECT_EQ(code_of([&] { make::make_kernel(kernel, context, nullptr, false, opencl); }),
            sycl::errc::invalid);
  EXPECT_EQ(code_of([&] { make::make_queue(queue, context, nullptr, false, {}, {}, opencl); }),
            sycl::errc::invalid);
}

TEST_F(opencl_objects, a_queue_is_one_of_opencl) {
  const sycl::context context(device());
  for (const bool timed : {false, true}) {
    using sycl::property::queue::enable_profiling;
    sycl::queue queue =
        timed ? sycl::queue(context, device(), enable_profiling()) : sycl::queue(context, device());
    cl_command_queue handle = expect_shared(queue, object::queue);
    cl_command_queue_properties properties = 0;
    EXPECT_EQ(cl().clGetCommandQueueInfo(handle, CL_QUEUE_PROPERTIES, sizeof properties,
                                         &properties, nullptr),
              CL_SUCCESS);
    EXPECT_EQ((properties & CL_QUEUE_PROFILING_ENABLE) != 0, timed);
    cl_device_id id = nullptr;
    EXPECT_EQ(cl().clGetCommandQueueInfo(handle, CL_QUEUE_DEVICE, sizeof id, &id, nullptr),
              CL_SUCCESS);
    EXPECT_EQ(id, id_of(device()));
    for (int i = 0; i < 2; ++i) {
      EXPECT_EQ(cl().clReleaseCommandQueue(handle), CL_SUCCESS);
    }
  }
}

TEST_F(opencl_objects, a_queue_made_over_a_handle_is_like_the_native_one) {
  const sycl::context context(device());
  const native<cl_context> its = native_context(context);
  for (const cl_command_queue_properties properties :
       {0, CL_QUEUE_PROFILING_ENABLE, CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE}) {
    std::vector<sycl::queue> made;
    {
      const native<cl_command_queue> theirs = new_queue(its.get(), id_of(device()), properties);
      made.push_back(sycl::make_queue<opencl>(theirs.get(), context));
      const native<cl_command_queue> same(sycl::get_native<opencl>(made[0]),
                                          cl().clReleaseCommandQueue);
      EXPECT_EQ(same.get(), theirs.get());
    }
    EXPECT_EQ(made[0].get_device(), device());
    EXPECT_EQ(made[0].get_context(), context);
    EXPECT_EQ(made[0].is_in_order(), (properties & CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE) == 0);
    EXPECT_EQ(made[0].has_property<sycl::property::queue::enable_profiling>(),
              (properties & CL_QUEUE_PROFILING_ENABLE) != 0);
    int* const place = sycl::malloc_shared<int>(4, made[0]);
    made[0].fill(place, 3, 4).wait_and_throw();
    EXPECT_EQ(place[3], 3);
    sycl::free(place, made[0]);
  }
}

TEST_F(opencl_objects, a_queue_of_another_context_is_refused) {
  const sycl::context context(device());
  const native<cl_context> other = new_context({id_of(device())});
  const native<cl_command_queue> theirs = new_queue(other.get(), id_of(device()));
  EXPECT_EQ(code_of([&] { sycl::make_queue<opencl>(theirs.get(), context); }), sycl::errc::invalid);
  EXPECT_EQ(code_of([&] { sycl::make_queue<opencl>(nullptr, context); }), sycl::errc::invalid);
}

TEST_F(opencl_objects, times_are_not_asked_of_a_queue_that_keeps_none) {
  const sycl::context context(device());
  const native<cl_context> its = native_context(context);
  const native<cl_command_queue> theirs = new_queue(its.get(), id_of(device()));
  EXPECT_EQ(code_of([&] {
              sycl::detail::make_queue(theirs.get(), context, nullptr, true,
                                       {sycl::property::queue::enable_profiling()}, {}, opencl);
            }),
            sycl::errc::invalid);
}

TEST_F(opencl_objects, programs_and_kernels_are_kept_by_references_of_their_own) {
  const sycl::context context(device());
  const native<cl_context> its = native_context(context);
  std::vector<sycl::kernel> kernels;
  std::vector<sycl::kernel_bundle<sycl::bundle_state::executable>> bundles;
  {
    const native<cl_program> program = new_program(its.get(), source);
    const native<cl_kernel> kernel = new_kernel(program.get(), "none");
    kernels.push_back(sycl::make_kernel<opencl>(kernel.get(), context));
    bundles.push_back(
        sycl::make_kernel_bundle<opencl, sycl::bundle_state::executable>(program.get(), context));
  }
  cl_kernel kernel = expect_shared(kernels[0], object::kernel);
  const auto programs = expect_shared(bundles[0], object::program);
  ASSERT_EQ(programs.size(), 1U);
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(cl().clReleaseKernel(kernel), CL_SUCCESS);
    EXPECT_EQ(cl().clReleaseProgram(programs[0]), CL_SUCCESS);
  }
  EXPECT_EQ(kernels[0].get_context(), context);
  EXPECT_EQ(kernels[0].get_backend(), opencl);
  EXPECT_EQ(bundles[0].get_context(), context);
  EXPECT_EQ(bundles[0].get_devices(), std::vector<sycl::device>{device()});
  sycl::queue(context, device())
      .submit([&](sycl::handler& h) { h.single_task(kernels[0]); })
      .wait_and_throw();
}

TEST_F(opencl_objects, a_kernel_of_another_context_is_refused) {
  const sycl::context context(device()), other(device());
  const sycl::kernel none = make_kernel(context, source, "none");
  sycl::queue queue(other, device());
  EXPECT_EQ(code_of([&] { queue.submit([&](sycl::handler& h) { h.single_task(none); }); }),
            sycl::errc::invalid);
  const native<cl_kernel> its(sycl::get_native<opencl>(none), cl().clReleaseKernel);
  EXPECT_EQ(code_of([&] { sycl::make_kernel<opencl>(its.get(), other); }), sycl::errc::invalid);
}

TEST_F(opencl_objects, an_event_is_that_of_its_command) {
  const sycl::context context(device());
  sycl::queue queue(context, device());
  int* const place = sycl::malloc_shared<int>(4, queue);
  const sycl::event filled = queue.fill(place, 3, 4);
  const std::vector<cl_event> handles = expect_shared(filled, object::event);
  ASSERT_EQ(handles.size(), 1U);
  EXPECT_EQ(cl().clWaitForEvents(1, handles.data()), CL_SUCCESS);
  EXPECT_EQ(place[3], 3);
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(cl().clReleaseEvent(handles[0]), CL_SUCCESS);
  }
  queue.wait();
  sycl::free(place, queue);
}

TEST_F(opencl_objects, an_event_of_the_host_has_no_handle) {
  const sycl::context context(device());
  sycl::queue queue(context, device());
  const sycl::event done = queue.submit([](sycl::handler& h) { h.host_task([] {}); });
  queue.wait();
  EXPECT_TRUE(sycl::get_native<opencl>(done).empty());
}

TEST_F(opencl_objects, are_of_no_other_backend) {
  constexpr auto level_zero = sycl::backend::ext_kestrel_level_zero;
  const sycl::context context(device());
  EXPECT_EQ(code_of([&] { sycl::get_native<level_zero>(device()); }), sycl::errc::backend_mismatch);
  EXPECT_EQ(code_of([&] { sycl::get_native<sycl::backend::host>(context); }),
            sycl::errc::backend_mismatch);
  EXPECT_EQ(code_of([] { sycl::get_native<opencl>(sycl::device()); }),
            sycl::errc::backend_mismatch);
}

}  // namespace
