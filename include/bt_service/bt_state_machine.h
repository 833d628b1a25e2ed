/**
 * @file
 * The table-driven hierarchical state machines that the service's processes are made of.
 *
 * A process hands each message to BT_CMN_doMtxFunc(). The dispatch table names the machines that handle the message's
 * id, the function-id table gives each machine's current state and matrix, and the matrix row of state and id gives the
 * action to run. An action moves its machine with BT_CMN_changeStatus(), which runs exit and entry functions along the
 * parents of the two states.
 *
 * Tables are the caller's constants; each ends in a row whose first field is BT_TABLE_END. The current state of a
 * machine is a variable of its owner, who drives a machine from one thread at a time. Parents must not form a circle.
 */
#ifndef BT_SERVICE_BT_STATE_MACHINE_H
#define BT_SERVICE_BT_STATE_MACHINE_H

#include <bt_service/bt_message.h>
#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

enum { BT_TABLE_END = 0xFFFF };

/** A state. The offsets are counted in words, the size of a pointer. */
typedef struct state_table {
    uint32_t state;                   /* 0  state id, or BT_TABLE_END                */
    void (*entry)(void);              /* 1  run when the state is entered            */
    void (*exit)(void);               /* 2  run when the state is left               */
    const struct state_table* parent; /* 3  the state around this one; null for none */
} BtStateRow;
BT_ASSERT_AT(BtStateRow, entry, sizeof(void*));
BT_ASSERT_AT(BtStateRow, exit, 2 * sizeof(void*));
BT_ASSERT_AT(BtStateRow, parent, 3 * sizeof(void*));

/** An action: takes the message; 0 when handled, 1 when not, by convention. */
typedef uint32_t (*BtAction)(void* message);

/** What a machine does on an event in a state. */
typedef struct mtx_table {
    uint32_t state;            /* 0  state id, or BT_TABLE_END        */
    uint32_t cid;              /* 4  command or event id              */
    BtAction func;             /* 8  run for this event in this state */
} BtMatrixRow;
BT_ASSERT_AT(BtMatrixRow, cid, 4);
BT_ASSERT_AT(BtMatrixRow, func, 8);

/** Which machine handles an event; an event with several rows drives several machines. */
typedef struct dispatch_table {
    uint32_t cid;              /* 0  command or event id, or BT_TABLE_END */
    uint32_t func_id;          /* 4  id of the machine                    */
} BtDispatchRow;
BT_ASSERT_SIZE(BtDispatchRow, 8);
BT_ASSERT_AT(BtDispatchRow, func_id, 4);

/** A machine. The offsets are counted in words, the size of a pointer. */
typedef struct func_id_table {
    uint32_t func_id;                  /* 0  id of the machine, or BT_TABLE_END   */
    uint32_t (*getstate)(void);        /* 1  delivers the machine's current state */
    const struct mtx_table* mtx_table; /* 2  its matrix                           */
} BtFunctionIdRow;
BT_ASSERT_AT(BtFunctionIdRow, getstate, sizeof(void*));
BT_ASSERT_AT(BtFunctionIdRow, mtx_table, 2 * sizeof(void*));

/**
 * Moves a machine to another state.
 *
 * With the same parent on both sides only the old state's exit and the new state's entry function run. Otherwise all of
 * the old state's ancestors are left, innermost first, and all of the new state's are entered, outermost first, shared
 * ancestors included. `*current_state` takes the new value after the entry functions.
 *
 * @param current_state  the machine's state
 * @param next_state     id of the new state
 * @param state_table    the machine's states
 * @return 0 changed; 1 null pointer, a row without a function, already in that state, or a current state without a row,
 *         with nothing run; 1 also for a new state without a row, the exit functions having run
 */
BT_API int32_t BT_CMN_changeStatus(uint32_t* current_state, uint32_t next_state, const BtStateRow* state_table);

/** Runs the exit functions of a state and then of its ancestors, innermost first. */
BT_API void bt_cmn_changeStatusExit(const BtStateRow* row);

/** Runs the entry functions of a state's ancestors, outermost first, and then its own. */
BT_API void bt_cmn_changeStatusEntry(const BtStateRow* row);

/**
 * Runs the action of every machine that handles a message, in the order of the dispatch table.
 *
 * @param message         a BtMessage; handed to the actions
 * @param dispatch_table  which machine handles which id
 * @param func_id_table   the machines
 * @return result of the last machine's action; 1 when that machine had none for its state, when no machine handles the
 *         id, or for a null pointer
 */
BT_API uint32_t BT_CMN_doMtxFunc(void* message, const BtDispatchRow* dispatch_table,
                                 const BtFunctionIdRow* func_id_table);

/** The search through the dispatch table; arguments and result as for BT_CMN_doMtxFunc(). */
BT_API uint32_t bt_cmn_searchDispatchTable(void* message, const BtDispatchRow* dispatch_table,
                                           const BtFunctionIdRow* func_id_table);

/**
 * Runs the action of the machine that one dispatch row names.
 *
 * @return the action's result; 1 for a null pointer, an unknown machine, or one without getstate or action
 */
BT_API uint32_t bt_cmn_searchFuncIdTable(void* message, const BtDispatchRow* dispatch_row,
                                         const BtFunctionIdRow* func_id_table);

/**
 * Runs the action of a machine for a message in a state.
 *
 * @return the action's result; 1 for a null pointer, or a state and id without action
 */
BT_API uint32_t bt_cmn_searchMtxTable(void* message, const BtFunctionIdRow* func_id_row, uint32_t state);

/** An action that does nothing. @return 0; 1 for a null message */
BT_API uint32_t BT_CMN_nopMtxFunc(void* message);

/** The action of an event that a state does not accept; logs its id. @return 1 */
BT_API uint32_t BT_CMN_errMtxFunc(void* message);

/** The getstate of a machine that handles nothing. @return 0xFFFF, a state no matrix row can have */
BT_API uint32_t BT_CMN_nopGetState(void);

/** An entry or exit function that does nothing. */
BT_API void BT_CMN_nopEntryExit(void);

BT_EXTERN_C_END

#endif
