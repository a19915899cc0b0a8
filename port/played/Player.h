// SPDX-License-Identifier: Apache-2.0
// Plays the services of a simulated device on a bus.
#ifndef PORT_PLAYED_PLAYER_H
#define PORT_PLAYED_PLAYER_H

#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "../../devicefile/DeviceFile.h"
#include "../backend/Network.h"
#include "Stage.h"

namespace port::played {

class Player {
public:
    /// `file` is a path. `onProblem` is told of a mistake in it, once. The services begin when
    /// start() is called, in the thread whose default context runs them and destroys this.
    Player(std::string file, const std::string& address, const std::vector<std::string>& services,
           std::function<void(const std::string&)> onProblem);
    ~Player();
    Player(const Player&) = delete;
    Player& operator=(const Player&) = delete;

    /// Returns when the services are on the bus. Throws std::runtime_error, as for a device file
    /// with mistakes.
    void start();
    /// Shows what the file says now; a file that becomes broken changes nothing.
    void refresh();

private:
    struct Now {
        Facts facts;
        ModemNumbers modems;
        Scene scene{facts, modems};
    };
    std::string change(const std::vector<devicefile::Edit>& changes);
    void show(std::shared_ptr<const devicefile::Device> device);
    static gboolean onChanged(gpointer self);

    devicefile::DeviceFile file_;
    Owned<GMainContext> context_;
    std::shared_ptr<const devicefile::Device> device_;
    ModemNumbers modems_;
    std::unique_ptr<Now> now_;
    std::vector<std::unique_ptr<Stage>> stages_;
    std::unique_ptr<Watch> watch_;
    Owned<GSource> change_;
};

/// The names of all services.
std::vector<std::string> serviceNames();

} // namespace port::played

#endif
