#include "generate/rowstream.h"

#include <algorithm>
#include <condition_variable>
#include <exception>
#include <mutex>
#include <thread>
#include <vector>

namespace {

// Rows a block: large enough that handing a block on costs little beside
// making it, small enough that the blocks in flight take a few megabytes.
constexpr std::int64_t BlockRows = 1 << 15;
// However many threads are asked for, this many blocks at most are held.
constexpr int MaxSlots = 32;

// The blocks being made or waiting to be written, shared by the threads
// that make them and the one that writes them. Block b lives in slot
// b % slots until it is written; no thread starts a block while its slot
// still holds one that is not.
class Blocks {
public:
    Blocks(const NameRun& run, const RowFormatter& formatter, int threads)
        : m_run(run)
        , m_formatter(formatter)
        , m_count((run.rows().size() + BlockRows - 1) / BlockRows)
        , m_slots(std::size_t(std::clamp(threads * 2, 2, MaxSlots)))
    {
    }

    std::int64_t count() const { return m_count; }

    // A thread's work: blocks one after another until there are none or
    // the stream stops.
    void make()
    {
        std::vector<NamePair> pairs;
        for (;;) {
            std::int64_t block = 0;
            {
                std::unique_lock lock(m_mutex);
                m_changed.wait(lock, [&] {
                    return m_stopped || m_next >= m_count
                           || m_next < m_written + std::int64_t(m_slots.size());
                });
                if (m_stopped || m_next >= m_count)
                    return;
                block = m_next++;
            }
            Slot& slot = m_slots[std::size_t(block) % m_slots.size()];
            try {
                format(block, pairs, slot.bytes);
            } catch (...) {
                stop(std::current_exception());
                return;
            }
            {
                const std::lock_guard lock(m_mutex);
                slot.ready = true;
            }
            m_changed.notify_all();
        }
    }

    // The writer's side: waits for block b, hands its bytes to sink and
    // frees its slot.
    void write(std::int64_t block, const ByteSink& sink)
    {
        Slot& slot = m_slots[std::size_t(block) % m_slots.size()];
        {
            std::unique_lock lock(m_mutex);
            m_changed.wait(lock, [&] { return slot.ready || m_failure; });
            if (m_failure)
                std::rethrow_exception(m_failure);
        }
        sink(QByteArrayView(slot.bytes));
        {
            const std::lock_guard lock(m_mutex);
            slot.ready = false;
            ++m_written;
        }
        m_changed.notify_all();
    }

    void stop(std::exception_ptr failure = {})
    {
        {
            const std::lock_guard lock(m_mutex);
            m_stopped = true;
            if (failure && !m_failure)
                m_failure = failure;
        }
        m_changed.notify_all();
    }

    // Makes block b into out, on the calling thread.
    void format(std::int64_t block, std::vector<NamePair>& pairs, QByteArray& out) const
    {
        const std::int64_t first = m_run.rows().begin + block * BlockRows;
        const std::int64_t rows = std::min(BlockRows, m_run.rows().end - first);
        pairs.resize(std::size_t(rows));
        m_run.pairs(first, pairs);
        out.truncate(0); // keeps its room for the next block
        m_formatter.appendRows(first, pairs, out);
    }

private:
    struct Slot {
        QByteArray bytes;
        bool ready = false;
    };

    const NameRun& m_run;
    const RowFormatter& m_formatter;
    const std::int64_t m_count;
    std::vector<Slot> m_slots;

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::int64_t m_next = 0;
    std::int64_t m_written = 0;
    bool m_stopped = false;
    std::exception_ptr m_failure;
};

} // namespace

int threadsFor(int asked)
{
    if (asked > 0)
        return asked;
    return std::max(1, int(std::thread::hardware_concurrency()));
}

void streamRows(const NameRun& run, const RowFormatter& formatter, int threads,
                const ByteSink& sink)
{
    Blocks blocks(run, formatter, std::max(1, threadsFor(threads)));
    const int workers = int(std::min<std::int64_t>(threadsFor(threads), blocks.count()));
    if (workers <= 1) {
        std::vector<NamePair> pairs;
        QByteArray bytes;
        for (std::int64_t block = 0; block < blocks.count(); ++block) {
            blocks.format(block, pairs, bytes);
            sink(QByteArrayView(bytes));
        }
        return;
    }

    std::vector<std::thread> makers;
    // However the writing ends, the makers stop and are joined before the
    // blocks they use go away.
    struct Join {
        Blocks& blocks;
        std::vector<std::thread>& threads;
        ~Join()
        {
            blocks.stop();
            for (std::thread& thread : threads)
                thread.join();
        }
    } join{blocks, makers};
    for (int i = 0; i < workers; ++i)
        makers.emplace_back([&blocks] { blocks.make(); });
    for (std::int64_t block = 0; block < blocks.count(); ++block)
        blocks.write(block, sink);
}
