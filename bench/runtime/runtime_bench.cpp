// Costs of the runtime's main operations, beside a malloc and memcpy of the same size.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include "Test_Schema.h"
#include "runtime/Instance_Map.h"

namespace cimrt {
namespace {

using namespace test;

/// The yardstick: a block of the size of an instance, allocated, filled and freed.
void malloc_memcpy(benchmark::State& state) {
  const auto size = static_cast<std::size_t>(state.range(0));
  const std::vector<char> source(size, 'x');
  for (auto _ : state) {
    void* block = std::malloc(size);
    std::memcpy(block, source.data(), size);
    benchmark::DoNotOptimize(block);
    std::free(block);
  }
}
BENCHMARK(malloc_memcpy)->Arg(sizeof(T_Device))->Arg(sizeof(T_All))->Arg(33)->Arg(8192);

Ref<T_Device> full_device(std::uint32_t number) {
  Ref<T_Device> device = make_device("fc-port-10:00:00:00:54:00:00:01", number);
  device->Caption.set("a caption of usual length");
  device->Speed.set(std::uint64_t{16});
  return device;
}

void clone_and_destroy_device(benchmark::State& state) {
  const Ref<T_Device> device = full_device(1);
  for (auto _ : state) {
    Instance* copy = clone(static_cast<const Instance*>(device.get()));
    benchmark::DoNotOptimize(copy);
    destroy(copy);
  }
}
BENCHMARK(clone_and_destroy_device);

void clone_and_destroy_all_types(benchmark::State& state) {
  const Ref<T_All> all = make<T_All>();
  for (auto _ : state) {
    Instance* copy = clone(static_cast<const Instance*>(all.get()));
    benchmark::DoNotOptimize(copy);
    destroy(copy);
  }
}
BENCHMARK(clone_and_destroy_all_types);

void clone_and_destroy_link(benchmark::State& state) {
  const Ref<T_Link> link = make_link(full_device(1), full_device(2));
  for (auto _ : state) {
    Instance* copy = clone(static_cast<const Instance*>(link.get()));
    benchmark::DoNotOptimize(copy);
    destroy(copy);
  }
}
BENCHMARK(clone_and_destroy_link);

constexpr int BATCH = 1000;

/// Only the destruction is timed.
void destroy_device(benchmark::State& state) {
  const Ref<T_Device> device = full_device(1);
  std::vector<Instance*> copies(BATCH);
  for (auto _ : state) {
    state.PauseTiming();
    for (Instance*& copy : copies) copy = clone(static_cast<const Instance*>(device.get()));
    state.ResumeTiming();
    for (Instance* copy : copies) destroy(copy);
  }
  state.SetItemsProcessed(state.iterations() * BATCH);
}
BENCHMARK(destroy_device);

void key_eq_of_devices(benchmark::State& state) {
  const Ref<T_Device> a = full_device(1);
  const Ref<T_Device> b(clone(a.get()));
  b->Name.value = String(a->Name.value.c_str());  // equal texts that do not share a rep
  for (auto _ : state) benchmark::DoNotOptimize(key_eq(a.get(), b.get()));
}
BENCHMARK(key_eq_of_devices);

void key_eq_of_links(benchmark::State& state) {
  const Ref<T_Link> a = make_link(full_device(1), full_device(2));
  const Ref<T_Link> b = make_link(full_device(1), full_device(2));
  for (auto _ : state) benchmark::DoNotOptimize(key_eq(a.get(), b.get()));
}
BENCHMARK(key_eq_of_links);

void fill(Instance_Map<T_Device>& map, std::uint32_t n) {
  for (std::uint32_t i = 0; i < n; ++i) map.insert(full_device(i).release());
}

/// Fills a map of n entries; per item.
void map_insert(benchmark::State& state) {
  const auto n = static_cast<std::uint32_t>(state.range(0));
  std::vector<Instance*> instances(n);
  for (auto _ : state) {
    state.PauseTiming();
    for (std::uint32_t i = 0; i < n; ++i) instances[i] = full_device(i).release();
    {
      Instance_Map<T_Device> map;
      state.ResumeTiming();
      for (Instance* instance : instances) map.insert(instance);
      state.PauseTiming();
    }
    state.ResumeTiming();
  }
  state.SetItemsProcessed(state.iterations() * n);
}
BENCHMARK(map_insert)->Arg(100)->Arg(10000)->Arg(1000000)->Unit(benchmark::kMicrosecond);

void map_find(benchmark::State& state) {
  const auto n = static_cast<std::uint32_t>(state.range(0));
  Instance_Map<T_Device> map;
  fill(map, n);
  const Ref<T_Device> model = full_device(0);
  std::uint32_t next = 0;
  for (auto _ : state) {
    next = (next + 7919) % n;
    model->Number.value = next;
    benchmark::DoNotOptimize(map.find(model.get()));
  }
}
BENCHMARK(map_find)->Arg(100)->Arg(10000)->Arg(1000000);

void map_find_missing(benchmark::State& state) {
  const auto n = static_cast<std::uint32_t>(state.range(0));
  Instance_Map<T_Device> map;
  fill(map, n);
  const Ref<T_Device> model = full_device(n);
  for (auto _ : state) {
    ++model->Number.value;
    benchmark::DoNotOptimize(map.find(model.get()));
  }
}
BENCHMARK(map_find_missing)->Arg(100)->Arg(10000)->Arg(1000000);

void string_append_characters(benchmark::State& state) {
  for (auto _ : state) {
    String text;
    for (int i = 0; i < BATCH; ++i) text.append('x');
    benchmark::DoNotOptimize(text.c_str());
  }
  state.SetItemsProcessed(state.iterations() * BATCH);
}
BENCHMARK(string_append_characters);

void string_copy(benchmark::State& state) {
  const String text("a text that is shared");
  for (auto _ : state) {
    const String copy(text);
    benchmark::DoNotOptimize(copy.c_str());
  }
}
BENCHMARK(string_copy);

void string_from_text(benchmark::State& state) {
  for (auto _ : state) {
    const String text("a text of usual length for this");
    benchmark::DoNotOptimize(text.c_str());
  }
}
BENCHMARK(string_from_text);

template <class T>
void array_append(benchmark::State& state, const T& item) {
  for (auto _ : state) {
    Array<T> array;
    for (int i = 0; i < BATCH; ++i) array.append(item);
    benchmark::DoNotOptimize(array.begin());
  }
  state.SetItemsProcessed(state.iterations() * BATCH);
}
BENCHMARK_CAPTURE(array_append, uint64, std::uint64_t{5});
BENCHMARK_CAPTURE(array_append, string, String("shared"));

}  // namespace
}  // namespace cimrt
