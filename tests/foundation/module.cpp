// What the plug-in makes, changes, throws and catches; the test does the other half.
#include "module.h"

#include "catching.h"

namespace plugin {

using namespace kvt::ex;

UStringArray<0> makeArray(int count) {
    UStringArray<0> array;
    for (int i = 0; i < count; ++i) {
        addTo(array);
    }
    return array;
}

void dropArray(std::unique_ptr<vector<UString<0>>> array) {
    array.reset();
}

void addTo(UStringArray<0>& array) {
    const std::string number = std::to_string(array.size());
    array.push_back(UString<0>(
        (array.size() % 2 == 0 ? number : number + " and more than a small-string buffer can hold").c_str()));
}

void throwFailure(const std::string& className) {
    if (className == "Throwable") {
        throw Throwable("of the module");
    }
    if (className == "FatalError") {
        throw FatalError("of the module");
    }
    if (className == "UStringException") {
        throw UStringException("of the module");
    }
    if (className == "UStringBadEncodingException") {
        throw UStringBadEncodingException(UString<28>("\xFF"), Encoding::Utf8, "?", "?");
    }
    if (className == "PythonVersionError") {
        throw PythonVersionError("3", "2");
    }
    throw HiddenFailure("of the module");
}

std::string caughtAs(const std::function<void()>& operation) {
    return kvt::test::caughtAs(operation);
}

void passThrough(const std::function<void()>& operation) {
    try {
        operation();
    } catch (Throwable& failure) {
        failure.addStackFrame("module.cpp", "passThrough", 7);
        throw;
    }
}

} // namespace plugin
