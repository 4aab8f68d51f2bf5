// Rendering cost of a large result: a list of 100,000 structures of ten fields (strings,
// integers and booleans) through each formatter into a writer that discards its bytes.
// The target is about one microsecond per cell or less for table and json; the "time_per_cell"
// counter shows it directly.
//
//   build/bin/bench_render [--benchmark_filter=Table]
#include "engine/Format.h"
#include "engine/Writer.h"

#include <kitbase/MetaObj.h>

#include <benchmark/benchmark.h>

#include <string>

namespace {

using namespace Kitbase;

const int kRows = 100000;
const int kFields = 10;

boost::shared_ptr<MetaObj::MetaStruct> RowTemplate() {
    boost::shared_ptr<MetaObj::MetaStruct> row = MetaObj::MetaStruct::New("BenchRow");
    row->SetField("Name", MetaObj::MetaString::New());
    row->SetField("Id", MetaObj::MetaInt::New());
    row->SetField("Enabled", MetaObj::MetaBool::New());
    row->SetField("Path", MetaObj::MetaString::New());
    row->SetField("Size", MetaObj::MetaInt::New());
    row->SetField("Loaded", MetaObj::MetaBool::New());
    row->SetField("Owner", MetaObj::MetaString::New());
    row->SetField("Count", MetaObj::MetaInt::New());
    row->SetField("Description", MetaObj::MetaString::New());
    row->SetField("Shared", MetaObj::MetaBool::New());
    return row;
}

const boost::shared_ptr<MetaObj::MetaList>& Rows() {
    static boost::shared_ptr<MetaObj::MetaList> list;
    if (!list) {
        list = MetaObj::MetaList::New(MetaObj::MetaTypeStruct, RowTemplate());
        list->Reserve(kRows);
        for (int i = 0; i < kRows; ++i) {
            boost::shared_ptr<MetaObj::MetaStruct> row = MetaObj::MetaStruct::New("BenchRow");
            row->SetField("Name", "module-" + std::to_string(i));
            row->SetField("Id", static_cast<long long>(i) * 7919);
            row->SetField("Enabled", i % 3 != 0);
            row->SetField("Path", "/usr/lib/quarn/modules/module-" + std::to_string(i % 977));
            row->SetField("Size", static_cast<long long>(i) * 4096 + 17);
            row->SetField("Loaded", i % 2 == 0);
            row->SetField("Owner", i % 5 == 0 ? "system" : "tenant \"blue\"");
            row->SetField("Count", -static_cast<long long>(i % 1000));
            row->SetField("Description", "Driver for device family " + std::to_string(i % 31) +
                                             " with ümlaut and a tab\tinside");
            row->SetField("Shared", i % 7 == 0);
            list->AddStruct(row);
        }
    }
    return list;
}

void RunFormatter(benchmark::State& state, const char* formatter) {
    const boost::shared_ptr<MetaObj::MetaList>& rows = Rows();
    boost::shared_ptr<MetaObj::MetaList> shape =
        MetaObj::MetaList::New(MetaObj::MetaTypeStruct, RowTemplate());
    Engine::FormatParams params;
    params.Set("wrap-last", state.range(0) ? "true" : "false");
    Engine::RenderRequest request;
    request.result = rows.get();
    request.resultTemplate = shape.get();
    request.params = &params;
    request.width = 200;
    for (auto _ : state) {
        Engine::Writer out{Engine::Writer::DiscardTag()};
        Engine::Render(formatter, request, out);
        out.Flush();
    }
    const double cells = static_cast<double>(kRows) * kFields;
    state.SetItemsProcessed(static_cast<int64_t>(state.iterations() * cells));
    // Seconds per cell, shown with an SI prefix (e.g. "190n").
    state.counters["time_per_cell"] = benchmark::Counter(
        cells, benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

void BM_Table(benchmark::State& state) { RunFormatter(state, "table"); }
void BM_Json(benchmark::State& state) { RunFormatter(state, "json"); }
void BM_Simple(benchmark::State& state) { RunFormatter(state, "simple"); }
void BM_Csv(benchmark::State& state) { RunFormatter(state, "csv"); }
void BM_Xml(benchmark::State& state) { RunFormatter(state, "xml"); }
void BM_KeyValue(benchmark::State& state) { RunFormatter(state, "keyvalue"); }

// Argument: 1 to make the table wrap its last column (the other formatters ignore it).
BENCHMARK(BM_Table)->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Json)->Arg(0)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Simple)->Arg(0)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Csv)->Arg(0)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Xml)->Arg(0)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_KeyValue)->Arg(0)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
