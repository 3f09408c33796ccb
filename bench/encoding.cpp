// Encoding, decoding and copying a typical bag, against msgpack-c with an owning structure of the
// same fields, in the same run.
#include <benchmark/benchmark.h>
#include <msgpack.hpp>

#include <cstring>
#include <string>
#include <vector>

#include "Nimbo/Context.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"

namespace {

struct Nested {
    std::string name;
    int count;
    double ratio;
    bool enabled;
    std::vector<int> ids;
    MSGPACK_DEFINE_MAP(name, count, ratio, enabled, ids);
};

struct Element {
    std::string label;
    int x;
    int y;
    double weight;
    MSGPACK_DEFINE_MAP(label, x, y, weight);
};

struct Bag {
    std::string s1, s2, s3, s4, s5;
    int i1, i2, i3, i4, i5;
    double d1, d2, d3;
    bool b1, b2;
    std::vector<double> samples;
    std::vector<int> indexes;
    Nested nested;
    std::vector<Element> elements;
    msgpack::type::raw_ref raw;  // packing side: the bytes as a bin
    MSGPACK_DEFINE_MAP(s1, s2, s3, s4, s5, i1, i2, i3, i4, i5, d1, d2, d3, b1, b2, samples,
                       indexes, nested, elements, raw);
};

// The decoded form owns its buffer bytes.
struct OwningBag {
    std::string s1, s2, s3, s4, s5;
    int i1, i2, i3, i4, i5;
    double d1, d2, d3;
    bool b1, b2;
    std::vector<double> samples;
    std::vector<int> indexes;
    Nested nested;
    std::vector<Element> elements;
    std::vector<char> raw;
    MSGPACK_DEFINE_MAP(s1, s2, s3, s4, s5, i1, i2, i3, i4, i5, d1, d2, d3, b1, b2, samples,
                       indexes, nested, elements, raw);
};

const char kText[] = "sixteen chars ok";

struct Fixture {
    Nimbo::Context context;
    Tarn::Types types{context};
    Tarn::Parameters bag{types};
    Bag peer;
    std::vector<char> buffer = std::vector<char>(256, 'b');

    Fixture() {
        const char* strings[] = {"s1", "s2", "s3", "s4", "s5"};
        const char* ints[] = {"i1", "i2", "i3", "i4", "i5"};
        for (int i = 0; i < 5; ++i) {
            bag.WriteString(strings[i], kText);
            bag.WriteInt32(ints[i], 1000 * i + 7);
        }
        bag.WriteDouble("d1", 1.5);
        bag.WriteDouble("d2", 2.0);
        bag.WriteDouble("d3", 3.25);
        bag.WriteBool("b1", true);
        bag.WriteBool("b2", false);
        std::vector<double> samples(100);
        for (int i = 0; i < 100; ++i) samples[i] = i * 0.5;
        std::vector<int> indexes(50);
        for (int i = 0; i < 50; ++i) indexes[i] = i * 3;
        bag.WriteDoubleArray("samples", samples);
        bag.WriteInt32Array("indexes", indexes);
        Tarn::Parameters nested(types);
        nested.WriteString("name", kText);
        nested.WriteInt32("count", 3);
        nested.WriteDouble("ratio", 0.75);
        nested.WriteBool("enabled", true);
        nested.WriteInt32Array("ids", std::vector<int>{1, 2, 3});
        bag.WriteParameters("nested", nested);
        std::vector<Tarn::Parameters*> elements;
        std::vector<const void*> pointers;
        for (int i = 0; i < 3; ++i) {
            auto* element = new Tarn::Parameters(types);
            element->WriteString("label", kText);
            element->WriteInt32("x", i);
            element->WriteInt32("y", -i);
            element->WriteDouble("weight", 0.5 + i);
            elements.push_back(element);
            pointers.push_back(element);
        }
        bag.WriteObjectArray("elements", "Parameters", pointers);
        for (auto* element : elements) delete element;
        bag.WriteBuffer("raw", buffer.data(), static_cast<unsigned int>(buffer.size()));

        peer = Bag{kText, kText, kText, kText, kText, 7, 1007, 2007, 3007, 4007, 1.5, 2.0, 3.25,
                   true, false, samples, indexes,
                   Nested{kText, 3, 0.75, true, {1, 2, 3}}, {},
                   msgpack::type::raw_ref(buffer.data(), static_cast<uint32_t>(buffer.size()))};
        for (int i = 0; i < 3; ++i) peer.elements.push_back(Element{kText, i, -i, 0.5 + i});
    }
};

Fixture& Shared() {
    static Fixture fixture;
    return fixture;
}

void BM_Tarn_Encode(benchmark::State& state) {
    Fixture& f = Shared();
    for (auto _ : state) benchmark::DoNotOptimize(f.bag.ToBinary());
    state.counters["bytes"] = f.bag.ToBinary().GetSize();
}
BENCHMARK(BM_Tarn_Encode);

void BM_Tarn_Decode(benchmark::State& state) {
    Fixture& f = Shared();
    Nimbo::Binary bytes = f.bag.ToBinary();
    for (auto _ : state) {
        Tarn::Parameters decoded(f.types, bytes);
        benchmark::DoNotOptimize(&decoded);
    }
}
BENCHMARK(BM_Tarn_Decode);

void BM_Tarn_EncodeDecode(benchmark::State& state) {
    Fixture& f = Shared();
    for (auto _ : state) {
        Tarn::Parameters decoded(f.types, f.bag.ToBinary());
        benchmark::DoNotOptimize(&decoded);
    }
}
BENCHMARK(BM_Tarn_EncodeDecode);

void BM_Tarn_Copy(benchmark::State& state) {
    Fixture& f = Shared();
    for (auto _ : state) {
        Tarn::Parameters copy(f.bag);
        benchmark::DoNotOptimize(&copy);
    }
}
BENCHMARK(BM_Tarn_Copy);

void BM_Msgpack_Pack(benchmark::State& state) {
    Fixture& f = Shared();
    for (auto _ : state) {
        msgpack::sbuffer out;
        msgpack::pack(out, f.peer);
        benchmark::DoNotOptimize(out.data());
    }
    msgpack::sbuffer out;
    msgpack::pack(out, f.peer);
    state.counters["bytes"] = static_cast<double>(out.size());
}
BENCHMARK(BM_Msgpack_Pack);

void BM_Msgpack_Decode(benchmark::State& state) {
    Fixture& f = Shared();
    msgpack::sbuffer packed;
    msgpack::pack(packed, f.peer);
    for (auto _ : state) {
        msgpack::object_handle handle = msgpack::unpack(packed.data(), packed.size());
        OwningBag decoded;
        handle.get().convert(decoded);
        benchmark::DoNotOptimize(&decoded);
    }
}
BENCHMARK(BM_Msgpack_Decode);

void BM_Msgpack_PackDecode(benchmark::State& state) {
    Fixture& f = Shared();
    for (auto _ : state) {
        msgpack::sbuffer packed;
        msgpack::pack(packed, f.peer);
        msgpack::object_handle handle = msgpack::unpack(packed.data(), packed.size());
        OwningBag decoded;
        handle.get().convert(decoded);
        benchmark::DoNotOptimize(&decoded);
    }
}
BENCHMARK(BM_Msgpack_PackDecode);

// Copying a bag that holds 1 MiB of bytes, against copying 1 MiB with memcpy.
constexpr unsigned int kMiB = 1u << 20;

void BM_Tarn_Copy1MiB(benchmark::State& state) {
    Fixture& f = Shared();
    std::vector<char> bytes(kMiB, 'x');
    Tarn::Parameters bag(f.types);
    bag.WriteBuffer("big", bytes.data(), kMiB);
    for (auto _ : state) {
        Tarn::Parameters copy(bag);
        benchmark::DoNotOptimize(&copy);
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kMiB);
}
BENCHMARK(BM_Tarn_Copy1MiB);

void BM_Memcpy1MiB(benchmark::State& state) {
    std::vector<char> from(kMiB, 'x');
    std::vector<char> to(kMiB);
    for (auto _ : state) {
        std::memcpy(to.data(), from.data(), kMiB);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kMiB);
}
BENCHMARK(BM_Memcpy1MiB);

// A copy through the binary form, as received bytes are: encode, then decode.
void BM_Tarn_EncodeDecode1MiB(benchmark::State& state) {
    Fixture& f = Shared();
    std::vector<char> bytes(kMiB, 'x');
    Tarn::Parameters bag(f.types);
    bag.WriteBuffer("big", bytes.data(), kMiB);
    for (auto _ : state) {
        Tarn::Parameters copy(f.types, bag.ToBinary());
        benchmark::DoNotOptimize(&copy);
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kMiB);
}
BENCHMARK(BM_Tarn_EncodeDecode1MiB);

}  // namespace

BENCHMARK_MAIN();
