// vorel_rnsap._native: the decoder module and the command line's capture
// reader and printers, for Python. Passes run with the GIL released.
#include <arpa/inet.h>
#include <pybind11/pybind11.h>
#include <pybind11/stl.h>

#include <string>
#include <utility>
#include <vector>

#include "cli/hex_input.h"
#include "python/native/capture_stream.h"
#include "python/native/json_capture.h"
#include "python/native/shared_decoder.h"

namespace py = pybind11;

namespace rnsap::python {
namespace {

constexpr int64_t kNanosecondsPerSecond = 1'000'000'000;

cli::Pass PassOf(std::string_view name) {
  const std::optional<cli::Pass> pass = cli::PassNamed(name);
  if (!pass) throw py::value_error("unknown pass '" + std::string(name) + "'");
  return *pass;
}

// The octets of bytes, a bytearray or another buffer of bytes, or of a
// message in hex as rnsap-decode takes it as an argument.
std::vector<uint8_t> OctetsOf(const py::object& message) {
  if (py::isinstance<py::str>(message)) {
    cli::HexLine parsed = cli::ParseHexMessage(message.cast<std::string>());
    if (parsed.kind != cli::HexLine::Kind::kMessage) throw py::value_error(parsed.error);
    return std::move(parsed.octets);
  }
  const py::buffer_info buffer = py::reinterpret_borrow<py::buffer>(message).request();
  if (buffer.itemsize != 1 || buffer.ndim != 1 || buffer.strides[0] != 1) {
    throw py::type_error("a message is bytes, a one-dimensional buffer of bytes, or hex text");
  }
  const auto* data = static_cast<const uint8_t*>(buffer.ptr);
  return {data, data + buffer.size};
}

DecodedMessage DecodeObject(const py::object& message, std::string_view passName) {
  const cli::Pass pass = PassOf(passName);
  std::vector<uint8_t> octets = OctetsOf(message);
  const py::gil_scoped_release unlocked;
  return DecodeMessage(pass, std::move(octets));
}

py::object KeyValueObject(const cli::KeyValue& key) {
  if (key.variable) return py::str(key.hex);
  return py::int_(key.number);
}

py::object FrameMember(const DecodedMessage& message,
                       py::object (*member)(const cli::FrameStamp&)) {
  return message.frame ? member(*message.frame) : py::none();
}

void BindMessage(py::module_& module) {
  py::class_<BitSegment>(module, "Segment")
      .def_readonly("first_bit", &BitSegment::firstBit)
      .def_readonly("last_bit", &BitSegment::lastBit)
      .def_readonly("value", &BitSegment::segmentValue)
      .def("__repr__", [](const BitSegment& segment) {
        return py::str("Segment({}, {}, {})")
            .format(segment.firstBit, segment.lastBit, segment.segmentValue);
      });
  py::class_<DecodedField>(module, "Field")
      .def_readonly("field_id", &DecodedField::fieldId)
      .def_readonly("label", &DecodedField::label)
      .def_readonly("depth", &DecodedField::depth)
      .def_readonly("value", &DecodedField::value)
      .def_readonly("text", &DecodedField::text)
      .def_readonly("segments", &DecodedField::segments)
      .def_readonly("first_segment", &DecodedField::firstSegment)
      .def_readonly("bit_order_group", &DecodedField::bitOrderGroup)
      .def("__repr__", [](const DecodedField& field) {
        return py::str("Field({}, {!r}, {!r})").format(field.fieldId, field.label, field.text);
      });
  py::class_<DisplayedLine>(module, "DisplayLine")
      .def_readonly("display_id", &DisplayedLine::displayId)
      .def_readonly("text", &DisplayedLine::text)
      .def("__repr__", [](const DisplayedLine& line) {
        return py::str("DisplayLine({}, {!r})").format(line.displayId, line.text);
      });
  py::class_<cli::KeyValue>(module, "Key")
      .def_readonly("row", &cli::KeyValue::row)
      .def_readonly("name", &cli::KeyValue::name)
      .def_property_readonly("value", &KeyValueObject)
      .def_property_readonly("bits",
                             [](const cli::KeyValue& key) -> py::object {
                               return key.variable ? py::object(py::int_(key.bits)) : py::none();
                             })
      .def("__repr__", [](const cli::KeyValue& key) {
        return py::str("Key({}, {!r}, {!r})").format(key.row, key.name, KeyValueObject(key));
      });
  py::class_<cli::MessageSummary>(module, "Summary")
      .def_property_readonly("pass_",
                             [](const cli::MessageSummary& summary) {
                               return std::string(cli::PassName(summary.pass));
                             })
      .def_readonly("result", &cli::MessageSummary::result)
      .def_readonly("bits_left_out", &cli::MessageSummary::bitsLeftOut)
      .def_readonly("position", &cli::MessageSummary::position)
      .def_readonly("flags", &cli::MessageSummary::flags)
      .def_property_readonly("verdict", [](const cli::MessageSummary& summary) -> py::object {
        return summary.pass == cli::Pass::kValidate ? py::object(py::int_(summary.verdict))
                                                    : py::none();
      });
  py::class_<DecodedMessage>(module, "Message")
      .def_property_readonly(
          "pass_",
          [](const DecodedMessage& message) { return std::string(PassName(message.pass)); })
      .def_property_readonly("octets",
                             [](const DecodedMessage& message) {
                               return py::bytes(
                                   reinterpret_cast<const char*>(message.octets.data()),
                                   message.octets.size());
                             })
      .def_readonly("fields", &DecodedMessage::fields)
      .def_readonly("lines", &DecodedMessage::lines)
      .def_readonly("keys", &DecodedMessage::keys)
      .def_readonly("summary", &DecodedMessage::summary)
      .def_property_readonly("frame",
                             [](const DecodedMessage& message) {
                               return FrameMember(message, [](const cli::FrameStamp& frame) {
                                 return py::object(py::int_(frame.number));
                               });
                             })
      .def_property_readonly(
          "time",
          [](const DecodedMessage& message) {
            return FrameMember(message, [](const cli::FrameStamp& frame) {
              return py::object(py::float_(static_cast<double>(frame.seconds) +
                                           frame.nanoseconds / double{kNanosecondsPerSecond}));
            });
          })
      .def_property_readonly("time_ns",
                             [](const DecodedMessage& message) {
                               return FrameMember(message, [](const cli::FrameStamp& frame) {
                                 return py::object(py::int_(frame.seconds * kNanosecondsPerSecond +
                                                            frame.nanoseconds));
                               });
                             })
      .def_property_readonly("origin", [](const DecodedMessage& message) -> py::object {
        return message.frame ? py::cast(message.origin) : py::none();
      });
}

// An endpoint's address as text ("192.0.2.1", "2001:db8::1"), none over an SS7 link.
py::object AddressText(const cli::NetworkEndpoint& endpoint) {
  if (endpoint.ipVersion == 0) return py::none();
  char text[INET6_ADDRSTRLEN] = {};
  inet_ntop(endpoint.ipVersion == 4 ? AF_INET : AF_INET6, endpoint.address.data(), text,
            sizeof text);
  return py::str(text);
}

// A point code of the routing label, none where no label was read.
py::object PointCode(const cli::MessageOrigin& origin, uint32_t code) {
  return origin.hasPointCodes ? py::object(py::int_(code)) : py::none();
}

void BindOrigin(py::module_& module) {
  py::class_<cli::NetworkEndpoint>(module, "Endpoint")
      .def_property_readonly("address", &AddressText)
      .def_readonly("port", &cli::NetworkEndpoint::port)
      .def("__repr__", [](const cli::NetworkEndpoint& endpoint) {
        return py::str("Endpoint({!r}, {})").format(AddressText(endpoint), endpoint.port);
      });
  py::class_<cli::MessageOrigin>(module, "Origin")
      .def_readonly("source", &cli::MessageOrigin::source)
      .def_readonly("destination", &cli::MessageOrigin::destination)
      .def_readonly("association", &cli::MessageOrigin::association)
      .def_property_readonly(
          "opc", [](const cli::MessageOrigin& origin) { return PointCode(origin, origin.opc); })
      .def_property_readonly(
          "dpc", [](const cli::MessageOrigin& origin) { return PointCode(origin, origin.dpc); })
      .def_property_readonly("sccp",
                             [](const cli::MessageOrigin& origin) {
                               return std::string(cli::SccpMessageKindName(origin.sccpKind));
                             })
      .def_readonly("connection", &cli::MessageOrigin::connection)
      .def_readonly("relation", &cli::MessageOrigin::relation);
}

void BindCapture(py::module_& module) {
  py::class_<cli::CaptureCounts>(module, "CaptureCounts")
      .def_readonly("frames", &cli::CaptureCounts::frames)
      .def_readonly("rnsap", &cli::CaptureCounts::rnsap)
      .def_readonly("skipped", &cli::CaptureCounts::skipped)
      .def_readonly("malformed", &cli::CaptureCounts::malformed)
      .def_readonly("duplicates", &cli::CaptureCounts::duplicates)
      .def_readonly("evicted", &cli::CaptureCounts::evicted)
      .def_readonly("incomplete", &cli::CaptureCounts::incomplete)
      .def_readonly("unattributed", &cli::CaptureCounts::unattributed);
  py::class_<cli::CaptureNote>(module, "CaptureNote")
      .def_readonly("frame", &cli::CaptureNote::frame)
      .def_readonly("reason", &cli::CaptureNote::reason);
  py::class_<JsonCaptureOutcome>(module, "JsonLinesOutcome")
      .def_readonly("counts", &JsonCaptureOutcome::counts)
      .def_readonly("read", &JsonCaptureOutcome::read)
      .def_readonly("errors", &JsonCaptureOutcome::errors);
  py::class_<CaptureStream>(module, "CaptureReader")
      .def(py::init([](std::string path, std::string_view passName) {
             return std::make_unique<CaptureStream>(std::move(path), PassOf(passName));
           }),
           py::arg("path"), py::arg("pass_") = "keys")
      .def("__iter__", [](py::object self) { return self; })
      .def("__next__",
           [](CaptureStream& stream) {
             std::optional<DecodedMessage> message;
             {
               const py::gil_scoped_release unlocked;
               message = stream.Next();
             }
             if (!message) throw py::stop_iteration();
             return std::move(*message);
           })
      .def_property_readonly("counts",
                             [](const CaptureStream& stream) { return stream.outcome().counts; })
      .def_property_readonly("notes", [](const CaptureStream& stream) { return stream.notes(); });
}

}  // namespace
}  // namespace rnsap::python

PYBIND11_MODULE(_native, module) {
  using namespace rnsap::python;
  module.doc() = "The Vorel RNSAP decoder module, loaded once per process.";
  py::register_exception<CaptureError>(module, "CaptureError", PyExc_RuntimeError);
  BindOrigin(module);
  BindMessage(module);
  BindCapture(module);
  module.def("set_default_module", &SetDefaultModulePath, py::arg("path"));
  module.def("load_module", &LoadModule, py::arg("path"), py::call_guard<py::gil_scoped_release>());
  module.def("loaded_module", &LoadedModulePath);
  module.def("decode", &DecodeObject, py::arg("message"), py::arg("pass_") = "decode");
  module.def(
      "write_json_lines",
      [](const std::string& capture, const std::string& output, std::string_view passName) {
        const rnsap::cli::Pass pass = PassOf(passName);
        const py::gil_scoped_release unlocked;
        return WriteJsonLines(capture, output, pass);
      },
      py::arg("capture"), py::arg("output"), py::arg("pass_") = "decode");
}
