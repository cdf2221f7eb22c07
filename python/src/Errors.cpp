// zinmox.Error and the logger "zinmox".
#include "Errors.h"

#include <utility>

#include "ZinHost/Target.h"
#include "ZinHost/TextError.h"

namespace py = pybind11;

namespace zinmox {

namespace {

constexpr const char* kErrorDoc =
    "A failed call. str() gives the session's message texts of that call, one per line.\n\n"
    "Attributes:\n"
    "    function: the exported ZinMOX function (or the operation) that failed\n"
    "    messages: list of (code, text) tuples, in the order the session received them\n"
    "    texts: the message texts\n"
    "    codes: the message codes (256 for an error, 32768 for \"Zin abort command\")";

PyObject* errorType = nullptr;  // owned by the module from bindErrors on

std::string joinTexts(const Messages& messages) {
  std::string joined;
  for (const Message& message : messages) {
    if (!joined.empty()) joined += '\n';
    joined += message.text;
  }
  return joined;
}

void raiseError(const Failure& failure) {
  py::list messages;
  py::list texts;
  py::list codes;
  for (const Message& message : failure.messages()) {
    messages.append(py::make_tuple(message.code, message.text));
    texts.append(message.text);
    codes.append(message.code);
  }
  py::object error = py::reinterpret_borrow<py::object>(errorType)(failure.what());
  error.attr("function") = failure.function();
  error.attr("messages") = messages;
  error.attr("texts") = texts;
  error.attr("codes") = codes;
  PyErr_SetObject(errorType, error.ptr());
}

}  // namespace

Failure::Failure(std::string function, Messages messages, std::string text)
    : function_(std::move(function)), messages_(std::move(messages)) {
  text_ = messages_.empty() ? std::move(text) : joinTexts(messages_);
  if (text_.empty()) text_ = function_ + " failed without a message.";
}

void bindErrors(py::module_& module) {
  errorType = PyErr_NewExceptionWithDoc("zinmox.Error", kErrorDoc, PyExc_RuntimeError, nullptr);
  if (errorType == nullptr) throw py::error_already_set();
  module.add_object("Error", py::handle(errorType));
  py::register_exception_translator([](std::exception_ptr pending) {
    if (!pending) return;
    try {
      std::rethrow_exception(pending);
    } catch (const Failure& failure) {
      raiseError(failure);
    } catch (const ZinHost::TextError& error) {
      PyErr_SetString(PyExc_ValueError, error.what());
    } catch (const ZinHost::TargetError& error) {
      const bool unreachable = error.kind() == ZinHost::TargetError::Kind::Unreachable;
      PyErr_SetString(unreachable ? PyExc_ConnectionError : PyExc_ValueError, error.what());
    }
  });
}

void logMessages(uint32_t handle, const Messages& messages) {
  if (messages.empty()) return;
  const py::object logger = py::module_::import("logging").attr("getLogger")("zinmox");
  for (const Message& message : messages) {
    const int level = message.code == 0x100 ? 40 : message.code == 0x8000 ? 30 : 20;
    logger.attr("log")(level, "session %d, code %d: %s", handle, message.code, message.text);
  }
}

}  // namespace zinmox
