// tarn_consumer: checks that an installed TarnCommandBinder is usable from outside its tree. It
// writes an int32 into a Parameters and reads it back; exit status 0 on success.
#include <TarnCommandBinder.h>

#include <iostream>

int main() {
    Nimbo::Context context;
    Tarn::Types types(context);
    Tarn::Parameters parameters = types.CreateParameters();
    int value = 0;
    if (parameters.WriteInt32("answer", 42) != S_OK ||
        parameters.ReadInt32("answer", value) != S_OK || value != 42) {
        std::cerr << "tarn_consumer: int32 round trip failed (read " << value << ")\n";
        return 1;
    }
    std::cout << "tarn_consumer: TarnCommandBinder works (answer = " << value << ")\n";
    return 0;
}
