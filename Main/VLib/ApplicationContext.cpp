#include "Main/VLib/ApplicationContext.h"

ApplicationContext &ApplicationContext::instance()
{
    static ApplicationContext context;
    return context;
}
