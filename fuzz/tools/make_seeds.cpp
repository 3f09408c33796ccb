// Writes a seed corpus of valid encodings: make_seeds <folder> fills <folder>/decode_parameters/.
#include <sys/stat.h>

#include <cstdio>
#include <string>
#include <vector>

#include "Nimbo/Context.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"

namespace {

bool Save(const std::string& path, const Nimbo::Binary& bytes) {
    std::FILE* file = std::fopen(path.c_str(), "wb");
    if (file == nullptr) return false;
    bool ok = std::fwrite(bytes.GetData(), 1, bytes.GetSize(), file) == bytes.GetSize();
    return std::fclose(file) == 0 && ok;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: make_seeds <folder>\n");
        return 2;
    }
    std::string folder = std::string(argv[1]) + "/decode_parameters";
    mkdir(argv[1], 0755);
    mkdir(folder.c_str(), 0755);

    Nimbo::Context context;
    Tarn::Types types(context);
    std::vector<Nimbo::Binary> seeds;

    Tarn::Parameters empty(types);
    seeds.push_back(empty.ToBinary());

    Tarn::Parameters scalars(types);
    scalars.WriteString("s", "text");
    scalars.WriteBool("b", true);
    scalars.WriteInt8("i8", -3);
    scalars.WriteUint8("u8", 200);
    scalars.WriteInt16("i16", -300);
    scalars.WriteUint16("u16", 60000);
    scalars.WriteInt32("i32", -70000);
    scalars.WriteUint32("u32", 4000000000u);
    scalars.WriteInt64("i64", -5000000000LL);
    scalars.WriteUint64("u64", 10000000000000000000ULL);
    scalars.WriteFloat("f", 0.5f);
    scalars.WriteDouble("d", 0.25);
    scalars.WriteBuffer("buf", "bytes", 5);
    seeds.push_back(scalars.ToBinary());

    Tarn::Parameters arrays(types);
    arrays.WriteStringArray("ss", {"a", "bc"});
    arrays.WriteBoolArray("bs", std::vector<bool>{true, false});
    arrays.WriteInt8Array("i8s", std::vector<signed char>{1, -1});
    arrays.WriteUint8Array("u8s", std::vector<unsigned char>{1, 2});
    arrays.WriteInt16Array("i16s", std::vector<short>{1});
    arrays.WriteUint16Array("u16s", std::vector<unsigned short>{1});
    arrays.WriteInt32Array("i32s", std::vector<int>{1, 2, 3});
    arrays.WriteUint32Array("u32s", std::vector<unsigned int>{});
    arrays.WriteInt64Array("i64s", std::vector<long long>{1});
    arrays.WriteUint64Array("u64s", std::vector<unsigned long long>{1});
    arrays.WriteFloatArray("fs", std::vector<float>{1.5f});
    arrays.WriteDoubleArray("ds", std::vector<double>{2.5});
    seeds.push_back(arrays.ToBinary());

    Tarn::Parameters nested(types);
    nested.WriteParameters("inner", scalars);
    nested.WriteObjectArray("list", "Parameters", {&scalars, &arrays});
    nested.WriteObjectArray("none", "Point", {});
    seeds.push_back(nested.ToBinary());
    Tarn::Parameters deeper(types);
    deeper.WriteParameters("n", nested);
    seeds.push_back(deeper.ToBinary());

    for (std::size_t i = 0; i < seeds.size(); ++i) {
        if (!Save(folder + "/seed" + std::to_string(i), seeds[i])) {
            std::perror(folder.c_str());
            return 1;
        }
    }
    return 0;
}
