// Serves a page and the sounds on it to the browsers of this machine.
#pragma once

#include "tool/page/PageRow.h"
#include "tool/page/ServerModule.h"

#include <string>
#include <vector>

/// The site: below a token that nobody can guess, the page, `file/N` and `decoded/N` for the sound of row N. Nothing
/// else is given out: no other names, and no file that is outside the folders that were indexed.
class PageSite : public ServedSite {
public:
    /// `roots` are folders with a slash at the end, links resolved.
    PageSite(std::vector<PageRow> rows, std::string page, std::vector<std::string> roots);

    /// The path of the page: "/TOKEN/".
    std::string path() const { return "/" + token_ + "/"; }
    /// The port, without which no request is answered.
    void setPort(int port) { port_ = port; }

    ServedAnswer answer(const std::string& method, const std::string& path, const std::string& host) override;
    void eachHeader(const std::function<void(const char*, const std::string&)>& visit) const override;

private:
    bool isOwnHost(const std::string& host) const;
    bool hasToken(const std::string& path) const;
    ServedAnswer answerFor(const std::string& item) const;
    const PageRow* rowOf(const std::string& number) const;

    std::vector<PageRow> rows_;
    std::shared_ptr<ServedBody> page_;
    std::vector<std::string> roots_;
    std::string token_, policy_;
    int port_ = 0;
};
