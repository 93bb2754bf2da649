// qzivifgen: the headless control and its object model from Python. Properties come from the
// classes' own property tables, so a property added there is a Python property at once;
// collections keep their 1-based Item and also behave as Python sequences; points go in and out
// as numpy arrays without a loop; a failure is a QZIviFgenError with number, source and text.
#include "qzivi/control/QZIviFgen.h"
#include "qzivi/model/QZIviConfigurations.h"
#include "qzivi/model/Sequences.h"
#include "qzivi/support/failure.h"

#include <pybind11/functional.h>
#include <pybind11/numpy.h>
#include <pybind11/pybind11.h>
#include <pybind11/stl.h>

#include <cstdint>
#include <deque>
#include <limits>
#include <sys/mman.h>

namespace py = pybind11;
using namespace qzivi;

namespace {

// The control as Python holds it: with the event connections that live as long as it does.
class Fgen : public QZIviFgen {
public:
    Fgen() {
        InitProperties();
        ExceptionOnError(true); // failures are exceptions, as Python expects
    }
    std::vector<Connection> connections;
};

PyObject* g_oError = nullptr;

// ---- Values between Python and the property tables ----

py::object ToPython(const PropertyValue& value) {
    return std::visit([](const auto& v) -> py::object { return py::cast(v); }, value);
}

PropertyValue FromPython(const py::handle& value, PropertyKind kind, std::string_view name) {
    const auto wrong = [&](const char* what) {
        throw py::type_error(std::string(name) + " takes " + what + ", not " +
                             std::string(py::str(py::type::of(value).attr("__name__"))));
    };
    switch (kind) {
    case PropertyKind::Double:
        if (!py::isinstance<py::float_>(value) && !py::isinstance<py::int_>(value))
            wrong("a number");
        return value.cast<double>();
    case PropertyKind::Int32: {
        if (!py::isinstance<py::int_>(value) || py::isinstance<py::bool_>(value))
            wrong("a whole number");
        const auto n = value.cast<long long>();
        if (n < std::numeric_limits<std::int32_t>::min() ||
            n > std::numeric_limits<std::int32_t>::max())
            throw py::value_error(std::string(name) + ": " + std::to_string(n) +
                                  " is beyond a 32-bit number");
        return static_cast<std::int32_t>(n);
    }
    case PropertyKind::Bool:
        if (!py::isinstance<py::bool_>(value)) wrong("True or False");
        return value.cast<bool>();
    case PropertyKind::Text:
        if (!py::isinstance<py::str>(value)) wrong("a text");
        return value.cast<std::string>();
    case PropertyKind::Reference:
        break;
    }
    wrong("an object");
    return {};
}

// Names kept for the life of the module: pybind may hold on to them.
const char* Keep(std::string_view name) {
    static std::deque<std::string> names;
    return names.emplace_back(name).c_str();
}

// Every row of `Owner`'s table that has access becomes a Python property.
template <typename Owner, typename Class>
void TableProperties(Class& cls) {
    for (const auto& row : Owner::Properties()) {
        if (!row.get || !row.put) continue;
        const auto* r = &row;
        cls.def_property(
            Keep(row.name), [r](const Owner& o) { return ToPython(r->get(o)); },
            [r](Owner& o, const py::object& v) { r->put(o, FromPython(v, r->kind, r->name)); });
    }
}

// ---- Collections: Item counts from 1; [i] from 0 as Python's sequences do, [name] by name ----

template <typename Collection>
auto Entry(Collection& c, const py::object& key) {
    if (py::isinstance<py::str>(key)) {
        const auto name = key.cast<std::string>();
        const auto position = c.IndexOfName(name);
        if (position == -1) throw py::key_error(name);
        return c.Item(position);
    }
    auto i = key.cast<long long>();
    const long long count = c.Count();
    if (i < 0) i += count;
    if (i < 0 || i >= count) throw py::index_error("index out of range");
    return c.Item(static_cast<int>(i + 1));
}

Variant Index(const py::object& key) {
    if (py::isinstance<py::str>(key)) return Variant(key.cast<std::string>());
    return Variant(key.cast<std::int64_t>());
}

template <typename Collection, typename Class>
void SequenceProtocol(Class& cls) {
    cls.def("__len__", [](Collection& c) { return c.Count(); })
        .def(
            "__iter__", [](Collection& c) { return py::make_iterator(c.begin(), c.end()); },
            py::keep_alive<0, 1>())
        .def("__getitem__", [](Collection& c, const py::object& key) { return Entry(c, key); })
        .def("__contains__",
             [](Collection& c, const std::string& name) { return c.IndexOfName(name) != -1; })
        .def_property_readonly("Count", [](Collection& c) { return c.Count(); })
        .def(
            "Item", [](Collection& c, const py::object& key) { return c.Item(Index(key)); },
            py::arg("Index"), "The member at a position from 1, or of a name.")
        .def(
            "Remove", [](Collection& c, const py::object& key) { c.Remove(Index(key)); },
            py::arg("Index"));
}

// Points handed to numpy without a copy: the array keeps the shared points alive.
py::array_t<double> ToNumpy(std::shared_ptr<const std::vector<double>> points) {
    if (!points) return py::array_t<double>(0);
    auto* keep = new std::shared_ptr<const std::vector<double>>(std::move(points));
    py::capsule owner(
        keep, [](void* p) { delete static_cast<std::shared_ptr<const std::vector<double>>*>(p); });
    py::array_t<double> array({static_cast<py::ssize_t>((*keep)->size())}, {sizeof(double)},
                              (*keep)->data(), owner);
    py::detail::array_proxy(array.ptr())->flags &= ~py::detail::npy_api::NPY_ARRAY_WRITEABLE_;
    return array;
}

std::vector<double>
FromNumpy(const py::array_t<double, py::array::c_style | py::array::forcecast>& a) {
    if (a.ndim() != 1) throw py::value_error("points are a one-dimensional array");
    std::vector<double> points;
    points.reserve(static_cast<std::size_t>(a.size()));
    // Large points on huge pages, as numpy's own arrays: a fresh buffer then costs a fault a
    // 2 MiB instead of one a 4 KiB page, which otherwise is most of the time of a copy.
    constexpr std::uintptr_t kHuge = 2 << 20;
    const auto begin = reinterpret_cast<std::uintptr_t>(points.data());
    const auto end = begin + points.capacity() * sizeof(double);
    const std::uintptr_t first = (begin + kHuge - 1) & ~(kHuge - 1);
    if (end > first + kHuge)
        ::madvise(reinterpret_cast<void*>(first), (end - first) & ~(kHuge - 1), MADV_HUGEPAGE);
    points.assign(a.data(), a.data() + a.size());
    return points;
}

// An event of the control as Python sees it: connect(callable) returns a handle to disconnect.
template <typename... Args>
void BindEvent(py::class_<Fgen>& cls, const char* name, Event<Args...> QZIviFgen::*event) {
    cls.def((std::string("connect_") + name).c_str(),
            [event](Fgen& fgen, py::function handler) {
                // Let go of the callable with the interpreter's lock held, wherever the control
                // drops the connection (it may do so inside Configure, with the lock released).
                struct Callable {
                    py::function f;
                    ~Callable() {
                        py::gil_scoped_acquire gil;
                        f = py::function();
                    }
                };
                auto shared = std::shared_ptr<Callable>(new Callable{std::move(handler)});
                fgen.connections.push_back((fgen.*event).Connect([shared](Args... args) {
                    py::gil_scoped_acquire gil;
                    try {
                        shared->f(args...);
                    } catch (py::error_already_set& e) { // a handler's failure is no control's
                        e.discard_as_unraisable("a qzivifgen event handler");
                    }
                }));
                return fgen.connections.size() - 1;
            },
            py::arg("handler"));
}

} // namespace

PYBIND11_MODULE(qzivifgen, m) {
    m.doc() = "The QZIviFgen instrument control for function generators, headless.";
    py::options options;
    options.disable_function_signatures();

    g_oError = PyErr_NewException("qzivifgen.QZIviFgenError", PyExc_RuntimeError, nullptr);
    m.attr("QZIviFgenError") = py::handle(g_oError);
    py::register_exception_translator([](std::exception_ptr p) {
        try {
            if (p) std::rethrow_exception(p);
        } catch (const Failure& f) {
            py::object error = py::reinterpret_borrow<py::object>(g_oError)(f.Description());
            error.attr("number") = f.Number();
            error.attr("source") = f.Source();
            error.attr("description") = f.Description();
            PyErr_SetObject(g_oError, error.ptr());
        }
    });

    py::class_<QZIviFgenChannel, std::shared_ptr<QZIviFgenChannel>> channel(
        m, "QZIviFgenChannel", "An output channel: what the application wants of it.");
    TableProperties<QZIviFgenChannel>(channel);
    channel
        .def_property(
            "ArbWaveform", [](const QZIviFgenChannel& c) { return c.ArbWaveform(); },
            [](QZIviFgenChannel& c, std::shared_ptr<QZIviFgenArbWaveform> w) { c.ArbWaveform(w); })
        .def_property(
            "Sequence", [](const QZIviFgenChannel& c) { return c.Sequence(); },
            [](QZIviFgenChannel& c, std::shared_ptr<QZIviFgenSequence> s) { c.Sequence(s); })
        .def("__repr__",
             [](const QZIviFgenChannel& c) { return "<QZIviFgenChannel " + c.Name() + ">"; });

    py::class_<QZIviFgenArbWaveform, std::shared_ptr<QZIviFgenArbWaveform>>(
        m, "QZIviFgenArbWaveform",
        "An arbitrary waveform: points from a data file, or held in the configuration.")
        .def_property(
            "Name", [](const QZIviFgenArbWaveform& w) { return w.Name(); },
            [](QZIviFgenArbWaveform& w, const std::string& v) { w.Name(v); })
        .def_property(
            "Source", [](const QZIviFgenArbWaveform& w) { return w.Source(); },
            [](QZIviFgenArbWaveform& w, std::int32_t v) { w.Source(v); })
        .def_property(
            "Filename", [](const QZIviFgenArbWaveform& w) { return w.Filename(); },
            [](QZIviFgenArbWaveform& w, const std::string& v) { w.Filename(v); })
        .def_property(
            "AutoNormalizeMode",
            [](const QZIviFgenArbWaveform& w) { return w.AutoNormalizeMode(); },
            [](QZIviFgenArbWaveform& w, std::int32_t v) { w.AutoNormalizeMode(v); })
        .def_property_readonly("WaveformHandle", &QZIviFgenArbWaveform::WaveformHandle)
        .def_property(
            "Data",
            [](QZIviFgenArbWaveform& w) {
                Points points;
                {
                    py::gil_scoped_release free;
                    points = w.Data();
                }
                return ToNumpy(std::move(points));
            },
            [](QZIviFgenArbWaveform& w,
               const py::array_t<double, py::array::c_style | py::array::forcecast>& a) {
                std::vector<double> points = FromNumpy(a);
                py::gil_scoped_release free;
                w.Data(std::move(points));
            },
            "The points as a read-only numpy array of float64; set from any array of numbers.")
        .def(
            "GetDataSample",
            [](QZIviFgenArbWaveform& w, std::int32_t start, std::int32_t interval,
               std::int32_t count) {
                Points points;
                {
                    py::gil_scoped_release free;
                    points = w.GetDataSample(start, interval, count);
                }
                return ToNumpy(std::move(points));
            },
            py::arg("StartIndex") = 0, py::arg("Interval") = 1, py::arg("Count") = -1,
            "Points of the data file from StartIndex, every Interval-th, Count of them (-1: all).")
        .def_property_readonly("DataSize", &QZIviFgenArbWaveform::DataSize)
        .def("ForceReload", &QZIviFgenArbWaveform::ForceReload)
        .def("__repr__", [](const QZIviFgenArbWaveform& w) {
            return "<QZIviFgenArbWaveform " + w.Name() + ">";
        });

    py::class_<QZIviFgenSequenceItem, std::shared_ptr<QZIviFgenSequenceItem>>(
        m, "QZIviFgenSequenceItem", "A step of a sequence: a waveform and its repetitions.")
        .def_property(
            "Waveform", [](const QZIviFgenSequenceItem& i) { return i.Waveform(); },
            [](QZIviFgenSequenceItem& i, std::shared_ptr<QZIviFgenArbWaveform> w) {
                i.Waveform(w);
            })
        .def_property(
            "Iterations", [](const QZIviFgenSequenceItem& i) { return i.Iterations(); },
            [](QZIviFgenSequenceItem& i, std::int32_t v) { i.Iterations(v); });

    py::class_<QZIviFgenSequence, std::shared_ptr<QZIviFgenSequence>>(
        m, "QZIviFgenSequence", "An ordered list of waveforms with their repetitions.")
        .def_property(
            "Name", [](const QZIviFgenSequence& s) { return s.Name(); },
            [](QZIviFgenSequence& s, const std::string& v) { s.Name(v); })
        .def("Add", &QZIviFgenSequence::Add, py::arg("Waveform") = py::none(),
             py::arg("Iterations") = 0)
        .def(
            "SequenceItem",
            [](QZIviFgenSequence& s, std::int32_t i) { return s.SequenceItem(Variant(i)); },
            py::arg("Index"))
        .def(
            "Remove", [](QZIviFgenSequence& s, std::int32_t i) { s.Remove(Variant(i)); },
            py::arg("Index"))
        .def_property_readonly("Count", &QZIviFgenSequence::Count)
        .def("__len__", &QZIviFgenSequence::Count)
        .def(
            "__iter__", [](QZIviFgenSequence& s) { return py::make_iterator(s.begin(), s.end()); },
            py::keep_alive<0, 1>())
        .def_property_readonly("SequenceHandle", &QZIviFgenSequence::SequenceHandle)
        .def("__repr__",
             [](const QZIviFgenSequence& s) { return "<QZIviFgenSequence " + s.Name() + ">"; });

    py::class_<QZIviFgenChannels, std::shared_ptr<QZIviFgenChannels>> channels(
        m, "QZIviFgenChannels", "The output channels, in order.");
    SequenceProtocol<QZIviFgenChannels>(channels);
    channels.def("Add", &QZIviFgenChannels::Add, py::arg("ChannelName") = "")
        .def_property(
            "ActiveChannel", [](QZIviFgenChannels& c) { return c.ActiveChannel(); },
            [](QZIviFgenChannels& c, std::shared_ptr<QZIviFgenChannel> a) { c.ActiveChannel(a); });

    py::class_<QZIviFgenArbWaveforms, std::shared_ptr<QZIviFgenArbWaveforms>> waveforms(
        m, "QZIviFgenArbWaveforms", "The arbitrary waveforms, in order.");
    SequenceProtocol<QZIviFgenArbWaveforms>(waveforms);
    waveforms
        .def(
            "Add",
            [](QZIviFgenArbWaveforms& w, const std::string& name, const py::object& source,
               const std::string& file, const py::object& mode) {
                return w.Add(name,
                             source.is_none() ? Variant::Missing() : Variant(source.cast<int>()),
                             file, mode.is_none() ? Variant::Missing() : Variant(mode.cast<int>()));
            },
            py::arg("WaveformName") = "", py::arg("Source") = py::none(), py::arg("Filename") = "",
            py::arg("AutoNormalizeMode") = py::none())
        .def("GetMaxWaveformSize", &QZIviFgenArbWaveforms::GetMaxWaveformSize)
        .def("GetMinWaveformSize", &QZIviFgenArbWaveforms::GetMinWaveformSize)
        .def("GetMaxNumWaveforms", &QZIviFgenArbWaveforms::GetMaxNumWaveforms)
        .def("GetWaveformQuantum", &QZIviFgenArbWaveforms::GetWaveformQuantum);

    py::class_<QZIviFgenSequences, std::shared_ptr<QZIviFgenSequences>> sequences(
        m, "QZIviFgenSequences", "The sequences, in order.");
    SequenceProtocol<QZIviFgenSequences>(sequences);
    sequences.def("Add", &QZIviFgenSequences::Add, py::arg("SequenceName") = "");

    py::class_<QZIviFgenInternalConfig, std::shared_ptr<QZIviFgenInternalConfig>> internal(
        m, "QZIviFgenInternalConfig", "The internal trigger rate and internal AM and FM sources.");
    TableProperties<QZIviFgenInternalConfig>(internal);

    py::class_<QZIviConfiguration, std::shared_ptr<QZIviConfiguration>>(
        m, "QZIviConfiguration", "A named snapshot of the whole tree.")
        .def_property_readonly("Name", &QZIviConfiguration::Name)
        .def("Load", &QZIviConfiguration::Load, py::call_guard<py::gil_scoped_release>())
        .def("Store", &QZIviConfiguration::Store)
        .def("Import", &QZIviConfiguration::Import, py::arg("FilePath"),
             py::call_guard<py::gil_scoped_release>())
        .def("Export", &QZIviConfiguration::Export, py::arg("FilePath"),
             py::call_guard<py::gil_scoped_release>());

    py::class_<QZIviConfigurations, std::shared_ptr<QZIviConfigurations>>(
        m, "QZIviConfigurations", "The saved snapshots, and .qzc files through them.")
        .def("Add", &QZIviConfigurations::Add, py::arg("Name"), py::arg("FilePath") = "",
             py::call_guard<py::gil_scoped_release>())
        .def("Item",
             [](QZIviConfigurations& c, const py::object& key) { return c.Item(Index(key)); })
        .def("Remove", [](QZIviConfigurations& c, const py::object& key) { c.Remove(Index(key)); })
        .def_property_readonly("Count", &QZIviConfigurations::Count)
        .def("__len__", &QZIviConfigurations::Count)
        .def(
            "__iter__",
            [](QZIviConfigurations& c) { return py::make_iterator(c.begin(), c.end()); },
            py::keep_alive<0, 1>());

    py::class_<Fgen> fgen(m, "QZIviFgen",
                          "The control on a generator named by its IVI logical name, with no "
                          "panel. Failures raise QZIviFgenError.");
    fgen.def(py::init<>());
    for (const auto& row : CIviFgenPropImp::Properties()) {
        if (!row.get || !row.put) continue;
        const std::string name(row.name);
        const PropertyKind kind = row.kind;
        fgen.def_property(
            Keep(row.name), [name](Fgen& f) { return ToPython(f.Property(name)); },
            [name, kind](Fgen& f, const py::object& v) {
                f.Property(name, FromPython(v, kind, name));
            });
    }
    fgen.def_property(
            "ExceptionOnError", [](Fgen& f) { return f.ExceptionOnError(); },
            [](Fgen& f, bool v) { f.ExceptionOnError(v); })
        .def_property_readonly("SessionHandle", [](Fgen& f) { return f.SessionHandle(); })
        .def_property_readonly("Channels", [](Fgen& f) { return f.Channels(); })
        .def_property_readonly("Waveforms", [](Fgen& f) { return f.Waveforms(); })
        .def_property_readonly("Sequences", [](Fgen& f) { return f.Sequences(); })
        .def_property_readonly("Internal", [](Fgen& f) { return f.Internal(); })
        .def_property_readonly("Configurations", [](Fgen& f) { return f.Configurations(); })
        .def("Init", &QZIviFgen::Init, py::arg("DoIDQuery") = false, py::arg("DoReset") = false,
             py::arg("OptionString") = "",
             py::arg("ReInitBehavior") = static_cast<std::int32_t>(qziviNoOp),
             py::call_guard<py::gil_scoped_release>(), "Opens a session on the logical name.")
        .def("Configure", &QZIviFgen::Configure, py::call_guard<py::gil_scoped_release>(),
             "Sends the whole tree to the instrument.")
        .def("Initiate", &QZIviFgen::Initiate, py::call_guard<py::gil_scoped_release>())
        .def("Abort", &QZIviFgen::Abort, py::call_guard<py::gil_scoped_release>())
        .def("SendSoftwareTrigger", &QZIviFgen::SendSoftwareTrigger,
             py::call_guard<py::gil_scoped_release>())
        .def("CloseSession", &QZIviFgen::CloseSession, py::call_guard<py::gil_scoped_release>())
        .def("GetLastIviError", &QZIviFgen::GetLastIviError)
        .def("__repr__",
             [](Fgen& f) {
                 return "<QZIviFgen " + f.LogicalName() +
                        (f.SessionHandle() != 0 ? ", session open>" : ">");
             })
        .def(
            "RenderOutput",
            [](Fgen& f, const std::string& channel, double start, double step, std::int32_t count) {
                std::shared_ptr<std::vector<double>> volts;
                {
                    py::gil_scoped_release free;
                    volts = std::make_shared<std::vector<double>>(
                        f.Engine().RenderOutput(channel, start, step, count));
                }
                return ToNumpy(std::move(volts));
            },
            py::arg("channel"), py::arg("start"), py::arg("step"), py::arg("count"),
            "What the output carries: count samples in volts from start seconds on, step apart "
            "(a driver that renders, as the simulator does).");
    BindEvent(fgen, "IviError", &QZIviFgen::IviError);
    BindEvent(fgen, "IviWarning", &QZIviFgen::IviWarning);
    BindEvent(fgen, "Configured", &QZIviFgen::Configured);
    BindEvent(fgen, "Initialized", &QZIviFgen::Initialized);
    fgen.def(
        "disconnect",
        [](Fgen& f, std::size_t handle) {
            if (handle < f.connections.size()) f.connections[handle].Disconnect();
        },
        py::arg("handle"), "Ends a connection that a connect_... call returned.");

    for (const auto& [name, value] : std::initializer_list<std::pair<const char*, int>>{
             {"qzivifgenOutputFunc", qzivifgenOutputFunc},
             {"qzivifgenOutputArb", qzivifgenOutputArb},
             {"qzivifgenOutputSeq", qzivifgenOutputSeq},
             {"qzivifgenWaveformSine", qzivifgenWaveformSine},
             {"qzivifgenWaveformSquare", qzivifgenWaveformSquare},
             {"qzivifgenWaveformTriangle", qzivifgenWaveformTriangle},
             {"qzivifgenWaveformRampUp", qzivifgenWaveformRampUp},
             {"qzivifgenWaveformRampDown", qzivifgenWaveformRampDown},
             {"qzivifgenWaveformDC", qzivifgenWaveformDC},
             {"qzivifgenpersisted", qzivifgenpersisted},
             {"qzivifgenASCIIFile", qzivifgenASCIIFile},
             {"qzivifgen2ByteInteger", qzivifgen2ByteInteger},
             {"qzivifgen4ByteInteger", qzivifgen4ByteInteger},
             {"qzivifgenNoAutoNormalize", qzivifgenNoAutoNormalize},
             {"qzivifgenNormalize", qzivifgenNormalize},
             {"qzivifgenStdFuncExt", qzivifgenStdFuncExt},
             {"qzivifgenArbWfmExt", qzivifgenArbWfmExt},
             {"qzivifgenArbSeqExt", qzivifgenArbSeqExt}})
        m.attr(name) = value;
}
