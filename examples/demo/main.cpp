// tarn_demo: a first look at Parameters, the typed property bag that commands exchange.
//
// It makes a kernel context and the type registry every bag is bound to, writes a few kinds of
// properties, reads them back, renders the bag as JSON, then reads a property that is not there:
// the read fails with a negative result, and the library publishes why through the kernel. The
// kernel's default error listener prints that text to stderr:
//
//   TarnCommandBinder: Parameters::ReadInt32() unknown property <missing>
//
// Exit status 0 when every value came back as written and the missing read failed.
#include <iostream>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"
#include "ZelUnicodeString.h"

namespace {

int failures = 0;

void Check(bool ok, const char* what) {
    if (!ok) {
        std::cerr << "tarn_demo: " << what << " failed\n";
        ++failures;
    }
}

}  // namespace

int main() {
    Nimbo::Context context;
    Tarn::Types types(context);
    Tarn::Parameters parameters = types.CreateParameters();

    const std::vector<double> samples{1.5, 2.25, -3.0};
    Check(parameters.WriteString("name", "demo \xC3\xA9t\xC3\xA9") == S_OK, "WriteString");
    Check(parameters.WriteInt32("count", 42) == S_OK, "WriteInt32");
    Check(parameters.WriteDouble("ratio", 0.75) == S_OK, "WriteDouble");
    Check(parameters.WriteDoubleArray("samples", samples) == S_OK, "WriteDoubleArray");

    ZelUnicodeString name;
    int count = 0;
    double ratio = 0;
    std::vector<double> readSamples;
    Check(parameters.ReadString("name", name) == S_OK && name == "demo \xC3\xA9t\xC3\xA9",
          "ReadString");
    Check(parameters.ReadInt32("count", count) == S_OK && count == 42, "ReadInt32");
    Check(parameters.ReadDouble("ratio", ratio) == S_OK && ratio == 0.75, "ReadDouble");
    Check(parameters.ReadDoubleArray("samples", readSamples) == S_OK && readSamples == samples,
          "ReadDoubleArray");

    std::cout << "name    (string)   = " << name << "\n";
    std::cout << "count   (int32)    = " << count << "\n";
    std::cout << "ratio   (double)   = " << ratio << "\n";
    std::cout << "samples (double[]) = [";
    for (std::size_t i = 0; i < readSamples.size(); ++i) {
        std::cout << (i == 0 ? "" : ", ") << readSamples[i];
    }
    std::cout << "]\n";

    ZelUnicodeString json;
    Check(parameters.ToJSON(json) >= 0, "ToJSON");
    std::cout << "as JSON: " << json << std::endl;  // flushed: stderr comes next

    // Not there: a negative result, and the reason goes to the error listener (stderr).
    int missing = 0;
    const long result = parameters.ReadInt32("missing", missing);
    std::cout << "ReadInt32(\"missing\") returned " << (result < 0 ? "a failure" : "success")
              << " (" << result << ")" << std::endl;
    Check(result < 0, "reading a missing property");

    return failures == 0 ? 0 : 1;
}
