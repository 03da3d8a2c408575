// Job files of any bytes: a job, or a complaint with its place; and a job that is written is read again as the same.
#include <fuzzing.h>

#include <base/failure.h>
#include <translate/job_file.h>
#include <translate/job_text.h>

#include <string>

using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    host::Job job;
    try {
        job = host::readJob(text, "job.toml");
    } catch (const host::Failure& failure) {
        const std::string said = failure.what();
        require(said.rfind("job.toml:", 0) == 0 && said[9] >= '1' && said[9] <= '9',
                "a complaint has its place");
        return 0;
    }
    const std::string written = host::jobText(job);
    requireEqual(host::jobText(host::readJob(written, "written")), written, "the job that was written");
    return 0;
}
