// Files of any bytes: what they seem to be is found out, and is a job that can be read.
#include <fuzzing.h>

#include <base/failure.h>
#include <infer/proposal.h>
#include <infer/survey.h>
#include <translate/job_file.h>

#include <string>
#include <sys/mman.h>
#include <unistd.h>

using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const int file = ::memfd_create("input", 0);
    require(file >= 0 && ::write(file, data, size) == static_cast<ssize_t>(size), "the input is in a file");
    const std::string path = "/proc/self/fd/" + std::to_string(file);
    std::uint64_t bytes = 0;
    const host::Survey survey = host::surveyFile(path, "", [&](std::uint64_t count) { bytes += count; });
    ::close(file);
    require(bytes >= size && bytes <= 2 * size, "all bytes are read twice, but for a mark");
    requireEqual(survey.bytes, std::uint64_t{size}, "the bytes of the file");
    const std::string job = host::proposedJob(survey);
    try {
        host::readJob(job, "job.toml");
    } catch (const host::Failure& failure) {
        require(false, std::string(failure.what()) + "\n" + job);
    }
    return 0;
}
