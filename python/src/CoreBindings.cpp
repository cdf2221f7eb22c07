// zinmox.Core: the Python face of one MOX core.
#include <pybind11/stl.h>

#include <memory>
#include <string>
#include <vector>

#include "Convert.h"
#include "Core.h"
#include "CoreRef.h"
#include "Ports.h"
#include "Values.h"

namespace py = pybind11;

namespace zinmox {

namespace {

using Ptr = std::shared_ptr<Core>;

py::object sizes(Core& core, const py::object& names, bool output) {
  if (py::isinstance<py::str>(names)) {
    return py::int_(core.sizes({toCText(names, "a signal name")}, output).front());
  }
  if (!py::isinstance<py::list>(names) && !py::isinstance<py::tuple>(names)) {
    throw py::type_error("names must be a str or a list of str, not " + typeName(names));
  }
  std::vector<std::string> list;
  for (const py::handle name : names) list.push_back(toCText(name, "a signal name"));
  return py::cast(core.sizes(list, output));
}

}  // namespace

void bindCore(py::module_& module) {
  using py::arg;
  py::class_<Core, Ptr>(module, "Core",
                        "A MOX core of a session (Session.core(ref)). Every method is one call "
                        "of the library; a failure raises zinmox.Error with its messages.")
      .def_property_readonly(
          "ref", [](const Core& self) { return refTuple(self.ref()); },
          "The core reference as a (device, chain, core) tuple.")
      .def(
          "init",
          [](const Ptr& self) {
            self->init();
            return self;
          },
          "Reads the core's status and sets up its object, with the reserved whole-port "
          "signals \"async_out_data\", \"sync_out_data\", \"async_in_data\" and \"sync_in_data\". "
          "A core set up before loses its names. Returns the core.")
      .def("terminate", &Core::terminate, "Drops the core's object and its names.")
      .def_property_readonly("info", &Core::infoFields,
                             "The twelve fields of the core's information as a dict of ints "
                             "(a fresh status read; the core need not be initialised).")
      .def("define", &Core::define, arg("name"), arg("port"), arg("bits"),
           "Names port bits. port: \"sync_out\", \"sync_in\", \"async_out\" or \"async_in\". "
           "bits: one bit index, a list of them (a bus; value bit i is port bit bits[i]) or a "
           "bit-list str such as \"0-7\", \"7-0\" or \"0,2,4\" (at most the port's width). A bit "
           "listed twice, and an output name with '.' or '=', raise ValueError.")
      .def("undefine", &Core::undefine, arg("name"), arg("port"),
           "Removes a name. Input ports search the inputs, output ports the outputs.")
      .def("sizes", &sizes, arg("names"), arg("output") = true,
           "The widths in bits of named outputs (output=True) or inputs: an int for one name, "
           "a list for a list of names.")
      .def("write", &writeValues, arg("values") = py::none(), py::pos_only(),
           "Writes named outputs in one transfer: write({\"ctl\": 0x3F}) or write(ctl=0x3F).\n\n"
           "A value is a non-negative int that fits the signal, a hex text (most significant "
           "digit first, optionally after \"0x\": a shorter text is sign-extended, a longer one "
           "keeps its last digits), or a list of 16 step values (ints or hex texts) for a pulse "
           "train "
           "on a synchronous output, step 0 first. A key may carry the library's suffix "
           "\".pulsetrain\" with a hex text or an int holding the 16 packed steps.")
      .def("read", &readValues,
           "Reads every input signal in one transfer: a dict of name -> zinmox.Reading. Reading "
           "clears the activity latches.")
      .def_property_readonly(
          "ports", [](const Ptr& self) { return Ports(self); }, "Whole-port access (zinmox.Ports).")
      .def("__repr__",
           [](const Core& self) { return "<zinmox.Core " + refText(self.ref()) + ">"; });
}

}  // namespace zinmox
