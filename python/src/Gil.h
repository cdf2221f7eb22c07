// Running library work with the GIL released, in a way that survives interpreter exit.
#ifndef ZINMOX_PYTHON_GIL_H
#define ZINMOX_PYTHON_GIL_H

#include <pybind11/pybind11.h>

#include <exception>
#include <optional>
#include <type_traits>
#include <utility>

namespace zinmox {

/// Runs `work` with the GIL released and returns its result. The GIL is taken back by a plain
/// call, never by a destructor: when the interpreter exits while a daemon thread is inside
/// `work`, taking the GIL back ends that thread by unwinding its stack, and an unwinding that
/// meets a noexcept frame (every destructor, such as pybind11's gil_scoped_release) aborts the
/// process. Exceptions of `work` are carried past the re-acquisition and rethrown.
template <class Work>
auto withoutGil(Work&& work) -> std::invoke_result_t<Work&> {
  using Result = std::invoke_result_t<Work&>;
  std::exception_ptr error;
  PyThreadState* state = PyEval_SaveThread();
  if constexpr (std::is_void_v<Result>) {
    try {
      work();
    } catch (...) {
      error = std::current_exception();
    }
    PyEval_RestoreThread(state);
    if (error) std::rethrow_exception(error);
  } else {
    std::optional<Result> result;
    try {
      result.emplace(work());
    } catch (...) {
      error = std::current_exception();
    }
    PyEval_RestoreThread(state);
    if (error) std::rethrow_exception(error);
    return std::move(*result);
  }
}

}  // namespace zinmox

#endif
